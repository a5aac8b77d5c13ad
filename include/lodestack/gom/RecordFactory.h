// RecordFactory: how the object model makes records it reads from bytes.
//
// The reader of a code-14 variant knows only the record's type id; it asks
// the installed factory for an empty record of that id and lets the record
// read its own bytes. The object model knows no record classes: the schema
// installs its factory (ids 100 to 135) when the library is loaded. An
// application with record classes of its own may install a factory that
// answers its ids and hands every other id to the one it replaced. With no
// factory, or for an id the factory does not know, the result is null and
// the read fails.
//
// Install during start-up, before objects are read on any thread; the
// factory itself is called on the reading thread.
#ifndef LODESTACK_GOM_RECORDFACTORY_H
#define LODESTACK_GOM_RECORDFACTORY_H

#include "lodestack/gom/ObjectBase.h"

namespace lodestack {
namespace gom {

// An empty record of `typeId`, or null when the id is unknown or memory is
// exhausted. Must not throw.
using RecordFactoryFunction = SharedPointer<ObjectBase> (*)(unsigned short typeId);

// Makes `factory` the one the reader asks; returns the factory it replaces
// (null when there was none).
LODESTACK_EXPORT RecordFactoryFunction installRecordFactory(RecordFactoryFunction factory);
// An empty record of `typeId` from the installed factory; null for id 0,
// without a factory, or when the factory has none.
LODESTACK_EXPORT SharedPointer<ObjectBase> createRecord(unsigned short typeId);

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_RECORDFACTORY_H
