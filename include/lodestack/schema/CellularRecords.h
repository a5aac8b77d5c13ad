// The record kinds every cellular technology repeats, as templates over the
// value-record conventions of Record.h. A technology's header declares its
// records over these with its own field tables and accessor names:
//
//   FrequencyInfoRecord           two values, both present when constructed
//   NwMeasurementRecord           frequencyInfo (bit 1) plus the technology's
//                                 measured values; one cell heard
//                                 (a FrequencyInfoHolder)
//   ServingCellMeasurementRecord  holds the serving cell as a network
//                                 measurement and delegates some properties
//                                 to it (see Via)
//   NeighborCellRecord            frequencyInfo (bit 1), coverage (bit 2) and
//                                 the technology's extras
//   ServingCell                   a cell description: dn (bit 1), coverage
//                                 (bit 2) and its neighbour cells
//
// Records are reference counted and used by one thread at a time.
#ifndef LODESTACK_SCHEMA_CELLULARRECORDS_H
#define LODESTACK_SCHEMA_CELLULARRECORDS_H

#include "lodestack/gom/ObjectCollection.h"
#include "lodestack/schema/Area.h"

namespace lodestack {
namespace schema {

template <class Self, unsigned short TypeId, class T1, class T2>
class LODESTACK_EXPORT FrequencyInfoRecord
    : public Record<Self, TypeId, FieldTable<unsigned char, Field<T1, 1>, Field<T2, 2>>> {
  using Base = Record<Self, TypeId, FieldTable<unsigned char, Field<T1, 1>, Field<T2, 2>>>;

 public:
  using Table = typename Base::Table;
  FrequencyInfoRecord() = default;
  FrequencyInfoRecord(const T1& first, const T2& second) { this->setFields(first, second); }
  using Base::create;
  static gom::SharedPointer<Self> create(const T1& first, const T2& second) {
    return Base::createWith(first, second);
  }
};

// A record whose first property is the carrier it was heard on:
// frequencyInfo (bit 1), then Extra.
template <class Self, unsigned short TypeId, class FrequencyInfo, class... Extra>
class LODESTACK_EXPORT FrequencyInfoHolder
    : public Record<Self, TypeId,
                    FieldTable<unsigned char, Field<gom::SharedPointer<FrequencyInfo>, 1>,
                               Extra...>> {
  using Base = Record<Self, TypeId,
                      FieldTable<unsigned char, Field<gom::SharedPointer<FrequencyInfo>, 1>,
                                 Extra...>>;

 public:
  using Table = typename Base::Table;
  using Base::create;
  // With frequencyInfo set (mask 1).
  static gom::SharedPointer<Self> create(const gom::SharedPointer<FrequencyInfo>& frequencyInfo) {
    return Base::createWith(frequencyInfo);
  }

  LODESTACK_RECORD_PROPERTY(0, frequencyInfo, setFrequencyInfo)
};

// One cell heard: frequencyInfo (bit 1) plus the technology's values.
template <class Self, unsigned short TypeId, class FrequencyInfo, class... Extra>
using NwMeasurementRecord = FrequencyInfoHolder<Self, TypeId, FrequencyInfo, Extra...>;

// A neighbour as a cell description: frequencyInfo (bit 1), coverage (bit 2),
// then the technology's extras.
template <class Self, unsigned short TypeId, class FrequencyInfo, class... Extra>
class LODESTACK_EXPORT NeighborCellRecord
    : public FrequencyInfoHolder<Self, TypeId, FrequencyInfo, Field<gom::SharedPointer<Area>, 2>,
                                 Extra...> {
  using Base = FrequencyInfoHolder<Self, TypeId, FrequencyInfo,
                                   Field<gom::SharedPointer<Area>, 2>, Extra...>;

 public:
  using Table = typename Base::Table;
  LODESTACK_RECORD_PROPERTY(1, coverage, setCoverage)
};

// A delegated property of a serving cell measurement: presence bit Bit of
// the serving record stands for field NwField of its network measurement.
template <unsigned int Bit, std::size_t NwField>
struct Via {
  static constexpr unsigned int bit = Bit;
  static constexpr std::size_t nwField = NwField;
};

// A serving cell measurement: its own fields (Table, one of which holds the
// SharedPointer<Nw>) plus delegated properties (Vias) that have no field of
// their own:
//  - valueExists of a delegated bit is true when the network measurement
//    exists and has the corresponding bit; unset of it unsets that bit;
//  - its getter reads the network measurement (a default value without
//    one); its setter first creates and stores an empty network
//    measurement when none is held (OutOfMemory when that fails).
// Delegated bits never enter the record's own mask, so its bytes and its
// equality see them through the network measurement only.
template <class Self, unsigned short TypeId, class Nw, class TableT, class... Vias>
class LODESTACK_EXPORT ServingCellMeasurementRecord : public Record<Self, TypeId, TableT> {
  using Base = Record<Self, TypeId, TableT>;

 public:
  using Table = TableT;
  using NwMeasurement = Nw;
  using Mask = unsigned char;
  static constexpr std::size_t kNwField = TableT::template indexOf<gom::SharedPointer<Nw>>();
  static_assert(kNwField < TableT::kFieldCount, "the table must hold the network measurement");
  static constexpr Mask kViaBits = static_cast<Mask>((0u | ... | Vias::bit));

  bool valueExists(Mask mask) const {
    return Table::valueExists(static_cast<Mask>(mask & ~kViaBits)) &&
           (true && ... && viaExists<Vias>(mask));
  }
  void unset(Mask mask) {
    Table::unset(static_cast<Mask>(mask & ~kViaBits));
    (unsetVia<Vias>(mask), ...);
  }

  const gom::SharedPointer<Nw>& nwMeasurement() const { return this->template field<kNwField>(); }
  // Refused (6) for an empty pointer, which changes nothing.
  Status setNwMeasurement(const gom::SharedPointer<Nw>& nw) {
    return nw ? this->template setField<kNwField>(nw) : Refused;
  }

 protected:
  template <std::size_t NwField>
  using ViaType = typename Nw::Table::template TypeAt<NwField>;

  // One delegated property V: present unless `mask` names it and the
  // network measurement lacks it; unset there when `mask` names it.
  template <class V>
  bool viaExists(Mask mask) const {
    const gom::SharedPointer<Nw>& nw = nwMeasurement();
    return !(mask & V::bit) || (nw && nw->valueExists(Nw::Table::template bitOf<V::nwField>()));
  }
  template <class V>
  void unsetVia(Mask mask) {
    const gom::SharedPointer<Nw>& nw = nwMeasurement();
    if ((mask & V::bit) && nw) nw->unset(Nw::Table::template bitOf<V::nwField>());
  }
  template <std::size_t NwField>
  ViaType<NwField> via() const {
    const gom::SharedPointer<Nw>& nw = nwMeasurement();
    return nw ? nw->template field<NwField>() : ViaType<NwField>();
  }
  template <std::size_t NwField>
  Status setVia(const ViaType<NwField>& v) {
    if (!nwMeasurement()) {
      gom::SharedPointer<Nw> nw = Nw::create();
      if (!nw) return OutOfMemory;
      (void)setNwMeasurement(nw);
    }
    return nwMeasurement()->template setField<NwField>(v);
  }
};

// A getter and setter pair for a delegated property: field `nwField` of the
// held network measurement (see ServingCellMeasurementRecord).
#define LODESTACK_VIA_PROPERTY(nwField, name, setter)                    \
  ViaType<nwField> name() const { return this->template via<nwField>(); } \
  ::lodestack::Status setter(const ViaType<nwField>& v) { return this->template setVia<nwField>(v); }

// A cell description: dn (bit 1) and coverage (bit 2) under the value-record
// conventions, then its neighbour cells. Traits names Dn, NeighborCell and
// kTypeId. Bytes: the record's, followed by the neighbour collection (a
// 4-byte count and each neighbour's bytes, see ObjectCollection). Equality
// and copies include the neighbours, item by item.
template <class Traits>
class LODESTACK_EXPORT ServingCell
    : public Record<ServingCell<Traits>, Traits::kTypeId,
                    FieldTable<unsigned char, Field<gom::SharedPointer<typename Traits::Dn>, 1>,
                               Field<gom::SharedPointer<Area>, 2>>> {
  using Base = Record<ServingCell<Traits>, Traits::kTypeId,
                      FieldTable<unsigned char, Field<gom::SharedPointer<typename Traits::Dn>, 1>,
                                 Field<gom::SharedPointer<Area>, 2>>>;

 public:
  using Table = typename Base::Table;
  using Dn = typename Traits::Dn;
  using NeighborCell = typename Traits::NeighborCell;
  using Neighbors = gom::ObjectCollection<NeighborCell>;

  using Base::create;
  // With dn set (mask 1).
  static gom::SharedPointer<ServingCell> create(const gom::SharedPointer<Dn>& dn) {
    return Base::createWith(dn);
  }

  LODESTACK_RECORD_PROPERTY(0, dn, setDn)
  LODESTACK_RECORD_PROPERTY(1, coverage, setCoverage)

  // The neighbour list, owned by the cell.
  Neighbors& neighbors() { return neighbors_; }
  const Neighbors& currentNeighbors() const { return neighbors_; }

  bool writeTail(IStream& s) const { return neighbors_.write(s); }
  bool readTail(IStream& s) { return neighbors_.read(s); }
  bool tailEqual(const ServingCell& other) const { return neighbors_ == other.neighbors_; }
  bool copyTail(const ServingCell& other) {
    clearTail();
    for (const gom::SharedPointer<NeighborCell>& n : other.neighbors_) {
      gom::SharedPointer<NeighborCell> copy = NeighborCell::create(n);
      if (!copy || neighbors_.add(copy) != Ok) return false;
    }
    return true;
  }
  void clearTail() { neighbors_ = Neighbors(); }

 private:
  Neighbors neighbors_;
};

template <class DnT, class NeighborCellT, unsigned short TypeId>
struct LODESTACK_EXPORT ServingCellTraits {
  using Dn = DnT;
  using NeighborCell = NeighborCellT;
  static constexpr unsigned short kTypeId = TypeId;
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_CELLULARRECORDS_H
