// Location: a geolocation web service's answer as the library's position
// record, and how it compares with a GNSS fix.
//
// The services answer 200 with {"location": {"lat": degrees, "lng":
// degrees}, "accuracy": metres}, and document the accuracy only as the
// radius of a circle around the location. This tool reads it as the circle
// of 95 % confidence, the meaning the W3C Geolocation API gives its
// accuracy, through which browsers hand these services' answers to web
// pages. Under a circular Gaussian error with deviation s along each axis,
// the distance to the true position follows a Rayleigh law,
// P(r <= R) = 1 - exp(-R^2 / 2s^2), so the circle holding the position with
// probability p has the radius s * sqrt(-2 ln(1 - p)): 2.4477 s for 95 %,
// 1.1774 s for 50 %. The record's horizontalCepUncertainty, the 50 % circle,
// is therefore the accuracy times sqrt(ln 2 / ln 20) = 0.4810.
//
// Errors answer with a status other than 200 and, from these services,
// {"error": {"code": ..., "message": "...", "errors": [{"reason": ...}]}}.
//
// Plain functions on values; any thread.
#ifndef LODESTACK_SCAN_LOCATION_H
#define LODESTACK_SCAN_LOCATION_H

#include <optional>
#include <string>

#include <lodestack/schema/PositionEstimate.h>

#include "MeasurementTree.h"

namespace lodestack {
namespace scan {

// horizontalCepUncertainty per metre of the services' accuracy:
// sqrt(ln 2 / ln 20), the 50 % radius over the 95 % one.
constexpr double kCepPerAccuracyMetre = 0.48101;

struct Location {
  // latitude, longitude, horizontalCepUncertainty and a time stamp (now);
  // source SourceInjection.
  gom::SharedPointer<schema::PositionEstimate> position;
  double accuracy = 0;  // the service's radius, metres
};

// Reads an answer of HTTP status `status`. True with `location` filled for a
// 200 whose body holds a position: lat in [-90, 90], lng in [-180, 180]
// (180 is read as -180, the same meridian) and an accuracy above 0. False
// with a one-line `error` otherwise: "no position for these measurements"
// for 404, "the service answered HTTP <status>: <its message>" for other
// statuses (without ": ..." when the body gives none), and "the answer is
// not a position: <why>" for a 200 that does not hold one.
bool readAnswer(long status, const std::string& body, Location& location, std::string& error);

// A GNSS fix, degrees.
struct Fix {
  double latitude = 0;
  double longitude = 0;
};

// The service's position as one JSON line's object:
// {"kind": "location", "latitude", "longitude", "accuracy",
//  "horizontalCepUncertainty"}, with "distance" (metres, great circle) to
// `fix` and "inside" (whether the fix lies within the accuracy circle) when
// there is one.
Json locationJson(const Location& location, const std::optional<Fix>& fix);

// The same as text, one line with its newline:
// "location: latitude 60.1697000, longitude 24.9360000, accuracy 50.0 m;
//  18.3 m from the GNSS fix, inside the accuracy circle".
std::string locationText(const Location& location, const std::optional<Fix>& fix);

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_LOCATION_H
