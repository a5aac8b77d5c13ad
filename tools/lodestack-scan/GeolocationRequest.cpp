#include "GeolocationRequest.h"

#include <optional>
#include <set>
#include <string>
#include <utility>

#include <lodestack/gom/CharacterData.h>
#include <lodestack/radioadaptation/ConverterOxel.h>
#include <lodestack/schema/Wlan.h>

namespace lodestack {
namespace scan {
namespace {

using gom::SharedPointer;
using schema::MeasurementContainer;
using schema::WlanApMeasurement;
using schema::WlanDn;
using schema::WlanMeasurement;

std::optional<long long> number(const Json& object, const char* key) {
  const auto it = object.find(key);
  if (it == object.end() || !it->is_number_integer()) return std::nullopt;
  return it->get<long long>();
}

// A cell id of 0 is what the measurement library reports for a neighbour
// whose id it did not read (UTRA neighbours always carry one).
std::optional<long long> cellIdOf(const Json& object, const char* key) {
  const std::optional<long long> id = number(object, key);
  return id && *id != 0 ? id : std::nullopt;
}

// GSM reports the received level as RXLEV 0-63, which stands for
// -110 dBm and below up to -48 dBm and above in 1 dB steps: dBm = RXLEV - 110.
std::optional<long long> gsmDbm(const Json& cell) {
  const std::optional<long long> rxLevel = number(cell, "rxLevel");
  return rxLevel ? std::optional<long long>(*rxLevel - 110) : std::nullopt;
}
// UTRA cells carry RSCP in dBm.
std::optional<long long> rscpDbm(const Json& cell) { return number(cell, "rscp"); }
// The E-UTRA levels travel in the measurement library's own encoding, which
// this request does not convert.
std::optional<long long> noDbm(const Json&) { return std::nullopt; }

// How one technology's measurements give cell towers.
struct RadioKind {
  const char* collection;  // in the measurement tree
  const char* radioType;   // in the request
  const char* cellIdKey;   // the cell id, in the identity and in neighbours
  const char* areaKey;     // the location (or tracking) area code
  std::optional<long long> (*signalDbm)(const Json&);
  bool timingAdvance;      // whether the serving cell's value means the same
};

const RadioKind kRadioKinds[] = {
    {"geran", "gsm", "cid", "lac", gsmDbm, true},
    {"utraFdd", "wcdma", "ucid", "lac", rscpDbm, false},
    // The services know no TD-SCDMA type; it is a UTRA mode like WCDMA.
    {"utraTdd", "wcdma", "ucid", "lac", rscpDbm, false},
    {"eutra", "lte", "ucid", "tac", noDbm, true},
};

class TowerList {
 public:
  void add(const RadioKind& kind, const Json& cell, const Json& serving) {
    const std::optional<long long> cellId = cellIdOf(cell, kind.cellIdKey);
    if (!cellId) return;
    const Json* sameCell = nullptr;
    for (const Json& nw : neighbours(cell)) {
      if (number(nw, kind.cellIdKey) == cellId) sameCell = &nw;
    }
    std::optional<long long> area = number(cell, kind.areaKey);
    if (!area) area = number(serving, kind.areaKey);
    std::optional<long long> dbm = kind.signalDbm(serving);
    if (!dbm && sameCell) dbm = kind.signalDbm(*sameCell);
    Json tower = towerOf(kind, cell, area, *cellId, dbm);
    if (kind.timingAdvance && serving.contains("timingAdvance")) {
      tower["timingAdvance"] = serving["timingAdvance"];
    }
    push(kind, *cellId, std::move(tower));

    // Neighbours heard in the serving cell's report belong to its network.
    for (const Json& nw : neighbours(cell)) {
      const std::optional<long long> id = cellIdOf(nw, kind.cellIdKey);
      if (id && &nw != sameCell) {
        push(kind, *id, towerOf(kind, cell, number(nw, kind.areaKey), *id, kind.signalDbm(nw)));
      }
    }
  }

  Json take() { return std::move(towers_); }

 private:
  static const Json& neighbours(const Json& cell) {
    static const Json kNone = Json::array();
    const auto it = cell.find("nwMeasurements");
    return it == cell.end() ? kNone : *it;
  }

  static Json towerOf(const RadioKind& kind, const Json& cell, std::optional<long long> area,
                      long long cellId, std::optional<long long> dbm) {
    Json tower = Json::object();
    tower["radioType"] = kind.radioType;
    if (cell.contains("mcc")) tower["mobileCountryCode"] = cell["mcc"];
    if (cell.contains("mnc")) tower["mobileNetworkCode"] = cell["mnc"];
    if (area) tower["locationAreaCode"] = *area;
    tower["cellId"] = cellId;
    if (dbm) tower["signalStrength"] = *dbm;
    return tower;
  }

  // One entry per cell, the first (the serving cell's) winning.
  void push(const RadioKind& kind, long long cellId, Json tower) {
    if (seen_.emplace(kind.radioType, cellId).second) towers_.push_back(std::move(tower));
  }

  Json towers_ = Json::array();
  std::set<std::pair<std::string, long long>> seen_;
};

Json treeOf(const SharedPointer<MeasurementContainer>& container) {
  return container ? measurementTree(container->wrappedObject()) : Json::object();
}

template <class R>
const R& required(const SharedPointer<R>& record) {
  if (!record) throw WrongObjectType;
  return *record;
}

// The network name the measurement source attached to the identity; empty
// when it did not know it.
std::string ssidOf(const WlanDn& dn) {
  SharedPointer<gom::CharacterData> ssid;
  const SharedPointer<gom::GenericObject>& extension = dn.extensionReference();
  if (!extension ||
      extension->getStringProperty(radioadaptation::ConverterOxel::kSsidProperty, ssid) != Ok ||
      !ssid) {
    return std::string();
  }
  return std::string(ssid->data(), ssid->length());
}

// What the services ask clients to leave out: networks whose owners opted
// out by a name ending in "_nomap", and locally administered addresses
// (second-lowest bit of the first byte), which are random or reassigned
// and locate nothing.
bool optedOut(const unsigned char* mac, const std::string& ssid) {
  static const std::string kOptOut = "_nomap";
  const bool noMap = ssid.size() >= kOptOut.size() &&
                     ssid.compare(ssid.size() - kOptOut.size(), kOptOut.size(), kOptOut) == 0;
  return noMap || (mac[0] & 0x02) != 0;
}

// Read from the records rather than the measurement tree: the network name
// lives in the identity's in-memory extension, which the tree leaves out.
Json accessPoints(const SharedPointer<MeasurementContainer>& wlan) {
  Json list = Json::array();
  if (!wlan || !wlan->valueExists(MeasurementContainer::Wlan)) return list;
  const SharedPointer<gom::ValueCollection> items = wlan->wlanMeasurementCollection();
  for (unsigned int i = 0; i < required(items).size(); ++i) {
    const SharedPointer<WlanMeasurement> m =
        WlanMeasurement::create(MeasurementContainer::collectionItem(items, i));
    if (!m) throw WrongObjectType;
    if (!m->valueExists(WlanMeasurement::kDn)) continue;
    const WlanDn& dn = required(m->dn());
    unsigned int length = 0;
    const unsigned char* mac = dn.getBssid(length);
    if (length != 6 || optedOut(mac, ssidOf(dn))) continue;  // 8 bytes: no MAC address
    Json entry = Json::object();
    entry["macAddress"] = bssidText(mac, length);
    if (m->valueExists(WlanMeasurement::kWlanApMeasurement)) {
      const WlanApMeasurement& ap = required(m->wlanApMeasurement());
      if (ap.valueExists(WlanApMeasurement::RxLevel)) {
        entry["signalStrength"] = int(ap.rxLevel());  // dBm
      }
    }
    list.push_back(std::move(entry));
  }
  return list;
}

}  // namespace

Json geolocationRequest(const SharedPointer<MeasurementContainer>& cellular,
                        const SharedPointer<MeasurementContainer>& wlan) {
  const Json cells = treeOf(cellular);
  TowerList towers;
  for (const RadioKind& kind : kRadioKinds) {
    const auto list = cells.find(kind.collection);
    if (list == cells.end()) continue;
    for (const Json& cell : *list) {
      towers.add(kind, cell, cell.value("servingCellMeasurement", Json::object()));
    }
  }

  Json request = Json::object();
  request["cellTowers"] = towers.take();
  request["wifiAccessPoints"] = accessPoints(wlan);
  return request;
}

std::string whyNotLocatable(const Json& request) {
  if (!request["cellTowers"].empty() || request["wifiAccessPoints"].size() >= 2) {
    return std::string();
  }
  return "no request sent: fewer than two access points and no cell";
}

void RoundMeasurements::take(const Result& result) {
  const bool kept = result.kind == IMeasurementsObserver::Cellular ||
                    result.kind == IMeasurementsObserver::Wlan;
  if (!kept || !isUsable(result.status) || !result.measurements) return;
  SharedPointer<MeasurementContainer> container = MeasurementContainer::create(result.measurements);
  if (!container) throw WrongObjectType;
  (result.kind == IMeasurementsObserver::Cellular ? cellular_ : wlan_) = std::move(container);
}

void RoundMeasurements::clear() {
  cellular_ = nullptr;
  wlan_ = nullptr;
}

}  // namespace scan
}  // namespace lodestack
