// Cells from ModemManager 1.20 or later (org.freedesktop.ModemManager1).
//
// Every modem of GetManagedObjects (objects with the ...ModemManager1.Modem
// interface) is asked GetCellInfo; each dictionary of its answer becomes a
// measurement element by its cell-type (u) and serving (b):
//
// - Serving cells: operator-id (s, "MCCMNC") gives country and network
//   code; lac/tac and ci (s, hexadecimal) the location area and cell id.
//   GSM (2) keeps ci and lac when they fit 16 bits, rx-level (u, the RXLEV
//   index 0-63) as the received level and timing-advance (u) when it fits
//   a byte; UMTS (3, WCDMA) and TD-SCDMA (4) take ci as the 28-bit UTRAN
//   cell id and lac; LTE (5) takes ci as the 28-bit E-UTRAN cell id (the
//   element carries the identity only). A serving cell without operator-id
//   (or, for UMTS, TD-SCDMA and LTE, without ci) cannot be named and is
//   left out.
// - Neighbours join the first serving cell of their technology in the same
//   modem's answer (those of a technology without one are left out, as are
//   LTE neighbours, which the LTE element has no place for). GSM: arfcn (u)
//   and base-station-id (s, hexadecimal BSIC) are required, lac, ci and
//   rx-level taken when given. UMTS: uarfcn (u) and psc (u) required; ci,
//   ecio (d, dB) as the CPICH Ec/No index 0-49 (0 below -24 dB, then one
//   step per 0.5 dB), rscp (d, dBm) rounded to -120..-25, path-loss (u, dB)
//   clamped to 46..158. TD-SCDMA: uarfcn and cell-parameter-id required;
//   ci, rscp and path-loss as for UMTS; no carrier RSSI is published.
//   A neighbour's UTRAN cell id is 0 when ModemManager gives no ci.
// - NR (6) and CDMA (1) cells are counted (lastSkippedCells()) and skipped.
//
// Unset values stay unset. A value of another D-Bus type than documented,
// an operator-id that is not 5 or 6 digits, or an id that is not
// hexadecimal fails the measurement; so do no modem, a failed GetCellInfo,
// and modems that report no cell at all.
#include <algorithm>
#include <cctype>
#include <cmath>
#include <ctime>

#include "lodestack/debug/Debug.h"
#include "platform/host/ServiceSource.h"

namespace lodestack {
namespace platform {
namespace host {

namespace {

const BusService kModemManager{"ModemManager", "org.freedesktop.ModemManager1"};
const char* const kModemInterface = "org.freedesktop.ModemManager1.Modem";

enum CellType : std::uint32_t { Cdma = 1, Gsm = 2, Umts = 3, Tdscdma = 4, Lte = 5, Nr = 6 };

std::optional<std::uint32_t> atMost(std::optional<std::uint32_t> value, std::uint32_t max) {
  return value && *value <= max ? value : std::nullopt;
}

std::optional<std::uint32_t> hexadecimal(const Dictionary& cell, const char* key) {
  const auto text = cell.get<std::string>(key);
  if (!text || text->empty()) return std::nullopt;
  if (text->size() > 8 || !std::all_of(text->begin(), text->end(),
                                       [](char c) { return std::isxdigit(static_cast<unsigned char>(c)); }))
    cell.fail(std::string(key) + " \"" + *text + "\" is not hexadecimal");
  return static_cast<std::uint32_t>(std::stoul(*text, nullptr, 16));
}

// Country and network code from "MCCMNC"; false when absent.
bool setOperator(const Dictionary& cell, OxelCellularElement& e) {
  const auto id = cell.get<std::string>("operator-id");
  if (!id || id->empty()) return false;
  if ((id->size() != 5 && id->size() != 6) ||
      !std::all_of(id->begin(), id->end(), [](char c) { return c >= '0' && c <= '9'; }))
    cell.fail("operator-id \"" + *id + "\" is not an MCC and MNC");
  e.setCountryCode(static_cast<unsigned short>(std::stoul(id->substr(0, 3))));
  e.setNetworkId(static_cast<unsigned short>(std::stoul(id->substr(3))));
  return true;
}

int rscpDbm(double dbm) { return std::clamp(static_cast<int>(std::lround(dbm)), -120, -25); }

unsigned char ecNoIndex(double db) {
  if (db < -24) return 0;
  return static_cast<unsigned char>(std::min(49, static_cast<int>(std::floor((db + 24) * 2)) + 1));
}

template <class Neighbour>
void setUtraMeasurements(const Dictionary& cell, Neighbour& n) {
  if (auto ci = atMost(hexadecimal(cell, "ci"), 0x0FFFFFFF)) n.setUcId(*ci);
  if (auto rscp = cell.get<double>("rscp"); rscp && std::isfinite(*rscp)) n.setRscp(rscpDbm(*rscp));
  if (auto loss = cell.get<std::uint32_t>("path-loss"))
    n.setPathloss(static_cast<unsigned char>(std::clamp<std::uint32_t>(*loss, 46, 158)));
}

// The cells of one modem's answer, made into elements.
class ModemCells {
 public:
  ModemCells(const std::string& modem, GVariant* cells) {
    const gsize n = g_variant_n_children(cells);
    reported_ = n > 0;
    // Serving cells first: neighbours may come before theirs in the list.
    for (int pass = 0; pass < 2; ++pass) {
      for (gsize i = 0; i < n; ++i) {
        Variant dict(g_variant_get_child_value(cells, i));
        const Dictionary cell(kModemManager, dict.get(),
                              "cell " + std::to_string(i) + " of " + modem);
        const auto type = cell.get<std::uint32_t>("cell-type");
        if (!type) cell.fail("no cell-type");
        const bool serving = cell.get<bool>("serving").value_or(false);
        if (pass == 0 && serving) addServing(cell, *type);
        if (pass == 1 && !serving) addNeighbour(cell, *type);
        if (pass == 0) count(*type);
      }
    }
  }

  void appendTo(ServiceAnswer& answer) const {
    for (const auto& e : elements_) answer.result.add(e);
    answer.skipped.nr += skipped_.nr;
    answer.skipped.cdma += skipped_.cdma;
  }
  // Whether the modem reported any cell, usable here or not.
  bool reported() const { return reported_; }

 private:
  void count(std::uint32_t type) {
    if (type == Nr) ++skipped_.nr;
    if (type == Cdma) ++skipped_.cdma;
  }

  template <class E>
  std::shared_ptr<E> named(const Dictionary& cell) {
    auto e = std::make_shared<E>();
    if (!setOperator(cell, *e)) return nullptr;
    e->setTimestamp(static_cast<unsigned int>(std::time(nullptr)));
    return e;
  }

  template <class E>
  void addUmtsServing(const Dictionary& cell, std::shared_ptr<E>& first) {
    auto e = named<E>(cell);
    const auto ci = atMost(hexadecimal(cell, "ci"), 0x0FFFFFFF);
    if (!e || !ci) return;
    e->setUcId(*ci);
    if (auto lac = atMost(hexadecimal(cell, "lac"), 0xFFFF))
      e->setLocationAreaCode(static_cast<unsigned short>(*lac));
    add(e, first);
  }

  template <class E, class First>
  void add(const std::shared_ptr<E>& e, First& first) {
    elements_.push_back(e);
    if (!first) first = e;
  }

  void addServing(const Dictionary& cell, std::uint32_t type) {
    switch (type) {
      case Gsm: {
        auto e = named<OxelElementGSM>(cell);
        if (!e) return;
        if (auto lac = atMost(hexadecimal(cell, "lac"), 0xFFFF))
          e->setLocationAreaCode(static_cast<unsigned short>(*lac));
        if (auto ci = atMost(hexadecimal(cell, "ci"), 0xFFFF))
          e->setCellId(static_cast<unsigned short>(*ci));
        if (auto level = atMost(cell.get<std::uint32_t>("rx-level"), 63))
          e->setPowerRx(static_cast<unsigned char>(*level));
        if (auto ta = atMost(cell.get<std::uint32_t>("timing-advance"), 255))
          e->setTimingAdvance(static_cast<unsigned char>(*ta));
        add(e, gsm_);
        return;
      }
      case Umts: addUmtsServing(cell, wcdma_); return;
      case Tdscdma: addUmtsServing(cell, tdscdma_); return;
      case Lte: {
        auto e = named<OxelElementLTE>(cell);
        const auto ci = atMost(hexadecimal(cell, "ci"), 0x0FFFFFFF);
        if (!e || !ci) return;
        e->setCellId(*ci);
        elements_.push_back(e);
        return;
      }
      default: return;
    }
  }

  void addNeighbour(const Dictionary& cell, std::uint32_t type) {
    if (type == Gsm && gsm_) {
      const auto bsic = atMost(hexadecimal(cell, "base-station-id"), 63);
      const auto arfcn = atMost(cell.get<std::uint32_t>("arfcn"), 1023);
      if (!bsic || !arfcn) return;  // no frequency info to place it by
      OxelGsmNeighbourCell n;
      n.setColor(static_cast<unsigned char>(*bsic));
      n.setFrequency(static_cast<unsigned short>(*arfcn));
      if (auto lac = atMost(hexadecimal(cell, "lac"), 0xFFFF))
        n.setLocationAreaCode(static_cast<unsigned short>(*lac));
      if (auto ci = atMost(hexadecimal(cell, "ci"), 0xFFFF)) n.setCellId(static_cast<unsigned short>(*ci));
      if (auto level = atMost(cell.get<std::uint32_t>("rx-level"), 63))
        n.setPowerRx(static_cast<unsigned char>(*level));
      gsm_->addNeighbourCell(n);
    } else if (type == Umts && wcdma_) {
      const auto uarfcn = atMost(cell.get<std::uint32_t>("uarfcn"), 16383);
      const auto psc = atMost(cell.get<std::uint32_t>("psc"), 511);
      if (!uarfcn || !psc) return;
      OxelWcdmaNeighbourCell n;
      n.setFrequencyDl(static_cast<unsigned short>(*uarfcn));
      n.setScramblingCode(static_cast<unsigned short>(*psc));
      setUtraMeasurements(cell, n);
      if (auto ecio = cell.get<double>("ecio"); ecio && std::isfinite(*ecio))
        n.setEcNo(ecNoIndex(*ecio));
      wcdma_->addNeighbourCell(n);
    } else if (type == Tdscdma && tdscdma_) {
      const auto uarfcn = atMost(cell.get<std::uint32_t>("uarfcn"), 16383);
      const auto parameterId = atMost(cell.get<std::uint32_t>("cell-parameter-id"), 127);
      if (!uarfcn || !parameterId) return;
      OxelTdscdmaNeighbourCell n;
      n.setFrequency(static_cast<unsigned short>(*uarfcn));
      n.setCellParameterId(static_cast<unsigned char>(*parameterId));
      setUtraMeasurements(cell, n);
      tdscdma_->addNeighbourCell(n);
    }
  }

  std::vector<std::shared_ptr<const OxelObservationElement>> elements_;
  std::shared_ptr<OxelElementGSM> gsm_;
  std::shared_ptr<OxelElementWCDMA> wcdma_;
  std::shared_ptr<OxelElementTDSCDMA> tdscdma_;
  SkippedCells skipped_;
  bool reported_ = false;
};

class ModemManager : public ServiceProtocol {
 public:
  std::vector<BusService> services() const override { return {kModemManager}; }
  bool cellular() const override { return true; }

  ServiceAnswer measure(BusSession& bus) override {
    Variant reply = bus.call(kModemManager, "/org/freedesktop/ModemManager1",
                             "org.freedesktop.DBus.ObjectManager", "GetManagedObjects", nullptr,
                             "(a{oa{sa{sv}}})");
    Variant objects(g_variant_get_child_value(reply.get(), 0));
    ObjectPaths modems;
    GVariantIter iter;
    g_variant_iter_init(&iter, objects.get());
    const gchar* path = nullptr;
    GVariant* interfaces = nullptr;
    while (g_variant_iter_next(&iter, "{&o@a{sa{sv}}}", &path, &interfaces)) {
      Variant held(interfaces);
      if (Variant(g_variant_lookup_value(interfaces, kModemInterface, nullptr)))
        modems.push_back(path);
    }
    if (modems.empty()) throw BusFailure("ModemManager: no modem");
    std::sort(modems.begin(), modems.end());

    ServiceAnswer answer;
    bool anyCell = false;
    for (const std::string& modem : modems) {
      Variant cells = bus.call(kModemManager, modem, kModemInterface, "GetCellInfo", nullptr,
                               "(aa{sv})");
      Variant list(g_variant_get_child_value(cells.get(), 0));
      const ModemCells made(modem, list.get());
      anyCell = anyCell || made.reported();
      made.appendTo(answer);
    }
    if (!anyCell)
      throw BusFailure("ModemManager: no cell info from " +
                       (modems.size() == 1 ? modems.front() : std::to_string(modems.size()) + " modems"));
    return answer;
  }
};

}  // namespace

std::unique_ptr<ServiceProtocol> makeModemManagerProtocol() {
  return std::make_unique<ModemManager>();
}

}  // namespace host
}  // namespace platform
}  // namespace lodestack
