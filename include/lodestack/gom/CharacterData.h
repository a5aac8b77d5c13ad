// CharacterData: a reference-counted byte string.
//
// The bytes are NUL-terminated when present; a string read back with length
// 0 holds no array at all, while create(text, 0) holds a one-byte array. The
// two compare unequal: that asymmetry is part of the format's behaviour and
// is kept. Factories return null when memory is exhausted. One thread at a
// time.
#ifndef LODESTACK_GOM_CHARACTERDATA_H
#define LODESTACK_GOM_CHARACTERDATA_H

#include "lodestack/gom/SharedPointer.h"
#include "lodestack/stream/ISerializable.h"

namespace lodestack {
namespace gom {

class LODESTACK_EXPORT CharacterData : public ReferenceCountable,
                                       public ISerializable {
 public:
  // Copies `length` bytes of `text` (no terminator needed) and adds a NUL.
  static SharedPointer<CharacterData> create(const char* text, unsigned int length);
  // Reads a string record (4-byte length, then the bytes); null on failure.
  static SharedPointer<CharacterData> create(IStream& stream);

  // The bytes, NUL-terminated; null for a string that never got bytes.
  const char* data() const { return data_; }
  unsigned int length() const { return length_; }

  SharedPointer<CharacterData> clone() const;
  bool operator==(const CharacterData& other) const;
  bool operator!=(const CharacterData& other) const { return !(*this == other); }

  // 4-byte length, then the bytes; no terminator.
  bool write(IStream& stream) const override;
  // Replaces the bytes on success; on failure the string is unchanged. A
  // claimed length beyond the bytes the stream holds fails before anything
  // is allocated for it.
  bool read(IStream& stream) override;

 protected:
  CharacterData();
  ~CharacterData() override;

 private:
  // Short strings (BSSIDs, names) live in the object itself.
  static const unsigned int kInlineCapacity = 16;
  char* allocate(unsigned int bytes);
  void release();

  char* data_;
  unsigned int length_;
  char inline_[kInlineCapacity];
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_CHARACTERDATA_H
