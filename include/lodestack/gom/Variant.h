// Variant: one typed value under a 16-bit key; the unit in which a
// GenericObject stores its properties and a ValueCollection its items.
//
// A variant holds nothing (code 0), one of eleven scalars, or a shared handle
// to a string, generic object, record or value collection. Once set it never
// changes kind: a setter or getter of another kind returns Refused and leaves
// everything untouched; no conversion between kinds takes place.
//
// Copies share the held objects; clone() and cloneFrom() copy them deeply.
// Equality compares key, kind, and then objects by content and scalars by
// their 8-byte image (so float NaNs with one bit pattern are equal and +0 and
// -0 are not). Not thread-safe.
//
// Objects held inside held objects nest at most kMaxNestingDepth levels deep
// for every operation that walks them: deeper (or cyclic: an object holding
// itself, which is never detected) trees fail write(), make clone() null and
// cloneFrom() InvalidArgument, and == answers false where it would have to
// look deeper.
#ifndef LODESTACK_GOM_VARIANT_H
#define LODESTACK_GOM_VARIANT_H

#include <cstddef>
#include <new>

#include "lodestack/core/Status.h"
#include "lodestack/gom/SharedPointer.h"
#include "lodestack/stream/ISerializable.h"

namespace lodestack {
namespace gom {

class CharacterData;
class GenericObject;
class ObjectBase;
class ValueCollection;

class LODESTACK_EXPORT Variant : public ISerializable {
 public:
  // Data type codes; each is also the first field of a serialised variant.
  enum DataType : unsigned short {
    TypeEmpty = 0,
    TypeInt8 = 1,
    TypeUint8 = 2,
    TypeInt16 = 3,
    TypeUint16 = 4,
    TypeInt32 = 5,
    TypeUint32 = 6,
    TypeInt64 = 7,
    TypeUint64 = 8,
    TypeFloat = 9,
    TypeDouble = 10,
    TypeBoolean = 11,
    TypeString = 12,
    TypeGenericObject = 13,
    TypeObject = 14,
    TypeCollection = 15
  };

  Variant() : key_(0), type_(TypeEmpty), bits_(0) {}
  explicit Variant(unsigned short key) : key_(key), type_(TypeEmpty), bits_(0) {}
  // A copy of v (sharing its object) under another key.
  Variant(unsigned short key, const Variant& v);
  Variant(const Variant& v)
      : ISerializable(), key_(v.key_), type_(v.type_), bits_(v.bits_) {
    if (holdsObject() && object_) object_->increment();
  }
  Variant(Variant&& v) noexcept
      : ISerializable(), key_(v.key_), type_(v.type_), bits_(v.bits_) {
    v.type_ = TypeEmpty;
    v.bits_ = 0;
  }
  Variant& operator=(const Variant& v);
  Variant& operator=(Variant&& v) noexcept;
  ~Variant() override { releaseObject(); }

  // Nodes come from a per-thread cache of blocks; see the source.
  static void* operator new(std::size_t size);
  static void* operator new(std::size_t size, const std::nothrow_t&) noexcept;
  static void* operator new(std::size_t, void* place) noexcept { return place; }
  static void operator delete(void* block, std::size_t size) noexcept;

  // A heap variant owned by the caller; null when memory is exhausted.
  static Variant* create();
  // A deep copy on the heap, owned by the caller; null on failure.
  Variant* clone() const;
  // Deep assignment: like operator= but the held object is cloned. Status
  // OutOfMemory (variant unchanged) when the clone cannot be made, and
  // InvalidArgument when it nests too deeply (see above).
  Status cloneFrom(const Variant& v);

  unsigned short key() const { return key_; }
  unsigned short dataType() const { return type_; }
  bool isEmpty() const { return type_ == TypeEmpty; }
  void dump() const {}

  bool operator==(const Variant& v) const;
  bool operator!=(const Variant& v) const { return !(*this == v); }

  Status setInt8Value(signed char v);
  Status setUint8Value(unsigned char v);
  Status setInt16Value(short v);
  Status setUint16Value(unsigned short v);
  Status setInt32Value(int v);
  Status setUint32Value(unsigned int v);
  Status setInt64Value(long long v);
  Status setUint64Value(unsigned long long v);
  Status setFloatValue(float v);
  Status setDoubleValue(double v);
  Status setBooleanValue(bool v);
  Status setStringValue(const SharedPointer<CharacterData>& v);
  Status setGenericObjectValue(const SharedPointer<GenericObject>& v);
  Status setObjectValue(const SharedPointer<ObjectBase>& v);
  Status setCollectionValue(const SharedPointer<ValueCollection>& v);

  Status getInt8Value(signed char& v) const;
  Status getUint8Value(unsigned char& v) const;
  Status getInt16Value(short& v) const;
  Status getUint16Value(unsigned short& v) const;
  Status getInt32Value(int& v) const;
  Status getUint32Value(unsigned int& v) const;
  Status getInt64Value(long long& v) const;
  Status getUint64Value(unsigned long long& v) const;
  Status getFloatValue(float& v) const;
  Status getDoubleValue(double& v) const;
  Status getBooleanValue(bool& v) const;
  Status getStringValue(SharedPointer<CharacterData>& v) const;
  Status getGenericObjectValue(SharedPointer<GenericObject>& v) const;
  Status getObjectValue(SharedPointer<ObjectBase>& v) const;
  Status getCollectionValue(SharedPointer<ValueCollection>& v) const;

  // Variant record: 2-byte code, 2-byte key, payload by code. False when the
  // stream refuses bytes or the objects nest too deeply; what was written
  // stays in the stream.
  bool write(IStream& stream) const override;
  // Reads a variant record. On failure the variant is left as it was. Objects
  // nest at most kMaxNestingDepth levels deep; deeper input fails the read.
  bool read(IStream& stream) override;

  static const int kMaxNestingDepth = 100;

 protected:
  bool holdsObject() const { return type_ >= TypeString && type_ <= TypeCollection; }
  void releaseObject() {
    if (holdsObject() && object_) {
      ReferenceCountable* old = object_;
      bits_ = 0;
      old->decrement();
    }
  }
  template <class T>
  Status setScalar(unsigned short code, T v);
  template <class T>
  Status getScalar(unsigned short code, T& v) const;
  Status setHeld(unsigned short code, ReferenceCountable* object);
  // Takes new contents whose reference is already held, then releases the
  // old object.
  void replace(unsigned short key, unsigned short type, unsigned long long bits);
  template <class T>
  Status getHeld(unsigned short code, SharedPointer<T>& out) const;

  unsigned short key_;
  unsigned short type_;
  union {
    unsigned long long bits_;       // scalars, zero-extended
    ReferenceCountable* object_;    // codes 12 to 15, one counted reference
  };
};

// The variant as stored inside a GenericObject: a Variant whose key is the
// property id.
class LODESTACK_EXPORT InternalVariant final : public Variant {
 public:
  explicit InternalVariant(unsigned short key) : Variant(key) {}
  InternalVariant(unsigned short key, const Variant& v) : Variant(key, v) {}
  InternalVariant(const InternalVariant& v) = default;
  InternalVariant(InternalVariant&& v) noexcept = default;
  InternalVariant& operator=(const InternalVariant& v) = default;
  InternalVariant& operator=(InternalVariant&& v) noexcept = default;
  ~InternalVariant() override = default;
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_VARIANT_H
