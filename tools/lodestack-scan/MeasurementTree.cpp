#include "MeasurementTree.h"

#include <array>
#include <charconv>
#include <cmath>
#include <ctime>
#include <type_traits>
#include <utility>

#include <lodestack/schema/Cdma.h>
#include <lodestack/schema/EUtra.h>
#include <lodestack/schema/Geran.h>
#include <lodestack/schema/Gnss.h>
#include <lodestack/schema/MeasurementContainer.h>
#include <lodestack/schema/UtraFdd.h>
#include <lodestack/schema/UtraTdd.h>
#include <lodestack/schema/Wlan.h>
#include <lodestack/schema/utility/Utility.h>

namespace lodestack {
namespace scan {
namespace {

using gom::GenericObject;
using gom::SharedPointer;
using namespace schema;

// The schema names of a record's fields, in the order of its field table.
template <class R>
struct FieldNames;

#define LODESTACK_SCAN_FIELD_NAMES(Record, ...)                                            \
  template <>                                                                              \
  struct FieldNames<Record> {                                                              \
    static constexpr std::array<const char*, Record::Table::kFieldCount> value{__VA_ARGS__}; \
  };

LODESTACK_SCAN_FIELD_NAMES(GeranCellDn, "mcc", "mnc", "lac", "cid")
LODESTACK_SCAN_FIELD_NAMES(UtraCellDn, "mcc", "mnc", "ucid")
LODESTACK_SCAN_FIELD_NAMES(EUtraCellDn, "mcc", "mnc", "ucid")
LODESTACK_SCAN_FIELD_NAMES(CdmaCellDn, "sid", "nid", "bsid")
LODESTACK_SCAN_FIELD_NAMES(GeranFrequencyInfo, "bsic", "arfcn")
LODESTACK_SCAN_FIELD_NAMES(UtraFddFrequencyInfo, "uarfcnDl", "pcpich")
LODESTACK_SCAN_FIELD_NAMES(UtraTddFrequencyInfo, "uarfcn", "cellParam")
LODESTACK_SCAN_FIELD_NAMES(EUtraFrequencyInfo, "earfcn", "pci")
LODESTACK_SCAN_FIELD_NAMES(CdmaFrequencyInfo)
LODESTACK_SCAN_FIELD_NAMES(GeranNwMeasurement, "frequencyInfo", "lac", "cid", "rxLevel")
LODESTACK_SCAN_FIELD_NAMES(UtraFddNwMeasurement, "frequencyInfo", "uarfcnUl", "utraCarrierRssi",
                           "ucid", "ecNo", "rscp", "pathloss")
LODESTACK_SCAN_FIELD_NAMES(UtraTddNwMeasurement, "frequencyInfo", "utraCarrierRssi", "ucid",
                           "rscp", "pathloss")
LODESTACK_SCAN_FIELD_NAMES(EUtraNwMeasurement, "frequencyInfo", "tac", "rsrp", "rsrq", "ucid")
LODESTACK_SCAN_FIELD_NAMES(CdmaNwMeasurement, "frequencyInfo")
LODESTACK_SCAN_FIELD_NAMES(GeranServingCellMeasurement, "timingAdvance", "frequency",
                           "nwMeasurement")
LODESTACK_SCAN_FIELD_NAMES(UtraFddServingCellMeasurement, "lac", "nwMeasurement")
LODESTACK_SCAN_FIELD_NAMES(UtraTddServingCellMeasurement, "lac", "timingAdvance",
                           "nwMeasurement")
LODESTACK_SCAN_FIELD_NAMES(EUtraServingCellMeasurement, "nwMeasurement", "timingAdvance")
LODESTACK_SCAN_FIELD_NAMES(CdmaServingCellMeasurement, "nwMeasurement")
LODESTACK_SCAN_FIELD_NAMES(WlanDn, "bssid")
LODESTACK_SCAN_FIELD_NAMES(WlanApMeasurement, "ssid", "rxLevel", "txLevel", "rssi", "distance",
                           "distanceUncertainty", "band", "apLatitude", "apLongitude")
LODESTACK_SCAN_FIELD_NAMES(Coverage, "latitude", "longitude", "majorAxis", "minorAxis", "angle",
                           "altitude", "altitudeUncertainty", "horizontalCepUncertainty")
LODESTACK_SCAN_FIELD_NAMES(GnssMeasurementData, "speed", "speedUncertainty", "course",
                           "courseUncertainty")

#undef LODESTACK_SCAN_FIELD_NAMES

template <class R>
Json recordTree(const R& record);

// A float as the shortest decimal that reads back as the same float, so
// that 12.3f shows as 12.3 rather than as its exact double.
double readable(float v) {
  char text[32];
  const std::to_chars_result r = std::to_chars(text, text + sizeof text, v);
  double d = v;
  std::from_chars(text, r.ptr, d);
  return d;
}

template <class T>
Json fieldValue(const T& v) {
  if constexpr (std::is_same<T, float>::value) {
    return readable(v);
  } else if constexpr (std::is_floating_point<T>::value) {
    return v;
  } else if constexpr (std::is_signed<T>::value) {
    return static_cast<long long>(v);
  } else {
    return static_cast<unsigned long long>(v);
  }
}
Json fieldValue(const Bssid& v) { return bssidText(v.bytes, v.length); }
template <class R>
Json fieldValue(const SharedPointer<R>& v) {
  return v ? recordTree(*v) : Json();
}

// Adds each present field of a field table under its name.
template <class R, class Table, std::size_t... I>
void addFields(Json& out, const Table& table, std::index_sequence<I...>) {
  [[maybe_unused]] const auto add = [&](auto index) {
    constexpr std::size_t i = decltype(index)::value;
    if (table.presenceMask() & Table::template bitOf<i>()) {
      out[FieldNames<R>::value[i]] = fieldValue(table.template field<i>());
    }
  };
  (add(std::integral_constant<std::size_t, I>()), ...);
}
template <class R, class Table = typename R::Table>
void addFields(Json& out, const Table& table) {
  addFields<R>(out, table, std::make_index_sequence<Table::kFieldCount>());
}

// Moves the members of the object under `key` up into `out`.
void hoist(Json& out, const char* key) {
  const auto nested = out.find(key);
  if (nested == out.end() || !nested->is_object()) return;
  Json members = std::move(*nested);
  out.erase(key);
  for (auto& [name, value] : members.items()) out[name] = std::move(value);
}

void toDegrees(Json& out, const char* key, double (*decode)(int)) {
  const auto coded = out.find(key);
  if (coded == out.end()) return;
  *coded = std::round(decode(coded->get<int>()) * 1e7) / 1e7;
}

template <class R>
Json recordTree(const R& record) {
  Json out = Json::object();
  addFields<R>(out, record);
  // A serving cell measurement's delegated values live in its network
  // measurement; shown together they read as the one cell they describe.
  hoist(out, "nwMeasurement");
  return out;
}

// The record a present property holds; a record of another class means
// the tree is not what the schema describes.
template <class R>
const R& required(const SharedPointer<R>& record) {
  if (!record) throw WrongObjectType;
  return *record;
}

void addTime(Json& out, const char* key, unsigned int seconds) { out[key] = isoTime(seconds); }

template <class M>
SharedPointer<M> wrap(const SharedPointer<GenericObject>& object) {
  SharedPointer<M> m = M::create(object);
  if (!m) throw WrongObjectType;
  return m;
}

template <class M>
Json cellTree(const SharedPointer<GenericObject>& object) {
  const SharedPointer<M> m = wrap<M>(object);
  Json out = Json::object();
  if (m->valueExists(M::kDn)) out.update(recordTree(required(m->dn())));
  if (m->valueExists(M::kTimeStamp)) addTime(out, "timeStamp", m->timeStamp());
  if constexpr ((M::kAllFlags & M::kUnreliableStateTimeStamp) != 0) {
    if (m->valueExists(M::kUnreliableStateTimeStamp)) {
      addTime(out, "unreliableStateTimeStamp", m->unreliableStateTimeStamp());
    }
  }
  if (m->valueExists(M::kServingCellMeasurement)) {
    out["servingCellMeasurement"] = recordTree(required(m->servingCellMeasurement()));
  }
  if (m->valueExists(M::kNwMeasurementCollection)) {
    Json list = Json::array();
    for (gom::Variant* item : required(m->nwMeasurementCollection())) {
      SharedPointer<gom::ObjectBase> record;
      if (!item || item->getObjectValue(record) != Ok) throw WrongObjectType;
      list.push_back(recordTree(required(SharedPointer<typename M::NwMeasurement>::cast(record))));
    }
    out["nwMeasurements"] = std::move(list);
  }
  return out;
}

Json wlanTree(const SharedPointer<GenericObject>& object) {
  const SharedPointer<WlanMeasurement> m = wrap<WlanMeasurement>(object);
  Json out = Json::object();
  if (m->valueExists(WlanMeasurement::kDn)) out.update(recordTree(required(m->dn())));
  if (m->valueExists(WlanMeasurement::kTimeStamp)) addTime(out, "timeStamp", m->timeStamp());
  if (m->valueExists(WlanMeasurement::kWlanApMeasurement)) {
    out.update(recordTree(required(m->wlanApMeasurement())));
    // The access point's position, read in the schema's coordinate coding.
    toDegrees(out, "apLatitude", Utility::wgs84Latitude);
    toDegrees(out, "apLongitude", Utility::wgs84Longitude);
  }
  return out;
}

Json gnssTree(const SharedPointer<GenericObject>& object) {
  const SharedPointer<GnssMeasurement> m = wrap<GnssMeasurement>(object);
  Json out = Json::object();
  if (m->valueExists(GnssMeasurement::kTimeStamp)) addTime(out, "timeStamp", m->timeStamp());
  if (m->valueExists(GnssMeasurement::kMeasurementData)) {
    const GnssMeasurementData& data = required(m->measurementData());
    addFields<Coverage>(out, data.coverage());
    toDegrees(out, "latitude", Utility::wgs84Latitude);
    toDegrees(out, "longitude", Utility::wgs84Longitude);
    addFields<GnssMeasurementData>(out, data);
  }
  return out;
}

struct CollectionKind {
  unsigned int flag;
  unsigned short propertyId;
  const char* name;
  Json (*tree)(const SharedPointer<GenericObject>&);
};

const CollectionKind kCollections[] = {
    {MeasurementContainer::Geran, 300, "geran", cellTree<GeranCellMeasurement>},
    {MeasurementContainer::UtraFdd, 301, "utraFdd", cellTree<UtraFddCellMeasurement>},
    {MeasurementContainer::UtraTdd, 302, "utraTdd", cellTree<UtraTddCellMeasurement>},
    {MeasurementContainer::EUtra, 310, "eutra", cellTree<EUtraCellMeasurement>},
    {MeasurementContainer::Cdma, 312, "cdma", cellTree<CdmaCellMeasurement>},
    {MeasurementContainer::Wlan, 314, "wlan", wlanTree},
    {MeasurementContainer::Gnss, 315, "gnss", gnssTree},
};

}  // namespace

Json measurementTree(const SharedPointer<GenericObject>& root) {
  if (!root) return Json();
  const SharedPointer<MeasurementContainer> container = wrap<MeasurementContainer>(root);
  Json out = Json::object();
  for (const CollectionKind& kind : kCollections) {
    if (!container->valueExists(kind.flag)) continue;
    const SharedPointer<gom::ValueCollection> items =
        container->measurementCollection(kind.propertyId);
    Json list = Json::array();
    for (unsigned int i = 0; i < required(items).size(); ++i) {
      const SharedPointer<GenericObject> item = MeasurementContainer::collectionItem(items, i);
      if (!item) throw WrongObjectType;
      list.push_back(kind.tree(item));
    }
    out[kind.name] = std::move(list);
  }
  return out;
}

Json resultTree(const Result& result) {
  const char* kind = kindName(result.kind);
  Json out = Json::object();
  out["kind"] = kind ? kind : "unknown";
  out["requestId"] = result.requestId;
  out["status"] = statusName(result.status);
  out["measurements"] = measurementTree(result.measurements);
  return out;
}

std::string bssidText(const unsigned char* bytes, unsigned int length) {
  static const char kDigits[] = "0123456789abcdef";
  std::string text;
  for (unsigned int i = 0; i < length; ++i) {
    if (i) text += ':';
    text += kDigits[bytes[i] >> 4];
    text += kDigits[bytes[i] & 0xF];
  }
  return text;
}

std::string isoTime(unsigned int secondsSinceEpoch) {
  const std::time_t t = secondsSinceEpoch;
  std::tm utc{};
  gmtime_r(&t, &utc);
  char text[32];
  std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &utc);
  return text;
}

}  // namespace scan
}  // namespace lodestack
