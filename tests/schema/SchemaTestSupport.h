// Byte and exception helpers shared by the schema tests.
#ifndef LODESTACK_TESTS_SCHEMA_SCHEMATESTSUPPORT_H
#define LODESTACK_TESTS_SCHEMA_SCHEMATESTSUPPORT_H

#include <gtest/gtest.h>

#include <vector>

#include <lodestack/lodestack.h>

using Bytes = std::vector<unsigned char>;

// What `s` writes; a failed write is a test failure.
inline Bytes bytesOf(const lodestack::ISerializable& s) {
  lodestack::BufferStream out;
  EXPECT_TRUE(s.write(out));
  const lodestack::Buffer& b = out.buffer();
  return Bytes(b.data(), b.data() + b.size());
}

inline bool readFrom(lodestack::ISerializable& s, const Bytes& bytes) {
  lodestack::BufferStream in(bytes.data(), static_cast<unsigned int>(bytes.size()));
  return s.read(in);
}

// The Status `f` throws, or Ok when it returns.
template <class F>
lodestack::Status thrownBy(F f) {
  try {
    f();
  } catch (lodestack::Status s) {
    return s;
  }
  return lodestack::Ok;
}

#endif  // LODESTACK_TESTS_SCHEMA_SCHEMATESTSUPPORT_H
