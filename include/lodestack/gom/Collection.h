// Collection<T>: a reference-counted, ordered sequence of T in insertion
// order; the store under GenericObject properties, ValueCollection items and
// the typed record collections.
//
// Growth never throws: add() reports OutOfMemory and leaves the collection as
// it was. Element pointers stay valid until the collection grows or an
// element before them is removed. One thread at a time.
#ifndef LODESTACK_GOM_COLLECTION_H
#define LODESTACK_GOM_COLLECTION_H

#include <new>
#include <utility>
#include <vector>

#include "lodestack/core/Export.h"
#include "lodestack/core/Status.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace gom {

template <class T>
class LODESTACK_EXPORT Collection : public ReferenceCountable {
 public:
  using value_type = T;
  using iterator = typename std::vector<T>::iterator;
  using const_iterator = typename std::vector<T>::const_iterator;

  // An empty collection; null when memory is exhausted.
  static SharedPointer<Collection> create() {
    return SharedPointer<Collection>(new (std::nothrow) Collection());
  }

  // Appends a copy. OutOfMemory (collection unchanged) when it cannot grow.
  Status add(const T& item) {
    try {
      items_.push_back(item);
    } catch (const std::bad_alloc&) {
      return OutOfMemory;
    }
    return Ok;
  }
  Status add(T&& item) {
    try {
      items_.push_back(std::move(item));
    } catch (const std::bad_alloc&) {
      return OutOfMemory;
    }
    return Ok;
  }

  // Removes the element at `element`. `next` receives the element that now
  // stands in its place, or null when the last one was removed. NotFound
  // (and next null) when `element` is not one of this collection's.
  Status remove(T* element, T*& next) {
    next = nullptr;
    if (!owns(element)) return NotFound;
    const std::size_t index = static_cast<std::size_t>(element - items_.data());
    items_.erase(items_.begin() + index);
    if (index < items_.size()) next = items_.data() + index;
    return Ok;
  }
  // Removes the element at `index`; false when there is none.
  bool removeAt(unsigned int index) {
    if (index >= items_.size()) return false;
    items_.erase(items_.begin() + index);
    return true;
  }

  // Pre-allocates room for n elements; false when memory is exhausted.
  bool reserve(unsigned int n) {
    try {
      items_.reserve(n);
    } catch (const std::bad_alloc&) {
      return false;
    }
    return true;
  }

  unsigned int size() const { return static_cast<unsigned int>(items_.size()); }
  bool empty() const { return items_.empty(); }

  // Iteration by element address: first() and nextImpl() give null at the end.
  T* first() { return items_.empty() ? nullptr : items_.data(); }
  const T* first() const { return items_.empty() ? nullptr : items_.data(); }
  T* nextImpl(const T* element) {
    return const_cast<T*>(static_cast<const Collection*>(this)->nextImpl(element));
  }
  const T* nextImpl(const T* element) const {
    if (!owns(element)) return nullptr;
    const T* next = element + 1;
    return next < items_.data() + items_.size() ? next : nullptr;
  }

  // Unchecked access: index must be below size().
  T& operator[](unsigned int index) { return items_[index]; }
  const T& operator[](unsigned int index) const { return items_[index]; }

  iterator begin() { return items_.begin(); }
  iterator end() { return items_.end(); }
  const_iterator begin() const { return items_.begin(); }
  const_iterator end() const { return items_.end(); }

 protected:
  Collection() = default;
  ~Collection() override = default;

  bool owns(const T* element) const {
    return element && !items_.empty() && element >= items_.data() &&
           element < items_.data() + items_.size();
  }

  std::vector<T> items_;
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_COLLECTION_H
