#include <cmath>
#include <cstring>
#include <vector>

#include <gtest/gtest.h>

#include "lodestack/stream/BufferStream.h"

namespace lodestack {
namespace {

std::vector<unsigned char> bytesOf(const Buffer& b) {
  return std::vector<unsigned char>(b.data(), b.data() + b.size());
}

TEST(Buffer, StartsEmptyAndAppendsExactly) {
  Buffer ignoredSize(1000);
  EXPECT_TRUE(ignoredSize.size() == 0 && ignoredSize.data() == nullptr) << "the size is a hint";

  Buffer b;
  b.append(nullptr, 0);
  EXPECT_EQ(b.data(), nullptr) << "appending nothing must not allocate";

  // Many small appends keep exactly the bytes written, whatever capacity
  // growth does behind them.
  std::vector<unsigned char> expected;
  for (unsigned int i = 0; i < 5000; ++i) {
    const unsigned char chunk[3] = {static_cast<unsigned char>(i), static_cast<unsigned char>(i >> 8), 0xAB};
    b.append(chunk, 1 + i % 3);
    expected.insert(expected.end(), chunk, chunk + 1 + i % 3);
  }
  b.fill(0x5A, 4);
  expected.insert(expected.end(), 4, 0x5A);
  EXPECT_EQ(bytesOf(b), expected);
  EXPECT_EQ(b.leftForReading(), expected.size());

  Buffer part = b.extract(2, 6);
  EXPECT_EQ(bytesOf(part), std::vector<unsigned char>(expected.begin() + 2, expected.begin() + 6));
  EXPECT_EQ(bytesOf(b.clone()), expected);
}

TEST(Buffer, MovesLikeAnAutoPointer) {
  const unsigned char abc[] = {'a', 'b', 'c', 'd'};
  Buffer source;
  source.append(abc, 4);
  unsigned char one;
  ASSERT_EQ(source.read(&one, 1, false), 1u);

  Buffer taken(source);
  EXPECT_TRUE(source.size() == 0 && source.data() == nullptr);
  EXPECT_EQ(source.readPosition(), 1u) << "the source keeps its cursor";
  EXPECT_EQ(taken.size(), 4u);
  EXPECT_EQ(taken.readPosition(), 0u);

  Buffer target;
  target.append(abc, 2);
  ASSERT_EQ(target.read(&one, 1, false), 1u);
  target = taken;
  EXPECT_EQ(target.size(), 4u);
  EXPECT_EQ(target.readPosition(), 1u) << "assignment keeps the target's cursor";
  EXPECT_EQ(taken.data(), nullptr);

  // Handing the bytes out gives exactly size() bytes and empties the buffer.
  auto_array_proxy<unsigned char> proxy = target;
  EXPECT_EQ(proxy.size, 4u);
  EXPECT_EQ(std::memcmp(proxy.data, abc, 4), 0);
  EXPECT_EQ(target.size(), 0u);
  Buffer back(proxy);
  EXPECT_EQ(back.size(), 4u);
  // Assigning the array already held changes nothing, not even the size.
  back = auto_array_proxy<unsigned char>(back.data(), 2);
  EXPECT_EQ(back.size(), 4u);

  // A cursor left past a smaller new end reads nothing.
  unsigned char four[4];
  ASSERT_EQ(back.read(four, 4, false), 4u);
  unsigned char* small = new unsigned char[1]{7};
  back = auto_array_proxy<unsigned char>(small, 1);
  EXPECT_EQ(back.leftForReading(), 0u);
  EXPECT_EQ(back.read(four, 4, false), 0u);
}

TEST(Buffer, ReadsAndSeeks) {
  const unsigned char bytes[] = {1, 2, 3};
  Buffer b;
  b.append(bytes, 3);
  unsigned char out[4] = {};
  EXPECT_EQ(b.read(out, 4, false), 3u);
  EXPECT_EQ(b.read(out, 4, false), 0u);
  EXPECT_EQ(b.read(out, 2, true), 2u) << "rewind re-reads from the first byte";
  EXPECT_EQ(out[0], 1);
  EXPECT_EQ(b.setReadPosition(3), InvalidArgument) << "a cursor may only stand on a byte";
  EXPECT_EQ(b.readPosition(), 2u);
  EXPECT_EQ(b.setReadPosition(2), Ok);
  b.reset();
  EXPECT_EQ(b.size(), 0u);
  EXPECT_EQ(b.readPosition(), 0u);
}

TEST(BufferStream, StateAndSeeking) {
  BufferStream s;
  EXPECT_FALSE(s.good()) << "a never-written stream holds no array";
  EXPECT_TRUE(s.eof());
  EXPECT_EQ(s.write(nullptr, 0), 0u);
  EXPECT_FALSE(s.good());
  ASSERT_TRUE(s.writeUint8(9) && s.writeUint16(0x0102));
  unsigned int size = 0;
  EXPECT_TRUE(s.good() && s.getSize(size) && size == 3);
  EXPECT_FALSE(s.seekFromStart(3));
  EXPECT_TRUE(s.seekFromStart(2));
  EXPECT_EQ(s.offset(), 2u);
  EXPECT_FALSE(s.seekFromEnd(0)) << "size - 0 is past the last byte";
  EXPECT_FALSE(s.seekFromEnd(4));
  EXPECT_TRUE(s.seekFromEnd(3));
  EXPECT_EQ(s.offset(), 0u);
}

TEST(BufferStream, TypedOperationsAreLittleEndianImages) {
  BufferStream s;
  ASSERT_TRUE(s.writeUint16(0xBEEF));
  ASSERT_TRUE(s.writeUint32(0x01020304));
  ASSERT_TRUE(s.writeUint64(0x1122334455667788ull));
  ASSERT_TRUE(s.writeFloat(1.0f));
  ASSERT_TRUE(s.writeDouble(-2.0));
  ASSERT_TRUE(s.writeUint16(static_cast<unsigned short>(-2)));
  const std::vector<unsigned char> expected = {
      0xEF, 0xBE, 0x04, 0x03, 0x02, 0x01, 0x88, 0x77, 0x66, 0x55, 0x44, 0x33, 0x22, 0x11,
      0x00, 0x00, 0x80, 0x3F, 0, 0, 0, 0, 0, 0, 0x00, 0xC0, 0xFE, 0xFF};
  EXPECT_EQ(bytesOf(s.buffer()), expected);

  unsigned short u16;
  unsigned int u32;
  unsigned long long u64;
  float f;
  double d;
  ASSERT_TRUE(s.readUint16(u16) && s.readUint32(u32) && s.readUint64(u64) && s.readFloat(f) &&
              s.readDouble(d));
  EXPECT_EQ(u16, 0xBEEF);
  EXPECT_EQ(u32, 0x01020304u);
  EXPECT_EQ(u64, 0x1122334455667788ull);
  EXPECT_EQ(f, 1.0f);
  EXPECT_EQ(d, -2.0);

  // A short read fails the typed read but consumes what was there.
  EXPECT_FALSE(s.readUint32(u32)) << "two bytes left";
  EXPECT_TRUE(s.eof());
  EXPECT_EQ(s.offset(), 28u);
}

}  // namespace
}  // namespace lodestack
