#include "gom/NodePool.h"
#include "lodestack/gom/Variant.h"

#include <cstring>
#include <new>

#include "gom/NestingGuard.h"
#include "lodestack/gom/RecordFactory.h"
#include "lodestack/gom/CharacterData.h"
#include "lodestack/gom/GenericObject.h"
#include "lodestack/gom/ObjectBase.h"
#include "lodestack/gom/ValueCollection.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace gom {

namespace {
using Pool = NodePool<sizeof(Variant)>;
}  // namespace

namespace {

// The held object of an object-kind variant as its own class. The union
// stores it as its ReferenceCountable base.
template <class T>
T* held(ReferenceCountable* object) {
  return static_cast<T*>(object);
}

}  // namespace

void* Variant::operator new(std::size_t size) {
  void* block = Pool::allocate(size);
  if (!block) throw std::bad_alloc();
  return block;
}

void* Variant::operator new(std::size_t size, const std::nothrow_t&) noexcept {
  return Pool::allocate(size);
}

void Variant::operator delete(void* block, std::size_t size) noexcept {
  Pool::release(block, size);
}

Variant::Variant(unsigned short key, const Variant& v) : Variant(v) { key_ = key; }

// The source may live inside the object this variant releases (a property
// of the held generic object): everything is read from it first.
Variant& Variant::operator=(const Variant& v) {
  if (this == &v) return *this;
  if (v.holdsObject() && v.object_) v.object_->increment();
  replace(v.key_, v.type_, v.bits_);
  return *this;
}

Variant& Variant::operator=(Variant&& v) noexcept {
  if (this == &v) return *this;
  const unsigned short key = v.key_, type = v.type_;
  const unsigned long long bits = v.bits_;
  v.type_ = TypeEmpty;
  v.bits_ = 0;
  replace(key, type, bits);
  return *this;
}

void Variant::replace(unsigned short key, unsigned short type, unsigned long long bits) {
  ReferenceCountable* old = holdsObject() ? object_ : nullptr;
  key_ = key;
  type_ = type;
  bits_ = bits;
  if (old) old->decrement();
}

Variant* Variant::create() { return new (std::nothrow) Variant(); }

Variant* Variant::clone() const {
  Variant* copy = create();
  if (!copy) return nullptr;
  if (copy->cloneFrom(*this) != Ok) {
    delete copy;
    return nullptr;
  }
  return copy;
}

Status Variant::cloneFrom(const Variant& v) {
  if (this == &v) return Ok;
  ReferenceCountable* copy = nullptr;
  if (v.holdsObject() && v.object_) {
    NestingGuard guard;
    if (!guard.ok()) return InvalidArgument;
    switch (v.type_) {
      case TypeString:
        copy = held<CharacterData>(v.object_)->clone().detach();
        break;
      case TypeGenericObject:
        copy = held<GenericObject>(v.object_)->clone().detach();
        break;
      case TypeObject:
        copy = held<ObjectBase>(v.object_)->clone().detach();
        break;
      case TypeCollection:
        copy = held<ValueCollection>(v.object_)->clone().detach();
        break;
    }
    if (!copy) return OutOfMemory;
  }
  unsigned long long bits = v.bits_;
  if (copy) {
    bits = 0;
    std::memcpy(&bits, &copy, sizeof copy);  // the reference detached from the clone's handle
  }
  replace(v.key_, v.type_, bits);
  return Ok;
}

bool Variant::operator==(const Variant& v) const {
  if (key_ != v.key_ || type_ != v.type_) return false;
  if (!holdsObject()) return bits_ == v.bits_;
  if (!object_ || !v.object_) return object_ == v.object_;
  if (object_ == v.object_) return true;
  NestingGuard guard;
  if (!guard.ok()) return false;
  switch (type_) {
    case TypeString:
      return *held<CharacterData>(object_) == *held<CharacterData>(v.object_);
    case TypeGenericObject:
      return *held<GenericObject>(object_) == *held<GenericObject>(v.object_);
    case TypeObject:
      return held<ObjectBase>(object_)->compare(held<ObjectBase>(v.object_));
    default:
      return *held<ValueCollection>(object_) == *held<ValueCollection>(v.object_);
  }
}

template <class T>
Status Variant::setScalar(unsigned short code, T v) {
  if (type_ != TypeEmpty && type_ != code) return Refused;
  unsigned long long bits = 0;
  std::memcpy(&bits, &v, sizeof(T));
  bits_ = bits;
  type_ = code;
  return Ok;
}

template <class T>
Status Variant::getScalar(unsigned short code, T& v) const {
  if (type_ != code) return Refused;
  std::memcpy(&v, &bits_, sizeof(T));
  return Ok;
}

Status Variant::setHeld(unsigned short code, ReferenceCountable* object) {
  if (type_ != TypeEmpty && type_ != code) return Refused;
  if (object) object->increment();
  releaseObject();
  type_ = code;
  bits_ = 0;
  object_ = object;
  return Ok;
}

template <class T>
Status Variant::getHeld(unsigned short code, SharedPointer<T>& out) const {
  if (type_ != code) return Refused;
  out = SharedPointer<T>(held<T>(object_));
  return Ok;
}

Status Variant::setInt8Value(signed char v) { return setScalar(TypeInt8, v); }
Status Variant::setUint8Value(unsigned char v) { return setScalar(TypeUint8, v); }
Status Variant::setInt16Value(short v) { return setScalar(TypeInt16, v); }
Status Variant::setUint16Value(unsigned short v) { return setScalar(TypeUint16, v); }
Status Variant::setInt32Value(int v) { return setScalar(TypeInt32, v); }
Status Variant::setUint32Value(unsigned int v) { return setScalar(TypeUint32, v); }
Status Variant::setInt64Value(long long v) { return setScalar(TypeInt64, v); }
Status Variant::setUint64Value(unsigned long long v) { return setScalar(TypeUint64, v); }
Status Variant::setFloatValue(float v) { return setScalar(TypeFloat, v); }
Status Variant::setDoubleValue(double v) { return setScalar(TypeDouble, v); }
Status Variant::setBooleanValue(bool v) {
  return setScalar(TypeBoolean, static_cast<unsigned char>(v ? 1 : 0));
}
Status Variant::setStringValue(const SharedPointer<CharacterData>& v) {
  return setHeld(TypeString, v.get());
}
Status Variant::setGenericObjectValue(const SharedPointer<GenericObject>& v) {
  return setHeld(TypeGenericObject, v.get());
}
Status Variant::setObjectValue(const SharedPointer<ObjectBase>& v) {
  return setHeld(TypeObject, v.get());
}
Status Variant::setCollectionValue(const SharedPointer<ValueCollection>& v) {
  return setHeld(TypeCollection, v.get());
}

Status Variant::getInt8Value(signed char& v) const { return getScalar(TypeInt8, v); }
Status Variant::getUint8Value(unsigned char& v) const { return getScalar(TypeUint8, v); }
Status Variant::getInt16Value(short& v) const { return getScalar(TypeInt16, v); }
Status Variant::getUint16Value(unsigned short& v) const { return getScalar(TypeUint16, v); }
Status Variant::getInt32Value(int& v) const { return getScalar(TypeInt32, v); }
Status Variant::getUint32Value(unsigned int& v) const { return getScalar(TypeUint32, v); }
Status Variant::getInt64Value(long long& v) const { return getScalar(TypeInt64, v); }
Status Variant::getUint64Value(unsigned long long& v) const { return getScalar(TypeUint64, v); }
Status Variant::getFloatValue(float& v) const { return getScalar(TypeFloat, v); }
Status Variant::getDoubleValue(double& v) const { return getScalar(TypeDouble, v); }
Status Variant::getBooleanValue(bool& v) const {
  unsigned char byte = 0;
  const Status status = getScalar(TypeBoolean, byte);
  if (status == Ok) v = byte != 0;
  return status;
}
Status Variant::getStringValue(SharedPointer<CharacterData>& v) const {
  return getHeld(TypeString, v);
}
Status Variant::getGenericObjectValue(SharedPointer<GenericObject>& v) const {
  return getHeld(TypeGenericObject, v);
}
Status Variant::getObjectValue(SharedPointer<ObjectBase>& v) const {
  return getHeld(TypeObject, v);
}
Status Variant::getCollectionValue(SharedPointer<ValueCollection>& v) const {
  return getHeld(TypeCollection, v);
}

namespace {

// Payload width of the scalar codes; 0 for codes without a scalar payload.
unsigned int scalarWidth(unsigned short code) {
  switch (code) {
    case Variant::TypeInt8:
    case Variant::TypeUint8:
    case Variant::TypeBoolean:
      return 1;
    case Variant::TypeInt16:
    case Variant::TypeUint16:
      return 2;
    case Variant::TypeInt32:
    case Variant::TypeUint32:
    case Variant::TypeFloat:
      return 4;
    case Variant::TypeInt64:
    case Variant::TypeUint64:
    case Variant::TypeDouble:
      return 8;
    default:
      return 0;
  }
}

}  // namespace

bool Variant::write(IStream& stream) const {
  // Code, key and a scalar payload (or a short string, or a nested object's
  // header) leave in one write: the same bytes as field by field, for a
  // fraction of the calls.
  unsigned char record[24];
  std::memcpy(record, &type_, 2);
  std::memcpy(record + 2, &key_, 2);
  if (!holdsObject()) {
    const unsigned int width = scalarWidth(type_);
    std::memcpy(record + 4, &bits_, 8);  // the first `width` bytes leave: little-endian
    if (stream.write(record, 4 + width) != 4 + width) return false;
    return stream.good();
  }
  NestingGuard guard;
  if (!guard.ok()) return false;
  if (type_ == TypeString) {
    // A variant holding no string writes an empty one.
    const CharacterData* text = held<CharacterData>(object_);
    const unsigned int length = text && text->data() ? text->length() : 0;
    if (length <= sizeof record - 8) {
      std::memcpy(record + 4, &length, 4);
      if (length) std::memcpy(record + 8, text->data(), length);
      return stream.write(record, 8 + length) == 8 + length && stream.good();
    }
  } else if (type_ == TypeGenericObject) {
    // An empty handle has no record to write.
    const GenericObject* object = held<GenericObject>(object_);
    if (!object) return false;
    const unsigned int count = object->propertyCount();
    std::memcpy(record + 4, &object->key_, 2);
    std::memcpy(record + 6, &count, 4);
    if (stream.write(record, 10) != 10) return false;
    return object->writeProperties(stream);
  }
  if (stream.write(record, 4) != 4) return false;
  switch (type_) {
    case TypeString:
      return held<CharacterData>(object_)->write(stream);
    case TypeObject: {
      if (!object_) return false;
      const ObjectBase* record = held<ObjectBase>(object_);
      return stream.writeUint16(record->key()) && record->write(stream);
    }
    default:
      if (!object_) return stream.writeUint32(0) && stream.good();
      return held<ValueCollection>(object_)->write(stream);
  }
}

namespace {

// Reads the payload of an object-kind variant into a new object; null on
// failure. Records throw only from the base class's write/read or on memory
// exhaustion; either is a failed read here.
ReferenceCountable* readHeld(unsigned short code, IStream& stream) {
  NestingGuard guard;
  if (!guard.ok()) return nullptr;
  switch (code) {
    case Variant::TypeString:
      return CharacterData::create(stream).detach();
    case Variant::TypeGenericObject:
      return GenericObject::create(stream).detach();
    case Variant::TypeObject: {
      unsigned short typeId = 0;
      if (!stream.readUint16(typeId) || typeId == 0) return nullptr;
      SharedPointer<ObjectBase> record = createRecord(typeId);
      if (!record) return nullptr;
      try {
        if (!record->read(stream)) return nullptr;
      } catch (...) {
        return nullptr;
      }
      return record.detach();
    }
    default: {
      SharedPointer<ValueCollection> collection = ValueCollection::create();
      if (!collection || !collection->read(stream)) return nullptr;
      return collection.detach();
    }
  }
}

}  // namespace

bool Variant::read(IStream& stream) {
  // Code and key arrive together; a short read fails either way.
  unsigned int header = 0;
  if (!stream.readUint32(header)) return false;
  const unsigned short code = static_cast<unsigned short>(header & 0xFFFF);
  const unsigned short key = static_cast<unsigned short>(header >> 16);
  unsigned long long bits = 0;
  ReferenceCountable* object = nullptr;
  if (code >= TypeString && code <= TypeCollection) {
    object = readHeld(code, stream);
    if (!object) return false;
  } else if (const unsigned int width = scalarWidth(code)) {
    unsigned char payload[8] = {};
    if (stream.read(payload, width) != width) return false;
    std::memcpy(&bits, payload, 8);  // zero-extended
  }
  // Code 0 and codes above 15 carry no payload.
  releaseObject();
  key_ = key;
  type_ = code;
  if (object) {
    bits_ = 0;
    object_ = object;
  } else {
    bits_ = bits;
  }
  return stream.good();
}

}  // namespace gom
}  // namespace lodestack
