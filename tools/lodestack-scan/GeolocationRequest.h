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
// give no entry at all. Neighbour cells with an id become towers of the
// serving cell's network. Both lists are always present, possibly empty.
#ifndef LODESTACK_SCAN_GEOLOCATIONREQUEST_H
#define LODESTACK_SCAN_GEOLOCATIONREQUEST_H

#include <lodestack/schema/MeasurementContainer.h>

#include "MeasurementTree.h"

namespace lodestack {
namespace scan {

// Either container may be null (no usable result of that kind this round).
// Throws Status WrongObjectType for a tree the schema's classes cannot walk.
Json geolocationRequest(const gom::SharedPointer<schema::MeasurementContainer>& cellular,
                        const gom::SharedPointer<schema::MeasurementContainer>& wlan);

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_GEOLOCATIONREQUEST_H
