// The measurement library of the positioning service, as lodestack uses it:
// RadioMeasurements starts and cancels cellular measurements and WLAN scans
// and reports the modem's state; each finished measurement comes back as an
// OxelMeasurements, a list of OxelObservationElement objects of one class per
// technology. These are the platform's own classes (global namespace). A
// device build supplies them; the host build implements them with a
// simulated library that replays a scenario (see doc/scenarios.md), or with
// the services of the D-Bus system bus (see doc/bus-services.md).
//
// Values and their "not available" marks, as the library hands them over:
// one-byte quantities use 255 for "not available"; fields with a ...Set()
// companion are present only when it returns true; times are seconds since
// the epoch. Callbacks run on the thread that started the measurement (the
// one running its dispatcher), either inside the start call or later; at
// most one measurement of each kind runs at a time. Elements and results are
// owned by the library object that reports them; OxelMeasurements is a value
// that shares its elements on copy.
#ifndef LODESTACK_PLATFORM_RADIOMEASUREMENTS_H
#define LODESTACK_PLATFORM_RADIOMEASUREMENTS_H

#include <memory>
#include <string>
#include <vector>

#include "lodestack/core/Export.h"

// One cell or access point of a result. elementId(): 0 GSM, 1 WCDMA,
// 2 TD-SCDMA, 3 WLAN, 4 LTE; other values are kinds lodestack skips.
class LODESTACK_EXPORT OxelObservationElement {
 public:
  explicit OxelObservationElement(int elementId) : elementId_(elementId) {}
  virtual ~OxelObservationElement();
  int elementId() const { return elementId_; }
  // When the element was measured, seconds since the epoch.
  unsigned int timestamp() const { return timestamp_; }
  void setTimestamp(unsigned int t) { timestamp_ = t; }

 private:
  int elementId_;
  unsigned int timestamp_ = 0;
};

// The identity every cellular element carries: country and network code.
class LODESTACK_EXPORT OxelCellularElement : public OxelObservationElement {
 public:
  using OxelObservationElement::OxelObservationElement;
  unsigned short countryCode() const { return countryCode_; }
  unsigned short networkId() const { return networkId_; }
  void setCountryCode(unsigned short mcc) { countryCode_ = mcc; }
  void setNetworkId(unsigned short mnc) { networkId_ = mnc; }

 private:
  unsigned short countryCode_ = 0;
  unsigned short networkId_ = 0;
};

// A GSM neighbour: colour code (BSIC) and frequency (ARFCN) always; cell id
// and location area code when their ...Set() says so; received level 0-63,
// 255 when not available.
class LODESTACK_EXPORT OxelGsmNeighbourCell {
 public:
  unsigned char color() const { return color_; }
  unsigned short frequency() const { return frequency_; }
  unsigned short cellId() const { return cellId_; }
  bool cellIdSet() const { return cellIdSet_; }
  unsigned short locationAreaCode() const { return lac_; }
  bool locationAreaCodeSet() const { return lacSet_; }
  unsigned char powerRx() const { return powerRx_; }

  void setColor(unsigned char bsic) { color_ = bsic; }
  void setFrequency(unsigned short arfcn) { frequency_ = arfcn; }
  void setCellId(unsigned short cid) { cellId_ = cid, cellIdSet_ = true; }
  void setLocationAreaCode(unsigned short lac) { lac_ = lac, lacSet_ = true; }
  void setPowerRx(unsigned char level) { powerRx_ = level; }

 private:
  unsigned char color_ = 0;
  unsigned short frequency_ = 0;
  unsigned short cellId_ = 0;
  bool cellIdSet_ = false;
  unsigned short lac_ = 0;
  bool lacSet_ = false;
  unsigned char powerRx_ = 255;
};

// A GSM serving cell (elementId 0) and the neighbours it hears.
class LODESTACK_EXPORT OxelElementGSM : public OxelCellularElement {
 public:
  OxelElementGSM() : OxelCellularElement(0) {}
  unsigned short locationAreaCode() const { return lac_; }
  bool locationAreaCodeSet() const { return lacSet_; }
  unsigned short cellId() const { return cellId_; }
  bool cellIdSet() const { return cellIdSet_; }
  // Received level 0-63; 255 when not available.
  unsigned char powerRx() const { return powerRx_; }
  unsigned char timingAdvance() const { return timingAdvance_; }
  bool timingAdvanceSet() const { return timingAdvanceSet_; }
  unsigned int neighbourCellCount() const { return static_cast<unsigned int>(neighbours_.size()); }
  // Index below neighbourCellCount().
  const OxelGsmNeighbourCell& neighbourCell(unsigned int i) const { return neighbours_[i]; }

  void setLocationAreaCode(unsigned short lac) { lac_ = lac, lacSet_ = true; }
  void setCellId(unsigned short cid) { cellId_ = cid, cellIdSet_ = true; }
  void setPowerRx(unsigned char level) { powerRx_ = level; }
  void setTimingAdvance(unsigned char ta) { timingAdvance_ = ta, timingAdvanceSet_ = true; }
  void addNeighbourCell(const OxelGsmNeighbourCell& n) { neighbours_.push_back(n); }

 private:
  unsigned short lac_ = 0;
  bool lacSet_ = false;
  unsigned short cellId_ = 0;
  bool cellIdSet_ = false;
  unsigned char powerRx_ = 255;
  unsigned char timingAdvance_ = 0;
  bool timingAdvanceSet_ = false;
  std::vector<OxelGsmNeighbourCell> neighbours_;
};

// A WCDMA (UTRA-FDD) neighbour: downlink UARFCN and primary scrambling code
// always (the frequency info's two values), the cell's 28-bit UTRAN cell id
// (RNC id and cell id), and the measured values. ecNo is the CPICH Ec/No
// index 0-49, pathloss 46-158 dB; both 255 when not available. rscp is the
// CPICH RSCP in dBm (-120 to -25), 255 when not available.
class LODESTACK_EXPORT OxelWcdmaNeighbourCell {
 public:
  unsigned short frequencyDl() const { return uarfcnDl_; }
  unsigned short scramblingCode() const { return psc_; }
  unsigned int ucId() const { return ucId_; }
  unsigned char ecNo() const { return ecNo_; }
  int rscp() const { return rscp_; }
  unsigned char pathloss() const { return pathloss_; }

  void setFrequencyDl(unsigned short uarfcn) { uarfcnDl_ = uarfcn; }
  void setScramblingCode(unsigned short psc) { psc_ = psc; }
  void setUcId(unsigned int ucid) { ucId_ = ucid; }
  void setEcNo(unsigned char v) { ecNo_ = v; }
  void setRscp(int dbm) { rscp_ = dbm; }
  void setPathloss(unsigned char db) { pathloss_ = db; }

 private:
  unsigned short uarfcnDl_ = 0;
  unsigned short psc_ = 0;
  unsigned int ucId_ = 0;
  unsigned char ecNo_ = 255;
  int rscp_ = 255;
  unsigned char pathloss_ = 255;
};

// A TD-SCDMA (UTRA-TDD) neighbour: UARFCN and cell parameter id always,
// the UTRAN cell id, carrier RSSI (0-76 index) and path loss, 255 when not
// available, and the P-CCPCH RSCP in dBm, 255 when not available.
class LODESTACK_EXPORT OxelTdscdmaNeighbourCell {
 public:
  unsigned short frequency() const { return uarfcn_; }
  unsigned char cellParameterId() const { return cellParameterId_; }
  unsigned int ucId() const { return ucId_; }
  unsigned char carrierRssi() const { return carrierRssi_; }
  int rscp() const { return rscp_; }
  unsigned char pathloss() const { return pathloss_; }

  void setFrequency(unsigned short uarfcn) { uarfcn_ = uarfcn; }
  void setCellParameterId(unsigned char id) { cellParameterId_ = id; }
  void setUcId(unsigned int ucid) { ucId_ = ucid; }
  void setCarrierRssi(unsigned char v) { carrierRssi_ = v; }
  void setRscp(int dbm) { rscp_ = dbm; }
  void setPathloss(unsigned char db) { pathloss_ = db; }

 private:
  unsigned short uarfcn_ = 0;
  unsigned char cellParameterId_ = 0;
  unsigned int ucId_ = 0;
  unsigned char carrierRssi_ = 255;
  int rscp_ = 255;
  unsigned char pathloss_ = 255;
};

// A UMTS serving cell: identity (country, network, 28-bit UTRAN cell id),
// location area code when set, and its neighbours. WCDMA is elementId 1,
// TD-SCDMA elementId 2; Neighbour is that technology's neighbour class.
template <int ElementId, class Neighbour>
class LODESTACK_EXPORT OxelUmtsElement : public OxelCellularElement {
 public:
  using NeighbourCell = Neighbour;
  OxelUmtsElement() : OxelCellularElement(ElementId) {}
  unsigned int ucId() const { return ucId_; }
  unsigned short locationAreaCode() const { return lac_; }
  bool locationAreaCodeSet() const { return lacSet_; }
  unsigned int neighbourCellCount() const { return static_cast<unsigned int>(neighbours_.size()); }
  // Index below neighbourCellCount().
  const Neighbour& neighbourCell(unsigned int i) const { return neighbours_[i]; }

  void setUcId(unsigned int ucid) { ucId_ = ucid; }
  void setLocationAreaCode(unsigned short lac) { lac_ = lac, lacSet_ = true; }
  void addNeighbourCell(const Neighbour& n) { neighbours_.push_back(n); }

 private:
  unsigned int ucId_ = 0;
  unsigned short lac_ = 0;
  bool lacSet_ = false;
  std::vector<Neighbour> neighbours_;
};

class LODESTACK_EXPORT OxelElementWCDMA : public OxelUmtsElement<1, OxelWcdmaNeighbourCell> {};
class LODESTACK_EXPORT OxelElementTDSCDMA : public OxelUmtsElement<2, OxelTdscdmaNeighbourCell> {};

// An LTE cell (elementId 4): its identity, with the 28-bit E-UTRAN cell id
// (eNodeB id and local cell id) as cellId().
class LODESTACK_EXPORT OxelElementLTE : public OxelCellularElement {
 public:
  OxelElementLTE() : OxelCellularElement(4) {}
  unsigned int cellId() const { return cellId_; }
  void setCellId(unsigned int eci) { cellId_ = eci; }

 private:
  unsigned int cellId_ = 0;
};

// A WLAN BSSID of up to 8 bytes; the bytes in use are those from index 0 on
// while isByteSet() holds (6 for an ordinary MAC address).
class LODESTACK_EXPORT OxelMacAddress {
 public:
  bool isByteSet(unsigned int index) const { return index < bytes_.size(); }
  // Index below 8 with isByteSet(index).
  unsigned char macByte(unsigned int index) const { return bytes_[index]; }
  // At most 8 bytes are kept.
  void setBytes(const unsigned char* bytes, unsigned int count) {
    bytes_.assign(bytes, bytes + (count > 8 ? 8 : count));
  }

 private:
  std::vector<unsigned char> bytes_;
};

// A WLAN access point (elementId 3): BSSID, received level (dBm), transmit
// level (dBm) and RSSI (0-100 %), each when its ...Set() says so, and the
// network name when the library knows it (empty otherwise).
class LODESTACK_EXPORT OxelElementWLAN : public OxelObservationElement {
 public:
  OxelElementWLAN() : OxelObservationElement(3) {}
  const OxelMacAddress& mac() const { return mac_; }
  signed char powerRx() const { return powerRx_; }
  bool powerRxSet() const { return powerRxSet_; }
  signed char powerTx() const { return powerTx_; }
  bool powerTxSet() const { return powerTxSet_; }
  unsigned char rssi() const { return rssi_; }
  bool rssiSet() const { return rssiSet_; }
  const std::string& ssid() const { return ssid_; }

  OxelMacAddress& mac() { return mac_; }
  void setPowerRx(signed char dbm) { powerRx_ = dbm, powerRxSet_ = true; }
  void setPowerTx(signed char dbm) { powerTx_ = dbm, powerTxSet_ = true; }
  void setRssi(unsigned char percent) { rssi_ = percent, rssiSet_ = true; }
  void setSsid(const std::string& ssid) { ssid_ = ssid; }

 private:
  OxelMacAddress mac_;
  signed char powerRx_ = 0;
  bool powerRxSet_ = false;
  signed char powerTx_ = 0;
  bool powerTxSet_ = false;
  unsigned char rssi_ = 0;
  bool rssiSet_ = false;
  std::string ssid_;
};

// One finished measurement: its elements in the order the library found
// them, and the modem's state while it was measured.
class LODESTACK_EXPORT OxelMeasurements {
 public:
  unsigned int count() const { return static_cast<unsigned int>(elements_.size()); }
  // Index below count(); valid while this value or a copy of it lives.
  const OxelObservationElement* element(unsigned int i) const { return elements_[i].get(); }
  // Non-zero when measured while the modem reported an unreliable state.
  int cellUnreliableState() const { return unreliableState_; }
  // When the modem's dedicated-channel state began: 0 not in it, -1 in it
  // since an unknown time.
  long cellDchTimestamp() const { return dchTimestamp_; }

  void add(std::shared_ptr<const OxelObservationElement> element) {
    elements_.push_back(std::move(element));
  }
  void setCellUnreliableState(int state) { unreliableState_ = state; }
  void setCellDchTimestamp(long t) { dchTimestamp_ = t; }

 private:
  std::vector<std::shared_ptr<const OxelObservationElement>> elements_;
  int unreliableState_ = 0;
  long dchTimestamp_ = 0;
};

class RadioMeasurementsImpl;

// The measurement library object. One per adaptation, made and used on the
// thread of the adaptation's dispatcher. The host build's constructor loads
// the scenario (LODESTACK_SCENARIO, or the built-in street) for the kinds
// that replay it, and starts the bus sources LODESTACK_WLAN and
// LODESTACK_CELLS choose (see HostPlatform.h); it throws
// std::runtime_error naming the fault when it cannot (a scenario that does
// not load, an unknown choice); the reason is also kept for
// lodestack::platform::lastError().
class LODESTACK_EXPORT RadioMeasurements {
 public:
  using Callback = void (*)(void* context, OxelMeasurements result);

  RadioMeasurements();
  // Cancels what runs: no callback comes after destruction.
  ~RadioMeasurements();
  RadioMeasurements(const RadioMeasurements&) = delete;
  RadioMeasurements& operator=(const RadioMeasurements&) = delete;

  // Starts a cellular measurement; `callback(context, result)` reports it,
  // once, unless cancelled. A measurement already running is replaced. May
  // call back before returning, and may throw when the library fails.
  void startCellMeasurements(Callback callback, void* context);
  void cancelCellMeasurements();
  // The same for a WLAN scan.
  void wlanIcdScan(Callback callback, void* context);
  void wlanIcdScanCancel();
  // Seconds the modem has been in its dedicated-channel state; -1 in it for
  // an unknown time, -2 not in it.
  int cellDchStateDuration();
  // Non-zero while cellular measurements are unusable after a change of
  // radio technology.
  int unreliableMeasurementsAfterTechChange();

 private:
  std::unique_ptr<RadioMeasurementsImpl> impl_;
};

#endif  // LODESTACK_PLATFORM_RADIOMEASUREMENTS_H
