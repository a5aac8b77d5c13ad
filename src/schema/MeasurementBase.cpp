#include "lodestack/schema/MeasurementBase.h"

namespace lodestack {
namespace schema {

namespace {
const FlagProperty kTimeStampFlags[] = {{MeasurementBase::kTimeStamp, MeasurementBase::kTimeStampId}};
}  // namespace

MeasurementBase::MeasurementBase() = default;
MeasurementBase::~MeasurementBase() = default;

bool MeasurementBase::valueExists(unsigned int mask) const {
  return !(mask & ~kAllFlags) && flagsPresent(mask, kTimeStampFlags);
}

void MeasurementBase::unset(unsigned int mask) { removeFlags(mask, kTimeStampFlags); }

void MeasurementBase::dump() const {}

unsigned int MeasurementBase::timeStamp() const {
  unsigned int value = 0;
  getProperty(kTimeStampId, value, "timeStamp");
  return value;
}

void MeasurementBase::setTimeStamp(unsigned int timeStamp) {
  setProperty(kTimeStampId, timeStamp, "timeStamp");
}

bool MeasurementBase::operator==(const MeasurementBase& other) const {
  if (!object_ || !other.object_) return !object_ && !other.object_;
  return *object_ == *other.object_;
}

bool MeasurementBase::baseCreate(unsigned short typeId) { return construct(typeId); }

bool MeasurementBase::baseCreate(unsigned short typeId, unsigned int timeStamp) {
  return construct(typeId) && object_->setUint32Property(kTimeStampId, timeStamp) == Ok;
}

bool MeasurementBase::baseCreate(unsigned short typeId,
                                 const gom::SharedPointer<gom::GenericObject>& object) {
  if (!object || object->key() != typeId) return false;
  construct(object);
  return true;
}

bool MeasurementBase::flagsPresent(unsigned int mask, const FlagProperty* flags,
                                   std::size_t count) const {
  for (std::size_t i = 0; i < count; ++i) {
    if ((mask & flags[i].flag) && !(object_ && object_->propertyExists(flags[i].id))) return false;
  }
  return true;
}

void MeasurementBase::removeFlags(unsigned int mask, const FlagProperty* flags, std::size_t count) {
  if (!object_) return;
  for (std::size_t i = 0; i < count; ++i) {
    if (mask & flags[i].flag) object_->removeProperty(flags[i].id);
  }
}

gom::SharedPointer<gom::ValueCollection> MeasurementBase::optionalCollection(unsigned short id) const {
  gom::SharedPointer<gom::ValueCollection> collection;
  if (object_) (void)object_->getCollectionProperty(id, collection);
  return collection;
}

unsigned int MeasurementBase::optionalUint32(unsigned short id) const {
  unsigned int value = 0;
  if (object_ && object_->getUint32Property(id, value) != Ok) value = 0;
  return value;
}

}  // namespace schema
}  // namespace lodestack
