// Coverage: a position and its uncertainty in compact, integer-coded form
// (latitude in units of 90/2^31 degrees, longitude in units of 180/2^31
// degrees), shared by cell coverage areas and GNSS measurement data. A plain
// value class with its own 8-bit presence mask; its bytes are the mask and
// the present fields (see FieldTable). Fields in order, with presence bits:
//
//   latitude i32 (1), longitude i32 (2), majorAxis u32 (8), minorAxis u32
//   (16), angle float (32), altitude float (4), altitudeUncertainty float
//   (64), horizontalCepUncertainty float (128)
//
// Setters store without checks and return Ok, except
// setHorizontalCepUncertainty, which refuses a negative value or NaN with
// InvalidArgument (0 is accepted). Getters return the stored value.
#ifndef LODESTACK_SCHEMA_COVERAGE_H
#define LODESTACK_SCHEMA_COVERAGE_H

#include "lodestack/schema/Record.h"

namespace lodestack {
namespace schema {

using CoverageFields =
    FieldTable<unsigned char, Field<int, 1>, Field<int, 2>, Field<unsigned int, 8>,
               Field<unsigned int, 16>, Field<float, 32>, Field<float, 4>, Field<float, 64>,
               Field<float, 128>>;

class LODESTACK_EXPORT Coverage : public CoverageFields {
 public:
  using Table = CoverageFields;
  enum Bit : unsigned char {
    Latitude = 1,
    Longitude = 2,
    Altitude = 4,
    MajorAxis = 8,
    MinorAxis = 16,
    Angle = 32,
    AltitudeUncertainty = 64,
    HorizontalCepUncertainty = 128
  };

  Coverage() = default;
  // A circle: mask 131.
  Coverage(int latitude, int longitude, float horizontalCepUncertainty) {
    setFields(latitude, longitude);
    setField<7>(horizontalCepUncertainty);
  }
  // An ellipse: mask 59.
  Coverage(int latitude, int longitude, unsigned int majorAxis, unsigned int minorAxis,
           float angle) {
    setFields(latitude, longitude, majorAxis, minorAxis, angle);
  }
  // An ellipse with altitude: mask 127.
  Coverage(int latitude, int longitude, unsigned int majorAxis, unsigned int minorAxis,
           float angle, float altitude, float altitudeUncertainty) {
    setFields(latitude, longitude, majorAxis, minorAxis, angle, altitude, altitudeUncertainty);
  }

  LODESTACK_RECORD_PROPERTY(0, latitude, setLatitude)
  LODESTACK_RECORD_PROPERTY(1, longitude, setLongitude)
  LODESTACK_RECORD_PROPERTY(2, majorAxis, setMajorAxis)
  LODESTACK_RECORD_PROPERTY(3, minorAxis, setMinorAxis)
  LODESTACK_RECORD_PROPERTY(4, angle, setAngle)
  LODESTACK_RECORD_PROPERTY(5, altitude, setAltitude)
  LODESTACK_RECORD_PROPERTY(6, altitudeUncertainty, setAltitudeUncertainty)
  float horizontalCepUncertainty() const { return field<7>(); }
  Status setHorizontalCepUncertainty(float v) {
    if (!(v >= 0.0f)) return InvalidArgument;  // negative or NaN
    return setField<7>(v);
  }

  bool operator==(const Coverage& other) const { return fieldsEqual(other); }
  bool operator!=(const Coverage& other) const { return !fieldsEqual(other); }
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_COVERAGE_H
