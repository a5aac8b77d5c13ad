#include "lodestack/radioadaptation/RadioAdaptationCommon.h"

#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/radioadaptation/MeasurementTracing.h"
#include "lodestack/schema/MeasurementContainer.h"
#include "radioadaptation/RadioLog.h"

namespace lodestack {
namespace radioadaptation {

using gom::GenericObject;
using gom::SharedPointer;

namespace {

// The cellular collections of a container, in stamping order: GERAN,
// UTRA-FDD, UTRA-TDD, E-UTRA, CDMA.
const unsigned short kCellularCollections[] = {300, 301, 302, 310, 312};
const unsigned short kUtraFddCollection = 301;
const unsigned short kUtraTddCollection = 302;
const unsigned short kTimeStampProperty = 205;
const unsigned short kUnreliableStateProperty = 207;

const IRadioAdaptationObserver::MeasurementType kTypesInOrder[] = {
    IRadioAdaptationObserver::Cellular, IRadioAdaptationObserver::Wlan,
    IRadioAdaptationObserver::Gnss};


}  // namespace

IRadioAdaptationObserver::~IRadioAdaptationObserver() = default;
IRadioAdaptation::~IRadioAdaptation() = default;

void RadioAdaptationCommon::AsyncHelper::handleAsyncCall(void*) {
  if (owner) owner->handleAsyncCallPrivate();
}

RadioAdaptationCommon::RadioAdaptationCommon()
    : observer(nullptr),
      requestCounter(0),
      networkStatusFlags(0),
      unreliableSince(0),
      wifiStatusValue(0),
      gnssStatusValue(0) {}

RadioAdaptationCommon::~RadioAdaptationCommon() {
  cancelAllRequests();
  if (dispatcher) dispatcher->removeAllAsyncCall(&asyncHelper);
  asyncHelper.owner = nullptr;
  cellularCancelTimer.clear();
  wlanCancelTimer.clear();
  notificationQueue.clear();
  pendingRequests.clear();
  dispatcher.clear();
}

bool RadioAdaptationCommon::init() {
  dispatcher = core::AsyncCallDispatcher::openDispatcher(core::AsyncCallDispatcher::MainLoopDefault);
  if (!dispatcher) return false;
  asyncHelper.owner = this;
  return true;
}

int RadioAdaptationCommon::verifyMeasurementTypes(int types) {
  return types == Cellular || types == Wlan || types == Gnss ? types : 0;
}

Status RadioAdaptationCommon::requestMeasurements(int types, unsigned int& requestId) {
  requestId = 0;
  if (!observer) return Refused;
  const int verified = verifyMeasurementTypes(types);
  if (verified == 0) return InvalidArgument;
  const MeasurementType type = static_cast<MeasurementType>(verified);

  auto pending = pendingRequests.find(type);
  if (pending != pendingRequests.end()) {
    requestId = pending->second;
    return AlreadyPending;
  }
  // Ids are consumed even by requests that fail below.
  const unsigned int id = ++requestCounter;
  pendingRequests[type] = id;

  Status status = doRequest(type);
  // AlreadyPending from the platform: its measurement of this kind is
  // running already, and this request will take its result.
  if (status != Ok && status != AlreadyPending) {
    radioLog("request %u of kind %d failed: %s\n", id, verified, statusName(status));
    (void)cancelRequest(id);
    return status;
  }
  status = startCancelTimer(type);
  if (status != Ok) {
    radioLog("request %u: no cancel timer: %s\n", id, statusName(status));
    (void)cancelRequest(id);
    return status;
  }
  radioLog("request %u of kind %d started\n", id, verified);
  requestId = id;
  return Ok;
}

SharedPointer<core::ITimer>& RadioAdaptationCommon::cancelTimer(MeasurementType type) {
  return type == Cellular ? cellularCancelTimer : wlanCancelTimer;
}

Status RadioAdaptationCommon::startCancelTimer(MeasurementType type) {
  if (type != Cellular && type != Wlan) return Ok;
  SharedPointer<core::ITimer>& timer = cancelTimer(type);
  if (!timer) {
    timer = SharedPointer<core::ITimer>(core::ITimer::create(this));
    if (!timer) return OutOfMemory;
  }
  const int ms = type == Cellular ? kCellularTimeoutMs : kWlanTimeoutMs;
  return static_cast<Status>(timer->start(ms, 0, 1000));
}

Status RadioAdaptationCommon::stopCancelTimer(MeasurementType type) {
  if (type != Cellular && type != Wlan) return Ok;
  SharedPointer<core::ITimer>& timer = cancelTimer(type);
  return timer ? static_cast<Status>(timer->stop()) : Ok;
}

Status RadioAdaptationCommon::cancelRequest(unsigned int requestId) {
  if (requestId == 0) return InvalidArgument;
  auto entry = pendingRequests.begin();
  while (entry != pendingRequests.end() && entry->second != requestId) ++entry;
  if (entry == pendingRequests.end()) return NotFound;

  const MeasurementType type = entry->first;
  for (MeasurementType bit : kTypesInOrder) {
    if (!(type & bit)) continue;
    (void)stopCancelTimer(bit);
    (void)doCancelRequest(bit);
  }
  // By key: the platform may have completed the request while cancelling.
  pendingRequests.erase(type);
  radioLog("request %u cancelled\n", requestId);
  return Ok;
}

void RadioAdaptationCommon::cancelAllRequests() {
  (void)stopCancelTimer(Cellular);
  (void)stopCancelTimer(Wlan);
  std::map<MeasurementType, unsigned int> pending;
  pending.swap(pendingRequests);
  for (const auto& entry : pending) {
    for (MeasurementType bit : kTypesInOrder)
      if (entry.first & bit) (void)doCancelRequest(bit);
  }
}

void RadioAdaptationCommon::timeout(core::ITimer* timer) {
  MeasurementType type;
  if (timer && timer == cellularCancelTimer.get())
    type = Cellular;
  else if (timer && timer == wlanCancelTimer.get())
    type = Wlan;
  else
    return;
  auto pending = pendingRequests.find(type);
  if (pending == pendingRequests.end()) return;
  radioLog("request %u timed out\n", pending->second);
  (void)doCancelRequest(type);
  handleRequestComplete(type, SharedPointer<GenericObject>(), Timeout, false);
}

void RadioAdaptationCommon::handleRequestComplete(MeasurementType type,
                                                  const SharedPointer<GenericObject>& measurements,
                                                  Status status, bool deliverAsync) {
  (void)stopCancelTimer(type);
  if (!observer) return;

  SharedPointer<GenericObject> m = measurements;
  if (!isUsable(status)) {
    m.clear();
  } else if (m) {
    if (m->key() != schema::MeasurementContainer::kTypeId) throw WrongObjectType;
    (void)addTimeStamp(m, static_cast<long>(std::time(nullptr)));
    (void)addUnreliableStateTimeStamp(m);
  }

  Result result{0, type, m, status};
  auto pending = pendingRequests.find(type);
  if (pending != pendingRequests.end()) {
    result.requestId = pending->second;
    pendingRequests.erase(pending);
  }
  if (deliverAsync)
    scheduleNotification(result);
  else
    issueNotification(result);
}

void RadioAdaptationCommon::scheduleNotification(const Result& result) {
  notificationQueue.push_back(result);
  // One queued call per result keeps delivery one at a time, oldest first.
  if (!dispatcher || !dispatcher->queueAsyncCall(&asyncHelper, nullptr)) {
    radioLog("result of request %u dropped: no queued call\n", result.requestId);
    notificationQueue.pop_back();
  }
}

void RadioAdaptationCommon::handleAsyncCallPrivate() { issueNextNotification(); }

void RadioAdaptationCommon::issueNextNotification() {
  if (notificationQueue.empty()) return;
  // Taken off the queue before the observer runs: it may destroy this
  // engine from inside the call.
  Result result = std::move(notificationQueue.front());
  notificationQueue.pop_front();
  issueNotification(result);
}

void RadioAdaptationCommon::issueNotification(const Result& result) {
  if (!observer) return;
  radioLog("request %u of kind %d: %s\n", result.requestId, result.type, statusName(result.status));
  observer->radioMeasurementsReady(result.requestId, result.type, result.measurements,
                                   result.status);
}

Status RadioAdaptationCommon::setSimulationEnabled(bool) { return NotSupported; }

Status RadioAdaptationCommon::setObserver(IRadioAdaptationObserver* o) {
  observer = o;
  if (!o) cancelAllRequests();
  return Ok;
}

void RadioAdaptationCommon::onSubscriptionChanged(int, bool) {}

Status RadioAdaptationCommon::doRequest(MeasurementType) { return NotSupported; }
Status RadioAdaptationCommon::doCancelRequest(MeasurementType) { return NotSupported; }

SharedPointer<GenericObject> RadioAdaptationCommon::doParseMeasurement(const void* data, int,
                                                                      Status& status) {
  if (!data) {
    status = InvalidArgument;
    return SharedPointer<GenericObject>();
  }
  const SharedPointer<GenericObject>& object = *static_cast<const SharedPointer<GenericObject>*>(data);
  // Wrapped only for the tracing hooks; a wrong key is refused by the caller.
  SharedPointer<schema::MeasurementContainer> container = schema::MeasurementContainer::create(object);
  if (container) {
    MeasurementTracing::logMeasurement(*container, static_cast<long>(std::time(nullptr)));
    MeasurementTracing::logMeasurementDebug(*container, "PUSH RADIO", "api", false);
  }
  status = Ok;
  return object;
}

int RadioAdaptationCommon::doParseNetworkStatus(const void* data, MeasurementType, Status& status) {
  if (!data) {
    status = InvalidArgument;
    return 0;
  }
  status = Ok;
  return *static_cast<const int*>(data);
}

Status RadioAdaptationCommon::pushMeasurement(const void* data, int, int types) {
  const int type = verifyMeasurementTypes(types);
  if (type == 0) return InvalidArgument;
  Status status = Ok;
  SharedPointer<GenericObject> m;
  try {
    m = doParseMeasurement(data, type, status);
    if (!isUsable(status)) return status;
    if (m) {
      if (m->key() != schema::MeasurementContainer::kTypeId) throw WrongObjectType;
      (void)addTimeStamp(m, static_cast<long>(std::time(nullptr)));
      (void)addUnreliableStateTimeStamp(m);
    }
  } catch (...) {
    return Failed;
  }
  scheduleNotification(Result{0, type, m, status});
  return Ok;
}

Status RadioAdaptationCommon::pushNetworkStatus(const void* data, int subscription,
                                                MeasurementType type) {
  if (subscription > 0) return NotSupported;
  Status status = Ok;
  const int value = doParseNetworkStatus(data, type, status);
  if (status != Ok) return status;
  switch (type) {
    case Wlan:
      wifiStatusValue = value;
      break;
    case Gnss:
      gnssStatusValue = value;
      break;
    case Cellular:
      networkStatusFlags = value;
      // The unreliable state keeps the time it began while it lasts.
      if (!(value & kUnreliableMeasurementsFlag))
        unreliableSince = 0;
      else if (unreliableSince == 0)
        unreliableSince = std::time(nullptr);
      break;
    default:
      return NotSupported;
  }
  return status;
}

int RadioAdaptationCommon::networkStatus(int subscription) {
  return subscription <= 0 ? networkStatusFlags : 0;
}
int RadioAdaptationCommon::wifiStatus(int) { return wifiStatusValue; }
int RadioAdaptationCommon::gnssStatus(int) { return gnssStatusValue; }

Status RadioAdaptationCommon::addTimeStamp(SharedPointer<GenericObject>& object, long time) {
  if (!object) return Ok;
  if (time == -1) return Failed;
  for (unsigned short collection : kCellularCollections) {
    // An empty collection ends the walk with NotFound, leaving the
    // collections after it unstamped; callers ignore the result.
    const Status status =
        addTimeStamp(object, collection, kTimeStampProperty, static_cast<unsigned int>(time));
    if (status != Ok) return status;
  }
  return Ok;
}

Status RadioAdaptationCommon::addTimeStamp(SharedPointer<GenericObject>& object,
                                           unsigned short collectionId, unsigned short propertyId,
                                           unsigned int value) {
  SharedPointer<gom::ValueCollection> collection;
  if (!object || object->getCollectionProperty(collectionId, collection) != Ok || !collection)
    return Ok;
  if (collection->empty()) return NotFound;
  for (gom::Variant* item : *collection) {
    SharedPointer<GenericObject> element;
    if (!item || item->getGenericObjectValue(element) != Ok || !element) {
      if (item) item->dump();
      return Failed;
    }
    // A stamp the platform set already wins.
    if (element->propertyExists(propertyId)) continue;
    const Status status = element->setUint32Property(propertyId, value);
    if (status != Ok) return status;
  }
  return Ok;
}

Status RadioAdaptationCommon::addUnreliableStateTimeStamp(SharedPointer<GenericObject>& object) {
  if (!object || !(networkStatusFlags & kUnreliableMeasurementsFlag)) return Ok;
  const unsigned int since = static_cast<unsigned int>(unreliableSince);
  Status status = addTimeStamp(object, kUtraFddCollection, kUnreliableStateProperty, since);
  if (status == Ok) status = addTimeStamp(object, kUtraTddCollection, kUnreliableStateProperty, since);
  return status;
}

}  // namespace radioadaptation
}  // namespace lodestack
