// LinuxRadioAdaptationOxel: the radio adaptation of the Linux platform. Over
// the request engine (RadioAdaptationCommon) it starts cellular measurements
// and WLAN scans on the platform's measurement library (RadioMeasurements),
// converts each result (ConverterOxel), keeps the engine's view of the
// modem's unreliable states up to date, and while some client is subscribed
// to Gnss runs a FreeGnssListener whose positions reach the observer as GNSS
// measurements with request id 0.
//
// The modem's state: before each cellular request the library's
// dedicated-channel duration sets (or, for -2, clears) bit 0x1000 of
// networkStatus() and the time the state began; each cellular result does
// the same from its own dedicated-channel time stamp, and is delivered with
// UnreliableMeasurement when measured in an unreliable state. While the
// library reports a recent change of radio technology, cellular requests
// fail with Failed. A result the library delivers inside its own start call
// goes through the engine's queue, so the observer never runs inside
// requestMeasurements.
//
// Obtain it from RadioAdaptationFactory::createRadioAdaptation(); it runs
// on the creating thread's dispatcher and takes no locks. pushMeasurement
// takes a pointer to an OxelMeasurements.
#ifndef LODESTACK_RADIOADAPTATION_LINUXRADIOADAPTATIONOXEL_H
#define LODESTACK_RADIOADAPTATION_LINUXRADIOADAPTATIONOXEL_H

#include "lodestack/platform/RadioMeasurements.h"
#include "lodestack/radioadaptation/RadioAdaptationCommon.h"
#include "lodestack/schema/PositionEstimate.h"

namespace lodestack {
namespace radioadaptation {

class LinuxRadioAdaptationOxelPrivate;

class LODESTACK_EXPORT LinuxRadioAdaptationOxel : public RadioAdaptationCommon {
 public:
  LinuxRadioAdaptationOxel();
  // Cancels what runs, stops GNSS and releases the measurement library.
  ~LinuxRadioAdaptationOxel() override;

  void onSubscriptionChanged(int types, bool subscribed) override;
  int networkStatus(int subscription) override;
  int wifiStatus(int subscription) override;
  int gnssStatus(int subscription) override;
  // Opens the dispatcher and makes the measurement library; false when
  // either fails (on the host, a scenario that does not load).
  bool init() override;

 protected:
  Status doRequest(MeasurementType type) override;
  Status doCancelRequest(MeasurementType type) override;
  // `data` points to an OxelMeasurements.
  gom::SharedPointer<gom::GenericObject> doParseMeasurement(const void* data, int type,
                                                            Status& status) override;
  int doParseNetworkStatus(const void* data, MeasurementType type, Status& status) override;

  Status requestCellularMeasurements();
  Status requestWifiMeasurements();
  void handleMeasurement(MeasurementType type, const OxelMeasurements& result, Status status,
                         bool deliverAsync);
  void cellScanCallback(const OxelMeasurements& result);
  void wlanIcdScanCallback(const OxelMeasurements& result);
  void freeGnssScanCallback(const gom::SharedPointer<schema::PositionEstimate>& position,
                            Status status);
  static void staticCellScanCallback(void* self, OxelMeasurements result);
  static void staticWlanIcdScanCallback(void* self, OxelMeasurements result);

 private:
  friend class LinuxRadioAdaptationOxelPrivate;

  // The container of a library result, and for cellular results the status
  // and modem state it carries.
  gom::SharedPointer<gom::GenericObject> convert(MeasurementType type,
                                                 const OxelMeasurements& result, Status& status);

  RadioMeasurements* radioMeasurements;
  LinuxRadioAdaptationOxelPrivate* privatePart;
  bool cellScanStarting;
  bool wlanScanStarting;
};

}  // namespace radioadaptation
}  // namespace lodestack

#endif  // LODESTACK_RADIOADAPTATION_LINUXRADIOADAPTATIONOXEL_H
