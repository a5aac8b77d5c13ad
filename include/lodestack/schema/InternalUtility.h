// InternalUtility: the collection operations that the schema's measurement
// classes share, over the generic object a measurement wraps. Status style:
// nothing here throws. One thread at a time.
#ifndef LODESTACK_SCHEMA_INTERNALUTILITY_H
#define LODESTACK_SCHEMA_INTERNALUTILITY_H

#include "lodestack/gom/GenericObject.h"
#include "lodestack/gom/ObjectBase.h"
#include "lodestack/gom/ValueCollection.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT InternalUtility {
 public:
  // The collection under property `id`, made and stored there when absent
  // (`created` tells). Refused when the property holds another kind,
  // OutOfMemory when a new collection cannot be made or stored.
  [[nodiscard]] static Status getCollection(gom::SharedPointer<gom::GenericObject>& object,
                                            unsigned short id,
                                            gom::SharedPointer<gom::ValueCollection>& out,
                                            bool& created);
  // Appends `item` (shared, not copied) to the collection under `id`. A
  // collection made by this call is removed again when the append fails.
  [[nodiscard]] static Status addGenericObjectToCollection(
      gom::SharedPointer<gom::GenericObject>& object, unsigned short id,
      const gom::SharedPointer<gom::GenericObject>& item);
  [[nodiscard]] static Status addObjectBaseToCollection(
      gom::SharedPointer<gom::GenericObject>& object, unsigned short id,
      const gom::SharedPointer<gom::ObjectBase>& item);
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_INTERNALUTILITY_H
