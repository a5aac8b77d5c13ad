// ObjectBaseFactory: makes an empty schema record from its object type id
// (100 to 135). This is how records are re-created when generic objects are
// read back from bytes.
#ifndef LODESTACK_SCHEMA_OBJECTBASEFACTORY_H
#define LODESTACK_SCHEMA_OBJECTBASEFACTORY_H

#include "lodestack/gom/ObjectBase.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT ObjectBaseFactory {
 public:
  // A new, empty record of the class registered under `id`; null for ids
  // that name no record (0 included) or when memory is exhausted.
  static gom::SharedPointer<gom::ObjectBase> createObject(unsigned short id);
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_OBJECTBASEFACTORY_H
