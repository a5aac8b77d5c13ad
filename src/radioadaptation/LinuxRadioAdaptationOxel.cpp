#include "lodestack/radioadaptation/LinuxRadioAdaptationOxel.h"

#include <ctime>
#include <exception>
#include <new>

#include "lodestack/radioadaptation/ConverterOxel.h"
#include "lodestack/radioadaptation/MeasurementTracingOxel.h"
#include "lodestack/radioadaptation/RadioAdaptationFactory.h"
#include "lodestack/schema/Gnss.h"
#include "lodestack/schema/MeasurementContainer.h"
#include "radioadaptation/LinuxRadioAdaptationOxelPrivate.h"
#include "radioadaptation/RadioLog.h"

namespace lodestack {
namespace radioadaptation {

using gom::GenericObject;
using gom::SharedPointer;

IRadioAdaptation* RadioAdaptationFactory::createRadioAdaptation() {
  LinuxRadioAdaptationOxel* adaptation = new LinuxRadioAdaptationOxel();
  if (!adaptation->init()) {
    delete adaptation;
    return nullptr;
  }
  return adaptation;
}

LinuxRadioAdaptationOxel::LinuxRadioAdaptationOxel()
    : radioMeasurements(nullptr),
      privatePart(nullptr),
      cellScanStarting(false),
      wlanScanStarting(false) {}

LinuxRadioAdaptationOxel::~LinuxRadioAdaptationOxel() {
  // Cancelled here, while this class's hooks still reach the library.
  cancelAllRequests();
  if (privatePart && privatePart->listener) privatePart->listener->setObserver(nullptr);
  delete privatePart;
  delete radioMeasurements;
}

bool LinuxRadioAdaptationOxel::init() {
  if (!RadioAdaptationCommon::init()) return false;
  privatePart = new (std::nothrow) LinuxRadioAdaptationOxelPrivate(this);
  if (!privatePart) return false;
  try {
    radioMeasurements = new RadioMeasurements();
  } catch (const std::exception& e) {
    radioLog("measurement library not started: %s\n", e.what());
    return false;
  }
  return true;
}

int LinuxRadioAdaptationOxel::networkStatus(int s) { return RadioAdaptationCommon::networkStatus(s); }
int LinuxRadioAdaptationOxel::wifiStatus(int s) { return RadioAdaptationCommon::wifiStatus(s); }
int LinuxRadioAdaptationOxel::gnssStatus(int s) { return RadioAdaptationCommon::gnssStatus(s); }
int LinuxRadioAdaptationOxel::doParseNetworkStatus(const void* data, MeasurementType type,
                                                   Status& status) {
  return RadioAdaptationCommon::doParseNetworkStatus(data, type, status);
}

Status LinuxRadioAdaptationOxel::doRequest(MeasurementType type) {
  switch (type) {
    case Cellular: return requestCellularMeasurements();
    case Wlan: return requestWifiMeasurements();
    default: return NotSupported;  // GNSS arrives through the subscription
  }
}

Status LinuxRadioAdaptationOxel::doCancelRequest(MeasurementType type) {
  switch (type) {
    case Cellular:
      radioMeasurements->cancelCellMeasurements();
      return Ok;
    case Wlan:
      radioMeasurements->wlanIcdScanCancel();
      return Ok;
    default:
      return NotSupported;
  }
}

Status LinuxRadioAdaptationOxel::requestCellularMeasurements() {
  try {
    if (radioMeasurements->unreliableMeasurementsAfterTechChange()) {
      radioLog("cellular request refused: radio technology just changed\n");
      return Failed;
    }
    cellScanStarting = true;
    // The dedicated-channel state makes neighbour measurements unreliable
    // from the time it began.
    const int duration = radioMeasurements->cellDchStateDuration();
    if (duration == -2) {
      networkStatusFlags &= ~kUnreliableMeasurementsFlag;
      unreliableSince = 0;
    } else if (duration == -1) {
      networkStatusFlags |= kUnreliableMeasurementsFlag;
      unreliableSince = 0;
    } else {
      networkStatusFlags |= kUnreliableMeasurementsFlag;
      unreliableSince = std::time(nullptr) - duration;
    }
    radioMeasurements->startCellMeasurements(&staticCellScanCallback, this);
    cellScanStarting = false;
    return Ok;
  } catch (const std::exception& e) {
    cellScanStarting = false;
    radioLog("cellular measurement not started: %s\n", e.what());
    return Failed;
  } catch (...) {
    cellScanStarting = false;
    return Failed;
  }
}

Status LinuxRadioAdaptationOxel::requestWifiMeasurements() {
  try {
    wlanScanStarting = true;
    radioMeasurements->wlanIcdScan(&staticWlanIcdScanCallback, this);
    wlanScanStarting = false;
    return Ok;
  } catch (const std::exception& e) {
    wlanScanStarting = false;
    radioLog("WLAN scan not started: %s\n", e.what());
    return Failed;
  } catch (...) {
    wlanScanStarting = false;
    return Failed;
  }
}

void LinuxRadioAdaptationOxel::staticCellScanCallback(void* self, OxelMeasurements result) {
  static_cast<LinuxRadioAdaptationOxel*>(self)->cellScanCallback(result);
}

void LinuxRadioAdaptationOxel::staticWlanIcdScanCallback(void* self, OxelMeasurements result) {
  static_cast<LinuxRadioAdaptationOxel*>(self)->wlanIcdScanCallback(result);
}

void LinuxRadioAdaptationOxel::cellScanCallback(const OxelMeasurements& result) {
  try {
    handleMeasurement(Cellular, result, Ok, cellScanStarting);
  } catch (...) {
    radioLog("cellular result dropped\n");
  }
}

void LinuxRadioAdaptationOxel::wlanIcdScanCallback(const OxelMeasurements& result) {
  try {
    handleMeasurement(Wlan, result, Ok, wlanScanStarting);
  } catch (...) {
    radioLog("WLAN result dropped\n");
  }
}

SharedPointer<GenericObject> LinuxRadioAdaptationOxel::convert(MeasurementType type,
                                                               const OxelMeasurements& result,
                                                               Status& status) {
  SharedPointer<schema::MeasurementContainer> container = schema::MeasurementContainer::create();
  if (!container) throw OutOfMemory;
  ConverterOxel::convertOxelMeasurement(result, container);
  status = Ok;
  if (type == Cellular) {
    if (result.cellUnreliableState()) status = UnreliableMeasurement;
    const long since = result.cellDchTimestamp();
    if (since == 0) {
      networkStatusFlags &= ~kUnreliableMeasurementsFlag;
      unreliableSince = 0;
    } else {
      networkStatusFlags |= kUnreliableMeasurementsFlag;
      unreliableSince = since == -1 ? 0 : static_cast<std::time_t>(since);
    }
  }
  return container->wrappedObject();
}

void LinuxRadioAdaptationOxel::handleMeasurement(MeasurementType type,
                                                 const OxelMeasurements& result, Status status,
                                                 bool deliverAsync) {
  MeasurementTracingOxel::logMeasurement(result, static_cast<long>(std::time(nullptr)));
  MeasurementTracingOxel::logMeasurementDebug(result, nullptr, nullptr, false);
  if (!hasObserver()) return;
  if (status != Ok) {
    handleRequestComplete(type, SharedPointer<GenericObject>(), status, deliverAsync);
    return;
  }
  SharedPointer<GenericObject> object = convert(type, result, status);
  radioLog("result of kind %d: %u elements, %s\n", type, result.count(), statusName(status));
  handleRequestComplete(type, object, status, deliverAsync);
}

SharedPointer<GenericObject> LinuxRadioAdaptationOxel::doParseMeasurement(const void* data, int type,
                                                                         Status& status) {
  if (!data) {
    status = InvalidArgument;
    return SharedPointer<GenericObject>();
  }
  const OxelMeasurements& result = *static_cast<const OxelMeasurements*>(data);
  MeasurementTracingOxel::logMeasurement(result, static_cast<long>(std::time(nullptr)));
  MeasurementTracingOxel::logMeasurementDebug(result, "PUSH RADIO", "api", false);
  return convert(static_cast<MeasurementType>(type), result, status);
}

void LinuxRadioAdaptationOxel::onSubscriptionChanged(int types, bool subscribed) {
  RadioAdaptationCommon::onSubscriptionChanged(types, subscribed);
  if (!(types & Gnss) || !privatePart) return;
  try {
    if (subscribed) {
      if (!privatePart->listener) privatePart->listener = new FreeGnssListener();
      privatePart->listener->setObserver(privatePart);
    } else if (privatePart->listener) {
      // Kept for a later subscription.
      privatePart->listener->setObserver(nullptr);
    }
  } catch (...) {
    // Subscribing reports nothing back; the location manager's failure is
    // logged and the next subscription tries again.
    radioLog("FREE GNSS: location manager not available\n");
    if (privatePart->listener) privatePart->listener->setObserver(nullptr);
  }
}

void LinuxRadioAdaptationOxel::freeGnssScanCallback(const SharedPointer<schema::PositionEstimate>& position,
                                                    Status status) {
  if (!position || !isUsable(status)) {
    handleRequestComplete(Gnss, SharedPointer<GenericObject>(), status, false);
    return;
  }
  radioLog("%s\n", position->dumpShort("FREE GNSS", gRadioAdaptationComponentName, false).c_str());
  if (!hasObserver()) return;
  if (status == UnreliableMeasurement) {
    handleRequestComplete(Gnss, SharedPointer<GenericObject>(), UnreliableMeasurement, false);
    return;
  }
  SharedPointer<schema::GnssMeasurement> gnss = schema::GnssMeasurement::create(*position);
  SharedPointer<schema::MeasurementContainer> container = schema::MeasurementContainer::create();
  if (!gnss || !container) throw OutOfMemory;
  const Status added = container->addGnssMeasurement(gnss->wrappedObject());
  if (added != Ok) throw added;
  handleRequestComplete(Gnss, container->wrappedObject(), Ok, false);
}

}  // namespace radioadaptation
}  // namespace lodestack
