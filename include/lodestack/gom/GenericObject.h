// GenericObject: the property bag under every measurement. A 16-bit object
// type id (its key) and properties in insertion order, each a variant under
// a 16-bit property id.
//
// A property keeps its kind for life: a setter of another kind returns
// Refused; removeProperty() followed by a new set changes it. Getters return
// NotFound for a missing id and Refused for a kind mismatch. Lookups are
// linear: objects hold a few dozen properties and their order is part of
// equality and of the byte format.
//
// Byte format (little-endian): 2-byte key, 4-byte property count, then the
// variant records. read() replaces key and properties whole or leaves the
// object as it was; a key of 0 ends the read at once, without touching the
// object (writers never use key 0). Nesting is bounded by
// Variant::kMaxNestingDepth in reading, writing, clone() and ==, so an object
// that holds itself (never detected; it leaks) fails to write and clones to
// null, and == answers false where it would have to look deeper.
//
// Objects are reference counted (see SharedPointer) and belong to one thread
// at a time. Factories return null when memory is exhausted.
#ifndef LODESTACK_GOM_GENERICOBJECT_H
#define LODESTACK_GOM_GENERICOBJECT_H

#include <cstddef>
#include <new>
#include <vector>

#include "lodestack/gom/Collection.h"
#include "lodestack/gom/Variant.h"

namespace lodestack {
namespace gom {

class LODESTACK_EXPORT GenericObject : public ReferenceCountable,
                                       public ISerializable {
 public:
  // Property arrays of the usual small sizes come from a per-thread cache of
  // blocks; larger ones from the general allocator.
  template <class T>
  struct PropertyAllocator {
    using value_type = T;
    PropertyAllocator() = default;
    template <class U>
    PropertyAllocator(const PropertyAllocator<U>&) {}
    T* allocate(std::size_t n) {
      return static_cast<T*>(allocateBlock(n * sizeof(T)));
    }
    void deallocate(T* p, std::size_t n) { releaseBlock(p, n * sizeof(T)); }
    bool operator==(const PropertyAllocator&) const { return true; }
    bool operator!=(const PropertyAllocator&) const { return false; }
  };
  using PropertyStore = std::vector<InternalVariant, PropertyAllocator<InternalVariant>>;

  // Nodes come from a per-thread cache of blocks; see the source.
  static void* operator new(std::size_t size);
  static void* operator new(std::size_t size, const std::nothrow_t&) noexcept;
  static void* operator new(std::size_t, void* place) noexcept { return place; }
  static void operator delete(void* block, std::size_t size) noexcept;

  static SharedPointer<GenericObject> create(unsigned short key);
  // Same key and the same properties, in order; nested strings, objects and
  // collections are shared with the source, not copied.
  static SharedPointer<GenericObject> create(const GenericObject& source);
  static SharedPointer<GenericObject> create(const SharedPointer<GenericObject>& source);
  // A new object filled by read(); null when reading fails.
  static SharedPointer<GenericObject> create(IStream& stream);
  // A deep copy: nested objects are cloned too.
  SharedPointer<GenericObject> clone() const;

  unsigned short key() const { return key_; }

  Status getUint8Property(unsigned short id, unsigned char& v) const;
  Status getInt8Property(unsigned short id, signed char& v) const;
  Status getUint16Property(unsigned short id, unsigned short& v) const;
  Status getInt16Property(unsigned short id, short& v) const;
  Status getUint32Property(unsigned short id, unsigned int& v) const;
  Status getInt32Property(unsigned short id, int& v) const;
  Status getUint64Property(unsigned short id, unsigned long long& v) const;
  Status getInt64Property(unsigned short id, long long& v) const;
  Status getFloatProperty(unsigned short id, float& v) const;
  Status getDoubleProperty(unsigned short id, double& v) const;
  Status getBooleanProperty(unsigned short id, bool& v) const;
  Status getStringProperty(unsigned short id, SharedPointer<CharacterData>& v) const;
  Status getGenericObjectProperty(unsigned short id, SharedPointer<GenericObject>& v) const;
  Status getObjectProperty(unsigned short id, SharedPointer<ObjectBase>& v) const;
  Status getCollectionProperty(unsigned short id, SharedPointer<ValueCollection>& v) const;

  // Update the property in place when it exists (Refused on a kind
  // mismatch), else append it (OutOfMemory when the store cannot grow).
  Status setUint8Property(unsigned short id, unsigned char v);
  Status setInt8Property(unsigned short id, signed char v);
  Status setUint16Property(unsigned short id, unsigned short v);
  Status setInt16Property(unsigned short id, short v);
  Status setUint32Property(unsigned short id, unsigned int v);
  Status setInt32Property(unsigned short id, int v);
  Status setUint64Property(unsigned short id, unsigned long long v);
  Status setInt64Property(unsigned short id, long long v);
  Status setFloatProperty(unsigned short id, float v);
  Status setDoubleProperty(unsigned short id, double v);
  Status setBooleanProperty(unsigned short id, bool v);
  Status setStringProperty(unsigned short id, const SharedPointer<CharacterData>& v);
  Status setGenericObjectProperty(unsigned short id, const SharedPointer<GenericObject>& v);
  Status setObjectProperty(unsigned short id, const SharedPointer<ObjectBase>& v);
  Status setCollectionProperty(unsigned short id, const SharedPointer<ValueCollection>& v);

  // Copies the stored variant (key included; objects shared) into out.
  Status getProperty(unsigned short id, Variant& out) const;
  // Replaces the stored variant by a copy of v under `id`, or appends one.
  // Refused when the stored variant is of another kind.
  Status setProperty(unsigned short id, const Variant& v);

  // The stored variant, or null. The pointer is valid until the next
  // property is added or removed.
  InternalVariant* findProperty(unsigned short id) { return findPropertyImpl(id); }
  const InternalVariant* findProperty(unsigned short id) const { return findPropertyImpl(id); }
  bool propertyExists(unsigned short id) const { return findPropertyImpl(id) != nullptr; }
  unsigned int propertyCount() const { return static_cast<unsigned int>(properties_.size()); }
  // The properties in order. Valid until a property is added or removed.
  const PropertyStore& properties() const { return properties_; }

  // Erases the property; those behind it move up one place. The iteration
  // cursor is deliberately left where it stands, so an iteration that
  // removes the current property skips the one after it.
  bool removeProperty(unsigned short id);

  // Iteration over property ids in insertion order; these move a cursor
  // kept in the object, hence not const.
  bool getFirstKey(unsigned short& id);
  bool getNextKey(unsigned short& id);

  // Same key and the same properties in the same order (values by content).
  bool operator==(const GenericObject& other) const;
  bool operator!=(const GenericObject& other) const { return !(*this == other); }
  void dump() const;

  bool write(IStream& stream) const override;
  bool read(IStream& stream) override;

 protected:
  GenericObject();
  explicit GenericObject(unsigned short key);
  ~GenericObject() override;

 private:
  friend class Variant;  // writes a nested object's header with its own
  bool writeProperties(IStream& stream) const;
  InternalVariant* findPropertyImpl(unsigned short id) const;
  template <class T, Status (Variant::*Get)(T&) const>
  Status getTyped(unsigned short id, T& v) const;
  template <class T, Status (Variant::*Set)(T)>
  Status setTyped(unsigned short id, T v);
  Status appendProperty(InternalVariant&& v);
  static bool append(PropertyStore& store, InternalVariant&& v);

  // Throws std::bad_alloc on exhaustion, as std::vector expects.
  static void* allocateBlock(std::size_t bytes);
  static void releaseBlock(void* block, std::size_t bytes) noexcept;

  static const std::size_t kNoCursor = static_cast<std::size_t>(-1);

  unsigned short key_;
  // Held directly rather than behind its own handle: nothing ever shares a
  // property store, and it saves an allocation per object.
  PropertyStore properties_;
  std::size_t cursor_;
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_GENERICOBJECT_H
