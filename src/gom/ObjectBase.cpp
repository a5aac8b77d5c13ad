#include "lodestack/gom/ObjectBase.h"

#include "lodestack/gom/RecordFactory.h"

namespace lodestack {
namespace gom {

namespace {
RecordFactoryFunction recordFactory = nullptr;
}  // namespace

RecordFactoryFunction installRecordFactory(RecordFactoryFunction factory) {
  RecordFactoryFunction previous = recordFactory;
  recordFactory = factory;
  return previous;
}

SharedPointer<ObjectBase> createRecord(unsigned short typeId) {
  if (typeId == 0 || !recordFactory) return SharedPointer<ObjectBase>();
  return recordFactory(typeId);
}

ObjectBase::ObjectBase(unsigned short key) : key_(key) {}

ObjectBase::ObjectBase(const ObjectBase& source)
    : ReferenceCountable(), ISerializable(), key_(source.key_),
      extension_(source.extension_) {}

ObjectBase::~ObjectBase() = default;

void ObjectBase::dump() const {}

bool ObjectBase::write(IStream&) const { throw WrongObjectType; }

bool ObjectBase::read(IStream&) { throw WrongObjectType; }

SharedPointer<GenericObject> ObjectBase::extension() {
  if (!extension_) extension_ = GenericObject::create(key_);
  return extension_;
}

bool ObjectBase::operator==(const ObjectBase& other) const {
  if (key_ != other.key_) return false;
  if (!extension_ || !other.extension_) return !extension_ && !other.extension_;
  return *extension_ == *other.extension_;
}

ObjectBase& ObjectBase::operator=(const ObjectBase& source) {
  extension_ = source.extension_;
  return *this;
}

Status ObjectBase::copy(const ObjectBase& source) {
  *this = source;
  if (!source.extension_) return Ok;
  extension_ = GenericObject::create(*source.extension_);
  return extension_ ? Ok : OutOfMemory;
}

Status ObjectBase::cloneFrom(const ObjectBase& source) {
  extension_.clear();
  if (!source.extension_) return Ok;
  extension_ = source.extension_->clone();
  return extension_ ? Ok : OutOfMemory;
}

}  // namespace gom
}  // namespace lodestack
