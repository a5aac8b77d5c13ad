// The hook through which the reader of code-14 variants makes empty records
// by type id. The object model knows no record classes; the schema installs
// its factory when the library is loaded. With no factory, or for an id the
// factory does not know, the result is null and the read fails.
#ifndef LODESTACK_SRC_GOM_RECORDFACTORY_H
#define LODESTACK_SRC_GOM_RECORDFACTORY_H

#include "lodestack/gom/ObjectBase.h"

namespace lodestack {
namespace gom {

using RecordFactoryFunction = SharedPointer<ObjectBase> (*)(unsigned short typeId);

// Returns true so that it can initialise a static flag at load time.
bool installRecordFactory(RecordFactoryFunction factory);
SharedPointer<ObjectBase> createRecord(unsigned short typeId);

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_SRC_GOM_RECORDFACTORY_H
