#include "lodestack/gom/Variant.h"

#include <cstring>
#include <new>

#include "gom/NestingGuard.h"
#include "gom/RecordFactory.h"
#include "lodestack/gom/CharacterData.h"
#include "lodestack/gom/GenericObject.h"
#include "lodestack/gom/ObjectBase.h"
#include "lodestack/gom/ValueCollection.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace gom {

namespace {

// The held object of an object-kind variant as its own class. The union
// stores it as its ReferenceCountable base.
template <class T>
T* held(ReferenceCountable* object) {
  return static_cast<T*>(object);
}

}  // namespace

Variant::Variant(unsigned short key, const Variant& v) : Variant(v) { key_ = key; }

Variant::Variant(const Variant& v) : ISerializable(), key_(v.key_), type_(v.type_), bits_(v.bits_) {
  if (holdsObject() && object_) object_->increment();
}

Variant::Variant(Variant&& v) noexcept
    : ISerializable(), key_(v.key_), type_(v.type_), bits_(v.bits_) {
  v.type_ = TypeEmpty;
  v.bits_ = 0;
}

Variant& Variant::operator=(const Variant& v) {
  if (this == &v) return *this;
  if (v.holdsObject() && v.object_) v.object_->increment();
  releaseObject();
  key_ = v.key_;
  type_ = v.type_;
  bits_ = v.bits_;
  return *this;
}

Variant& Variant::operator=(Variant&& v) noexcept {
  if (this == &v) return *this;
  releaseObject();
  key_ = v.key_;
  type_ = v.type_;
  bits_ = v.bits_;
  v.type_ = TypeEmpty;
  v.bits_ = 0;
  return *this;
}

Variant::~Variant() { releaseObject(); }

InternalVariant::~InternalVariant() = default;

void Variant::releaseObject() {
  if (holdsObject() && object_) {
    ReferenceCountable* old = object_;
    bits_ = 0;
    old->decrement();
  }
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
  releaseObject();
  key_ = v.key_;
  type_ = v.type_;
  if (copy) {
    bits_ = 0;
    object_ = copy;  // the reference detached from the clone's handle
  } else {
    bits_ = v.bits_;
  }
  return Ok;
}

bool Variant::operator==(const Variant& v) const {
  if (key_ != v.key_ || type_ != v.type_) return false;
  if (!holdsObject()) return bits_ == v.bits_;
  if (!object_ || !v.object_) return object_ == v.object_;
  if (object_ == v.object_) return true;
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

bool Variant::write(IStream& stream) const {
  if (!stream.writeUint16(type_) || !stream.writeUint16(key_)) return false;
  switch (type_) {
    case TypeInt8:
    case TypeUint8:
    case TypeBoolean:
      if (!stream.writeUint8(static_cast<unsigned char>(bits_))) return false;
      break;
    case TypeInt16:
    case TypeUint16:
      if (!stream.writeUint16(static_cast<unsigned short>(bits_))) return false;
      break;
    case TypeInt32:
    case TypeUint32:
    case TypeFloat:
      if (!stream.writeUint32(static_cast<unsigned int>(bits_))) return false;
      break;
    case TypeInt64:
    case TypeUint64:
    case TypeDouble:
      if (!stream.writeUint64(bits_)) return false;
      break;
    case TypeString:
      // A variant holding no string writes an empty one.
      if (!object_) return stream.writeUint32(0) && stream.good();
      return held<CharacterData>(object_)->write(stream);
    case TypeGenericObject:
      // An empty handle has no record to write.
      return object_ && held<GenericObject>(object_)->write(stream);
    case TypeObject: {
      if (!object_) return false;
      const ObjectBase* record = held<ObjectBase>(object_);
      return stream.writeUint16(record->key()) && record->write(stream);
    }
    case TypeCollection:
      if (!object_) return stream.writeUint32(0) && stream.good();
      return held<ValueCollection>(object_)->write(stream);
    default:
      break;  // code 0 and unknown codes carry no payload
  }
  return stream.good();
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
  unsigned short code = 0;
  unsigned short key = 0;
  if (!stream.readUint16(code) || !stream.readUint16(key)) return false;
  unsigned long long bits = 0;
  ReferenceCountable* object = nullptr;
  bool ok = true;
  switch (code) {
    case TypeInt8:
    case TypeUint8:
    case TypeBoolean: {
      unsigned char v = 0;
      ok = stream.readUint8(v);
      bits = v;
      break;
    }
    case TypeInt16:
    case TypeUint16: {
      unsigned short v = 0;
      ok = stream.readUint16(v);
      bits = v;
      break;
    }
    case TypeInt32:
    case TypeUint32:
    case TypeFloat: {
      unsigned int v = 0;
      ok = stream.readUint32(v);
      bits = v;
      break;
    }
    case TypeInt64:
    case TypeUint64:
    case TypeDouble:
      ok = stream.readUint64(bits);
      break;
    case TypeString:
    case TypeGenericObject:
    case TypeObject:
    case TypeCollection:
      object = readHeld(code, stream);
      ok = object != nullptr;
      break;
    default:
      break;  // code 0 and codes above 15 carry no payload
  }
  if (!ok) return false;
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
