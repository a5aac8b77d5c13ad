// ObjectHandle<T> and SharedPointer<T>: owning handles over ReferenceCountable
// objects.
//
// A handle is one pointer wide. Copying raises the pointee's count, dropping
// lowers it, and the last drop destroys the object. There are no weak
// handles; cycles leak. Like the count itself, handles are not thread-safe:
// an object and its handles belong to one thread at a time.
//
// SharedPointer<Derived> converts implicitly to SharedPointer<Base>; the other
// way is SharedPointer<Derived>::cast(base), a type-tested downcast that gives
// a null handle when the object is of another class.
#ifndef LODESTACK_GOM_SHAREDPOINTER_H
#define LODESTACK_GOM_SHAREDPOINTER_H

#include <cstddef>
#include <type_traits>

#include "lodestack/gom/ReferenceCountable.h"

namespace lodestack {
namespace gom {

template <class T>
class ObjectHandle {
 public:
  ObjectHandle() : ptr_(nullptr) {}
  // Takes a reference to `object` (count + 1); null is allowed.
  explicit ObjectHandle(T* object) : ptr_(object) {
    if (ptr_) ptr_->increment();
  }
  ObjectHandle(const ObjectHandle& other) : ptr_(other.ptr_) {
    if (ptr_) ptr_->increment();
  }
  ObjectHandle(ObjectHandle&& other) noexcept : ptr_(other.ptr_) {
    other.ptr_ = nullptr;
  }
  ~ObjectHandle() {
    if (ptr_) ptr_->decrement();
  }

  // Same handle: nothing. Otherwise the source's pointee (if any) is taken
  // with count + 1 and then the old pointee is released. The source is read
  // first because it may live inside the old pointee (`head = head->next`),
  // and the handle is set before the release because it may, too.
  ObjectHandle& operator=(const ObjectHandle& other) {
    if (this == &other) return *this;
    T* fresh = other.ptr_;
    if (fresh) fresh->increment();
    replace(fresh);
    return *this;
  }
  ObjectHandle& operator=(ObjectHandle&& other) noexcept {
    if (this != &other) {
      T* fresh = other.ptr_;
      other.ptr_ = nullptr;
      replace(fresh);
    }
    return *this;
  }

  T* get() const { return ptr_; }

 protected:
  void release() {
    if (ptr_) {
      T* old = ptr_;
      ptr_ = nullptr;
      old->decrement();
    }
  }
  // Holds `fresh` (whose reference the caller already took), then releases
  // the old pointee.
  void replace(T* fresh) {
    T* old = ptr_;
    ptr_ = fresh;
    if (old) old->decrement();
  }
  T* ptr_;
};

template <class T>
class SharedPointer : public ObjectHandle<T> {
  using Base = ObjectHandle<T>;

 public:
  SharedPointer() = default;
  SharedPointer(std::nullptr_t) {}
  explicit SharedPointer(T* object) : Base(object) {}
  SharedPointer(const SharedPointer&) = default;
  SharedPointer(SharedPointer&&) noexcept = default;
  SharedPointer& operator=(const SharedPointer&) = default;
  SharedPointer& operator=(SharedPointer&&) noexcept = default;

  // Upcast: SharedPointer<Derived> -> SharedPointer<Base>.
  template <class U, class = std::enable_if_t<std::is_convertible<U*, T*>::value>>
  SharedPointer(const SharedPointer<U>& other) : Base(other.get()) {}
  template <class U, class = std::enable_if_t<std::is_convertible<U*, T*>::value>>
  SharedPointer(SharedPointer<U>&& other) noexcept : Base() {
    this->ptr_ = other.detach();
  }

  // Type-tested downcast: null when `other` holds an object of another class.
  template <class U>
  static SharedPointer cast(const SharedPointer<U>& other) {
    return SharedPointer(dynamic_cast<T*>(other.get()));
  }

  // Releases the pointee, if any, and leaves the handle null.
  void clear() { this->release(); }

  // Hands the reference over to the caller without touching the count.
  T* detach() {
    T* p = this->ptr_;
    this->ptr_ = nullptr;
    return p;
  }

  T* operator->() const { return this->ptr_; }
  T& operator*() const { return *this->ptr_; }
  explicit operator bool() const { return this->ptr_ != nullptr; }
  bool isNull() const { return this->ptr_ == nullptr; }
};

template <class T, class U>
bool operator==(const SharedPointer<T>& a, const SharedPointer<U>& b) {
  return a.get() == b.get();
}
template <class T, class U>
bool operator!=(const SharedPointer<T>& a, const SharedPointer<U>& b) {
  return a.get() != b.get();
}
template <class T>
bool operator==(const SharedPointer<T>& a, std::nullptr_t) { return !a; }
template <class T>
bool operator!=(const SharedPointer<T>& a, std::nullptr_t) { return bool(a); }

// Wraps a freshly made object (count 0) into its first handle.
template <class T>
SharedPointer<T> adopt(T* object) { return SharedPointer<T>(object); }

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_SHAREDPOINTER_H
