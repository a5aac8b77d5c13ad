#include "lodestack/gom/GenericObject.h"

#include <new>

#include "lodestack/gom/CharacterData.h"
#include "lodestack/gom/ObjectBase.h"
#include "lodestack/gom/ValueCollection.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace gom {

GenericObject::GenericObject() : key_(0), cursor_(kNoCursor) {}

GenericObject::GenericObject(unsigned short key) : key_(key), cursor_(kNoCursor) {}

GenericObject::~GenericObject() = default;

SharedPointer<GenericObject> GenericObject::create(unsigned short key) {
  SharedPointer<GenericObject> object(new (std::nothrow) GenericObject(key));
  if (!object) return object;
  object->properties_ = PropertyStore::create();
  if (!object->properties_) return SharedPointer<GenericObject>();
  return object;
}

SharedPointer<GenericObject> GenericObject::create(const GenericObject& source) {
  SharedPointer<GenericObject> copy = create(source.key_);
  if (!copy || !source.properties_) return copy;
  if (!copy->properties_->reserve(source.properties_->size()))
    return SharedPointer<GenericObject>();
  for (const InternalVariant& property : *source.properties_) {
    if (copy->properties_->add(property) != Ok) return SharedPointer<GenericObject>();
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
  if (!copy || !properties_) return copy;
  if (!copy->properties_->reserve(properties_->size())) return SharedPointer<GenericObject>();
  for (const InternalVariant& property : *properties_) {
    InternalVariant deep(property.key());
    if (deep.cloneFrom(property) != Ok || copy->properties_->add(std::move(deep)) != Ok)
      return SharedPointer<GenericObject>();
  }
  return copy;
}

InternalVariant* GenericObject::findPropertyImpl(unsigned short id) const {
  if (!properties_) return nullptr;
  for (InternalVariant& property : *properties_) {
    if (property.key() == id) return &property;
  }
  return nullptr;
}

Status GenericObject::appendProperty(InternalVariant&& v) {
  if (!properties_) {
    properties_ = PropertyStore::create();
    if (!properties_) return OutOfMemory;
  }
  return properties_->add(std::move(v));
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
  InternalVariant* next = nullptr;
  return properties_->remove(property, next) == Ok;
}

bool GenericObject::getFirstKey(unsigned short& id) {
  if (propertyCount() == 0) return false;
  cursor_ = 0;
  id = (*properties_)[0].key();
  return true;
}

bool GenericObject::getNextKey(unsigned short& id) {
  if (cursor_ == kNoCursor) return false;
  ++cursor_;
  if (cursor_ >= propertyCount()) {
    cursor_ = kNoCursor;
    return false;
  }
  id = (*properties_)[static_cast<unsigned int>(cursor_)].key();
  return true;
}

bool GenericObject::operator==(const GenericObject& other) const {
  if (key_ != other.key_) return false;
  const unsigned int count = propertyCount();
  if (count != other.propertyCount()) return false;
  for (unsigned int i = 0; i < count; ++i) {
    if (!((*properties_)[i] == (*other.properties_)[i])) return false;
  }
  return true;
}

void GenericObject::dump() const {
  if (!properties_) return;
  for (const InternalVariant& property : *properties_) property.dump();
}

bool GenericObject::write(IStream& stream) const {
  if (!stream.writeUint16(key_) || !stream.writeUint32(propertyCount())) return false;
  if (properties_) {
    for (const InternalVariant& property : *properties_) {
      if (!property.write(stream)) return false;
    }
  }
  return stream.good();
}

bool GenericObject::read(IStream& stream) {
  // An empty store that nobody else holds can take the properties directly:
  // on failure it is emptied again, which leaves the object as it was.
  const bool reuse = properties_ && properties_->empty() && properties_->referenceCount() == 1;
  SharedPointer<PropertyStore> fresh = reuse ? properties_ : PropertyStore::create();
  if (!fresh) return false;
  unsigned short key = 0;
  if (!stream.readUint16(key)) return false;
  // Key 0 ends the read here, leaving the count and properties that a
  // writer emitted unread: deliberate, keys are never 0 in practice.
  if (key == 0) return stream.good();
  unsigned int count = 0;
  if (!stream.readUint32(count)) return false;
  // Every property takes at least 4 bytes: reserve no more than the stream
  // can hold, so a forged count costs nothing before its bytes are there.
  const unsigned int left = stream.bytesLeftHint();
  const unsigned int plausible = left / 4 < count ? left / 4 : count;
  if (plausible <= 4096) fresh->reserve(plausible);
  for (unsigned int i = 0; i < count; ++i) {
    InternalVariant property(0);
    if (!property.read(stream) || fresh->add(std::move(property)) != Ok) {
      if (reuse) {
        while (!fresh->empty()) fresh->removeAt(fresh->size() - 1);
      }
      return false;
    }
  }
  key_ = key;
  properties_ = fresh;
  cursor_ = kNoCursor;
  return stream.good();
}

}  // namespace gom
}  // namespace lodestack
