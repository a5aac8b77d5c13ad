// The request body of the public geolocation web services, built from one
// round's cellular and WLAN results:
//
//   {"cellTowers": [{"radioType": "gsm" | "wcdma" | "lte",
//                    "mobileCountryCode", "mobileNetworkCode",
//                    "locationAreaCode", "cellId", "signalStrength" (dBm),
//                    "timingAdvance"}, ...],
//    "wifiAccessPoints": [{"macAddress": "aa:bb:cc:dd:ee:ff",
//                          "signalStrength" (dBm)}, ...]}
//
// A value the measurements do not tell is left out; a cell whose cell id is
// unknown (or 0), and a WLAN identifier that is not a 6-byte MAC address,
// give no entry at all. Neither do the access points the services ask
// clients to leave out: those whose network name (when the measurement
// source knew it) ends in "_nomap", and locally administered addresses.
// Neighbour cells with an id become towers of the serving cell's network.
// Both lists are always present, possibly empty.
#ifndef LODESTACK_SCAN_GEOLOCATIONREQUEST_H
#define LODESTACK_SCAN_GEOLOCATIONREQUEST_H

#include <string>

#include <lodestack/schema/MeasurementContainer.h>

#include "MeasurementTree.h"

namespace lodestack {
namespace scan {

// Either container may be null (no usable result of that kind this round).
// Throws Status WrongObjectType for a tree the schema's classes cannot walk.
Json geolocationRequest(const gom::SharedPointer<schema::MeasurementContainer>& cellular,
                        const gom::SharedPointer<schema::MeasurementContainer>& wlan);

// Why the services cannot answer `request`, or empty when they may: without
// a cell tower they want at least two access points.
std::string whyNotLocatable(const Json& request);

// A round's last usable cellular and WLAN results, from which its request
// is built. One thread.
class RoundMeasurements {
 public:
  // Keeps the container of a usable cellular or WLAN result; anything else
  // adds nothing. Throws Status WrongObjectType for a root that is not a
  // measurement container.
  void take(const Result& result);
  // geolocationRequest() of what the round kept; throws like it.
  Json request() const { return geolocationRequest(cellular_, wlan_); }
  void clear();

 private:
  gom::SharedPointer<schema::MeasurementContainer> cellular_;
  gom::SharedPointer<schema::MeasurementContainer> wlan_;
};

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_GEOLOCATIONREQUEST_H
