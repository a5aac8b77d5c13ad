#include <errno.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include "lodestack/platform/SecureStorage.h"
#include "platform/PlatformTestSupport.h"
#include "support/TemporaryDirectory.h"

namespace lodestack {
namespace {

using testing::EnvScope;
using testing::readText;
using testing::TemporaryDirectory;

// ssa_get's result; the value handed out goes to `value` when given.
int get(const char* name, std::string* value = nullptr) {
  char* data = nullptr;
  size_t length = 99;
  const int status = ssa_get(name, &data, &length);
  EXPECT_TRUE(status == 0 || (data == nullptr && length == 0)) << "a failed get hands out nothing";
  if (value) *value = data ? std::string(data, length) : std::string();
  free(data);
  return status;
}

std::string valueOf(const char* name) {
  std::string value;
  get(name, &value);
  return value;
}

int put(const char* name, const std::string& value) { return ssa_put(name, value.data(), value.size()); }

unsigned int modeOf(const std::string& path) {
  struct stat info;
  return stat(path.c_str(), &info) == 0 ? info.st_mode & 07777 : 0;
}

TEST(SecureStorage, PrivateFilesReplacedWhole) {
  TemporaryDirectory dir;
  const std::string storage = dir.file("nested/storage");
  EnvScope chosen("LODESTACK_SECURE_STORAGE_DIR", storage);
  EXPECT_EQ(get("key"), -ENOENT);

  ASSERT_EQ(put("key", std::string("first\0value", 11)), 11);
  EXPECT_EQ(modeOf(storage), 0700u);
  EXPECT_EQ(modeOf(dir.file("nested")), 0700u);
  EXPECT_EQ(modeOf(storage + "/key"), 0600u);
  EXPECT_EQ(valueOf("key"), std::string("first\0value", 11));

  struct stat before, after;
  ASSERT_EQ(stat((storage + "/key").c_str(), &before), 0);
  ASSERT_EQ(put("key", "second"), 6);
  ASSERT_EQ(stat((storage + "/key").c_str(), &after), 0);
  EXPECT_NE(before.st_ino, after.st_ino) << "replaced by a rename, not rewritten in place";
  EXPECT_EQ(valueOf("key"), "second");
  EXPECT_EQ(ssa_delete("key"), 0);
  EXPECT_EQ(ssa_delete("key"), -ENOENT);
  std::error_code ignored;
  EXPECT_TRUE(std::filesystem::is_empty(storage, ignored)) << "no temporary file is left";

  ASSERT_EQ(chmod(storage.c_str(), 0755), 0);
  ASSERT_EQ(put("key", ""), 0);
  EXPECT_EQ(modeOf(storage), 0700u) << "an existing directory of ours is narrowed";
}

TEST(SecureStorage, BadNamesAndEntriesFailCleanly) {
  TemporaryDirectory dir;
  EnvScope chosen("LODESTACK_SECURE_STORAGE_DIR", dir.path());
  for (const char* name : {"", ".hidden", "a/b", "..", static_cast<const char*>(nullptr)}) {
    EXPECT_EQ(get(name), -EINVAL) << (name ? name : "null");
    EXPECT_EQ(put(name, "x"), -EINVAL);
    EXPECT_EQ(ssa_delete(name), -EINVAL);
  }
  EXPECT_EQ(put(std::string(201, 'n').c_str(), "x"), -EINVAL);
  EXPECT_EQ(ssa_put("n", nullptr, 1), -EINVAL);
  EXPECT_EQ(put("big", std::string(65537, 'b')), -EFBIG);
  EXPECT_EQ(put("big", std::string(65536, 'b')), 65536);

  // Unreadable entries are errors: a directory, a link, an oversized file.
  ASSERT_EQ(mkdir(dir.file("folder").c_str(), 0700), 0);
  ASSERT_EQ(symlink("big", dir.file("link").c_str()), 0);
  testing::writeText(dir.file("huge"), std::string(70000, 'h'));
  EXPECT_LT(get("folder"), 0);
  EXPECT_EQ(get("link"), -ELOOP) << "links are not followed";
  EXPECT_EQ(get("huge"), -EFBIG);
  EXPECT_LT(put("folder", "x"), 0) << "a directory is not replaced";
}

TEST(SecureStorage, DefaultLocationFollowsXdgThenHome) {
  TemporaryDirectory dir;
  EnvScope unchosen("LODESTACK_SECURE_STORAGE_DIR", "");
  {
    EnvScope data("XDG_DATA_HOME", dir.file("data"));
    ASSERT_EQ(put("a", "1"), 1);
  }
  EXPECT_EQ(readText(dir.file("data/lodestack/secure-storage/a")), "1");
  EnvScope relative("XDG_DATA_HOME", "relative/ignored");
  EnvScope home("HOME", dir.file("home"));
  ASSERT_EQ(put("b", "2"), 1);
  EXPECT_EQ(readText(dir.file("home/.local/share/lodestack/secure-storage/b")), "2");
  EXPECT_EQ(modeOf(dir.file("home/.local")), 0700u);
}

// A reader running beside a writer sees one whole value or the other.
TEST(SecureStorage, ConcurrentReadersNeverSeeHalfAValue) {
  TemporaryDirectory dir;
  EnvScope chosen("LODESTACK_SECURE_STORAGE_DIR", dir.path());
  const std::string a(40000, 'a'), b(30000, 'b');
  ASSERT_EQ(put("k", a), 40000);
  std::atomic<bool> done{false};
  std::atomic<int> torn{0}, reads{0};
  std::thread reader([&] {
    for (; !done; ++reads) {
      const std::string value = valueOf("k");
      if (value != a && value != b) ++torn;
    }
  });
  for (int i = 0; i < 60; ++i) ASSERT_GT(put("k", i % 2 ? a : b), 0);
  done = true;
  reader.join();
  EXPECT_EQ(torn.load(), 0) << "of " << reads.load() << " reads";
}

}  // namespace
}  // namespace lodestack
