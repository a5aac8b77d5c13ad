#include <sys/stat.h>
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <clocale>
#include <cstdlib>
#include <cstring>
#include <list>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "lodestack/core/Directory.h"
#include "lodestack/core/DirectoryLinux.h"
#include "lodestack/core/File.h"
#include "lodestack/gom/SharedPointer.h"
#include "support/TemporaryDirectory.h"

namespace lodestack::core {
namespace {

using gom::SharedPointer;
using lodestack::testing::readText;
using lodestack::testing::TemporaryDirectory;
using lodestack::testing::writeText;

std::vector<std::wstring> namesOf(const std::list<IDirectory::Entry>& entries) {
  std::vector<std::wstring> names;
  for (const IDirectory::Entry& entry : entries) names.push_back(entry.name);
  return names;
}

TEST(Directory, PathRules) {
  struct Join {
    const wchar_t* a;
    const wchar_t* b;
    const wchar_t* joined;
  };
  for (const Join& j : {Join{L"a", L"b", L"a/b"}, Join{L"a/", L"b", L"a/b"},
                        Join{L"a//", L"/b", L"a/b"}, Join{L"/", L"etc", L"/etc"},
                        Join{L"", L"b", L"b"}, Join{L"a", L"", L"a"}, Join{L"a", L"b/", L"a/b/"}})
    EXPECT_EQ(Directory::concat(j.a, j.b), j.joined) << j.a << " + " << j.b;

  struct Name {
    const wchar_t* path;
    const wchar_t* name;  // null: none
  };
  for (const Name& n : {Name{L"/x/y.log", L"y.log"}, Name{L"y.log", L"y.log"}, Name{L"/x/", nullptr},
                        Name{L"", nullptr}, Name{L"/", nullptr}}) {
    const std::wstring path = n.path;
    unsigned int length = 99;
    const wchar_t* name = Directory::findFileName(path, length);
    if (!n.name) {
      EXPECT_TRUE(name == nullptr && length == 0) << n.path;
    } else {
      ASSERT_NE(name, nullptr) << n.path;
      EXPECT_EQ(std::wstring(name, length), n.name);
    }
  }
}

TEST(Directory, MakeRemoveRenameAndCopy) {
  TemporaryDirectory dir;
  EXPECT_TRUE(Directory::mkDir(dir.wide("d")));
  EXPECT_TRUE(Directory::mkDir(dir.wide("d"))) << "an existing directory";
  writeText(dir.file("plain"), "contents");
  EXPECT_TRUE(Directory::mkDir(dir.wide("plain"))) << "EEXIST from a regular file counts too";
  EXPECT_FALSE(Directory::mkDir(dir.wide("missing/d")));

  EXPECT_TRUE(Directory::mkPath(dir.wide("p/q//r/")));
  EXPECT_TRUE(Directory::pathExists(dir.wide("p/q/r")));
  EXPECT_TRUE(Directory::mkPath(dir.wide("p/q")));
  EXPECT_FALSE(Directory::mkPath(dir.wide("plain/sub"))) << "a file on the way";
  EXPECT_FALSE(Directory::mkPath(dir.wide("plain")));

  ASSERT_EQ(symlink("nowhere", dir.file("dangling").c_str()), 0);
  EXPECT_TRUE(Directory::pathExists(dir.wide("dangling")));
  EXPECT_FALSE(Directory::pathExists(dir.wide("nowhere")));

  EXPECT_TRUE(Directory::copyFile(dir.wide("plain"), dir.wide("copy")));
  EXPECT_EQ(readText(dir.file("copy")), "contents");
  EXPECT_FALSE(Directory::copyFile(dir.wide("plain"), dir.wide("plain")));
  EXPECT_EQ(readText(dir.file("plain")), "contents") << "copying onto itself must not truncate";
  EXPECT_FALSE(Directory::copyFile(dir.wide("d"), dir.wide("copy2"))) << "not a regular file";
  EXPECT_FALSE(Directory::copyFile(dir.wide("nowhere"), dir.wide("copy2")));
  EXPECT_FALSE(Directory::pathExists(dir.wide("copy2")));

  EXPECT_TRUE(Directory::renameFile(dir.wide("copy"), dir.wide("moved")));
  EXPECT_FALSE(Directory::pathExists(dir.wide("copy")));
  EXPECT_TRUE(Directory::rmFile(dir.wide("moved")));
  EXPECT_FALSE(Directory::rmFile(dir.wide("moved")));
  EXPECT_TRUE(Directory::rmFile(dir.wide("d"))) << "an empty directory";

  char* cwd = get_current_dir_name();
  EXPECT_EQ(Directory::currentDir(), std::wstring(cwd, cwd + strlen(cwd)));
  free(cwd);
}

TEST(Directory, ModificationTime) {
  TemporaryDirectory dir;
  writeText(dir.file("f"), "x");
  SharedPointer<IDirectory> listing(Directory::open(dir.wide()));
  ASSERT_TRUE(listing);
  IDirectory::Entry entry;
  ASSERT_TRUE(Directory::setFileModificationTime(dir.wide("f"), 1000000000u));
  ASSERT_TRUE(listing->getEntry(L"f", entry));
  EXPECT_EQ(entry.modificationTime, 1000000000u);
  ASSERT_TRUE(Directory::setFileModificationTime(dir.wide("f"), 0));
  ASSERT_TRUE(listing->getEntry(L"f", entry));
  EXPECT_NEAR(static_cast<double>(entry.modificationTime), static_cast<double>(time(nullptr)), 5)
      << "0 means now";
  EXPECT_FALSE(Directory::setFileModificationTime(dir.wide("missing"), 0));
}

TEST(DirectoryLinux, ListsOrderedAndUnordered) {
  TemporaryDirectory dir;
  for (const char* name : {"b2", "a1", "b1", "c"}) writeText(dir.file(name), name);
  writeText(dir.file("b1"), "longer");
  ASSERT_EQ(mkdir(dir.file("bdir").c_str(), 0700), 0);
  ASSERT_EQ(symlink("a1", dir.file("blink").c_str()), 0);
  EXPECT_EQ(Directory::open(dir.wide("missing")), nullptr);
  SharedPointer<IDirectory> listing(Directory::open(dir.wide()));
  ASSERT_TRUE(listing);
  EXPECT_EQ(listing->path(), dir.wide());

  std::list<IDirectory::Entry> entries;
  ASSERT_TRUE(listing->getAllEntries(entries));
  EXPECT_EQ(namesOf(entries), (std::vector<std::wstring>{L"a1", L"b1", L"b2", L"bdir", L"blink", L"c"}))
      << "no . or .., ordered by name";
  ASSERT_TRUE(listing->findEntriesStartWith(L"b", entries));
  ASSERT_EQ(entries.size(), 4u);
  auto it = entries.begin();
  EXPECT_TRUE(it->type == IDirectory::Entry::RegularFileType && it->size == 6u) << "b1";
  ++it;
  EXPECT_EQ(it->size, 2u) << "b2";
  ++it;
  EXPECT_EQ(it->type, IDirectory::Entry::DirectoryType) << "bdir";
  ++it;
  EXPECT_EQ(it->type, IDirectory::Entry::OtherType) << "a symbolic link is described itself";

  ASSERT_TRUE(listing->findEntriesUnorderedStartWith(L"b", entries));
  std::vector<std::wstring> unordered = namesOf(entries);
  std::sort(unordered.begin(), unordered.end());
  EXPECT_EQ(unordered, (std::vector<std::wstring>{L"b1", L"b2", L"bdir", L"blink"}));
  ASSERT_TRUE(listing->findEntriesStartWith(L"zz", entries));
  EXPECT_TRUE(entries.empty());

  // The same operations relative to the directory.
  IDirectory::Entry entry;
  ASSERT_TRUE(listing->getEntry(L"b1", entry));
  EXPECT_EQ(entry.name, L"b1");
  EXPECT_FALSE(listing->getEntry(L"nothing", entry));
  EXPECT_TRUE(listing->subItemExists(L"bdir"));
  EXPECT_EQ(listing->subItemPath(L"c"), dir.wide("c"));
  SharedPointer<File> file(listing->openFile(entry, false));
  ASSERT_TRUE(file);
  unsigned char bytes[6];
  EXPECT_EQ(file->read(bytes, 6), 6u);
  ASSERT_TRUE(listing->getEntry(L"bdir", entry));
  EXPECT_EQ(listing->openFile(entry, false), nullptr) << "only regular files open";
  SharedPointer<IDirectory> sub(listing->openSubDir(L"bdir"));
  ASSERT_TRUE(sub);
  ASSERT_TRUE(sub->getAllEntries(entries));
  EXPECT_TRUE(entries.empty());
  EXPECT_EQ(listing->openSubDir(L"nothing"), nullptr);

  SharedPointer<IDirectory> notADirectory(Directory::open(dir.wide("c")));
  ASSERT_TRUE(notADirectory);
  EXPECT_FALSE(notADirectory->getAllEntries(entries));
}

TEST(DirectoryLinux, NamesTheLocaleCannotConvertAreLeftOut) {
  TemporaryDirectory dir;
  writeText(dir.file("plain"), "");
  writeText(dir.file("caf\xc3\xa9"), "");
  SharedPointer<IDirectory> listing(Directory::open(dir.wide()));
  ASSERT_TRUE(listing);
  std::list<IDirectory::Entry> entries;
  ASSERT_TRUE(listing->getAllEntries(entries));
  EXPECT_EQ(namesOf(entries), std::vector<std::wstring>{L"plain"}) << "the C locale is ASCII";

  std::setlocale(LC_CTYPE, "C.UTF-8");
  ASSERT_TRUE(listing->getAllEntries(entries));
  std::setlocale(LC_CTYPE, "C");
  EXPECT_EQ(namesOf(entries), (std::vector<std::wstring>{L"caf\u00e9", L"plain"}));
}

}  // namespace
}  // namespace lodestack::core
