// ShapeMatrix: the covariance of a horizontal position in degrees^2, the
// shape of an uncertainty ellipse. Element 0 is the latitude variance,
// element 1 the latitude-longitude covariance, element 2 the longitude
// variance. Conversions from metres use the WGS 84 ellipsoid
// (schema::Utility::meterInDegrees).
//
// A plain value type; any thread may use its own copies.
#ifndef LODESTACK_MATH_SHAPEMATRIX_H
#define LODESTACK_MATH_SHAPEMATRIX_H

#include "lodestack/math/Symmetric2by2Matrix.h"

namespace lodestack {

class Midpoint;
class StateEstimate;
class StateEstimateCovariance;

class LODESTACK_EXPORT ShapeMatrix : public Symmetric2by2Matrix {
 public:
  ShapeMatrix() = default;
  ShapeMatrix(double latitudeVariance, double covariance, double longitudeVariance)
      : Symmetric2by2Matrix(latitudeVariance, covariance, longitudeVariance) {}
  // Implicit on purpose: the sums and products of the base convert back.
  ShapeMatrix(const Symmetric2by2Matrix& matrix) : Symmetric2by2Matrix(matrix) {}

  // Makes this matrix the covariance of an ellipse with semi-axes
  // `semiMajor` and `semiMinor` metres whose major axis points `angle`
  // degrees clockwise from north, centred at `latitude` degrees. False,
  // with the matrix unchanged, at a pole.
  bool ellConvert(double latitude, double semiMajor, double semiMinor, double angle);

  // Adds the covariance of a circle of radius sqrt(q dt) metres (a random
  // walk of variance rate q over dt) and grows `accumulated` by q x. Returns
  // what ellConvert returns; at a pole nothing changes.
  bool increaseUncertainty(double latitude, double q, double dt, double x, double& accumulated);

  // Grows the standard deviation of each axis by rate sqrt(dt) metres.
  // The covariance element is kept: growth by isotropic motion adds
  // variance along the axes only. False, with nothing changed, at a pole.
  bool increaseUncertaintyAtConstRate(double latitude, double rate, double dt);

  // Fuses a measured position (centre `measurement`, covariance this
  // matrix) with the position part of a state estimate (elements 0, 1 of
  // `state`, covariance the position block of `covariance`), weighting each
  // by the other's uncertainty. On success `combined` receives the fused
  // position and this matrix the fused covariance. False, with nothing
  // changed, when the sum of the two covariances is singular.
  bool reweightMeasurement(const Midpoint& measurement, const StateEstimate& state,
                           const StateEstimateCovariance& covariance, Midpoint& combined);
};

}  // namespace lodestack

#endif  // LODESTACK_MATH_SHAPEMATRIX_H
