// The conventions of the schema's value records, written once.
//
// A value record is a small ObjectBase (cell identity, frequency info,
// network measurement, ...) whose properties are listed in a field table:
// each Field names a value type and the property's presence bit. From the
// table, FieldTable gives the presence mask and the values, and Record gives
// the ObjectBase part:
//  - valueExists(mask): every bit of mask is present (0 is always true);
//  - a setter stores the value, sets its bit and returns Ok, with no range
//    check; a record-valued property set to an empty pointer is absent;
//  - unset(mask) clears bits only; the values keep what they held;
//  - equality: equal masks, then each present property (records by content,
//    numbers by their bit image, so a NaN read back equals itself), then the
//    ObjectBase comparison (key and extension);
//  - bytes: version 1, the mask, then each present field in table order at
//    its own width (a record-valued field as that record's own bytes). A read
//    clears the record first and leaves it cleared when it fails.
//
// A record class is a short declaration over Record: its field table and one
// LODESTACK_RECORD_PROPERTY line per named accessor pair. Records are
// reference counted, created by their static create() functions (null when
// memory is exhausted) and used by one thread at a time.
#ifndef LODESTACK_SCHEMA_RECORD_H
#define LODESTACK_SCHEMA_RECORD_H

#include <cstring>
#include <new>
#include <tuple>
#include <type_traits>
#include <utility>

#include "lodestack/gom/ObjectBase.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace schema {

// One property of a record: its value type and its presence bit.
template <class T, unsigned int Bit>
struct Field {
  using Type = T;
  static constexpr unsigned int bit = Bit;
};

// How one field type travels in bytes, compares and copies.
template <class T, class = void>
struct FieldCodec;

// Numbers travel as their little-endian memory image at their own width.
template <class T>
struct FieldCodec<T, std::enable_if_t<std::is_arithmetic<T>::value>> {
  static bool isSet(const T&) { return true; }
  static bool write(IStream& s, const T& v) {
    unsigned char bytes[sizeof(T)];
    std::memcpy(bytes, &v, sizeof(T));
    return s.write(bytes, sizeof(T)) == sizeof(T);
  }
  static bool read(IStream& s, T& v) {
    unsigned char bytes[sizeof(T)];
    if (s.read(bytes, sizeof(T)) != sizeof(T)) return false;
    std::memcpy(&v, bytes, sizeof(T));
    return true;
  }
  static bool equal(const T& a, const T& b) { return std::memcmp(&a, &b, sizeof(T)) == 0; }
  static bool copy(T& to, const T& from) {
    to = from;
    return true;
  }
};

// A record-valued field: the held record's own bytes (its type is fixed by
// the table, so no type id travels); equal when both are empty or both hold
// equal records; copies are deep.
template <class R>
struct FieldCodec<gom::SharedPointer<R>> {
  static bool isSet(const gom::SharedPointer<R>& v) { return bool(v); }
  static bool write(IStream& s, const gom::SharedPointer<R>& v) { return v && v->write(s); }
  static bool read(IStream& s, gom::SharedPointer<R>& v) {
    gom::SharedPointer<R> record = R::create();
    if (!record || !record->read(s)) return false;
    v = record;
    return true;
  }
  static bool equal(const gom::SharedPointer<R>& a, const gom::SharedPointer<R>& b) {
    return a && b ? *a == *b : !a && !b;
  }
  static bool copy(gom::SharedPointer<R>& to, const gom::SharedPointer<R>& from) {
    to = from ? R::create(from) : gom::SharedPointer<R>();
    return to || !from;
  }
};

// The presence mask (of type Mask) and the values of a field table.
template <class Mask, class... Fields>
class LODESTACK_EXPORT FieldTable {
 public:
  using MaskType = Mask;
  using Values = std::tuple<typename Fields::Type...>;
  template <std::size_t I>
  using TypeAt = std::tuple_element_t<I, Values>;
  static constexpr std::size_t kFieldCount = sizeof...(Fields);
  static constexpr Mask kAllBits = static_cast<Mask>((0u | ... | Fields::bit));

  template <std::size_t I>
  static constexpr Mask bitOf() {
    constexpr unsigned int bits[] = {Fields::bit..., 0u};
    return static_cast<Mask>(bits[I]);
  }

  // The index of the first field of type T; kFieldCount when there is none.
  template <class T>
  static constexpr std::size_t indexOf() {
    constexpr bool match[] = {std::is_same<typename Fields::Type, T>::value..., false};
    for (std::size_t i = 0; i < kFieldCount; ++i) {
      if (match[i]) return i;
    }
    return kFieldCount;
  }

  bool valueExists(Mask mask) const { return (mask_ & mask) == mask; }
  void unset(Mask mask) { mask_ = static_cast<Mask>(mask_ & ~mask); }
  Mask presenceMask() const { return mask_; }

  // The stored value, whether or not its bit is set.
  template <std::size_t I>
  const TypeAt<I>& field() const { return std::get<I>(values_); }
  template <std::size_t I>
  Status setField(const TypeAt<I>& v) {
    std::get<I>(values_) = v;
    if (FieldCodec<TypeAt<I>>::isSet(v)) {
      mask_ = static_cast<Mask>(mask_ | bitOf<I>());
    } else {
      unset(bitOf<I>());
    }
    return Ok;
  }
  // Sets the first sizeof...(V) fields, in table order.
  template <class... V>
  void setFields(const V&... v) {
    setFieldsAt(std::index_sequence_for<V...>(), v...);
  }

  bool fieldsEqual(const FieldTable& other) const {
    return mask_ == other.mask_ &&
           eachField([&](auto i) {
             constexpr std::size_t I = decltype(i)::value;
             return !(mask_ & bitOf<I>()) ||
                    FieldCodec<TypeAt<I>>::equal(field<I>(), other.template field<I>());
           });
  }
  // The mask, then each present field.
  bool writeFields(IStream& s) const {
    return FieldCodec<Mask>::write(s, mask_) && eachField([&](auto i) {
             constexpr std::size_t I = decltype(i)::value;
             return !(mask_ & bitOf<I>()) || FieldCodec<TypeAt<I>>::write(s, field<I>());
           });
  }
  // Reads into a cleared table; on failure the table is left cleared.
  bool readFields(IStream& s) {
    clearFields();
    Mask mask = 0;
    const bool ok = FieldCodec<Mask>::read(s, mask) && eachField([&](auto i) {
                      constexpr std::size_t I = decltype(i)::value;
                      return !(mask & bitOf<I>()) ||
                             FieldCodec<TypeAt<I>>::read(s, std::get<I>(values_));
                    });
    if (!ok) {
      clearFields();
      return false;
    }
    mask_ = mask;
    return true;
  }
  // Deep copy: held records are copied too. False when a copy cannot be made.
  bool copyFields(const FieldTable& other) {
    mask_ = other.mask_;
    return eachField([&](auto i) {
      constexpr std::size_t I = decltype(i)::value;
      return FieldCodec<TypeAt<I>>::copy(std::get<I>(values_), other.template field<I>());
    });
  }
  void clearFields() {
    mask_ = 0;
    values_ = Values();
  }

 private:
  template <class F>
  bool eachField(F&& f) const {
    return eachFieldAt(f, std::make_index_sequence<kFieldCount>());
  }
  template <class F, std::size_t... I>
  static bool eachFieldAt(F& f, std::index_sequence<I...>) {
    return (true && ... && f(std::integral_constant<std::size_t, I>()));
  }
  template <std::size_t... I, class... V>
  void setFieldsAt(std::index_sequence<I...>, const V&... v) {
    (setField<I>(v), ...);
  }

  Mask mask_ = 0;
  Values values_{};
};

// The ObjectBase part of a value record of type id TypeId whose properties
// are Table (a FieldTable, or a class built on one). Self is the record class.
// Self may hide writeTail/readTail/tailEqual/copyTail/clearTail to carry data
// that follows the field table in its bytes.
template <class Self, unsigned short TypeId, class TableT>
class LODESTACK_EXPORT Record : public gom::ObjectBase, public TableT {
 public:
  using Table = TableT;
  using Mask = typename TableT::MaskType;
  static constexpr unsigned short kTypeId = TypeId;
  static constexpr unsigned char kVersion = 1;

  // An empty record; null when memory is exhausted.
  static gom::SharedPointer<Self> create() {
    return gom::SharedPointer<Self>(new (std::nothrow) Self());
  }
  // A deep copy (held records and the extension included); null for an
  // empty source or on exhaustion.
  static gom::SharedPointer<Self> create(const gom::SharedPointer<Self>& source) {
    return source ? copyOf(*source) : gom::SharedPointer<Self>();
  }

  gom::SharedPointer<gom::ObjectBase> clone() const override { return copyOf(self()); }
  bool compare(const gom::ObjectBase* other) const override {
    const Self* record = dynamic_cast<const Self*>(other);
    return record && self() == *record;
  }
  bool operator==(const Self& other) const {
    return this->fieldsEqual(other) && self().tailEqual(other) &&
           gom::ObjectBase::operator==(other);
  }
  bool operator!=(const Self& other) const { return !(*this == other); }

  // Data that follows the field table: none unless Self hides these.
  bool writeTail(IStream&) const { return true; }
  bool readTail(IStream&) { return true; }
  bool tailEqual(const Self&) const { return true; }
  bool copyTail(const Self&) { return true; }
  void clearTail() {}

  bool write(IStream& s) const override {
    return s.writeUint8(kVersion) && this->writeFields(s) && self().writeTail(s);
  }
  bool read(IStream& s) override {
    Self& me = static_cast<Self&>(*this);
    this->clearFields();
    me.clearTail();
    unsigned char version = 0;
    if (s.readUint8(version) && version == kVersion && this->readFields(s) && me.readTail(s)) {
      return true;
    }
    this->clearFields();
    me.clearTail();
    return false;
  }

 protected:
  Record() : gom::ObjectBase(TypeId) {}

  // A new record with its first fields set to the given values.
  template <class... V>
  static gom::SharedPointer<Self> createWith(const V&... v) {
    gom::SharedPointer<Self> record = create();
    if (record) record->setFields(v...);
    return record;
  }

 private:
  const Self& self() const { return static_cast<const Self&>(*this); }
  static gom::SharedPointer<Self> copyOf(const Self& source) {
    gom::SharedPointer<Self> copy = create();
    if (!copy || !copy->copyFields(source) || !copy->copyTail(source) ||
        copy->cloneFrom(source) != Ok) {
      return gom::SharedPointer<Self>();
    }
    return copy;
  }
};

}  // namespace schema
}  // namespace lodestack

// A getter and a setter for field `index` of the record's table, with the
// field's own type: `name()` returns the stored value (whether or not it is
// present; test valueExists first), `setter(v)` stores it and returns Ok.
#define LODESTACK_RECORD_PROPERTY(index, name, setter)                           \
  typename Table::template TypeAt<index> name() const {                          \
    return this->template field<index>();                                        \
  }                                                                              \
  ::lodestack::Status setter(const typename Table::template TypeAt<index>& v) {  \
    return this->template setField<index>(v);                                    \
  }

#endif  // LODESTACK_SCHEMA_RECORD_H
