#include "lodestack/radioadaptation/ConverterOxel.h"

#include "lodestack/gom/CharacterData.h"
#include "lodestack/schema/EUtra.h"
#include "lodestack/schema/Geran.h"
#include "lodestack/schema/UtraFdd.h"
#include "lodestack/schema/UtraTdd.h"
#include "lodestack/schema/Wlan.h"

namespace lodestack {
namespace radioadaptation {

using gom::GenericObject;
using gom::SharedPointer;
namespace s = schema;

namespace {

const unsigned char kNotAvailable = 255;

// A made record, or the OutOfMemory a failed creation raises.
template <class T>
SharedPointer<T> made(SharedPointer<T> p) {
  if (!p) throw OutOfMemory;
  return p;
}

void check(Status status) {
  if (status != Ok) throw status;
}

template <class E>
const E& elementAs(const OxelObservationElement* element) {
  const E* e = dynamic_cast<const E*>(element);
  if (!e) throw WrongObjectType;
  return *e;
}

// The measurement of `Measurement` for element `e`, stamped with its time.
template <class Measurement, class E>
SharedPointer<Measurement> newMeasurement(const E& e) {
  SharedPointer<Measurement> m = made(Measurement::create());
  m->setTimeStamp(e.timestamp());
  return m;
}

template <class Dn, class E>
SharedPointer<Dn> mobileDn(const E& e, unsigned int ucid) {
  SharedPointer<Dn> dn = made(Dn::create());
  check(dn->setMcc(e.countryCode()));
  check(dn->setMnc(e.networkId()));
  check(dn->setUcid(ucid));
  return dn;
}

// The two UMTS technologies differ only in the records and the neighbour
// values named here.
struct Wcdma {
  using Element = OxelElementWCDMA;
  using Measurement = s::UtraFddCellMeasurement;
  using Serving = s::UtraFddServingCellMeasurement;
  using Nw = s::UtraFddNwMeasurement;
  static SharedPointer<s::UtraFddFrequencyInfo> frequencyInfo(const OxelWcdmaNeighbourCell& n) {
    return s::UtraFddFrequencyInfo::create(n.frequencyDl(), n.scramblingCode());
  }
  static void setQuality(Nw& nw, const OxelWcdmaNeighbourCell& n) {
    if (n.ecNo() != kNotAvailable) check(nw.setEcNo(n.ecNo()));
  }
};

struct Tdscdma {
  using Element = OxelElementTDSCDMA;
  using Measurement = s::UtraTddCellMeasurement;
  using Serving = s::UtraTddServingCellMeasurement;
  using Nw = s::UtraTddNwMeasurement;
  static SharedPointer<s::UtraTddFrequencyInfo> frequencyInfo(const OxelTdscdmaNeighbourCell& n) {
    return s::UtraTddFrequencyInfo::create(n.frequency(), n.cellParameterId());
  }
  static void setQuality(Nw& nw, const OxelTdscdmaNeighbourCell& n) {
    if (n.carrierRssi() != kNotAvailable) check(nw.setUtraCarrierRssi(n.carrierRssi()));
  }
};

template <class Umts>
SharedPointer<GenericObject> convertUmts(const OxelObservationElement* element) {
  const typename Umts::Element& e = elementAs<typename Umts::Element>(element);
  SharedPointer<typename Umts::Measurement> m = newMeasurement<typename Umts::Measurement>(e);
  m->setDn(mobileDn<s::UtraCellDn>(e, e.ucId()));

  SharedPointer<typename Umts::Serving> serving = made(Umts::Serving::create());
  if (e.locationAreaCodeSet()) check(serving->setLac(e.locationAreaCode()));
  m->setServingCellMeasurement(serving);

  for (unsigned int i = 0; i < e.neighbourCellCount(); ++i) {
    const auto& n = e.neighbourCell(i);
    SharedPointer<typename Umts::Nw> nw = made(Umts::Nw::create(made(Umts::frequencyInfo(n))));
    check(nw->setUcid(n.ucId()));
    Umts::setQuality(*nw, n);
    if (n.rscp() != kNotAvailable) check(nw->setRscp(static_cast<signed char>(n.rscp())));
    if (n.pathloss() != kNotAvailable) check(nw->setPathloss(n.pathloss()));
    check(m->addNwMeasurement(nw));
  }
  return m->wrappedObject();
}

}  // namespace

void ConverterOxel::convertOxelMeasurement(const OxelMeasurements& result,
                                           SharedPointer<s::MeasurementContainer>& container) {
  for (unsigned int i = 0; i < result.count(); ++i) convertOxelElement(result.element(i), container);
}

void ConverterOxel::convertOxelElement(const OxelObservationElement* element,
                                       SharedPointer<s::MeasurementContainer>& container) {
  if (!element || !container) return;
  switch (element->elementId()) {
    case 0: return check(container->addGeranMeasurement(convertOxelGsm2Geran(element)));
    case 1: return check(container->addUtraFddMeasurement(convertOxelWcdma2UtraFdd(element)));
    case 2: return check(container->addUtraTddMeasurement(convertOxelTdscdma2UtraTdd(element)));
    case 3: return check(container->addWlanMeasurement(convertOxelWlan2Wlan(element)));
    case 4: return check(container->addEUtraMeasurement(convertOxelLte2EUtra(element)));
    default: return;  // a kind the schema does not carry
  }
}

SharedPointer<GenericObject> ConverterOxel::convertOxelGsm2Geran(const OxelObservationElement* element) {
  const OxelElementGSM& e = elementAs<OxelElementGSM>(element);
  SharedPointer<s::GeranCellMeasurement> m = newMeasurement<s::GeranCellMeasurement>(e);
  SharedPointer<s::GeranCellDn> dn = made(s::GeranCellDn::create());
  check(dn->setMcc(e.countryCode()));
  check(dn->setMnc(e.networkId()));
  if (e.locationAreaCodeSet()) check(dn->setLac(e.locationAreaCode()));
  if (e.cellIdSet()) check(dn->setCid(e.cellId()));
  m->setDn(dn);

  SharedPointer<s::GeranServingCellMeasurement> serving = made(s::GeranServingCellMeasurement::create());
  if (e.powerRx() != kNotAvailable) check(serving->setRxLevel(e.powerRx()));
  if (e.timingAdvanceSet()) check(serving->setTimingAdvance(e.timingAdvance()));
  m->setServingCellMeasurement(serving);

  for (unsigned int i = 0; i < e.neighbourCellCount(); ++i) {
    const OxelGsmNeighbourCell& n = e.neighbourCell(i);
    SharedPointer<s::GeranNwMeasurement> nw =
        made(s::GeranNwMeasurement::create(made(s::GeranFrequencyInfo::create(n.color(), n.frequency()))));
    if (n.cellIdSet()) check(nw->setCid(n.cellId()));
    if (n.locationAreaCodeSet()) check(nw->setLac(n.locationAreaCode()));
    if (n.powerRx() != kNotAvailable) check(nw->setRxLevel(n.powerRx()));
    check(m->addNwMeasurement(nw));
  }
  return m->wrappedObject();
}

SharedPointer<GenericObject> ConverterOxel::convertOxelWcdma2UtraFdd(const OxelObservationElement* e) {
  return convertUmts<Wcdma>(e);
}

SharedPointer<GenericObject> ConverterOxel::convertOxelTdscdma2UtraTdd(const OxelObservationElement* e) {
  return convertUmts<Tdscdma>(e);
}

SharedPointer<GenericObject> ConverterOxel::convertOxelLte2EUtra(const OxelObservationElement* element) {
  const OxelElementLTE& e = elementAs<OxelElementLTE>(element);
  SharedPointer<s::EUtraCellMeasurement> m = newMeasurement<s::EUtraCellMeasurement>(e);
  m->setDn(mobileDn<s::EUtraCellDn>(e, e.cellId()));
  return m->wrappedObject();
}

SharedPointer<GenericObject> ConverterOxel::convertOxelWlan2Wlan(const OxelObservationElement* element) {
  const OxelElementWLAN& e = elementAs<OxelElementWLAN>(element);
  SharedPointer<s::WlanMeasurement> m = newMeasurement<s::WlanMeasurement>(e);
  unsigned char bytes[8];
  unsigned int count = 0;
  while (count < 8 && e.mac().isByteSet(count)) {
    bytes[count] = e.mac().macByte(count);
    ++count;
  }
  SharedPointer<s::WlanDn> dn = made(s::WlanDn::create());
  check(dn->setBssid(bytes, count));
  if (!e.ssid().empty()) {
    SharedPointer<gom::GenericObject> extra = made(dn->extension());
    const std::string& ssid = e.ssid();
    check(extra->setStringProperty(
        kSsidProperty,
        made(gom::CharacterData::create(ssid.data(), static_cast<unsigned int>(ssid.size())))));
  }
  m->setDn(dn);

  SharedPointer<s::WlanApMeasurement> ap = made(s::WlanApMeasurement::create());
  if (e.powerRxSet()) check(ap->setRxLevel(e.powerRx()));
  if (e.powerTxSet()) check(ap->setTxLevel(e.powerTx()));
  if (e.rssiSet()) check(ap->setRssi(e.rssi()));
  m->setWlanApMeasurement(ap);
  return m->wrappedObject();
}

}  // namespace radioadaptation
}  // namespace lodestack
