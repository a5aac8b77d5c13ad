#include <algorithm>
#include <cstdlib>
#include <memory>
#include <random>
#include <string>

#include <gtest/gtest.h>

#include "crypto/CryptoTestSupport.h"
#include "lodestack/core/Directory.h"
#include "lodestack/core/File.h"
#include "lodestack/crypto/CryptoFileLin.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace {

using testing::Bytes;
using testing::ctrStream;
using testing::readBytes;
using testing::TemporaryDirectory;

const Bytes kKey = testing::fromHex("000102030405060708090a0b0c0d0e0f");
const Bytes kIv = testing::fromHex("a0a1a2a3a4a5a6a7a8a9aaabacadaeaf");  // bytes 12-15 are replaced

Bytes pattern(size_t n, unsigned seed = 1) {
  std::mt19937 random(seed);
  Bytes bytes(n);
  for (unsigned char& b : bytes) b = static_cast<unsigned char>(random());
  return bytes;
}

// An encrypted stream over a File; destroying it writes its block back
// before the file closes.
struct Encrypted {
  gom::SharedPointer<core::File> file;
  std::unique_ptr<CryptoFileLin> stream;
  Encrypted(const std::string& path, bool create, bool writable = true) {
    const std::wstring wide(path.begin(), path.end());
    file = gom::SharedPointer<core::File>(create ? core::Directory::createFile(wide)
                                                 : core::Directory::openFile(wide, writable));
    if (file) stream.reset(new CryptoFileLin(*file, kKey.data(), kIv.data()));
  }
  CryptoFileLin* operator->() { return stream.get(); }
};

// Writes in chunks of varying size, the way a serialiser would.
unsigned int writeInChunks(IStream& stream, const Bytes& plain) {
  static const unsigned int sizes[] = {1, 7, 512, 3, 1000, 511, 64};
  unsigned int done = 0;
  for (unsigned int i = 0; done < plain.size(); ++i) {
    const unsigned int n = std::min<unsigned int>(sizes[i % 7], plain.size() - done);
    const unsigned int wrote = stream.write(plain.data() + done, n);
    done += wrote;
    if (wrote != n) break;
  }
  return done;
}

Bytes readAll(IStream& stream) {
  Bytes out;
  unsigned char buffer[333];
  for (unsigned int got = sizeof buffer; got == sizeof buffer;) {
    got = stream.read(buffer, sizeof buffer);
    out.insert(out.end(), buffer, buffer + got);
  }
  return out;
}

// Each size written through the encrypted file is one continuous CTR stream
// that OpenSSL's command line decrypts, and reads back; a file OpenSSL
// encrypted reads back too.
TEST(CryptoFile, InteroperatesWithOpensslCommandLine) {
  ASSERT_EQ(std::system("openssl version >/dev/null 2>&1"), 0) << "tools/install-deps.sh installs it";
  TemporaryDirectory dir;
  Bytes counter = kIv;
  std::fill(counter.begin() + 12, counter.end(), 0);
  const std::string options = " -aes-128-ctr -K " + testing::toHex(kKey) + " -iv " + testing::toHex(counter);
  const std::string ours = dir.file("ours"), theirs = dir.file("theirs"), plainFile = dir.file("plain");
  for (size_t size : {0, 1, 511, 512, 513, 1000, 70000}) {
    const Bytes plain = pattern(size, static_cast<unsigned>(size));
    {
      Encrypted out(ours, true);
      ASSERT_EQ(writeInChunks(*out.stream, plain), size);
    }
    EXPECT_TRUE(readBytes(ours) == ctrStream(kKey, kIv, plain)) << "size " << size;
    ASSERT_EQ(std::system(("openssl enc -d" + options + " -in " + ours + " -out " + plainFile).c_str()), 0);
    EXPECT_TRUE(readBytes(plainFile) == plain) << "openssl decrypts our " << size << " bytes";
    Encrypted in(ours, false, false);
    EXPECT_TRUE(readAll(*in.stream) == plain) << "we read our " << size << " bytes";
    EXPECT_TRUE(in->eof());
    EXPECT_FALSE(in->canWrite()) << "a stream once read is not written";
    EXPECT_EQ(in->write(plain.data(), 1), 0u);

    ASSERT_EQ(std::system(("openssl enc -e" + options + " -in " + plainFile + " -out " + theirs).c_str()), 0);
    Encrypted again(theirs, false, false);
    EXPECT_TRUE(readAll(*again.stream) == plain) << "we read openssl's " << size << " bytes";
  }
}

// Rewriting bytes 600 to 610 of 1000 changes only them on disk; the size
// and end count an unflushed block. (Reads from the middle of blocks are
// the random test's.)
TEST(CryptoFile, SeeksIntoTheMiddleOfBlocks) {
  TemporaryDirectory dir;
  const std::string path = dir.file("f");
  Bytes model = pattern(1000);
  {
    Encrypted out(path, true);
    ASSERT_EQ(writeInChunks(*out.stream, model), 1000u);
  }
  const Bytes before = readBytes(path);
  const Bytes patch(11, 0xEE);
  {
    Encrypted out(path, false);
    ASSERT_TRUE(out->seekFromStart(600));
    ASSERT_EQ(out->write(patch.data(), 11), 11u);
    ASSERT_TRUE(out->flush());
    EXPECT_EQ(out->offset(), 611u) << "flush keeps the position";
  }
  std::copy(patch.begin(), patch.end(), model.begin() + 600);
  const Bytes after = readBytes(path);
  ASSERT_EQ(after.size(), 1000u);
  for (size_t i = 0; i < after.size(); ++i)
    ASSERT_TRUE(after[i] == before[i] || (i >= 600 && i <= 610)) << "byte " << i << " changed";
  EXPECT_TRUE(after == ctrStream(kKey, kIv, model));

  Encrypted file(path, false);
  EXPECT_FALSE(file->seekFromStart(1001)) << "beyond the end";
  const Bytes tail = pattern(300, 9);
  ASSERT_TRUE(file->seekFromEnd(0));
  ASSERT_EQ(file->write(tail.data(), 300), 300u);
  model.insert(model.end(), tail.begin(), tail.end());
  unsigned int size = 0;
  ASSERT_TRUE(file->getSize(size));
  EXPECT_EQ(size, 1300u) << "the unflushed block counts";
  EXPECT_TRUE(file->eof());
  ASSERT_TRUE(file->flush());
  EXPECT_TRUE(readBytes(path) == ctrStream(kKey, kIv, model));
}

// Random seeks, reads and writes against a plain copy, the stream re-made
// now and then.
TEST(CryptoFile, RandomOperationsMatchAPlainModel) {
  TemporaryDirectory dir;
  const std::string path = dir.file("f");
  Bytes model;
  std::mt19937 random(7);
  auto stream = std::make_unique<Encrypted>(path, true);
  unsigned char buffer[1500];
  for (int step = 0; step < 3000; ++step) {
    const unsigned op = random() % 10;
    const unsigned int at = (*stream)->offset();
    const unsigned int n = random() % sizeof buffer;
    if (op == 0) {
      stream.reset();
      stream = std::make_unique<Encrypted>(path, false);
    } else if (op <= 3) {
      ASSERT_TRUE((*stream)->seekFromStart(random() % (model.size() + 1)));
    } else if (op <= 5 && (*stream)->canWrite()) {
      for (unsigned int i = 0; i < n; ++i) buffer[i] = static_cast<unsigned char>(random());
      ASSERT_EQ((*stream)->write(buffer, n), n);
      model.resize(std::max<size_t>(model.size(), at + n));
      std::copy(buffer, buffer + n, model.begin() + at);
    } else {
      const unsigned int expected = std::min<unsigned int>(n, model.size() - at);
      ASSERT_EQ((*stream)->read(buffer, n), expected) << "step " << step;
      ASSERT_TRUE(std::equal(buffer, buffer + expected, model.begin() + at)) << "step " << step;
    }
  }
  stream.reset();
  EXPECT_TRUE(readBytes(path) == ctrStream(kKey, kIv, model));
}

TEST(CryptoFile, OpensThroughTheStoreUtility) {
  testing::SecureStorageScope storage;
  TemporaryDirectory dir;
  Status status = Failed;
  std::unique_ptr<ICryptographyUtility> utility(ICryptographyUtility::open("results", status));
  gom::SharedPointer<core::File> file(core::Directory::createFile(dir.wide("f")));
  ASSERT_TRUE(utility && file);
  std::unique_ptr<ICryptoFile> stream(ICryptoFile::open(*file, *utility));
  const Bytes plain = pattern(2000);
  ASSERT_TRUE(stream && stream->write(plain.data(), 2000) == 2000 && stream->flush());
  const Bytes material = testing::keyAndIvOf(*utility);
  const Bytes key(material.begin(), material.begin() + 16), iv(material.begin() + 16, material.end());
  EXPECT_TRUE(readBytes(dir.file("f")) == ctrStream(key, iv, plain));
}

}  // namespace
}  // namespace lodestack
