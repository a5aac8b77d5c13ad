#include "lodestack/schema/InternalUtility.h"

#include <memory>

namespace lodestack {
namespace schema {

namespace {

// Stores `item` in a new heap variant through `set` and appends it to the
// collection under `id`.
template <class T>
Status addToCollection(gom::SharedPointer<gom::GenericObject>& object, unsigned short id,
                       const gom::SharedPointer<T>& item,
                       Status (gom::Variant::*set)(const gom::SharedPointer<T>&)) {
  if (!object) return Failed;
  gom::SharedPointer<gom::ValueCollection> collection;
  bool created = false;
  Status status = InternalUtility::getCollection(object, id, collection, created);
  if (status != Ok) return status;
  std::unique_ptr<gom::Variant> variant(gom::Variant::create());
  status = variant ? ((*variant).*set)(item) : OutOfMemory;
  if (status == Ok) status = collection->add(variant.get());
  if (status == Ok) {
    variant.release();  // the collection owns it now
  } else if (created) {
    object->removeProperty(id);  // leave no empty collection behind
  }
  return status;
}

}  // namespace

Status InternalUtility::getCollection(gom::SharedPointer<gom::GenericObject>& object,
                                      unsigned short id,
                                      gom::SharedPointer<gom::ValueCollection>& out,
                                      bool& created) {
  created = false;
  if (!object) return Failed;
  if (object->propertyExists(id)) return object->getCollectionProperty(id, out);
  gom::SharedPointer<gom::ValueCollection> collection = gom::ValueCollection::create();
  if (!collection) return OutOfMemory;
  const Status status = object->setCollectionProperty(id, collection);
  if (status != Ok) return status;
  out = collection;
  created = true;
  return Ok;
}

Status InternalUtility::addGenericObjectToCollection(
    gom::SharedPointer<gom::GenericObject>& object, unsigned short id,
    const gom::SharedPointer<gom::GenericObject>& item) {
  return addToCollection(object, id, item, &gom::Variant::setGenericObjectValue);
}

Status InternalUtility::addObjectBaseToCollection(gom::SharedPointer<gom::GenericObject>& object,
                                                  unsigned short id,
                                                  const gom::SharedPointer<gom::ObjectBase>& item) {
  return addToCollection(object, id, item, &gom::Variant::setObjectValue);
}

}  // namespace schema
}  // namespace lodestack
