#include <sys/stat.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <random>
#include <string>

#include <gtest/gtest.h>

#include "crypto/CryptoTestSupport.h"
#include "lodestack/core/Directory.h"
#include "lodestack/core/File.h"
#include "lodestack/crypto/CryptoFileLin.h"
#include "lodestack/crypto/ICryptographyUtility.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace {

using gom::SharedPointer;
using testing::Bytes;
using testing::ctrStream;
using testing::readBytes;
using testing::TemporaryDirectory;
using testing::toHex;
using testing::writeBytes;

const Bytes kKey = testing::fromHex("000102030405060708090a0b0c0d0e0f");
const Bytes kIv = testing::fromHex("a0a1a2a3a4a5a6a7a8a9aaabacadaeaf");  // bytes 12-15 are replaced

Bytes pattern(size_t n, unsigned seed = 1) {
  std::mt19937 random(seed);
  Bytes bytes(n);
  for (unsigned char& b : bytes) b = static_cast<unsigned char>(random());
  return bytes;
}

// A File and an encrypted stream over it.
struct Encrypted {
  SharedPointer<core::File> file;
  std::unique_ptr<CryptoFileLin> stream;
  Encrypted(const std::string& path, bool create, bool writable = true) {
    const std::wstring wide(path.begin(), path.end());
    file = SharedPointer<core::File>(create ? core::Directory::createFile(wide)
                                            : core::Directory::openFile(wide, writable));
    if (file) stream.reset(new CryptoFileLin(*file, kKey.data(), kIv.data()));
  }
  ~Encrypted() {
    stream.reset();  // writes its block back before the file closes
  }
  CryptoFileLin& operator*() { return *stream; }
  CryptoFileLin* operator->() { return stream.get(); }
};

// Writes `plain` in chunks of varying size, the way a serialiser would.
unsigned int writeInChunks(IStream& stream, const Bytes& plain) {
  static const unsigned int sizes[] = {1, 7, 512, 3, 1000, 511, 64};
  unsigned int done = 0, i = 0;
  while (done < plain.size()) {
    const unsigned int n = std::min<unsigned int>(sizes[i++ % 7], plain.size() - done);
    const unsigned int wrote = stream.write(plain.data() + done, n);
    done += wrote;
    if (wrote != n) break;
  }
  return done;
}

Bytes readAll(IStream& stream, unsigned int chunk = 333) {
  Bytes out;
  unsigned char buffer[4096];
  for (;;) {
    const unsigned int got = stream.read(buffer, chunk);
    out.insert(out.end(), buffer, buffer + got);
    if (got < chunk) return out;
  }
}

const size_t kSizes[] = {0, 1, 511, 512, 513, 1000, 70000};

TEST(CryptoFile, StoresOneContinuousCtrStreamAndReadsItBack) {
  TemporaryDirectory dir;
  for (size_t size : kSizes) {
    const std::string path = dir.file("f" + std::to_string(size));
    const Bytes plain = pattern(size, static_cast<unsigned>(size));
    {
      Encrypted out(path, true);
      ASSERT_TRUE(out.stream);
      ASSERT_EQ(writeInChunks(*out, plain), size);
      EXPECT_EQ(out->offset(), size);
    }
    const Bytes stored = readBytes(path);
    ASSERT_EQ(stored.size(), size) << "no header, no padding";
    EXPECT_TRUE(stored == ctrStream(kKey, kIv, plain)) << "size " << size;

    Encrypted in(path, false, false);
    EXPECT_EQ(readAll(*in), plain) << "size " << size;
    EXPECT_TRUE(in->eof());
    EXPECT_FALSE(in->canWrite()) << "a stream once read is not written";
    EXPECT_EQ(in->write(plain.data(), 1), 0u);
  }
}

bool haveOpenssl() { return std::system("openssl version >/dev/null 2>&1") == 0; }

TEST(CryptoFile, InteroperatesWithOpensslCommandLine) {
  ASSERT_TRUE(haveOpenssl()) << "the openssl program is needed (tools/install-deps.sh)";
  TemporaryDirectory dir;
  Bytes counter = kIv;
  std::fill(counter.begin() + 12, counter.end(), 0);
  const std::string options = " -aes-128-ctr -K " + toHex(kKey) + " -iv " + toHex(counter);
  for (size_t size : kSizes) {
    const Bytes plain = pattern(size, 100 + static_cast<unsigned>(size));
    const std::string ours = dir.file("ours"), theirs = dir.file("theirs"),
                      decrypted = dir.file("plain");
    {
      Encrypted out(ours, true);
      ASSERT_EQ(writeInChunks(*out, plain), size);
    }
    ASSERT_EQ(std::system(("openssl enc -d" + options + " -in " + ours + " -out " + decrypted).c_str()), 0);
    EXPECT_TRUE(readBytes(decrypted) == plain) << "openssl decrypts our file of " << size << " bytes";

    writeBytes(decrypted, plain);
    ASSERT_EQ(std::system(("openssl enc -e" + options + " -in " + decrypted + " -out " + theirs).c_str()), 0);
    Encrypted in(theirs, false, false);
    EXPECT_TRUE(readAll(*in, 4096) == plain) << "we read openssl's file of " << size << " bytes";
  }
}

TEST(CryptoFile, RewritingAFewBytesTouchesOnlyThem) {
  TemporaryDirectory dir;
  const std::string path = dir.file("f");
  Bytes plain = pattern(1000);
  {
    Encrypted out(path, true);
    ASSERT_EQ(writeInChunks(*out, plain), 1000u);
  }
  const Bytes before = readBytes(path);
  const Bytes patch(11, 0xEE);
  {
    Encrypted out(path, false);
    ASSERT_TRUE(out->seekFromStart(600));
    ASSERT_EQ(out->write(patch.data(), 11), 11u);
    EXPECT_EQ(out->offset(), 611u);
    ASSERT_TRUE(out->flush());
    EXPECT_EQ(out->offset(), 611u) << "flush keeps the position";
  }
  std::copy(patch.begin(), patch.end(), plain.begin() + 600);
  const Bytes after = readBytes(path);
  ASSERT_EQ(after.size(), 1000u);
  for (size_t i = 0; i < after.size(); ++i)
    if (i < 600 || i > 610) {
      ASSERT_EQ(after[i], before[i]) << "byte " << i << " changed";
    }
  EXPECT_TRUE(after == ctrStream(kKey, kIv, plain));
}

TEST(CryptoFile, SeeksIntoTheMiddleOfBlocks) {
  TemporaryDirectory dir;
  const std::string path = dir.file("f");
  Bytes model = pattern(70000);
  {
    Encrypted out(path, true);
    ASSERT_EQ(writeInChunks(*out, model), 70000u);
  }
  Encrypted file(path, false);
  unsigned char got[2000];
  ASSERT_TRUE(file->seekFromStart(700));
  ASSERT_EQ(file->read(got, 100), 100u);
  EXPECT_TRUE(std::equal(got, got + 100, model.begin() + 700)) << "read from 700";
  EXPECT_EQ(file->offset(), 800u);

  // A second stream writes across blocks 2 to 4, starting mid-block, then
  // reads back through its own buffer before anything is flushed.
  Encrypted writer(path, false);
  const Bytes patch = pattern(1200, 9);
  ASSERT_TRUE(writer->seekFromStart(1500));
  ASSERT_EQ(writer->write(patch.data(), 1200), 1200u);
  std::copy(patch.begin(), patch.end(), model.begin() + 1500);
  ASSERT_TRUE(writer->seekFromStart(1400));
  ASSERT_EQ(writer->read(got, 1400), 1400u);
  EXPECT_TRUE(std::equal(got, got + 1400, model.begin() + 1400));
  EXPECT_TRUE(writer->canWrite()) << "reading back while writing is allowed";

  // Appending at the end, with the block still in the buffer.
  ASSERT_FALSE(writer->seekFromStart(70001)) << "beyond the end";
  ASSERT_TRUE(writer->seekFromEnd(0));
  ASSERT_EQ(writer->write(patch.data(), 300), 300u);
  model.insert(model.end(), patch.begin(), patch.begin() + 300);
  unsigned int size = 0;
  ASSERT_TRUE(writer->getSize(size));
  EXPECT_EQ(size, 70300u) << "the unflushed block counts";
  EXPECT_TRUE(writer->eof());
  ASSERT_TRUE(writer->seekFromEnd(10));
  EXPECT_FALSE(writer->eof());
  ASSERT_TRUE(writer->flush());
  writer.stream.reset();

  EXPECT_TRUE(readBytes(path) == ctrStream(kKey, kIv, model));
  Encrypted reader(path, false, false);
  ASSERT_TRUE(reader->seekFromEnd(300));
  ASSERT_EQ(reader->read(got, 2000), 300u);
  EXPECT_TRUE(std::equal(got, got + 300, patch.begin()));
}

// Random seeks, reads and writes against a plain copy, with the stream
// re-made now and then.
TEST(CryptoFile, RandomOperationsMatchAPlainModel) {
  TemporaryDirectory dir;
  const std::string path = dir.file("f");
  Bytes model;
  std::mt19937 random(7);
  auto stream = std::make_unique<Encrypted>(path, true);
  unsigned char buffer[3000];
  for (int step = 0; step < 3000; ++step) {
    const unsigned op = random() % 10;
    if (op == 0) {
      stream.reset();
      stream = std::make_unique<Encrypted>(path, false);
    } else if (op <= 3) {
      const unsigned int at = model.empty() ? 0 : random() % (model.size() + 1);
      ASSERT_TRUE((*stream)->seekFromStart(at));
    } else if (op <= 5 && (*stream)->canWrite()) {
      const unsigned int at = (*stream)->offset();
      const unsigned int n = random() % 1500;
      for (unsigned int i = 0; i < n; ++i) buffer[i] = static_cast<unsigned char>(random());
      ASSERT_EQ((*stream)->write(buffer, n), n);
      if (model.size() < at + n) model.resize(at + n);
      std::copy(buffer, buffer + n, model.begin() + at);
    } else {
      const unsigned int at = (*stream)->offset();
      const unsigned int n = random() % 1500;
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
  ASSERT_EQ(status, Ok);
  const Bytes plain = pattern(2000);
  SharedPointer<core::File> file(core::Directory::createFile(dir.wide("f")));
  ASSERT_TRUE(file);
  std::unique_ptr<ICryptoFile> stream(ICryptoFile::open(*file, *utility));
  ASSERT_TRUE(stream);
  ASSERT_EQ(stream->write(plain.data(), 2000), 2000u);
  ASSERT_TRUE(stream->flush());
  const Bytes material = testing::keyAndIvOf(*utility);
  EXPECT_TRUE(readBytes(dir.file("f")) ==
              ctrStream(Bytes(material.begin(), material.begin() + 16),
                        Bytes(material.begin() + 16, material.end()), plain));
}

}  // namespace
}  // namespace lodestack
