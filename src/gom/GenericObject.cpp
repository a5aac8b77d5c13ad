#include "gom/NodePool.h"
#include "lodestack/gom/GenericObject.h"

#include <cstring>
#include <new>

#include "gom/Reservation.h"
#include "lodestack/gom/CharacterData.h"
#include "lodestack/gom/ObjectBase.h"
#include "lodestack/gom/ValueCollection.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace gom {

namespace {
using Pool = NodePool<sizeof(GenericObject)>;
}  // namespace

// Property arrays are sized by the count read or by growth from one
// element: exact multiples of a property up to eight come from two pools.
namespace {
using SmallArrays = NodePool<4 * sizeof(InternalVariant)>;
using MediumArrays = NodePool<8 * sizeof(InternalVariant)>;
}  // namespace

void* GenericObject::allocateBlock(std::size_t bytes) {
  void* block = nullptr;
  if (bytes <= 4 * sizeof(InternalVariant))
    block = SmallArrays::allocate(4 * sizeof(InternalVariant));
  else if (bytes <= 8 * sizeof(InternalVariant))
    block = MediumArrays::allocate(8 * sizeof(InternalVariant));
  else
    block = ::operator new(bytes, std::nothrow);
  if (!block) throw std::bad_alloc();
  return block;
}

void GenericObject::releaseBlock(void* block, std::size_t bytes) noexcept {
  if (bytes <= 4 * sizeof(InternalVariant))
    SmallArrays::release(block, 4 * sizeof(InternalVariant));
  else if (bytes <= 8 * sizeof(InternalVariant))
    MediumArrays::release(block, 8 * sizeof(InternalVariant));
  else
    ::operator delete(block);
}

void* GenericObject::operator new(std::size_t size) {
  void* block = Pool::allocate(size);
  if (!block) throw std::bad_alloc();
  return block;
}

void* GenericObject::operator new(std::size_t size, const std::nothrow_t&) noexcept {
  return Pool::allocate(size);
}

void GenericObject::operator delete(void* block, std::size_t size) noexcept {
  Pool::release(block, size);
}

GenericObject::GenericObject() : key_(0), cursor_(kNoCursor) {}

GenericObject::GenericObject(unsigned short key) : key_(key), cursor_(kNoCursor) {}

GenericObject::~GenericObject() = default;

SharedPointer<GenericObject> GenericObject::create(unsigned short key) {
  return SharedPointer<GenericObject>(new (std::nothrow) GenericObject(key));
}

SharedPointer<GenericObject> GenericObject::create(const GenericObject& source) {
  SharedPointer<GenericObject> copy = create(source.key_);
  if (!copy) return copy;
  try {
    copy->properties_ = source.properties_;
  } catch (const std::bad_alloc&) {
    return SharedPointer<GenericObject>();
  }
  return copy;
}

SharedPointer<GenericObject> GenericObject::create(const SharedPointer<GenericObject>& source) {
  if (!source) return SharedPointer<GenericObject>();
  return create(*source);
}

SharedPointer<GenericObject> GenericObject::create(IStream& stream) {
  SharedPointer<GenericObject> object = create(0);
  if (!object || !object->read(stream)) return SharedPointer<GenericObject>();
  return object;
}

SharedPointer<GenericObject> GenericObject::clone() const {
  SharedPointer<GenericObject> copy = create(key_);
  if (!copy) return copy;
  for (const InternalVariant& property : properties_) {
    InternalVariant deep(property.key());
    if (deep.cloneFrom(property) != Ok || !append(copy->properties_, std::move(deep)))
      return SharedPointer<GenericObject>();
  }
  return copy;
}

InternalVariant* GenericObject::findPropertyImpl(unsigned short id) const {
  for (const InternalVariant& property : properties_) {
    if (property.key() == id) return const_cast<InternalVariant*>(&property);
  }
  return nullptr;
}

bool GenericObject::append(PropertyStore& store, InternalVariant&& v) {
  try {
    store.push_back(std::move(v));
  } catch (const std::bad_alloc&) {
    return false;
  }
  return true;
}

Status GenericObject::appendProperty(InternalVariant&& v) {
  return append(properties_, std::move(v)) ? Ok : OutOfMemory;
}

template <class T, Status (Variant::*Get)(T&) const>
Status GenericObject::getTyped(unsigned short id, T& v) const {
  const InternalVariant* property = findPropertyImpl(id);
  if (!property) return NotFound;
  return (property->*Get)(v);
}

template <class T, Status (Variant::*Set)(T)>
Status GenericObject::setTyped(unsigned short id, T v) {
  if (InternalVariant* property = findPropertyImpl(id)) return (property->*Set)(v);
  InternalVariant fresh(id);
  (fresh.*Set)(v);
  return appendProperty(std::move(fresh));
}

#define LODESTACK_PROPERTY_ACCESSORS(Name, Type)                               \
  Status GenericObject::get##Name##Property(unsigned short id, Type& v) const { \
    return getTyped<Type, &Variant::get##Name##Value>(id, v);                  \
  }                                                                            \
  Status GenericObject::set##Name##Property(unsigned short id, Type v) {       \
    return setTyped<Type, &Variant::set##Name##Value>(id, v);                  \
  }
#define LODESTACK_OBJECT_PROPERTY_ACCESSORS(Name, Type)                        \
  Status GenericObject::get##Name##Property(unsigned short id,                 \
                                            SharedPointer<Type>& v) const {    \
    return getTyped<SharedPointer<Type>, &Variant::get##Name##Value>(id, v);   \
  }                                                                            \
  Status GenericObject::set##Name##Property(unsigned short id,                 \
                                            const SharedPointer<Type>& v) {    \
    return setTyped<const SharedPointer<Type>&, &Variant::set##Name##Value>(id, v); \
  }

LODESTACK_PROPERTY_ACCESSORS(Uint8, unsigned char)
LODESTACK_PROPERTY_ACCESSORS(Int8, signed char)
LODESTACK_PROPERTY_ACCESSORS(Uint16, unsigned short)
LODESTACK_PROPERTY_ACCESSORS(Int16, short)
LODESTACK_PROPERTY_ACCESSORS(Uint32, unsigned int)
LODESTACK_PROPERTY_ACCESSORS(Int32, int)
LODESTACK_PROPERTY_ACCESSORS(Uint64, unsigned long long)
LODESTACK_PROPERTY_ACCESSORS(Int64, long long)
LODESTACK_PROPERTY_ACCESSORS(Float, float)
LODESTACK_PROPERTY_ACCESSORS(Double, double)
LODESTACK_PROPERTY_ACCESSORS(Boolean, bool)
LODESTACK_OBJECT_PROPERTY_ACCESSORS(String, CharacterData)
LODESTACK_OBJECT_PROPERTY_ACCESSORS(GenericObject, GenericObject)
LODESTACK_OBJECT_PROPERTY_ACCESSORS(Object, ObjectBase)
LODESTACK_OBJECT_PROPERTY_ACCESSORS(Collection, ValueCollection)

#undef LODESTACK_PROPERTY_ACCESSORS
#undef LODESTACK_OBJECT_PROPERTY_ACCESSORS

Status GenericObject::getProperty(unsigned short id, Variant& out) const {
  const InternalVariant* property = findPropertyImpl(id);
  if (!property) return NotFound;
  out = *property;
  return Ok;
}

Status GenericObject::setProperty(unsigned short id, const Variant& v) {
  if (InternalVariant* property = findPropertyImpl(id)) {
    if (property->dataType() != v.dataType()) return Refused;
    *property = InternalVariant(id, v);
    return Ok;
  }
  return appendProperty(InternalVariant(id, v));
}

bool GenericObject::removeProperty(unsigned short id) {
  InternalVariant* property = findPropertyImpl(id);
  if (!property) return false;
  properties_.erase(properties_.begin() + (property - properties_.data()));
  return true;
}

bool GenericObject::getFirstKey(unsigned short& id) {
  if (propertyCount() == 0) return false;
  cursor_ = 0;
  id = properties_[0].key();
  return true;
}

bool GenericObject::getNextKey(unsigned short& id) {
  if (cursor_ == kNoCursor) return false;
  ++cursor_;
  if (cursor_ >= propertyCount()) {
    cursor_ = kNoCursor;
    return false;
  }
  id = properties_[cursor_].key();
  return true;
}

bool GenericObject::operator==(const GenericObject& other) const {
  if (key_ != other.key_) return false;
  const unsigned int count = propertyCount();
  if (count != other.propertyCount()) return false;
  for (unsigned int i = 0; i < count; ++i) {
    if (!(properties_[i] == other.properties_[i])) return false;
  }
  return true;
}

void GenericObject::dump() const {
  for (const InternalVariant& property : properties_) property.dump();
}

bool GenericObject::write(IStream& stream) const {
  unsigned char header[6];
  const unsigned int count = propertyCount();
  std::memcpy(header, &key_, 2);
  std::memcpy(header + 2, &count, 4);
  if (stream.write(header, 6) != 6) return false;
  return writeProperties(stream);
}

bool GenericObject::writeProperties(IStream& stream) const {
  for (const InternalVariant& property : properties_) {
    if (!property.write(stream)) return false;
  }
  return stream.good();
}

bool GenericObject::read(IStream& stream) {
  unsigned short key = 0;
  if (!stream.readUint16(key)) return false;
  // Key 0 ends the read here, leaving the count and properties that a
  // writer emitted unread: deliberate, keys are never 0 in practice.
  if (key == 0) return stream.good();
  unsigned int count = 0;
  if (!stream.readUint32(count)) return false;
  // The properties go to a fresh store that replaces the old one only when
  // everything was read.
  PropertyStore fresh;
  const unsigned int plausible = plausibleItems(stream, count);
  try {
    fresh.reserve(plausible < 4096 ? plausible : 4096);
  } catch (const std::bad_alloc&) {
    return false;
  }
  for (unsigned int i = 0; i < count; ++i) {
    InternalVariant property(0);
    if (!property.read(stream) || !append(fresh, std::move(property))) return false;
  }
  key_ = key;
  properties_.swap(fresh);
  cursor_ = kNoCursor;
  return stream.good();
}

}  // namespace gom
}  // namespace lodestack
