#include "lodestack/schema/MeasurementContainer.h"

#include "lodestack/schema/InternalUtility.h"

namespace lodestack {
namespace schema {

namespace {
const FlagProperty kCollections[] = {
    {MeasurementContainer::Geran, 300},   {MeasurementContainer::UtraFdd, 301},
    {MeasurementContainer::UtraTdd, 302}, {MeasurementContainer::EUtra, 310},
    {MeasurementContainer::Cdma, 312},    {MeasurementContainer::Wlan, 314},
    {MeasurementContainer::Gnss, 315}};
}  // namespace

MeasurementContainer::MeasurementContainer() = default;
MeasurementContainer::~MeasurementContainer() = default;

gom::SharedPointer<MeasurementContainer> MeasurementContainer::create() {
  gom::SharedPointer<MeasurementContainer> c(new (std::nothrow) MeasurementContainer());
  return c && c->baseCreate(kTypeId) ? c : gom::SharedPointer<MeasurementContainer>();
}

gom::SharedPointer<MeasurementContainer> MeasurementContainer::create(
    const gom::SharedPointer<gom::GenericObject>& object) {
  gom::SharedPointer<MeasurementContainer> c(new (std::nothrow) MeasurementContainer());
  return c && c->baseCreate(kTypeId, object) ? c : gom::SharedPointer<MeasurementContainer>();
}

bool MeasurementContainer::valueExists(unsigned int mask) const {
  return !(mask & ~kAllFlags) && flagsPresent(mask, kCollections);
}

void MeasurementContainer::unset(unsigned int mask) { removeFlags(mask, kCollections); }

void MeasurementContainer::setMeasurementCollection(
    const gom::SharedPointer<gom::ValueCollection>& collection, unsigned short propertyId) {
  setProperty(propertyId, collection, "measurementCollection");
}

Status MeasurementContainer::addMeasurement(const gom::SharedPointer<gom::GenericObject>& m,
                                            unsigned short typeId, unsigned short collectionId) {
  if (!m || m->key() != typeId) return Refused;
  return InternalUtility::addGenericObjectToCollection(object_, collectionId, m);
}

gom::SharedPointer<gom::ValueCollection> MeasurementContainer::measurementCollection(
    unsigned short propertyId) const {
  gom::SharedPointer<gom::ValueCollection> collection;
  getProperty(propertyId, collection, "measurementCollection");
  return collection;
}

gom::SharedPointer<gom::GenericObject> MeasurementContainer::collectionItem(
    const gom::SharedPointer<gom::ValueCollection>& collection, unsigned int index) {
  gom::SharedPointer<gom::GenericObject> item;
  const gom::Variant* v = collection ? collection->item(index) : nullptr;
  if (v) (void)v->getGenericObjectValue(item);
  return item;
}

}  // namespace schema
}  // namespace lodestack
