// The position estimate and the GNSS records.
#include <gtest/gtest.h>

#include <lodestack/lodestack.h>

#include <cmath>
#include <limits>

using namespace lodestack;
using namespace lodestack::schema;
using gom::SharedPointer;

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

template <class F>
Status thrownBy(F f) {
  try {
    f();
  } catch (Status s) {
    return s;
  }
  return Ok;
}

}  // namespace

TEST(PositionEstimate, SettersEnforceTheirRanges) {
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
  EXPECT_EQ(p.setTimeStamp(5), Ok);
  EXPECT_EQ(p.latitude(), -90.0) << "the last accepted value";
  EXPECT_EQ(p.setLatitude(91.0), InvalidArgument);
  EXPECT_EQ(p.latitude(), -90.0);
}

TEST(PositionEstimate, GettersThrowAndIntegerViews) {
  PositionEstimate p;
  EXPECT_EQ(thrownBy([&] { (void)p.latitude(); }), WrongObjectType);
  EXPECT_EQ(thrownBy([&] { (void)p.source(); }), WrongObjectType);
  EXPECT_EQ(thrownBy([&] { (void)p.horizontalAccuracy(); }), WrongObjectType);

  EXPECT_EQ(p.setAltitudeAccuracy(0), InvalidArgument);
  EXPECT_EQ(p.setAltitudeAccuracy(7), Ok);
  EXPECT_EQ(p.altitudeUncertainty(), 7.0);
  EXPECT_EQ(p.setAltitudeUncertainty(65535.9), InvalidArgument);
  EXPECT_EQ(p.setAltitudeUncertainty(300.75), Ok);
  EXPECT_EQ(p.altitudeAccuracy(), 300);
  EXPECT_EQ(p.setHorizontalAccuracy(0), InvalidArgument);
  EXPECT_FALSE(p.valueExists(PositionEstimate::HorizontalCepUncertainty));
  EXPECT_EQ(p.setHorizontalAccuracy(4294967295u), Ok);
  EXPECT_EQ(p.horizontalCepUncertainty(), 4294967295.0);
  EXPECT_EQ(p.setHorizontalCepUncertainty(12.9), Ok);
  EXPECT_EQ(p.horizontalAccuracy(), 12u);
  p.setSource(PositionEstimate::SourceInjection);
  EXPECT_EQ(p.source(), PositionEstimate::SourceInjection);
}

TEST(PositionEstimate, FactoriesBytesAndDump) {
  EXPECT_FALSE(PositionEstimate::create(95.0, 0.0, 1u));
  EXPECT_FALSE(PositionEstimate::create(45.0, 0.0, 0u));
  EXPECT_FALSE(PositionEstimate::create(45.0, 0.0, 0.0, 1u)) << "zero circular error";
  EXPECT_FALSE(PositionEstimate::create(45.0, 0.0, 100.0, 50.0, 180.0, 1u));
  SharedPointer<PositionEstimate> p = PositionEstimate::create(47.5, 8.25, 100.0, 50.0, 30.0, 9u);
  ASSERT_TRUE(p);
  EXPECT_EQ(p->presenceMask(), 1u | 2u | 4u | 16u | 32u | 64u);
  p->setTechnology(PositionEstimate::TechnologyGnss | PositionEstimate::TechnologyWlan);

  BufferStream out;
  ASSERT_TRUE(p->write(out));
  // Version, 32-bit mask, six doubles, technology, time stamp.
  EXPECT_EQ(out.buffer().size(), 1u + 4u + 5u * 8u + 4u + 4u);
  SharedPointer<PositionEstimate> back = PositionEstimate::create();
  BufferStream in(out.buffer().data(), out.buffer().size());
  ASSERT_TRUE(back->read(in));
  EXPECT_TRUE(*back == *p);
  EXPECT_TRUE(*PositionEstimate::create(p) == *p);
  SharedPointer<gom::ObjectBase> made = ObjectBaseFactory::createObject(113);
  ASSERT_TRUE(made);
  EXPECT_EQ(made->key(), 113);

  EXPECT_EQ(p->dumpShort("FREE GNSS", "RadioAdapt", false),
            "RadioAdapt FREE GNSS: lat 47.5000000 lon 8.2500000 major 100.0 m minor 50.0 m "
            "angle 30.0 t 9");
  EXPECT_NE(p->dumpShort("x", "y", true).find("tech 5"), std::string::npos);
}
