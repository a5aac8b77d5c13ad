#include "lodestack/schema/GenericObjectWrapper.h"

namespace lodestack {

GenericObjectWrapper::GenericObjectWrapper() = default;
GenericObjectWrapper::~GenericObjectWrapper() = default;

gom::SharedPointer<GenericObjectWrapper> GenericObjectWrapper::create(unsigned short key) {
  gom::SharedPointer<GenericObjectWrapper> wrapper(new GenericObjectWrapper());
  if (!wrapper->construct(key)) return gom::SharedPointer<GenericObjectWrapper>();
  return wrapper;
}

gom::SharedPointer<GenericObjectWrapper> GenericObjectWrapper::create(
    const gom::SharedPointer<gom::GenericObject>& object) {
  if (!object) throw WrongObjectType;
  gom::SharedPointer<GenericObjectWrapper> wrapper(new GenericObjectWrapper());
  wrapper->construct(object);
  return wrapper;
}

bool GenericObjectWrapper::construct(unsigned short key) {
  object_ = gom::GenericObject::create(key);
  return bool(object_);
}

gom::SharedPointer<gom::GenericObject> GenericObjectWrapper::clone() const {
  return object_ ? object_->clone() : gom::SharedPointer<gom::GenericObject>();
}

bool GenericObjectWrapper::write(IStream& stream) const {
  return object_ && object_->write(stream);
}

bool GenericObjectWrapper::read(IStream& stream) {
  return object_ && object_->read(stream);
}

gom::GenericObject& GenericObjectWrapper::object() {
  if (!object_) throw Failed;
  return *object_;
}

const gom::GenericObject& GenericObjectWrapper::object() const {
  if (!object_) throw Failed;
  return *object_;
}

void GenericObjectWrapper::checkError(Status status, const char*, const char*) const {
  if (status != Ok) throw status;
}

}  // namespace lodestack
