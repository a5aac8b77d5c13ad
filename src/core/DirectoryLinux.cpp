#include "lodestack/core/DirectoryLinux.h"

#include <dirent.h>
#include <sys/stat.h>

#include <climits>
#include <cstring>
#include <new>

#include "lodestack/core/Directory.h"
#include "lodestack/core/File.h"
#include "lodestack/core/Unicode.h"

namespace lodestack {
namespace core {

IDirectory::~IDirectory() = default;

DirectoryLinux::DirectoryLinux(const std::wstring& path) : path_(path) {}

DirectoryLinux::~DirectoryLinux() = default;

bool DirectoryLinux::setEntryDetails(const char* path, Entry& entry) {
  struct stat info;
  if (path == nullptr || lstat(path, &info) != 0) return false;
  entry.type = S_ISDIR(info.st_mode)   ? Entry::DirectoryType
               : S_ISREG(info.st_mode) ? Entry::RegularFileType
                                       : Entry::OtherType;
  entry.size = info.st_size > static_cast<off_t>(UINT_MAX) ? UINT_MAX
                                                           : static_cast<unsigned int>(info.st_size);
  entry.modificationTime = static_cast<unsigned int>(info.st_mtime);
  return true;
}

bool DirectoryLinux::getEntriesStartWith(const std::wstring& prefix, std::list<Entry>& out,
                                         bool ordered) {
  out.clear();
  std::string dirName;
  if (!Unicode::convertFromUnicodeToUtf8(path_, dirName)) return false;
  DIR* dir = opendir(dirName.c_str());
  if (!dir) return false;
  while (const dirent* item = readdir(dir)) {
    if (std::strcmp(item->d_name, ".") == 0 || std::strcmp(item->d_name, "..") == 0) continue;
    Entry entry;
    if (!Unicode::convertFromUtf8ToUnicode(item->d_name, entry.name)) continue;
    if (entry.name.compare(0, prefix.size(), prefix) != 0) continue;
    std::string full;
    // An entry removed between readdir and lstat is left out.
    if (!Unicode::convertFromUnicodeToUtf8(subItemPath(entry.name), full) ||
        !setEntryDetails(full.c_str(), entry))
      continue;
    out.push_back(std::move(entry));
  }
  closedir(dir);
  // list::sort is stable: equal names keep their reading order.
  if (ordered) out.sort(&IDirectory::lesserName);
  return true;
}

bool DirectoryLinux::getEntry(const std::wstring& name, Entry& out) {
  std::string full;
  Entry entry;
  if (!Unicode::convertFromUnicodeToUtf8(subItemPath(name), full) ||
      !setEntryDetails(full.c_str(), entry))
    return false;
  entry.name = name;
  out = std::move(entry);
  return true;
}

bool DirectoryLinux::subItemExists(const std::wstring& name) {
  return Directory::pathExists(subItemPath(name));
}

std::wstring DirectoryLinux::subItemPath(const std::wstring& name) const {
  return Directory::concat(path_, name);
}

File* DirectoryLinux::openFile(const Entry& entry, bool forWriting) {
  if (entry.type != Entry::RegularFileType) return nullptr;
  return Directory::openFile(subItemPath(entry.name), forWriting);
}

IDirectory* DirectoryLinux::openSubDir(const std::wstring& name) {
  return Directory::open(subItemPath(name));
}

}  // namespace core
}  // namespace lodestack
