// Directory: path operations on wide-string paths (static functions).
//
// Paths use "/" as their only separator. Each operation converts its paths
// with Unicode (so the LC_CTYPE locale decides which names can be used) and
// makes one or a few system calls; failure is reported by a false or null
// result, never by an exception. Stateless; any thread may call.
#ifndef LODESTACK_CORE_DIRECTORY_H
#define LODESTACK_CORE_DIRECTORY_H

#include <string>

#include "lodestack/core/Export.h"

namespace lodestack {
namespace core {

class File;
class IDirectory;

class LODESTACK_EXPORT Directory {
 public:
  static const wchar_t kSeparator = L'/';

  Directory() = delete;

  // lstat succeeds: a dangling symbolic link exists.
  static bool pathExists(const std::wstring& path);
  // A directory object for `path`, or null when the path does not exist.
  // The path is not checked to be a directory: listing a file fails later.
  // The caller owns the result (count 0).
  static IDirectory* open(const std::wstring& path);
  // mkdir with mode 0777 (less the umask). True on success and whenever
  // something already exists at `path`, even a regular file.
  static bool mkDir(const std::wstring& path);
  // Creates every missing directory of `path` (mode 0777 less the umask).
  // True when `path` is a directory at the end; false when a component is
  // not a directory or cannot be made (directories made before the failure
  // stay).
  static bool mkPath(const std::wstring& path);
  // remove(): a file or an empty directory.
  static bool rmFile(const std::wstring& path);
  static bool renameFile(const std::wstring& from, const std::wstring& to);
  // Sets access and modification time to `time` (seconds since the epoch);
  // 0 sets both to now.
  static bool setFileModificationTime(const std::wstring& path, unsigned int time);
  // Points into `path` at the name after the last separator and sets
  // `length` to its length. A path without separator is all name. An empty
  // path, or one ending in a separator, gives null and length 0. The pointer
  // lives as long as `path` is unchanged.
  static const wchar_t* findFileName(const std::wstring& path, unsigned int& length);
  // Joins with exactly one separator: trailing separators of `a` and leading
  // ones of `b` are dropped first ("/" stays the root). An empty part gives
  // the other unchanged.
  static std::wstring concat(const std::wstring& a, const std::wstring& b);
  // Copies the bytes of the regular file `from` into `to`, created or
  // truncated (mode 0666 less the umask). On failure a partly written `to`
  // is removed. Copying a file onto itself fails.
  static bool copyFile(const std::wstring& from, const std::wstring& to);
  // The working directory; empty when it cannot be told or converted.
  static std::wstring currentDir();
  // "/opt/usr/share/oxel".
  static void getPreinstalledFilesPath(std::wstring& out);
  // The same path; `removable` := false (the storage is not removable).
  static void getDefaultStoragePath(std::wstring& out, bool& removable);
  // Opens an existing file for reading ("rb"), or for reading and writing
  // ("r+b"). `bufferSize` as openCrtFile; a buffer that cannot be set gives
  // null here. The caller owns the result (count 0).
  static File* openFile(const std::wstring& path, bool forWriting, unsigned int bufferSize = 0);
  // Creates or truncates a file for reading and writing ("w+b").
  static File* createFile(const std::wstring& path, unsigned int bufferSize = 0);
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_DIRECTORY_H
