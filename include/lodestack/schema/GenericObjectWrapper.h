// GenericObjectWrapper: the base of the measurement classes whose data lives
// in a wrapped GenericObject. The wrapper shares the object (it does not copy
// it) and adds typed property access that throws: every failing get or set
// throws the Status value (NotFound 4 for a missing property, Refused 6 for a
// property of another kind, Failed 1 for a wrapper without object). Callers
// test presence first. One thread at a time, like the object it wraps.
#ifndef LODESTACK_SCHEMA_GENERICOBJECTWRAPPER_H
#define LODESTACK_SCHEMA_GENERICOBJECTWRAPPER_H

#include "lodestack/gom/GenericObject.h"
#include "lodestack/gom/ObjectBase.h"
#include "lodestack/gom/ValueCollection.h"

namespace lodestack {

namespace detail {
// The GenericObject accessor pair of one property kind.
template <class T>
struct PropertyAccess;
#define LODESTACK_PROPERTY_ACCESS(T, Kind)                                                 \
  template <>                                                                              \
  struct PropertyAccess<T> {                                                               \
    static Status get(const gom::GenericObject& o, unsigned short id, T& v) {              \
      return o.get##Kind##Property(id, v);                                                 \
    }                                                                                      \
    static Status set(gom::GenericObject& o, unsigned short id, const T& v) {              \
      return o.set##Kind##Property(id, v);                                                 \
    }                                                                                      \
  };
LODESTACK_PROPERTY_ACCESS(unsigned char, Uint8)
LODESTACK_PROPERTY_ACCESS(signed char, Int8)
LODESTACK_PROPERTY_ACCESS(unsigned short, Uint16)
LODESTACK_PROPERTY_ACCESS(short, Int16)
LODESTACK_PROPERTY_ACCESS(unsigned int, Uint32)
LODESTACK_PROPERTY_ACCESS(int, Int32)
LODESTACK_PROPERTY_ACCESS(unsigned long long, Uint64)
LODESTACK_PROPERTY_ACCESS(long long, Int64)
LODESTACK_PROPERTY_ACCESS(float, Float)
LODESTACK_PROPERTY_ACCESS(double, Double)
LODESTACK_PROPERTY_ACCESS(bool, Boolean)
LODESTACK_PROPERTY_ACCESS(gom::SharedPointer<gom::CharacterData>, String)
LODESTACK_PROPERTY_ACCESS(gom::SharedPointer<gom::GenericObject>, GenericObject)
LODESTACK_PROPERTY_ACCESS(gom::SharedPointer<gom::ObjectBase>, Object)
LODESTACK_PROPERTY_ACCESS(gom::SharedPointer<gom::ValueCollection>, Collection)
#undef LODESTACK_PROPERTY_ACCESS
}  // namespace detail

class LODESTACK_EXPORT GenericObjectWrapper : public gom::ReferenceCountable,
                                              public ISerializable {
 public:
  // A wrapper of a new object of the given key (throwing allocation of the
  // wrapper; null when the object cannot be made).
  static gom::SharedPointer<GenericObjectWrapper> create(unsigned short key);
  // A wrapper sharing `object`; throws WrongObjectType (2) when it is null.
  static gom::SharedPointer<GenericObjectWrapper> create(
      const gom::SharedPointer<gom::GenericObject>& object);

  ~GenericObjectWrapper() override;

  // A deep clone of the wrapped object (not a new wrapper); null when there
  // is none or memory is exhausted.
  virtual gom::SharedPointer<gom::GenericObject> clone() const;
  // The wrapped object's byte format; false without an object.
  bool write(IStream& stream) const override;
  bool read(IStream& stream) override;

  // The wrapped object; throws Failed (1) when there is none.
  gom::GenericObject& object();
  const gom::GenericObject& object() const;
  const gom::SharedPointer<gom::GenericObject>& wrappedObject() const { return object_; }
  // The wrapped object's key; throws Failed (1) without one.
  unsigned short key() const { return object().key(); }

  // Throws `status` unless it is Ok. The words ("set"/"get" and the
  // property's name) are for diagnostics and not printed in this build.
  void checkError(Status status, const char* operation, const char* name) const;

  // Typed access to property `id`; throw on any failure (see above).
  template <class T>
  void setProperty(unsigned short id, const T& value, const char* name) {
    checkError(detail::PropertyAccess<T>::set(object(), id, value), "set", name);
  }
  template <class T>
  void getProperty(unsigned short id, T& out, const char* name) const {
    checkError(detail::PropertyAccess<T>::get(object(), id, out), "get", name);
  }

 protected:
  GenericObjectWrapper();
  // Creates the wrapped object; false when that fails.
  bool construct(unsigned short key);
  void construct(const gom::SharedPointer<gom::GenericObject>& object) { object_ = object; }

  gom::SharedPointer<gom::GenericObject> object_;
};

}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_GENERICOBJECTWRAPPER_H
