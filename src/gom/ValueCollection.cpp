#include "lodestack/gom/ValueCollection.h"

#include "gom/Reservation.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace gom {

SharedPointer<ValueCollection> ValueCollection::create() {
  return SharedPointer<ValueCollection>(new (std::nothrow) ValueCollection());
}

SharedPointer<ValueCollection> ValueCollection::create(const ValueCollection& source) {
  SharedPointer<ValueCollection> copy = create();
  if (!copy || !copy->reserve(source.size())) return SharedPointer<ValueCollection>();
  for (const Variant* item : source) {
    Variant* clone = item->clone();
    if (!clone) return SharedPointer<ValueCollection>();
    copy->items_.push_back(clone);  // cannot throw: reserved above
  }
  return copy;
}

SharedPointer<ValueCollection> ValueCollection::clone() const { return create(*this); }

ValueCollection::~ValueCollection() {
  for (Variant* item : items_) delete item;
}

Status ValueCollection::remove(Variant** element, Variant**& next) {
  Variant* doomed = owns(element) ? *element : nullptr;
  const Status status = Collection<Variant*>::remove(element, next);
  if (status == Ok) delete doomed;
  return status;
}

bool ValueCollection::removeAt(unsigned int index) {
  if (index >= size()) return false;
  delete items_[index];
  return Collection<Variant*>::removeAt(index);
}

bool ValueCollection::operator==(const ValueCollection& other) const {
  if (size() != other.size()) return false;
  for (unsigned int i = 0; i < size(); ++i) {
    if (!(*items_[i] == *other.items_[i])) return false;
  }
  return true;
}

void ValueCollection::dump() const {
  for (const Variant* item : items_) item->dump();
}

bool ValueCollection::write(IStream& stream) const {
  if (!stream.writeUint32(size())) return false;
  for (const Variant* item : items_) {
    if (!item->write(stream)) return false;
  }
  return stream.good();
}

bool ValueCollection::read(IStream& stream) {
  unsigned int count = 0;
  if (!stream.readUint32(count)) return false;
  const unsigned int plausible = plausibleItems(stream, count);
  if (plausible <= (1u << 20)) reserve(size() + plausible);
  for (unsigned int i = 0; i < count; ++i) {
    Variant* item = Variant::create();
    if (!item) return false;
    if (!item->read(stream) || add(item) != Ok) {
      delete item;
      return false;
    }
  }
  return stream.good();
}

}  // namespace gom
}  // namespace lodestack
