// DirectoryLinux: the IDirectory of a POSIX file system (opendir, readdir,
// lstat).
//
// Keeps its path only; nothing is held open between calls, so a listing
// shows the directory as it is at the time of the call. Made by
// Directory::open; reference counted; one thread at a time.
#ifndef LODESTACK_CORE_DIRECTORYLINUX_H
#define LODESTACK_CORE_DIRECTORYLINUX_H

#include <string>

#include "lodestack/core/IDirectory.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT DirectoryLinux : public IDirectory {
 public:
  explicit DirectoryLinux(const std::wstring& path);
  ~DirectoryLinux() override;

  bool getEntriesStartWith(const std::wstring& prefix, std::list<Entry>& out,
                           bool ordered) override;
  bool getEntry(const std::wstring& name, Entry& out) override;
  bool subItemExists(const std::wstring& name) override;
  std::wstring subItemPath(const std::wstring& name) const override;
  File* openFile(const Entry& entry, bool forWriting) override;
  IDirectory* openSubDir(const std::wstring& name) override;
  const std::wstring& path() const override { return path_; }

  // Type, size and modification time of `path` from lstat (a symbolic link
  // is described itself, type 0); the name is left alone. False when lstat
  // fails.
  static bool setEntryDetails(const char* path, Entry& entry);

 private:
  std::wstring path_;
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_DIRECTORYLINUX_H
