#include "lodestack/measurements/MeasurementsProvider.h"

#include <algorithm>
#include <new>

#include "lodestack/debug/Debug.h"
#include "lodestack/measurements/MeasurementsValidator.h"

namespace lodestack {

using gom::GenericObject;
using gom::SharedPointer;

namespace {

const int kKnownTypes = IMeasurementsObserver::Cellular | IMeasurementsObserver::Wlan |
                        IMeasurementsObserver::Gnss;
// Every kind at once, as the provider unsubscribes on destruction.
const int kAllTypes = 0x7FFFFFFF;
// The cellular collections of a container, validated in this order.
const unsigned short kCellularCollections[] = {300, 301, 302, 310, 312};

}  // namespace

IMeasurementsObserver::~IMeasurementsObserver() = default;
ISimulationDataProvider::~ISimulationDataProvider() = default;

MeasurementsProvider::MeasurementsProvider(radioadaptation::IRadioAdaptation& radio)
    : radio(radio), simulationProvider(nullptr) {}

MeasurementsProvider* MeasurementsProvider::create(radioadaptation::IRadioAdaptation& radio) {
  MeasurementsProvider* provider = new (std::nothrow) MeasurementsProvider(radio);
  if (provider && !provider->initialize()) {
    delete provider;
    provider = nullptr;
  }
  return provider;
}

MeasurementsProvider::~MeasurementsProvider() {
  radio.onSubscriptionChanged(kAllTypes, false);
  (void)radio.setObserver(nullptr);
  lastMeasurements.clear();
  observers.clear();
}

bool MeasurementsProvider::initialize() { return radio.setObserver(this) == Ok; }

int MeasurementsProvider::typesToRadioTypes(int types) { return types & kKnownTypes; }
int MeasurementsProvider::radioTypesToTypes(int types) { return types & kKnownTypes; }

int MeasurementsProvider::registeredTypes() const {
  int types = 0;
  for (const Registration& r : observers) types |= r.types;
  return types;
}

const MeasurementsProvider::Registration* MeasurementsProvider::findRegistration(
    const IMeasurementsObserver* observer) const {
  auto found = std::find_if(observers.begin(), observers.end(),
                            [observer](const Registration& r) { return r.observer == observer; });
  return found == observers.end() ? nullptr : &*found;
}

void MeasurementsProvider::addObserver(IMeasurementsObserver& observer, int types) {
  const int before = registeredTypes();
  Registration* registration = const_cast<Registration*>(findRegistration(&observer));
  if (registration)
    registration->types |= types;
  else
    observers.push_back(Registration{&observer, types});
  const int added = types & ~before;
  if (added) radio.onSubscriptionChanged(added, true);
}

void MeasurementsProvider::removeObserver(IMeasurementsObserver& observer, int types) {
  const int before = registeredTypes();
  Registration* registration = const_cast<Registration*>(findRegistration(&observer));
  if (!registration) return;
  registration->types &= ~types;
  if (registration->types == 0)
    observers.erase(observers.begin() + (registration - observers.data()));
  const int dropped = before & ~registeredTypes();
  if (dropped) radio.onSubscriptionChanged(dropped, false);
}

Status MeasurementsProvider::requestMeasurements(int types, unsigned int& requestId) {
  if (typesToRadioTypes(types) == 0) return InvalidArgument;
  // The caller's mask goes on unchanged: the adaptation refuses two kinds.
  return radio.requestMeasurements(types, requestId);
}

Status MeasurementsProvider::cancelRequest(unsigned int requestId) {
  return radio.cancelRequest(requestId);
}

Status MeasurementsProvider::setSimulationEnabled(ISimulationDataProvider*) { return NotSupported; }

SharedPointer<schema::MeasurementContainer> MeasurementsProvider::getLastMeasurements() const {
  return lastMeasurements;
}

Status MeasurementsProvider::pushMeasurement(const void* data, int size, int types) {
  return radio.pushMeasurement(data, size, typesToRadioTypes(types));
}

Status MeasurementsProvider::pushNetworkStatus(const void* data, int subscription,
                                               IMeasurementsObserver::MeasurementType type) {
  return radio.pushNetworkStatus(
      data, subscription,
      static_cast<radioadaptation::IRadioAdaptationObserver::MeasurementType>(
          typesToRadioTypes(type)));
}

SharedPointer<GenericObject> MeasurementsProvider::getRadioSimulationData() {
  return simulationProvider ? simulationProvider->getSimulationData() : SharedPointer<GenericObject>();
}

void MeasurementsProvider::radioMeasurementsReady(unsigned int requestId, int type,
                                                  SharedPointer<GenericObject> measurements,
                                                  Status status) {
  if (isUsable(status)) {
    const Status analysis = analyzeRadioMeasurements(measurements);
    if (analysis == UnreliableMeasurement) {
      if (status == Ok) status = UnreliableMeasurement;
    } else if (analysis != Ok) {
      measurements.clear();
      status = analysis;
    }
  }
  const int types = radioTypesToTypes(type);
  Debug::log(Debug::Level1, gMeasurementsComponentName, "result of request %u, kinds %d: %s\n",
             requestId, types, statusName(status));

  // The walk is over a snapshot of the list, and each observer is looked up
  // again before its call, so one that an earlier observer removed is not
  // called and one it added waits for the next result.
  std::vector<IMeasurementsObserver*> targets;
  for (const Registration& r : observers)
    if (r.types & types) targets.push_back(r.observer);
  for (IMeasurementsObserver* target : targets) {
    const Registration* current = findRegistration(target);
    if (!current || !(current->types & types)) continue;
    try {
      target->measurementsReady(requestId, types, measurements, status);
    } catch (...) {
      // An observer's failure is its own; the others still hear the result.
    }
  }
  if (measurements) saveResults(measurements);
}

Status MeasurementsProvider::analyzeRadioMeasurements(SharedPointer<GenericObject>& object) {
  if (!object || object->key() != schema::MeasurementContainer::kTypeId) return NotFound;
  for (unsigned short collection : kCellularCollections)
    MeasurementsValidator::validateMeasurementCollection(collection, object);
  return Ok;
}

void MeasurementsProvider::saveResults(SharedPointer<GenericObject>& object) {
  lastMeasurements = object ? schema::MeasurementContainer::create(object)
                            : schema::MeasurementContainer::create();
  if (!lastMeasurements) throw OutOfMemory;
}

}  // namespace lodestack
