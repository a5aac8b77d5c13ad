// The position estimate and the GNSS records.
#include <limits>

#include "schema/SchemaTestSupport.h"

namespace {
const double kNaN = std::numeric_limits<double>::quiet_NaN();
}  // namespace

TEST(PositionEstimate, SettersRangesAndIntegerViews) {
  PositionEstimate p;
  struct Case {
    Status (PositionEstimate::*setter)(double);
    double accepted[2];
    double refused[3];
  };
  const Case cases[] = {
      {&PositionEstimate::setLatitude, {90.0, -90.0}, {90.0000001, -91.0, kNaN}},
      {&PositionEstimate::setLongitude, {-180.0, 179.999}, {180.0, -180.1, kNaN}},
      {&PositionEstimate::setCourse, {-180.0, 0.0}, {180.0, 200.0, kNaN}},
      {&PositionEstimate::setHorizontalCepUncertainty, {4294967295.0, 0.1},
       {0.0, 4294967296.0, kNaN}},
      {&PositionEstimate::setMajorAxis, {1.0, 4294967295.0}, {0.0, -1.0, kNaN}},
      {&PositionEstimate::setAngle, {0.0, 179.9}, {180.0, -0.1, kNaN}},
      {&PositionEstimate::setAltitude, {16383.5, -16383.5}, {16383.6, -16383.6, kNaN}},
      {&PositionEstimate::setAltitudeUncertainty, {65535.0, 0.5}, {65535.5, 0.0, kNaN}},
      {&PositionEstimate::setSpeed, {0.0, 300.0}, {-0.1, -1.0, kNaN}},
      {&PositionEstimate::setSpeedUncertainty, {0.1, 1e9}, {0.0, -1.0, kNaN}},
      {&PositionEstimate::setCourseUncertainty, {0.1, 179.9}, {0.0, 180.0, kNaN}},
  };
  for (const Case& c : cases) {
    const unsigned int before = p.presenceMask();
    for (double v : c.refused) EXPECT_EQ((p.*c.setter)(v), InvalidArgument) << v;
    EXPECT_EQ(p.presenceMask(), before) << "a refused value changes nothing";
    for (double v : c.accepted) EXPECT_EQ((p.*c.setter)(v), Ok) << v;
  }
  EXPECT_EQ(p.setTimeStamp(0), InvalidArgument);
  EXPECT_FALSE(p.valueExists(PositionEstimate::TimeStamp));
  EXPECT_EQ(p.latitude(), -90.0) << "the last accepted value";
  EXPECT_EQ(thrownBy([&] { (void)p.minorAxis(); }), WrongObjectType) << "absent minorAxis";

  // The integer views truncate.
  EXPECT_EQ(p.setAltitudeAccuracy(0), InvalidArgument);
  EXPECT_EQ(p.setAltitudeAccuracy(7), Ok);
  EXPECT_EQ(p.altitudeUncertainty(), 7.0);
  EXPECT_EQ(p.setAltitudeUncertainty(300.75), Ok);
  EXPECT_EQ(p.altitudeAccuracy(), 300);
  EXPECT_EQ(p.setHorizontalAccuracy(0), InvalidArgument);
  EXPECT_EQ(p.setHorizontalAccuracy(4294967295u), Ok);
  EXPECT_EQ(p.horizontalCepUncertainty(), 4294967295.0);
  EXPECT_EQ(p.setHorizontalCepUncertainty(12.9), Ok);
  EXPECT_EQ(p.horizontalAccuracy(), 12u);
}

TEST(PositionEstimate, FactoriesBytesAndDump) {
  EXPECT_FALSE(PositionEstimate::create(45.0, 0.0, 0.0, 1u)) << "zero circular error";
  SharedPointer<PositionEstimate> p = PositionEstimate::create(47.5, 8.25, 100.0, 50.0, 30.0, 9u);
  ASSERT_TRUE(p);
  EXPECT_EQ(p->presenceMask(), 1u | 2u | 4u | 16u | 32u | 64u);
  p->setTechnology(PositionEstimate::TechnologyGnss | PositionEstimate::TechnologyWlan);

  // Version, 32-bit mask, five doubles, technology, time stamp.
  EXPECT_EQ(bytesOf(*p).size(), 1u + 4u + 5u * 8u + 4u + 4u);

  EXPECT_EQ(p->dumpShort("FREE GNSS", "RadioAdapt", false),
            "RadioAdapt FREE GNSS: lat 47.5000000 lon 8.2500000 major 100.0 m minor 50.0 m "
            "angle 30.0 t 9");
  EXPECT_NE(p->dumpShort("x", "y", true).find("tech 5"), std::string::npos);
}

TEST(Gnss, MeasurementDataRangesAndBytes) {
  const Coverage circle(Utility::latitude(47.5), Utility::longitude(8.25), 25.0f);
  EXPECT_FALSE(GnssMeasurementData::create(circle, -1.0, 1.0, 0.0, 1.0));
  EXPECT_FALSE(GnssMeasurementData::create(circle, 1.0, 0.0, 0.0, 1.0));
  EXPECT_FALSE(GnssMeasurementData::create(circle, 1.0, 1.0, 180.0, 1.0));
  EXPECT_FALSE(GnssMeasurementData::create(circle, 1.0, 1.0, 0.0, 180.0));
  SharedPointer<GnssMeasurementData> d = GnssMeasurementData::create(circle, 0.0, 1.0, -180.0, 5.0);
  ASSERT_TRUE(d);

  const Bytes bytes = bytesOf(*d);
  // Version, then the coverage (mask 131: latitude, longitude, circle), then
  // the 32-bit mask and four doubles.
  ASSERT_EQ(bytes.size(), 1u + 1u + 4u + 4u + 4u + 4u + 32u);
  EXPECT_EQ(bytes[1], 131);
  EXPECT_EQ(Bytes(bytes.begin() + 14, bytes.begin() + 16), Bytes({0x00, 0x1E})) << "mask 0x1E00";
  SharedPointer<gom::ObjectBase> copy = d->clone();
  d->setCoverage(Coverage());
  EXPECT_FALSE(copy->compare(d.get())) << "the coverage takes part in equality";
}

TEST(Gnss, ConversionsBetweenEstimateAndData) {
  SharedPointer<PositionEstimate> p = PositionEstimate::create(-33.9, 151.2, 120.7, 80.2, 45.0, 77u);
  ASSERT_TRUE(p);
  ASSERT_EQ(p->setAltitude(-12.5), Ok);
  ASSERT_EQ(p->setSpeed(2.5), Ok);
  ASSERT_EQ(p->setCourse(-90.0), Ok);
  p->setTechnology(PositionEstimate::TechnologyCellular);

  SharedPointer<GnssMeasurementData> d = GnssMeasurementData::create(*p);
  ASSERT_TRUE(d);
  const Coverage& c = d->coverage();
  EXPECT_EQ(c.latitude(), Utility::latitude(-33.9));
  EXPECT_EQ(c.majorAxis(), 120u) << "truncated";
  EXPECT_FALSE(c.valueExists(Coverage::HorizontalCepUncertainty)) << "absent stays absent";
  EXPECT_EQ(d->presenceMask(), 512u | 2048u);

  SharedPointer<PositionEstimate> q = d->toPosition();
  ASSERT_TRUE(q);
  EXPECT_EQ(q->technology(), 1u) << "always GNSS";
  EXPECT_NEAR(q->latitude(), -33.9, 90.0 / 2147483648.0);
  EXPECT_EQ(q->majorAxis(), 120.0);
  EXPECT_FALSE(q->valueExists(PositionEstimate::TimeStamp | PositionEstimate::SpeedUncertainty));

  SharedPointer<GnssMeasurementData> zeroAxis =
      GnssMeasurementData::create(Coverage(0, 0, 0u, 0u, 10.0f));
  EXPECT_FALSE(zeroAxis->toPosition()) << "the estimate refuses a 0 m axis";
}

TEST(Gnss, MeasurementAndInjection) {
  SharedPointer<PositionEstimate> p = PositionEstimate::create(10.0, 20.0, 30.0, 1234u);
  SharedPointer<GnssMeasurement> m = GnssMeasurement::create(*p);
  ASSERT_TRUE(m);
  EXPECT_TRUE(m->valueExists(0x6));
  EXPECT_FALSE(m->valueExists(0x1)) << "no dn";
  SharedPointer<PositionEstimate> back = m->toPosition();
  ASSERT_TRUE(back);
  EXPECT_EQ(back->timeStamp(), 1234u);
  EXPECT_EQ(back->technology(), 1u);
  EXPECT_EQ(back->horizontalCepUncertainty(), 30.0);

  m->unset(0x2);
  EXPECT_FALSE(m->toPosition()) << "no time stamp";

  SharedPointer<GnssInjection> i =
      GnssInjection::create(99u, GnssMeasurementData::create(Coverage(1, 2, 3.0f)));
  ASSERT_TRUE(i);
  EXPECT_FALSE(GnssMeasurement::create(i->wrappedObject())) << "an injection is no measurement";
}
