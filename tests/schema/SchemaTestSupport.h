// Byte and exception helpers shared by the schema tests, which all use the
// library's names unqualified.
#ifndef LODESTACK_TESTS_SCHEMA_SCHEMATESTSUPPORT_H
#define LODESTACK_TESTS_SCHEMA_SCHEMATESTSUPPORT_H

#include <gtest/gtest.h>

#include <vector>

#include <lodestack/lodestack.h>

using namespace lodestack;
using namespace lodestack::schema;
using gom::SharedPointer;
using Bytes = std::vector<unsigned char>;

// What `s` writes; a failed write is a test failure.
inline Bytes bytesOf(const ISerializable& s) {
  BufferStream out;
  EXPECT_TRUE(s.write(out));
  const Buffer& b = out.buffer();
  return Bytes(b.data(), b.data() + b.size());
}

inline bool readFrom(ISerializable& s, const Bytes& bytes) {
  BufferStream in(bytes.data(), static_cast<unsigned int>(bytes.size()));
  return s.read(in);
}

// The Status `f` throws, or Ok when it returns.
template <class F>
Status thrownBy(F f) {
  try {
    f();
  } catch (Status s) {
    return s;
  }
  return Ok;
}

#endif  // LODESTACK_TESTS_SCHEMA_SCHEMATESTSUPPORT_H
