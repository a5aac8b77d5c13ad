// IDirectory: one directory of the file system and the listing of its
// entries.
//
// Made by Directory::open (or openSubDir) and reference counted: keep it in a
// gom::SharedPointer<IDirectory>. Names are wide strings, converted at the
// system-call boundary as Unicode describes; entries whose names the locale
// cannot convert are left out of listings, as are "." and "..". Sizes are
// capped at 0xFFFFFFFF and times are seconds since the epoch. One thread at
// a time.
#ifndef LODESTACK_CORE_IDIRECTORY_H
#define LODESTACK_CORE_IDIRECTORY_H

#include <algorithm>
#include <list>
#include <string>

#include "lodestack/core/Export.h"
#include "lodestack/gom/ReferenceCountable.h"

namespace lodestack {
namespace core {

class File;

class LODESTACK_EXPORT IDirectory : public gom::ReferenceCountable {
 public:
  struct Entry {
    enum Type { OtherType = 0, DirectoryType = 1, RegularFileType = 2 };
    int type = OtherType;
    unsigned int size = 0;
    unsigned int modificationTime = 0;
    std::wstring name;
  };
  // Character by character rather than through std::wstring's compare, whose
  // vector wmemcmp reads past the end of a name (harmless, but memory
  // checkers such as valgrind report it).
  static bool lesserName(const Entry& a, const Entry& b) {
    return std::lexicographical_compare(a.name.begin(), a.name.end(), b.name.begin(), b.name.end());
  }
  static bool greaterName(const Entry& a, const Entry& b) { return lesserName(b, a); }

  ~IDirectory() override;

  // Replaces `out` with the entries whose names start with `prefix` (every
  // entry for an empty prefix): ordered by name when `ordered`, equal names
  // keeping their reading order, else in the order the system reads them.
  // False, with `out` empty, when the directory cannot be read.
  virtual bool getEntriesStartWith(const std::wstring& prefix, std::list<Entry>& out,
                                   bool ordered) = 0;
  // The entry `name` of this directory; false when it does not exist.
  virtual bool getEntry(const std::wstring& name, Entry& out) = 0;
  virtual bool subItemExists(const std::wstring& name) = 0;
  // This directory's path joined with `name` (Directory::concat).
  virtual std::wstring subItemPath(const std::wstring& name) const = 0;
  // Opens a regular file of this directory for reading, or for reading and
  // writing; null for an entry of another type or a file that does not
  // open. The caller owns the result (count 0).
  virtual File* openFile(const Entry& entry, bool forWriting) = 0;
  // The subdirectory `name`, or null when it does not exist. The caller
  // owns the result (count 0).
  virtual IDirectory* openSubDir(const std::wstring& name) = 0;
  virtual const std::wstring& path() const = 0;

  // Every entry, ordered by name.
  bool getAllEntries(std::list<Entry>& out) { return getEntriesStartWith(L"", out, true); }
  bool findEntriesStartWith(const std::wstring& prefix, std::list<Entry>& out) {
    return getEntriesStartWith(prefix, out, true);
  }
  bool findEntriesUnorderedStartWith(const std::wstring& prefix, std::list<Entry>& out) {
    return getEntriesStartWith(prefix, out, false);
  }
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_IDIRECTORY_H
