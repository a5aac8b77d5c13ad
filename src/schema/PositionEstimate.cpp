#include "lodestack/schema/PositionEstimate.h"

#include <cstdio>

namespace lodestack {
namespace schema {

namespace {
using Pointer = gom::SharedPointer<PositionEstimate>;
}  // namespace

Pointer PositionEstimate::create(double latitude, double longitude, unsigned int timeStamp) {
  Pointer p = create();
  if (!p || p->setLatitude(latitude) != Ok || p->setLongitude(longitude) != Ok ||
      p->setTimeStamp(timeStamp) != Ok)
    return Pointer();
  return p;
}

Pointer PositionEstimate::create(double latitude, double longitude,
                                 double horizontalCepUncertainty, unsigned int timeStamp) {
  Pointer p = create(latitude, longitude, timeStamp);
  if (!p || p->setHorizontalCepUncertainty(horizontalCepUncertainty) != Ok) return Pointer();
  return p;
}

Pointer PositionEstimate::create(double latitude, double longitude, double majorAxis,
                                 double minorAxis, double angle, unsigned int timeStamp) {
  Pointer p = create(latitude, longitude, timeStamp);
  if (!p || p->setMajorAxis(majorAxis) != Ok || p->setMinorAxis(minorAxis) != Ok ||
      p->setAngle(angle) != Ok)
    return Pointer();
  return p;
}

bool PositionEstimate::admissible(unsigned int bit, double v) {
  switch (bit) {
    case Latitude:
      return v >= -90.0 && v <= 90.0;
    case Longitude:
    case Course:
      return v >= -180.0 && v < 180.0;
    case HorizontalCepUncertainty:
    case MajorAxis:
    case MinorAxis:
      return v > 0.0 && v <= 4294967295.0;
    case Angle:
      return v >= 0.0 && v < 180.0;
    case Altitude:
      return v >= -16383.5 && v <= 16383.5;
    case AltitudeUncertainty:
      return v > 0.0 && v <= 65535.0;
    case Speed:
      return v >= 0.0;
    case SpeedUncertainty:
      return v > 0.0;
    case CourseUncertainty:
      return v > 0.0 && v < 180.0;
    case TimeStamp:
      return v != 0.0;
    default:
      return true;
  }
}

unsigned int PositionEstimate::horizontalAccuracy() const {
  return static_cast<unsigned int>(horizontalCepUncertainty());
}

unsigned short PositionEstimate::altitudeAccuracy() const {
  return static_cast<unsigned short>(static_cast<unsigned int>(altitudeUncertainty()) & 0xFFFF);
}

Status PositionEstimate::setHorizontalAccuracy(unsigned int metres) {
  return metres == 0 ? InvalidArgument : setField<2>(static_cast<double>(metres));
}

Status PositionEstimate::setAltitudeAccuracy(unsigned short metres) {
  return metres == 0 ? InvalidArgument : setField<7>(static_cast<double>(metres));
}

std::string PositionEstimate::dumpShort(const char* label, const char* component,
                                        bool full) const {
  std::string line;
  char part[64];
  auto add = [&](unsigned int bit, const char* format, double value) {
    if (!valueExists(bit)) return;
    std::snprintf(part, sizeof part, format, value);
    line += part;
  };
  line += component ? component : "";
  line += ' ';
  line += label ? label : "";
  line += ':';
  add(Latitude, " lat %.7f", field<0>());
  add(Longitude, " lon %.7f", field<1>());
  add(HorizontalCepUncertainty, " cep %.1f m", field<2>());
  add(MajorAxis, " major %.1f m", field<3>());
  add(MinorAxis, " minor %.1f m", field<4>());
  add(Angle, " angle %.1f", field<5>());
  if (full) {
    add(Altitude, " alt %.1f m", field<6>());
    add(AltitudeUncertainty, " +-%.1f m", field<7>());
    add(Speed, " speed %.2f m/s", field<8>());
    add(SpeedUncertainty, " +-%.2f m/s", field<9>());
    add(Course, " course %.1f", field<10>());
    add(CourseUncertainty, " +-%.1f", field<11>());
    add(TechnologyBit, " tech %.0f", field<12>());
    add(SourceBit, " source %.0f", field<13>());
  }
  add(TimeStamp, " t %.0f", field<14>());
  return line;
}

}  // namespace schema
}  // namespace lodestack
