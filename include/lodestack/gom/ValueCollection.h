// ValueCollection: an ordered, reference-counted list of heap variants that
// it owns; the collection kind (code 15) of variants and the container of
// measurements.
//
// add() takes ownership of the variant when it returns Ok (on any other
// status the caller still owns it). remove() and removeAt() delete the item.
// Equality is item by item, in order. One thread at a time.
#ifndef LODESTACK_GOM_VALUECOLLECTION_H
#define LODESTACK_GOM_VALUECOLLECTION_H

#include "lodestack/gom/Collection.h"
#include "lodestack/gom/Variant.h"

namespace lodestack {
namespace gom {

class LODESTACK_EXPORT ValueCollection : public Collection<Variant*>,
                                         public ISerializable {
 public:
  // Empty; null when memory is exhausted.
  static SharedPointer<ValueCollection> create();
  // Deep clones of every item, in order; null on failure.
  static SharedPointer<ValueCollection> create(const ValueCollection& source);
  SharedPointer<ValueCollection> clone() const;

  // Deletes the removed variant; see Collection::remove for `next`.
  Status remove(Variant** element, Variant**& next);
  bool removeAt(unsigned int index);

  // The item at index, or null past the end.
  Variant* item(unsigned int index) const {
    return index < size() ? items_[index] : nullptr;
  }

  bool operator==(const ValueCollection& other) const;
  bool operator!=(const ValueCollection& other) const { return !(*this == other); }
  void dump() const;

  // 4-byte item count, then each item's variant record.
  bool write(IStream& stream) const override;
  // Appends the items read to those already held. On failure the items
  // read before the failing one stay.
  bool read(IStream& stream) override;

 protected:
  ValueCollection() = default;
  ~ValueCollection() override;
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_VALUECOLLECTION_H
