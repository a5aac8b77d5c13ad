#include <sys/stat.h>
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <clocale>
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
// Wide strings are compared as char32_t ones: libstdc++ compares wchar_t
// with glibc's vector wmemcmp, whose reads past the end valgrind reports.
using Name = std::u32string;
using Names = std::vector<Name>;

Name u32(const std::wstring& text) { return Name(text.begin(), text.end()); }

Names namesOf(const std::list<IDirectory::Entry>& entries) {
  Names names;
  for (const IDirectory::Entry& entry : entries) names.push_back(u32(entry.name));
  return names;
}

TEST(Directory, PathRules) {
  EXPECT_EQ(u32(Directory::concat(L"a", L"b")), U"a/b");
  EXPECT_EQ(u32(Directory::concat(L"a//", L"/b/")), U"a/b/");
  EXPECT_EQ(u32(Directory::concat(L"/", L"etc")), U"/etc");
  EXPECT_EQ(u32(Directory::concat(L"", L"b")), U"b") << "a relative path stays relative";
  EXPECT_EQ(u32(Directory::concat(L"a", L"")), U"a");

  const std::wstring full = L"/x/y.log", bare = L"y.log", dir = L"/x/", empty;
  unsigned int length = 0;
  const wchar_t* name = Directory::findFileName(full, length);
  EXPECT_EQ(u32(std::wstring(name, length)), U"y.log");
  EXPECT_EQ(Directory::findFileName(bare, length), bare.c_str());
  EXPECT_EQ(length, 5u);
  EXPECT_EQ(Directory::findFileName(dir, length), nullptr) << "ends in a separator";
  EXPECT_EQ(length, 0u);
  EXPECT_EQ(Directory::findFileName(empty, length), nullptr);
}

TEST(Directory, MakeCopyRenameRemove) {
  TemporaryDirectory dir;
  writeText(dir.file("plain"), "contents");
  EXPECT_TRUE(Directory::mkDir(dir.wide("d")));
  EXPECT_TRUE(Directory::mkDir(dir.wide("plain"))) << "EEXIST counts, even from a regular file";
  EXPECT_FALSE(Directory::mkDir(dir.wide("missing/d")));
  EXPECT_TRUE(Directory::mkPath(dir.wide("p/q//r/")));
  EXPECT_TRUE(Directory::pathExists(dir.wide("p/q/r")));
  EXPECT_FALSE(Directory::mkPath(dir.wide("plain/sub"))) << "a file on the way";

  ASSERT_EQ(symlink("nowhere", dir.file("dangling").c_str()), 0);
  EXPECT_TRUE(Directory::pathExists(dir.wide("dangling")));

  EXPECT_TRUE(Directory::copyFile(dir.wide("plain"), dir.wide("copy")));
  EXPECT_EQ(readText(dir.file("copy")), "contents");
  EXPECT_FALSE(Directory::copyFile(dir.wide("plain"), dir.wide("plain")));
  EXPECT_EQ(readText(dir.file("plain")), "contents") << "copying onto itself must not truncate";
  EXPECT_FALSE(Directory::copyFile(dir.wide("d"), dir.wide("copy2"))) << "not a regular file";
  EXPECT_FALSE(Directory::pathExists(dir.wide("copy2")));

  EXPECT_TRUE(Directory::renameFile(dir.wide("copy"), dir.wide("moved")));
  EXPECT_TRUE(Directory::rmFile(dir.wide("moved")));
  EXPECT_FALSE(Directory::rmFile(dir.wide("moved")));
  EXPECT_TRUE(Directory::rmFile(dir.wide("d"))) << "an empty directory";
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
  EXPECT_NEAR(entry.modificationTime, static_cast<double>(time(nullptr)), 5) << "0 means now";
}

TEST(DirectoryLinux, ListsOrderedAndUnordered) {
  TemporaryDirectory dir;
  for (const char* name : {"b2", "a1", "b1", "c"}) writeText(dir.file(name), name);
  ASSERT_EQ(mkdir(dir.file("bdir").c_str(), 0700), 0);
  ASSERT_EQ(symlink("a1", dir.file("blink").c_str()), 0);
  EXPECT_EQ(Directory::open(dir.wide("missing")), nullptr);
  SharedPointer<IDirectory> listing(Directory::open(dir.wide()));
  ASSERT_TRUE(listing);

  std::list<IDirectory::Entry> entries;
  ASSERT_TRUE(listing->getAllEntries(entries));
  EXPECT_EQ(namesOf(entries), (Names{U"a1", U"b1", U"b2", U"bdir", U"blink", U"c"}));
  ASSERT_TRUE(listing->findEntriesStartWith(L"b", entries));
  std::vector<int> types;
  for (const IDirectory::Entry& entry : entries) types.push_back(entry.type);
  EXPECT_EQ(types, (std::vector<int>{2, 2, 1, 0})) << "files, a directory, a link itself";
  EXPECT_EQ(entries.front().size, 2u);
  ASSERT_TRUE(listing->findEntriesUnorderedStartWith(L"b", entries));
  Names unordered = namesOf(entries);
  std::sort(unordered.begin(), unordered.end());
  EXPECT_EQ(unordered, (Names{U"b1", U"b2", U"bdir", U"blink"}));

  IDirectory::Entry entry;
  ASSERT_TRUE(listing->getEntry(L"c", entry));
  SharedPointer<File> file(listing->openFile(entry, false));
  unsigned char byte = 0;
  ASSERT_TRUE(file && file->read(&byte, 1) == 1 && byte == 'c');
  ASSERT_TRUE(listing->getEntry(L"bdir", entry));
  EXPECT_EQ(listing->openFile(entry, false), nullptr) << "only regular files open";
  SharedPointer<IDirectory> sub(listing->openSubDir(L"bdir"));
  ASSERT_TRUE(sub && sub->getAllEntries(entries));
  EXPECT_TRUE(entries.empty());
  SharedPointer<IDirectory> notADirectory(Directory::open(dir.wide("c")));
  ASSERT_TRUE(notADirectory);
  EXPECT_FALSE(notADirectory->getAllEntries(entries));
}

TEST(DirectoryLinux, NamesTheLocaleCannotConvertAreLeftOut) {
  TemporaryDirectory dir;
  writeText(dir.file("plain"), "");
  writeText(dir.file("caf\xc3\xa9"), "");
  SharedPointer<IDirectory> listing(Directory::open(dir.wide()));
  std::list<IDirectory::Entry> entries;
  ASSERT_TRUE(listing && listing->getAllEntries(entries));
  EXPECT_EQ(namesOf(entries), Names{U"plain"}) << "the C locale is ASCII";
  std::setlocale(LC_CTYPE, "C.UTF-8");
  ASSERT_TRUE(listing->getAllEntries(entries));
  std::setlocale(LC_CTYPE, "C");
  EXPECT_EQ(namesOf(entries), (Names{U"caf\u00e9", U"plain"}));
}

}  // namespace
}  // namespace lodestack::core
