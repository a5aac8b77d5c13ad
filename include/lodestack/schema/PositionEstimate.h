// PositionEstimate (type id 113): the schema's position fix, a value record
// (see Record.h) with a 32-bit presence mask. Fields in order, with presence
// bits and what their setters accept:
//
//   latitude (2)                  degrees, -90 to 90
//   longitude (4)                 degrees, -180 included to 180 excluded
//   horizontalCepUncertainty (8)  metres, above 0 up to 4294967295
//   majorAxis (16), minorAxis (32) metres, above 0 up to 4294967295
//   angle (64)                    degrees, 0 included to 180 excluded
//   altitude (128)                metres, -16383.5 to 16383.5
//   altitudeUncertainty (256)     metres, above 0 up to 65535
//   speed (512)                   metres per second, 0 or above
//   speedUncertainty (1024)       metres per second, above 0
//   course (2048)                 degrees, -180 included to 180 excluded
//   courseUncertainty (4096)      degrees, above 0 and below 180
//   technology (8192)             bit set of Technology, any
//   source (16384)                Source, any
//   timeStamp (1)                 seconds since the epoch, any but 0
//
// All but technology, source and timeStamp are doubles. A setter given a
// value out of range (NaN included) returns InvalidArgument and changes
// nothing. Unlike the other records, every getter throws WrongObjectType (2)
// when its property is absent: test valueExists first. Factories return an
// empty pointer when a value is refused or memory is exhausted. One thread
// at a time.
#ifndef LODESTACK_SCHEMA_POSITIONESTIMATE_H
#define LODESTACK_SCHEMA_POSITIONESTIMATE_H

#include <string>

#include "lodestack/schema/Record.h"

namespace lodestack {
namespace schema {

using PositionEstimateFields =
    FieldTable<unsigned int, Field<double, 2>, Field<double, 4>, Field<double, 8>,
               Field<double, 16>, Field<double, 32>, Field<double, 64>, Field<double, 128>,
               Field<double, 256>, Field<double, 512>, Field<double, 1024>, Field<double, 2048>,
               Field<double, 4096>, Field<unsigned int, 8192>, Field<unsigned int, 16384>,
               Field<unsigned int, 1>>;

class LODESTACK_EXPORT PositionEstimate
    : public Record<PositionEstimate, 113, PositionEstimateFields> {
 public:
  enum Bit : unsigned int {
    TimeStamp = 1,
    Latitude = 2,
    Longitude = 4,
    HorizontalCepUncertainty = 8,
    MajorAxis = 16,
    MinorAxis = 32,
    Angle = 64,
    Altitude = 128,
    AltitudeUncertainty = 256,
    Speed = 512,
    SpeedUncertainty = 1024,
    Course = 2048,
    CourseUncertainty = 4096,
    TechnologyBit = 8192,
    SourceBit = 16384
  };
  // Bits of `technology`: what the position was computed from.
  enum Technology : unsigned int {
    TechnologyGnss = 1,      // a satellite fix (the only value GNSS data gives)
    TechnologyCellular = 2,  // cellular measurements
    TechnologyWlan = 4       // WLAN access points
  };
  // Who produced the estimate.
  enum Source : unsigned int {
    SourceUnknown = 0,
    SourceLocationManager = 1,  // the platform's location service (free GNSS)
    SourcePositioning = 2,      // computed by the positioning service
    SourceInjection = 3         // handed in from outside
  };

  using Record::create;
  static gom::SharedPointer<PositionEstimate> create(double latitude, double longitude,
                                                     unsigned int timeStamp);
  static gom::SharedPointer<PositionEstimate> create(double latitude, double longitude,
                                                     double horizontalCepUncertainty,
                                                     unsigned int timeStamp);
  static gom::SharedPointer<PositionEstimate> create(double latitude, double longitude,
                                                     double majorAxis, double minorAxis,
                                                     double angle, unsigned int timeStamp);

  double latitude() const { return present<0>(); }
  double longitude() const { return present<1>(); }
  double horizontalCepUncertainty() const { return present<2>(); }
  double majorAxis() const { return present<3>(); }
  double minorAxis() const { return present<4>(); }
  double angle() const { return present<5>(); }
  double altitude() const { return present<6>(); }
  double altitudeUncertainty() const { return present<7>(); }
  double speed() const { return present<8>(); }
  double speedUncertainty() const { return present<9>(); }
  double course() const { return present<10>(); }
  double courseUncertainty() const { return present<11>(); }
  unsigned int technology() const { return present<12>(); }
  Source source() const { return static_cast<Source>(present<13>()); }
  unsigned int timeStamp() const { return present<14>(); }

  [[nodiscard]] Status setLatitude(double v) { return checked<0>(v); }
  [[nodiscard]] Status setLongitude(double v) { return checked<1>(v); }
  [[nodiscard]] Status setHorizontalCepUncertainty(double v) { return checked<2>(v); }
  [[nodiscard]] Status setMajorAxis(double v) { return checked<3>(v); }
  [[nodiscard]] Status setMinorAxis(double v) { return checked<4>(v); }
  [[nodiscard]] Status setAngle(double v) { return checked<5>(v); }
  [[nodiscard]] Status setAltitude(double v) { return checked<6>(v); }
  [[nodiscard]] Status setAltitudeUncertainty(double v) { return checked<7>(v); }
  [[nodiscard]] Status setSpeed(double v) { return checked<8>(v); }
  [[nodiscard]] Status setSpeedUncertainty(double v) { return checked<9>(v); }
  [[nodiscard]] Status setCourse(double v) { return checked<10>(v); }
  [[nodiscard]] Status setCourseUncertainty(double v) { return checked<11>(v); }
  Status setTechnology(unsigned int v) { return setField<12>(v); }
  Status setSource(Source v) { return setField<13>(static_cast<unsigned int>(v)); }
  [[nodiscard]] Status setTimeStamp(unsigned int v) { return checked<14>(v); }

  // Whether `value` is admissible for the property of presence bit `bit`
  // (the table above); NaN never is. Bits without a range admit anything.
  static bool admissible(unsigned int bit, double value);

  // Integer views of horizontalCepUncertainty (truncated) and of
  // altitudeUncertainty (truncated, then its low 16 bits). The getters
  // throw like the others; the setters refuse 0.
  unsigned int horizontalAccuracy() const;
  unsigned short altitudeAccuracy() const;
  [[nodiscard]] Status setHorizontalAccuracy(unsigned int metres);
  [[nodiscard]] Status setAltitudeAccuracy(unsigned short metres);

  // One line for diagnostics: "<component> <label>: lat .. lon .. ...",
  // the present position and uncertainty, and with `full` also altitude,
  // speed, course, technology and source. Absent values are left out.
  std::string dumpShort(const char* label, const char* component, bool full) const;

 private:
  template <std::size_t I>
  Table::TypeAt<I> present() const {
    if (!valueExists(Table::bitOf<I>())) throw WrongObjectType;
    return field<I>();
  }
  template <std::size_t I>
  Status checked(const Table::TypeAt<I>& v) {
    return admissible(Table::bitOf<I>(), v) ? setField<I>(v) : InvalidArgument;
  }
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_POSITIONESTIMATE_H
