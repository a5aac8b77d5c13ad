// ObjectCollection<T>: a typed, serialisable list of records of one class
// (for instance the neighbour cells of a cell). The list holds shared
// pointers; the records are shared, not copied, by add().
//
// Bytes: a 4-byte item count, then each record's own bytes in order, with no
// type id (every item is a T). read() appends the items it reads; on failure
// those read before the failing one stay. One thread at a time.
#ifndef LODESTACK_GOM_OBJECTCOLLECTION_H
#define LODESTACK_GOM_OBJECTCOLLECTION_H

#include "lodestack/gom/Collection.h"
#include "lodestack/stream/ISerializable.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace gom {

template <class T>
class LODESTACK_EXPORT ObjectCollection : public Collection<SharedPointer<T>>,
                                          public ISerializable {
 public:
  ObjectCollection() = default;
  ~ObjectCollection() override = default;

  static SharedPointer<ObjectCollection> create() {
    return SharedPointer<ObjectCollection>(new (std::nothrow) ObjectCollection());
  }

  bool write(IStream& stream) const override {
    if (!stream.writeUint32(this->size())) return false;
    for (const SharedPointer<T>& item : *this) {
      if (!item || !item->write(stream)) return false;
    }
    return true;
  }

  bool read(IStream& stream) override {
    unsigned int count = 0;
    if (!stream.readUint32(count)) return false;
    // Every record takes at least one byte, so a hostile count ends with
    // the stream rather than with memory.
    for (unsigned int i = 0; i < count; ++i) {
      SharedPointer<T> item = T::create();
      if (!item || !item->read(stream) || this->add(item) != Ok) return false;
    }
    return true;
  }

  // Item by item, by the records' own equality (empty items equal only
  // each other).
  bool operator==(const ObjectCollection& other) const {
    if (this->size() != other.size()) return false;
    for (unsigned int i = 0; i < this->size(); ++i) {
      const SharedPointer<T>& a = (*this)[i];
      const SharedPointer<T>& b = other[i];
      if (a && b ? !(*a == *b) : (a || b)) return false;
    }
    return true;
  }
  bool operator!=(const ObjectCollection& other) const { return !(*this == other); }
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_OBJECTCOLLECTION_H
