// MeasurementsProvider: the library's entry point. A client creates it over a
// radio adaptation, registers observers for the kinds it wants (Cellular,
// Wlan, Gnss), requests cellular and WLAN measurements one kind at a time,
// and receives each result, validated (see MeasurementsValidator), through
// every observer registered for its kind, in registration order. GNSS fixes
// are never requested: they arrive while some observer wants Gnss. The last
// result that carried an object is kept for getLastMeasurements().
//
//   IRadioAdaptation* radio = RadioAdaptationFactory::createRadioAdaptation();
//   MeasurementsProvider* provider = MeasurementsProvider::create(*radio);
//   provider->addObserver(myObserver, IMeasurementsObserver::Cellular);
//   unsigned int id;
//   provider->requestMeasurements(IMeasurementsObserver::Cellular, id);
//   ... run the thread's dispatcher; results reach myObserver ...
//   delete provider;  // before the adaptation
//   delete radio;
//
// Ownership: the caller owns the provider (delete it) and the adaptation,
// which must outlive the provider; observers are not owned. Threading: one
// thread, the one whose dispatcher the adaptation runs on; no locks.
// Destruction unsubscribes every kind and cancels pending requests; the
// observers are not told.
#ifndef LODESTACK_MEASUREMENTS_MEASUREMENTSPROVIDER_H
#define LODESTACK_MEASUREMENTS_MEASUREMENTSPROVIDER_H

#include <vector>

#include "lodestack/measurements/IMeasurementsObserver.h"
#include "lodestack/measurements/ISimulationDataProvider.h"
#include "lodestack/radioadaptation/IRadioAdaptation.h"
#include "lodestack/schema/MeasurementContainer.h"

namespace lodestack {

class LODESTACK_EXPORT MeasurementsProvider : public radioadaptation::IRadioAdaptationObserver {
 public:
  // A provider installed as `radio`'s observer; null when memory is short or
  // the adaptation refuses the observer. The caller deletes it.
  static MeasurementsProvider* create(radioadaptation::IRadioAdaptation& radio);
  ~MeasurementsProvider() override;

  // Makes this the adaptation's only observer; true when it accepted.
  bool initialize();

  // Adds the kinds of `types` to `observer`'s registration (made on first
  // use, at the end of the list). Kinds no observer wanted before are
  // subscribed at the adaptation.
  void addObserver(IMeasurementsObserver& observer, int types);
  // Removes kinds from the registration; one left with none is dropped.
  // Kinds no observer wants any more are unsubscribed. An observer may add
  // or remove registrations from inside measurementsReady: one removed
  // there is not called again for the result being delivered.
  void removeObserver(IMeasurementsObserver& observer, int types);

  // Asks for one kind (Cellular or Wlan). InvalidArgument, without touching
  // requestId, when `types` names no kind; otherwise the adaptation's answer
  // (see IRadioAdaptation::requestMeasurements: two kinds at once are
  // InvalidArgument, Gnss NotSupported).
  Status requestMeasurements(int types, unsigned int& requestId);
  // The adaptation's cancelRequest.
  Status cancelRequest(unsigned int requestId);
  // NotSupported; nothing is stored.
  Status setSimulationEnabled(ISimulationDataProvider* provider);
  // The last result that carried an object; null before the first.
  gom::SharedPointer<schema::MeasurementContainer> getLastMeasurements() const;
  // Forward platform data to the adaptation (see IRadioAdaptation).
  Status pushMeasurement(const void* data, int size, int types);
  Status pushNetworkStatus(const void* data, int subscription,
                           IMeasurementsObserver::MeasurementType type);

  // IRadioAdaptationObserver.
  gom::SharedPointer<gom::GenericObject> getRadioSimulationData() override;
  void radioMeasurementsReady(unsigned int requestId, int type,
                              gom::SharedPointer<gom::GenericObject> measurements,
                              Status status) override;

  // The service's and the adaptation's kind masks; bits 1, 2 and 4 map to
  // themselves, others are dropped.
  static int typesToRadioTypes(int types);
  static int radioTypesToTypes(int types);

 private:
  struct Registration {
    IMeasurementsObserver* observer;
    int types;
  };

  explicit MeasurementsProvider(radioadaptation::IRadioAdaptation& radio);

  // Validates a container in place: NotFound for a null object or one that
  // is not a container, else Ok.
  Status analyzeRadioMeasurements(gom::SharedPointer<gom::GenericObject>& object);
  // Keeps `object` as the last result. Throws OutOfMemory when no handle
  // can be made.
  void saveResults(gom::SharedPointer<gom::GenericObject>& object);
  int registeredTypes() const;
  const Registration* findRegistration(const IMeasurementsObserver* observer) const;

  radioadaptation::IRadioAdaptation& radio;
  ISimulationDataProvider* simulationProvider;
  std::vector<Registration> observers;
  gom::SharedPointer<schema::MeasurementContainer> lastMeasurements;
};

}  // namespace lodestack

#endif  // LODESTACK_MEASUREMENTS_MEASUREMENTSPROVIDER_H
