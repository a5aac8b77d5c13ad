// The GNSS records: a satellite fix in compact form and the two objects that
// carry it.
//
//   GnssMeasurementData (130)  a Coverage value (always held; its own mask
//                              tells which of its fields exist), then
//                              speed (512), speedUncertainty (1024), course
//                              (2048), courseUncertainty (4096): doubles
//                              under a 32-bit mask, bits as in
//                              PositionEstimate
//   GnssMeasurement (type 21)  timeStamp (flag 2, id 205), measurementData
//   GnssInjection (type 13)    (flag 4, id 130); no dn, so flag 1 is refused
//
// GnssMeasurementData's bytes: version 1, the Coverage's mask and present
// fields, then its own 32-bit mask and present doubles. Its setters of the
// four doubles refuse values out of range (as PositionEstimate's) with
// InvalidArgument; its getters return the stored value. The two carriers
// follow MeasurementBase.h: getters throw NotFound (4) when the property is
// absent. Factories return an empty pointer on a refused value or when
// memory is exhausted. One thread at a time.
#ifndef LODESTACK_SCHEMA_GNSS_H
#define LODESTACK_SCHEMA_GNSS_H

#include "lodestack/schema/Coverage.h"
#include "lodestack/schema/MeasurementBase.h"
#include "lodestack/schema/PositionEstimate.h"

namespace lodestack {
namespace schema {

using GnssMotionFields = FieldTable<unsigned int, Field<double, 512>, Field<double, 1024>,
                                    Field<double, 2048>, Field<double, 4096>>;

class LODESTACK_EXPORT GnssMeasurementData
    : public Record<GnssMeasurementData, 130, GnssMotionFields> {
 public:
  enum Bit : unsigned int {
    Speed = PositionEstimate::Speed,
    SpeedUncertainty = PositionEstimate::SpeedUncertainty,
    Course = PositionEstimate::Course,
    CourseUncertainty = PositionEstimate::CourseUncertainty
  };

  using Record::create;
  static gom::SharedPointer<GnssMeasurementData> create(const Coverage& coverage);
  static gom::SharedPointer<GnssMeasurementData> create(const Coverage& coverage, double speed,
                                                        double speedUncertainty, double course,
                                                        double courseUncertainty);
  // Carries over what the estimate holds: latitude and longitude coded by
  // Utility::latitude/longitude, the axes truncated to whole metres, angle,
  // altitude and the uncertainties as floats, speed and course as they are.
  static gom::SharedPointer<GnssMeasurementData> create(const PositionEstimate& position);

  const Coverage& coverage() const { return coverage_; }
  Status setCoverage(const Coverage& coverage) {
    coverage_ = coverage;
    return Ok;
  }

  double speed() const { return field<0>(); }
  double speedUncertainty() const { return field<1>(); }
  double course() const { return field<2>(); }
  double courseUncertainty() const { return field<3>(); }
  [[nodiscard]] Status setSpeed(double v);
  [[nodiscard]] Status setSpeedUncertainty(double v);
  [[nodiscard]] Status setCourse(double v);
  [[nodiscard]] Status setCourseUncertainty(double v);

  // An estimate of whatever the coverage and the record hold, each value
  // through the estimate's checking setter, with technology 1 (GNSS); empty
  // when the estimate refuses a value (a coverage axis of 0 metres, say).
  gom::SharedPointer<PositionEstimate> toPosition() const;

  bool write(IStream& stream) const override;
  bool read(IStream& stream) override;

  // The coverage, for Record's equality and copies.
  bool tailEqual(const GnssMeasurementData& other) const { return coverage_ == other.coverage_; }
  bool copyTail(const GnssMeasurementData& other) {
    coverage_ = other.coverage_;
    return true;
  }
  void clearTail() { coverage_.clearFields(); }

 private:
  Coverage coverage_;
};

// What GnssMeasurement and GnssInjection share: a time stamp and the fix's
// data over a generic object of the subclass's type.
class LODESTACK_EXPORT GnssFix : public MeasurementBase {
 public:
  static constexpr unsigned int kMeasurementData = 0x4;
  static constexpr unsigned int kAllFlags = kMeasurementData | MeasurementBase::kAllFlags;
  static constexpr unsigned short kMeasurementDataId = 130;

  ~GnssFix() override;

  bool valueExists(unsigned int mask) const override;
  void unset(unsigned int mask) override;

  // The held data as an estimate (GnssMeasurementData::toPosition) carrying
  // this fix's time stamp. Empty when the time stamp or the data is absent,
  // or when the estimate refuses a value (a time stamp of 0 included).
  gom::SharedPointer<PositionEstimate> toPosition() const;

 protected:
  GnssFix() = default;
  GnssFix(const GnssFix&) = default;
  GnssFix& operator=(const GnssFix&) = default;

  // Throws NotFound when absent; empty when the record is of another class.
  gom::SharedPointer<GnssMeasurementData> data(const char* name) const;
  void setData(const gom::SharedPointer<GnssMeasurementData>& data, const char* name);

  // Fill a new fix of `typeId`; false on failure.
  bool make(unsigned short typeId) { return baseCreate(typeId); }
  bool make(unsigned short typeId, unsigned int timeStamp,
            const gom::SharedPointer<GnssMeasurementData>& data);
  // The estimate's time stamp (when present) and its data.
  bool make(unsigned short typeId, const PositionEstimate& position);

  // The factories of both subclasses.
  template <class Self, class... A>
  static gom::SharedPointer<Self> build(const A&... a) {
    gom::SharedPointer<Self> fix(new (std::nothrow) Self());
    return fix && fix->make(Self::kTypeId, a...) ? fix : gom::SharedPointer<Self>();
  }
  template <class Self>
  static gom::SharedPointer<Self> wrap(const gom::SharedPointer<gom::GenericObject>& object) {
    gom::SharedPointer<Self> fix(new (std::nothrow) Self());
    return fix && fix->baseCreate(Self::kTypeId, object) ? fix : gom::SharedPointer<Self>();
  }
};

class LODESTACK_EXPORT GnssMeasurement : public GnssFix {
 public:
  static constexpr unsigned short kTypeId = 21;

  // An empty measurement.
  static gom::SharedPointer<GnssMeasurement> create() { return build<GnssMeasurement>(); }
  static gom::SharedPointer<GnssMeasurement> create(
      unsigned int timeStamp, const gom::SharedPointer<GnssMeasurementData>& data) {
    return build<GnssMeasurement>(timeStamp, data);
  }
  static gom::SharedPointer<GnssMeasurement> create(const PositionEstimate& position) {
    return build<GnssMeasurement>(position);
  }
  // Wraps `object` (shared); null unless its key is 21.
  static gom::SharedPointer<GnssMeasurement> create(
      const gom::SharedPointer<gom::GenericObject>& object) {
    return wrap<GnssMeasurement>(object);
  }

  gom::SharedPointer<GnssMeasurementData> measurementData() const {
    return data("measurementData");
  }
  void setMeasurementData(const gom::SharedPointer<GnssMeasurementData>& d) {
    setData(d, "measurementData");
  }

 private:
  friend class GnssFix;
  GnssMeasurement() = default;
};

class LODESTACK_EXPORT GnssInjection : public GnssFix {
 public:
  static constexpr unsigned short kTypeId = 13;

  static gom::SharedPointer<GnssInjection> create() { return build<GnssInjection>(); }
  static gom::SharedPointer<GnssInjection> create(
      unsigned int timeStamp, const gom::SharedPointer<GnssMeasurementData>& data) {
    return build<GnssInjection>(timeStamp, data);
  }
  static gom::SharedPointer<GnssInjection> create(const PositionEstimate& position) {
    return build<GnssInjection>(position);
  }
  // Wraps `object` (shared); null unless its key is 13.
  static gom::SharedPointer<GnssInjection> create(
      const gom::SharedPointer<gom::GenericObject>& object) {
    return wrap<GnssInjection>(object);
  }

  gom::SharedPointer<GnssMeasurementData> gnssMeasurementData() const {
    return data("gnssMeasurementData");
  }
  void setGnssMeasurementData(const gom::SharedPointer<GnssMeasurementData>& d) {
    setData(d, "gnssMeasurementData");
  }

 private:
  friend class GnssFix;
  GnssInjection() = default;
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_GNSS_H
