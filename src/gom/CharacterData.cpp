#include "lodestack/gom/CharacterData.h"

#include <climits>
#include <cstring>
#include <new>

#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace gom {

CharacterData::CharacterData() : data_(nullptr), length_(0) {}

CharacterData::~CharacterData() { release(); }

// Room for `bytes` bytes: the inline array when it is free and large
// enough, else the heap; null on exhaustion.
char* CharacterData::allocate(unsigned int bytes) {
  if (bytes <= kInlineCapacity && data_ != inline_) return inline_;
  return new (std::nothrow) char[bytes];
}

void CharacterData::release() {
  if (data_ != inline_) delete[] data_;
  data_ = nullptr;
}

SharedPointer<CharacterData> CharacterData::create(const char* text, unsigned int length) {
  SharedPointer<CharacterData> string(new (std::nothrow) CharacterData());
  if (!string || length == UINT_MAX) return SharedPointer<CharacterData>();
  char* bytes = string->allocate(length + 1);
  if (!bytes) return SharedPointer<CharacterData>();
  if (length) std::memcpy(bytes, text, length);
  bytes[length] = '\0';
  string->data_ = bytes;
  string->length_ = length;
  return string;
}

SharedPointer<CharacterData> CharacterData::create(IStream& stream) {
  SharedPointer<CharacterData> string(new (std::nothrow) CharacterData());
  if (!string || !string->read(stream)) return SharedPointer<CharacterData>();
  return string;
}

SharedPointer<CharacterData> CharacterData::clone() const {
  if (!data_) return SharedPointer<CharacterData>(new (std::nothrow) CharacterData());
  return create(data_, length_);
}

bool CharacterData::operator==(const CharacterData& other) const {
  if (!data_) return !other.data_;
  if (!other.data_) return false;
  return length_ == other.length_ && std::memcmp(data_, other.data_, length_) == 0;
}

bool CharacterData::write(IStream& stream) const {
  const unsigned int length = data_ ? length_ : 0;
  if (length <= kInlineCapacity) {
    // Length and a short text leave in one write.
    unsigned char record[4 + kInlineCapacity];
    std::memcpy(record, &length, 4);
    if (length) std::memcpy(record + 4, data_, length);
    return stream.write(record, 4 + length) == 4 + length && stream.good();
  }
  if (!stream.writeUint32(length)) return false;
  if (length && stream.write(reinterpret_cast<const unsigned char*>(data_), length) != length)
    return false;
  return stream.good();
}

bool CharacterData::read(IStream& stream) {
  unsigned int length = 0;
  if (!stream.readUint32(length)) return false;
  char* bytes = nullptr;
  if (length > 0) {
    // Refuse a length the stream cannot hold before allocating for it. A
    // stream that cannot tell its size is read in bounded steps instead.
    const unsigned int left = stream.bytesLeftHint();
    if (length == UINT_MAX || (left != UINT_MAX && length > left)) return false;
    if (left != UINT_MAX) {
      bytes = allocate(length + 1);
      if (!bytes) return false;
      if (stream.read(reinterpret_cast<unsigned char*>(bytes), length) != length) {
        if (bytes != inline_) delete[] bytes;
        return false;
      }
    } else {
      const unsigned int kStep = 1u << 16;
      unsigned int have = 0;
      unsigned int capacity = 0;
      while (have < length) {
        const unsigned int chunk = length - have < kStep ? length - have : kStep;
        if (have + chunk + 1 > capacity) {
          const unsigned int wanted = have + chunk + 1 > 2 * capacity ? have + chunk + 1 : 2 * capacity;
          const unsigned int grown = wanted < length + 1 ? wanted : length + 1;
          char* bigger = new (std::nothrow) char[grown];
          if (!bigger) {
            delete[] bytes;
            return false;
          }
          if (have) std::memcpy(bigger, bytes, have);
          delete[] bytes;
          bytes = bigger;
          capacity = grown;
        }
        if (stream.read(reinterpret_cast<unsigned char*>(bytes + have), chunk) != chunk) {
          delete[] bytes;
          return false;
        }
        have += chunk;
      }
    }
    bytes[length] = '\0';
  }
  release();
  data_ = bytes;
  length_ = length;
  return stream.good();
}

}  // namespace gom
}  // namespace lodestack
