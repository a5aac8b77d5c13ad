// Utility: the positioning helpers of the schema, all static.
//
// - The integer coding of coordinates used by Coverage: a latitude in units
//   of 90 / 2^31 degrees, a longitude in units of 180 / 2^31 degrees.
// - Angle conversions, and the size of one metre in degrees on the WGS 84
//   ellipsoid at a given latitude.
// - Great-circle distance and initial bearing on a spherical earth of radius
//   6371010 m.
// - The ranking of WLAN measurements by received level, and the trimming
//   of a collection of them to its strongest entries.
// - Distances and the overlap test between two uncertainty ellipses, each a
//   centre (Midpoint) and a covariance in degrees^2 (ShapeMatrix); an
//   ellipse is the set of points x with (x - m)^T S^-1 (x - m) <= 1.
//
// Angles are degrees unless stated. Every function but trimWlanCollection is
// pure and may be called from any thread; trimWlanCollection edits the
// collection it is given, which belongs to one thread at a time.
#ifndef LODESTACK_SCHEMA_UTILITY_UTILITY_H
#define LODESTACK_SCHEMA_UTILITY_UTILITY_H

#include "lodestack/core/Export.h"
#include "lodestack/gom/ValueCollection.h"

namespace lodestack {

class Midpoint;
class ShapeMatrix;

namespace schema {

class LODESTACK_EXPORT Utility {
 public:
  // Coded latitude to degrees: i x 90 x 2^-31.
  static double wgs84Latitude(int coded);
  // Degrees to coded latitude, rounding down. Saturates: below -90 gives
  // INT_MIN, above 90 INT_MAX (90 itself codes as INT_MAX); NaN gives 0.
  static int latitude(double degrees);
  // Coded longitude to degrees: i x 180 x 2^-31.
  static double wgs84Longitude(int coded);
  // Degrees to coded longitude, like latitude() with 180 for 90.
  static int longitude(double degrees);

  // Radians to degrees, the input clamped to [0, single-precision pi].
  static double toDegrees(float radians);
  // Degrees to radians, the input clamped to [0, 180].
  static double toRadians(double degrees);

  // Degrees spanned by one metre at `latitude`: along the parallel (first
  // output) and along the meridian (second output). False, with both outputs
  // 0, at a pole, where the parallel has no length.
  static bool meterInDegrees(double latitude, double& lonDegreesPerMetre,
                             double& latDegreesPerMetre);
  // Metres per degree, the reciprocals of meterInDegrees; false, with both
  // outputs 0, at a pole.
  static bool degreeInMeters(double latitude, double& metresPerLonDegree,
                             double& metresPerLatDegree);

  // x clamped to [-1, 1]; NaN is returned as it is.
  static double normalizedSinOrCosValue(double x);
  // Cosine of the central angle between two points (spherical law of
  // cosines), clamped to [-1, 1].
  static double cosAlpha(double lat1, double lon1, double lat2, double lon2);
  // Great-circle distance in metres on the sphere of radius 6371010 m;
  // exactly 0 for identical points. Always true.
  static bool distance(double lat1, double lon1, double lat2, double lon2, double& metres);
  // Initial great-circle bearing from the first point to the second, in
  // [0, 360), clockwise from north. Conventions where the direction is not
  // defined: identical points (or points the central-angle cosine cannot
  // tell apart) give 0; from the north pole every direction is south, 180;
  // from the south pole it is north, 0; two antipodal points give 0, and two
  // points on one parallel half a turn apart give the way over the nearer
  // pole (0 on the northern hemisphere, 180 on the southern). Always true.
  static bool bearing(double lat1, double lon1, double lat2, double lon2, double& degrees);

  // The ordering of trimWlanCollection: true when `a` ranks below `b`. Each
  // variant holds a WlanMeasurement's generic object; its rank is the
  // rxLevel of its wlanApMeasurement (signed). An entry without one (no
  // access point measurement, no rxLevel, not a WLAN measurement at all)
  // ranks below every entry that has one, and level with the others.
  static bool sortWlans(gom::Variant* a, gom::Variant* b);
  // Keeps the `limit` entries of highest rank, releasing the others; the
  // survivors are left in ascending rank (ties in their former order). True
  // when the collection holds `limit` entries or fewer (untouched) or was
  // trimmed; false, with the collection untouched, for an empty pointer or
  // when memory is exhausted.
  static bool trimWlanCollection(unsigned int limit,
                                 gom::SharedPointer<gom::ValueCollection> collection);

  // Whether the two ellipses share a point (touching counts). Covariances
  // must be positive semidefinite; when their sum is singular the ellipses
  // overlap only when the centres coincide.
  static bool intersect(const Midpoint& m1, const ShapeMatrix& s1, const Midpoint& m2,
                        const ShapeMatrix& s2);
  // Mahalanobis form d^T (S1 + S2)^-1 d, d the difference of the centres
  // (longitude difference taken across the 180th meridian where shorter).
  // Infinity when the sum is singular and d is not 0; 0 when d is 0.
  static double mDistance(const Midpoint& m1, const ShapeMatrix& s1, const Midpoint& m2,
                          const ShapeMatrix& s2);
  // Bhattacharyya distance of the two Gaussians, with S = (S1 + S2) / 2:
  // d^T S^-1 d / 8 + ln(det S / sqrt(det S1 det S2)) / 2. Infinity when a
  // matrix is singular.
  static double bDistance(const Midpoint& m1, const ShapeMatrix& s1, const Midpoint& m2,
                          const ShapeMatrix& s2);
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_UTILITY_UTILITY_H
