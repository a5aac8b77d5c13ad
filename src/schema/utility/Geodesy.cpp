// Coordinate coding, angle conversions and spherical geodesy of Utility.
#include <climits>
#include <cmath>

#include "lodestack/schema/utility/Utility.h"

namespace lodestack {
namespace schema {

namespace {

const double kPi = 3.141592653589793;
const double kTwoToThe31 = 2147483648.0;
const double kTwoToTheMinus31 = 4.656612873077393e-10;
const double kDegreesToRadians = 0.017453292519943295;
const double kRadiansToDegrees = 57.29577951308232;
const double kEarthRadius = 6371010.0;  // the sphere of distance() and bearing()
// WGS 84 ellipsoid: semi-major axis, first eccentricity squared and
// 1 / (a (1 - e^2)).
const double kSemiMajorAxis = 6378137.0;
const double kEccentricitySquared = 0.006694380004260814;
const double kInverseMeridianScale = 1.578422502929283e-07;

// Degrees to the signed 32-bit coding of the range [-range, range].
int codeAngle(double degrees, double range) {
  if (degrees < -range) return INT_MIN;
  if (degrees > range) return INT_MAX;
  if (std::isnan(degrees)) return 0;
  double x = std::floor(degrees / range * kTwoToThe31);
  if (x >= kTwoToThe31) x -= 1.0;  // +range itself codes as INT_MAX
  return static_cast<int>(x);
}

}  // namespace

double Utility::wgs84Latitude(int coded) { return coded * 90.0 * kTwoToTheMinus31; }

int Utility::latitude(double degrees) { return codeAngle(degrees, 90.0); }

double Utility::wgs84Longitude(int coded) { return coded * 180.0 * kTwoToTheMinus31; }

int Utility::longitude(double degrees) { return codeAngle(degrees, 180.0); }

double Utility::toDegrees(float radians) {
  if (radians < 0.0f) return 0.0;
  if (radians > static_cast<float>(kPi)) return 180.00000500895632;  // single-precision pi
  return static_cast<double>(radians) / kPi * 180.0;
}

double Utility::toRadians(double degrees) {
  if (degrees < 0.0) return 0.0;
  if (degrees > 180.0) return kPi;
  return degrees / 180.0 * kPi;
}

bool Utility::meterInDegrees(double latitude, double& lonDegreesPerMetre,
                             double& latDegreesPerMetre) {
  const double phi = latitude * kPi / 180.0;
  const double s = std::sin(phi), c = std::cos(phi);
  const double w = std::sqrt(1.0 - kEccentricitySquared * s * s);
  if (phi == kPi / 2 || phi == -kPi / 2) {
    lonDegreesPerMetre = latDegreesPerMetre = 0.0;
    return false;
  }
  // 1 / (N cos phi) with N = a / W, and 1 / M with M = a (1 - e^2) / W^3.
  lonDegreesPerMetre = w * kRadiansToDegrees / (kSemiMajorAxis * c);
  latDegreesPerMetre = w * w * w * kRadiansToDegrees * kInverseMeridianScale;
  return true;
}

bool Utility::degreeInMeters(double latitude, double& metresPerLonDegree,
                             double& metresPerLatDegree) {
  double lon = 0.0, lat = 0.0;
  if (!meterInDegrees(latitude, lon, lat)) {
    metresPerLonDegree = metresPerLatDegree = 0.0;
    return false;
  }
  metresPerLonDegree = 1.0 / lon;
  metresPerLatDegree = 1.0 / lat;
  return true;
}

double Utility::normalizedSinOrCosValue(double x) {
  if (x > 1.0) return 1.0;
  if (x < -1.0) return -1.0;
  return x;
}

double Utility::cosAlpha(double lat1, double lon1, double lat2, double lon2) {
  const double phi1 = lat1 * kDegreesToRadians, phi2 = lat2 * kDegreesToRadians;
  return normalizedSinOrCosValue(std::sin(phi1) * std::sin(phi2) +
                                 std::cos(phi1) * std::cos(phi2) *
                                     std::cos((lon2 - lon1) * kDegreesToRadians));
}

bool Utility::distance(double lat1, double lon1, double lat2, double lon2, double& metres) {
  if (lat1 == lat2 && lon1 == lon2) {
    metres = 0.0;
    return true;
  }
  metres = std::acos(cosAlpha(lat1, lon1, lat2, lon2)) * kEarthRadius;
  return true;
}

bool Utility::bearing(double lat1, double lon1, double lat2, double lon2, double& degrees) {
  degrees = 0.0;
  if (lat1 == lat2 && lon1 == lon2) return true;
  if (lat1 == 90.0 || lat1 == -90.0) {
    degrees = lat1 > 0.0 ? 180.0 : 0.0;
    return true;
  }
  const double cosine = cosAlpha(lat1, lon1, lat2, lon2);
  if (cosine == 1.0 || cosine == -1.0) return true;
  const double dLon = lon2 - lon1;
  if (std::fabs(std::remainder(dLon, 360.0)) == 180.0) {
    // Half a turn of longitude apart: antipodes (every way is shortest; north
    // is taken), or two points of one parallel, joined over the nearer pole.
    if (lat2 == -lat1) return true;
    if (lat2 == lat1) {
      degrees = lat1 > 0.0 ? 0.0 : 180.0;
      return true;
    }
  }
  // Initial course of the great circle:
  // atan2(sin dLon cos phi2, cos phi1 sin phi2 - sin phi1 cos phi2 cos dLon).
  const double phi1 = lat1 * kDegreesToRadians, phi2 = lat2 * kDegreesToRadians;
  const double lambda = dLon * kDegreesToRadians;
  const double y = std::sin(lambda) * std::cos(phi2);
  const double x = std::cos(phi1) * std::sin(phi2) -
                   std::sin(phi1) * std::cos(phi2) * std::cos(lambda);
  double course = std::atan2(y, x) * kRadiansToDegrees;
  if (course < 0.0) course += 360.0;
  if (course >= 360.0) course -= 360.0;
  degrees = course;
  return true;
}

}  // namespace schema
}  // namespace lodestack
