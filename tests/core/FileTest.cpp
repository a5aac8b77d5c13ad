#include <string>

#include <gtest/gtest.h>

#include "lodestack/core/Directory.h"
#include "lodestack/core/File.h"
#include "lodestack/gom/SharedPointer.h"
#include "support/TemporaryDirectory.h"

namespace lodestack::core {
namespace {

using gom::SharedPointer;
using lodestack::testing::readText;
using lodestack::testing::TemporaryDirectory;
using lodestack::testing::writeText;

unsigned int writeString(IStream& stream, const std::string& text) {
  return stream.write(reinterpret_cast<const unsigned char*>(text.data()),
                      static_cast<unsigned int>(text.size()));
}

std::string readString(IStream& stream, unsigned int n) {
  std::string text(n, '\0');
  text.resize(stream.read(reinterpret_cast<unsigned char*>(&text[0]), n));
  return text;
}

TEST(File, ReadsWritesAndSeeks) {
  TemporaryDirectory dir;
  EXPECT_EQ(openCrtFile(dir.wide("missing"), "rb", 0), nullptr);
  EXPECT_EQ(openCrtFile(dir.wide("x"), "not a mode", 0), nullptr);
  SharedPointer<File> file(Directory::createFile(dir.wide("f")));
  ASSERT_TRUE(file && file->good());
  ASSERT_EQ(writeString(*file, "abcdef"), 6u);
  unsigned int size = 0;
  ASSERT_TRUE(file->getSize(size));
  EXPECT_EQ(size, 6u) << "buffered bytes count";

  // Reads and writes alternate without seeks of the caller's.
  ASSERT_TRUE(file->seekFromStart(2));
  EXPECT_EQ(readString(*file, 2), "cd");
  ASSERT_EQ(writeString(*file, "XY"), 2u);
  ASSERT_TRUE(file->seekFromStart(0));
  ASSERT_EQ(writeString(*file, "12"), 2u);
  EXPECT_EQ(readString(*file, 2), "cd");
  EXPECT_EQ(readString(*file, 10), "XY");
  EXPECT_TRUE(file->eof()) << "a read hit the end";

  ASSERT_TRUE(file->seekFromEnd(0));
  EXPECT_EQ(file->offset(), 6u) << "seekFromEnd(0) stands at the end";
  EXPECT_FALSE(file->eof()) << "a seek clears the end indicator";
  EXPECT_FALSE(file->seekFromEnd(7));
  ASSERT_TRUE(file->flush());
  EXPECT_EQ(readText(dir.file("f")), "12cdXY");
}

TEST(File, BufferOfTheRequestedSize) {
  TemporaryDirectory dir;
  SharedPointer<File> file(Directory::createFile(dir.wide("f"), 65536));
  ASSERT_TRUE(file);
  const std::string text(40000, 'b');
  ASSERT_EQ(writeString(*file, text), 40000u);
  EXPECT_EQ(readText(dir.file("f")).size(), 0u) << "all still in the 64 KiB buffer";
  ASSERT_TRUE(file->flush());
  EXPECT_EQ(readText(dir.file("f")), text);
}

TEST(File, ReadOnlyFileStillClaimsEveryCapability) {
  TemporaryDirectory dir;
  writeText(dir.file("r"), "data");
  SharedPointer<File> file(openCrtFile(dir.wide("r"), "rb", 0));
  ASSERT_TRUE(file);
  EXPECT_TRUE(file->canRead() && file->canSeek() && file->canWrite());
  EXPECT_EQ(writeString(*file, "x"), 0u);
  EXPECT_EQ(readText(dir.file("r")), "data");
  File custom(nullptr, File::CanRead | File::CanSeek);
  EXPECT_TRUE(!custom.good() && custom.canSeek() && !custom.canWrite());
}

}  // namespace
}  // namespace lodestack::core
