// The host platform's secure storage: one file per name in a private
// directory. See lodestack/platform/SecureStorage.h for the contract.
#include "lodestack/platform/SecureStorage.h"

#include <errno.h>
#include <fcntl.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

namespace {

const size_t kMaxEntry = 65536;
const size_t kMaxName = 200;

bool validName(const char* name) {
  if (!name || name[0] == '\0' || name[0] == '.') return false;
  const size_t length = strnlen(name, kMaxName + 1);
  return length <= kMaxName && std::memchr(name, '/', length) == nullptr;
}

std::string homeDirectory() {
  const char* home = std::getenv("HOME");
  if (home && home[0] == '/') return home;
  std::vector<char> scratch(16384);
  passwd entry;
  passwd* found = nullptr;
  if (getpwuid_r(geteuid(), &entry, scratch.data(), scratch.size(), &found) == 0 && found &&
      found->pw_dir && found->pw_dir[0] == '/')
    return found->pw_dir;
  return std::string();
}

// The storage directory's path, or empty when no home can be found.
std::string storageDirectory() {
  const char* chosen = std::getenv("LODESTACK_SECURE_STORAGE_DIR");
  if (chosen && chosen[0] != '\0') return chosen;
  std::string base;
  const char* data = std::getenv("XDG_DATA_HOME");
  if (data && data[0] == '/') {
    base = data;
  } else {
    base = homeDirectory();
    if (base.empty()) return base;
    base += "/.local/share";
  }
  return base + "/lodestack/secure-storage";
}

// Makes the missing directories of `path` with mode 0700.
void makePath(const std::string& path) {
  for (size_t at = path.find('/', 1); at != std::string::npos; at = path.find('/', at + 1))
    if (path[at - 1] != '/') mkdir(path.substr(0, at).c_str(), 0700);
  mkdir(path.c_str(), 0700);
}

// Finds (and, when `create`, makes) the storage directory and checks that it
// is this user's and private. 0 and the path, or a negative errno.
int openStorage(bool create, std::string& dir) {
  dir = storageDirectory();
  if (dir.empty()) return -ENOENT;
  if (create) makePath(dir);
  struct stat info;
  if (stat(dir.c_str(), &info) != 0) return -errno;
  if (!S_ISDIR(info.st_mode)) return -ENOTDIR;
  if (info.st_uid != geteuid()) return -EACCES;
  if ((info.st_mode & 07777) != 0700 && chmod(dir.c_str(), 0700) != 0) return -errno;
  return 0;
}

int failWith(int error, int fd, const std::string& temporary) {
  if (fd >= 0) close(fd);
  if (!temporary.empty()) unlink(temporary.c_str());
  return -error;
}

}  // namespace

extern "C" int ssa_get(const char* name, char** data, size_t* length) {
  if (!data || !length) return -EINVAL;
  *data = nullptr;
  *length = 0;
  if (!validName(name)) return -EINVAL;
  std::string dir;
  if (const int status = openStorage(false, dir)) return status;
  const int fd = open((dir + "/" + name).c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW);
  if (fd < 0) return -errno;
  struct stat info;
  if (fstat(fd, &info) != 0) return failWith(errno, fd, std::string());
  if (!S_ISREG(info.st_mode)) return failWith(EINVAL, fd, std::string());
  if (info.st_size > static_cast<off_t>(kMaxEntry)) return failWith(EFBIG, fd, std::string());
  const size_t size = static_cast<size_t>(info.st_size);
  char* buffer = static_cast<char*>(std::malloc(size ? size : 1));
  if (!buffer) return failWith(ENOMEM, fd, std::string());
  size_t got = 0;
  while (got < size) {
    const ssize_t n = read(fd, buffer + got, size - got);
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) {
      const int error = errno;
      std::free(buffer);
      return failWith(error, fd, std::string());
    }
    if (n == 0) break;
    got += static_cast<size_t>(n);
  }
  close(fd);
  *data = buffer;
  *length = got;
  return 0;
}

extern "C" int ssa_put(const char* name, const char* data, size_t length) {
  if (!validName(name) || (!data && length != 0)) return -EINVAL;
  if (length > kMaxEntry) return -EFBIG;
  std::string dir;
  if (const int status = openStorage(true, dir)) return status;
  // The temporary name starts with "." and so can never be an entry's.
  std::string temporary = dir + "/." + name + ".XXXXXX";
  const int fd = mkostemp(&temporary[0], O_CLOEXEC);
  if (fd < 0) return -errno;
  if (fchmod(fd, 0600) != 0) return failWith(errno, fd, temporary);
  for (size_t done = 0; done < length;) {
    const ssize_t n = write(fd, data + done, length - done);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) return failWith(n < 0 ? errno : EIO, fd, temporary);
    done += static_cast<size_t>(n);
  }
  if (fsync(fd) != 0) return failWith(errno, fd, temporary);
  if (close(fd) != 0) return failWith(errno, -1, temporary);
  if (rename(temporary.c_str(), (dir + "/" + name).c_str()) != 0)
    return failWith(errno, -1, temporary);
  // The rename itself reaches the disk with the directory.
  const int dirFd = open(dir.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (dirFd >= 0) {
    fsync(dirFd);
    close(dirFd);
  }
  return static_cast<int>(length);
}

extern "C" int ssa_delete(const char* name) {
  if (!validName(name)) return -EINVAL;
  std::string dir;
  if (const int status = openStorage(false, dir)) return status;
  return unlink((dir + "/" + name).c_str()) == 0 ? 0 : -errno;
}
