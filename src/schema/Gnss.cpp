#include "lodestack/schema/Gnss.h"

#include "lodestack/schema/utility/Utility.h"

namespace lodestack {
namespace schema {

namespace {

using DataPointer = gom::SharedPointer<GnssMeasurementData>;
using PositionPointer = gom::SharedPointer<PositionEstimate>;

}  // namespace

DataPointer GnssMeasurementData::create(const Coverage& coverage) {
  DataPointer data = create();
  if (data) data->coverage_ = coverage;
  return data;
}

DataPointer GnssMeasurementData::create(const Coverage& coverage, double speed,
                                        double speedUncertainty, double course,
                                        double courseUncertainty) {
  DataPointer data = create(coverage);
  if (!data || data->setSpeed(speed) != Ok || data->setSpeedUncertainty(speedUncertainty) != Ok ||
      data->setCourse(course) != Ok || data->setCourseUncertainty(courseUncertainty) != Ok)
    return DataPointer();
  return data;
}

DataPointer GnssMeasurementData::create(const PositionEstimate& p) {
  DataPointer data = create();
  if (!data) return data;
  Coverage& c = data->coverage_;
  bool ok = true;
  // Each present value through its setter; the first refusal ends it.
  auto carry = [&](unsigned int bit, auto set) {
    if (ok && p.valueExists(bit)) ok = set() == Ok;
  };
  using P = PositionEstimate;
  carry(P::Latitude, [&] { return c.setLatitude(Utility::latitude(p.latitude())); });
  carry(P::Longitude, [&] { return c.setLongitude(Utility::longitude(p.longitude())); });
  carry(P::MajorAxis, [&] { return c.setMajorAxis(static_cast<unsigned int>(p.majorAxis())); });
  carry(P::MinorAxis, [&] { return c.setMinorAxis(static_cast<unsigned int>(p.minorAxis())); });
  carry(P::Angle, [&] { return c.setAngle(static_cast<float>(p.angle())); });
  carry(P::Altitude, [&] { return c.setAltitude(static_cast<float>(p.altitude())); });
  carry(P::AltitudeUncertainty, [&] {
    return c.setAltitudeUncertainty(static_cast<float>(p.altitudeUncertainty()));
  });
  carry(P::HorizontalCepUncertainty, [&] {
    return c.setHorizontalCepUncertainty(static_cast<float>(p.horizontalCepUncertainty()));
  });
  carry(P::Speed, [&] { return data->setSpeed(p.speed()); });
  carry(P::SpeedUncertainty, [&] { return data->setSpeedUncertainty(p.speedUncertainty()); });
  carry(P::Course, [&] { return data->setCourse(p.course()); });
  carry(P::CourseUncertainty, [&] { return data->setCourseUncertainty(p.courseUncertainty()); });
  return ok ? data : DataPointer();
}

// The four doubles take the ranges of the estimate's same properties.
Status GnssMeasurementData::setSpeed(double v) {
  return PositionEstimate::admissible(Speed, v) ? setField<0>(v) : InvalidArgument;
}

Status GnssMeasurementData::setSpeedUncertainty(double v) {
  return PositionEstimate::admissible(SpeedUncertainty, v) ? setField<1>(v) : InvalidArgument;
}

Status GnssMeasurementData::setCourse(double v) {
  return PositionEstimate::admissible(Course, v) ? setField<2>(v) : InvalidArgument;
}

Status GnssMeasurementData::setCourseUncertainty(double v) {
  return PositionEstimate::admissible(CourseUncertainty, v) ? setField<3>(v) : InvalidArgument;
}

PositionPointer GnssMeasurementData::toPosition() const {
  PositionPointer p = PositionEstimate::create();
  if (!p) return p;
  const Coverage& c = coverage_;
  bool ok = true;
  auto carry = [&](bool present, auto set) {
    if (ok && present) ok = set() == Ok;
  };
  carry(c.valueExists(Coverage::Latitude),
        [&] { return p->setLatitude(Utility::wgs84Latitude(c.latitude())); });
  carry(c.valueExists(Coverage::Longitude),
        [&] { return p->setLongitude(Utility::wgs84Longitude(c.longitude())); });
  carry(c.valueExists(Coverage::MajorAxis), [&] { return p->setMajorAxis(c.majorAxis()); });
  carry(c.valueExists(Coverage::MinorAxis), [&] { return p->setMinorAxis(c.minorAxis()); });
  carry(c.valueExists(Coverage::Angle), [&] { return p->setAngle(c.angle()); });
  carry(c.valueExists(Coverage::Altitude), [&] { return p->setAltitude(c.altitude()); });
  carry(c.valueExists(Coverage::AltitudeUncertainty),
        [&] { return p->setAltitudeUncertainty(c.altitudeUncertainty()); });
  carry(c.valueExists(Coverage::HorizontalCepUncertainty),
        [&] { return p->setHorizontalCepUncertainty(c.horizontalCepUncertainty()); });
  carry(valueExists(Speed), [&] { return p->setSpeed(speed()); });
  carry(valueExists(SpeedUncertainty), [&] { return p->setSpeedUncertainty(speedUncertainty()); });
  carry(valueExists(Course), [&] { return p->setCourse(course()); });
  carry(valueExists(CourseUncertainty),
        [&] { return p->setCourseUncertainty(courseUncertainty()); });
  if (!ok) return PositionPointer();
  p->setTechnology(PositionEstimate::TechnologyGnss);
  return p;
}

bool GnssMeasurementData::write(IStream& stream) const {
  return stream.writeUint8(kVersion) && coverage_.writeFields(stream) && writeFields(stream);
}

bool GnssMeasurementData::read(IStream& stream) {
  clearFields();
  clearTail();
  unsigned char version = 0;
  if (stream.readUint8(version) && version == kVersion && coverage_.readFields(stream) &&
      readFields(stream))
    return true;
  clearFields();
  clearTail();
  return false;
}

GnssFix::~GnssFix() = default;

namespace {
const FlagProperty kDataFlags[] = {{GnssFix::kMeasurementData, GnssFix::kMeasurementDataId}};
}  // namespace

bool GnssFix::valueExists(unsigned int mask) const {
  return !(mask & ~kAllFlags) && flagsPresent(mask, kDataFlags) &&
         MeasurementBase::valueExists(mask & MeasurementBase::kAllFlags);
}

void GnssFix::unset(unsigned int mask) {
  removeFlags(mask, kDataFlags);
  MeasurementBase::unset(mask & MeasurementBase::kAllFlags);
}

PositionPointer GnssFix::toPosition() const {
  const DataPointer d = valueExists(kTimeStamp | kMeasurementData)
                            ? optionalRecord<GnssMeasurementData>(kMeasurementDataId)
                            : DataPointer();
  PositionPointer p = d ? d->toPosition() : PositionPointer();
  if (!p || p->setTimeStamp(timeStamp()) != Ok) return PositionPointer();
  return p;
}

DataPointer GnssFix::data(const char* name) const {
  gom::SharedPointer<gom::ObjectBase> record;
  getProperty(kMeasurementDataId, record, name);
  return DataPointer::cast(record);
}

void GnssFix::setData(const DataPointer& data, const char* name) {
  setProperty(kMeasurementDataId, gom::SharedPointer<gom::ObjectBase>(data), name);
}

bool GnssFix::make(unsigned short typeId, unsigned int timeStamp, const DataPointer& data) {
  return baseCreate(typeId, timeStamp) &&
         object_->setObjectProperty(kMeasurementDataId, data) == Ok;
}

bool GnssFix::make(unsigned short typeId, const PositionEstimate& position) {
  const DataPointer data = GnssMeasurementData::create(position);
  if (!data || !baseCreate(typeId) ||
      object_->setObjectProperty(kMeasurementDataId, data) != Ok)
    return false;
  return !position.valueExists(PositionEstimate::TimeStamp) ||
         object_->setUint32Property(kTimeStampId, position.timeStamp()) == Ok;
}

}  // namespace schema
}  // namespace lodestack
