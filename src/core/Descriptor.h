// Descriptors the core layer creates for itself.
#ifndef LODESTACK_SRC_CORE_DESCRIPTOR_H
#define LODESTACK_SRC_CORE_DESCRIPTOR_H

#include <fcntl.h>
#include <unistd.h>

namespace lodestack {
namespace core {

// Descriptor 0 means "none" in the core layer, yet a process running with
// standard input closed receives 0 for its next descriptor. Returns `fd`
// unless it is 0; then a close-on-exec duplicate above the standard
// descriptors, 0 being closed again (-1 when no duplicate can be made).
inline int offZero(int fd) {
  if (fd != 0) return fd;
  const int moved = fcntl(fd, F_DUPFD_CLOEXEC, 3);
  close(fd);
  return moved;
}

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_SRC_CORE_DESCRIPTOR_H
