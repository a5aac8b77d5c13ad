// The measurement layers and the container, over records made for the test.
#include "schema/SchemaTestSupport.h"

namespace {

class TestDn : public Record<TestDn, 7101, FieldTable<unsigned char, Field<unsigned short, 1>>> {};
class TestNw : public Record<TestNw, 7102, FieldTable<unsigned char, Field<unsigned char, 1>>> {};
class TestServing
    : public Record<TestServing, 7104, FieldTable<unsigned char, Field<unsigned char, 1>>> {};

struct TestTraits {
  using Base = Measurement<TestDn, 2>;
  using ServingCellMeasurement = TestServing;
  using NwMeasurement = TestNw;
  static constexpr unsigned short kTypeId = 2;
  static constexpr bool kUnreliableState = false;
};
using TestMeasurement = CellMeasurement<TestTraits>;

// Exposes the layer below for its own checks.
class PlainMeasurement : public Measurement<TestDn, 2> {
 public:
  static SharedPointer<PlainMeasurement> wrap(const SharedPointer<gom::GenericObject>& o) {
    SharedPointer<PlainMeasurement> m(new PlainMeasurement());
    return m->baseCreate(2, o) ? m : SharedPointer<PlainMeasurement>();
  }
};

}  // namespace

TEST(Measurement, FlagsAndLayers) {
  SharedPointer<TestMeasurement> m = TestMeasurement::create(TestDn::create(), 1000);
  ASSERT_TRUE(m);
  EXPECT_FALSE(m->valueExists(0x7)) << "no serving-cell measurement yet";
  EXPECT_FALSE(m->valueExists(0x10)) << "bit outside 0xF";

  m->setServingCellMeasurement(TestServing::create());
  ASSERT_EQ(Ok, m->addNwMeasurement(TestNw::create()));
  EXPECT_TRUE(m->valueExists(0xF));
  EXPECT_EQ(Refused, m->addNwMeasurement(SharedPointer<TestNw>()));
  EXPECT_EQ(1u, m->nwMeasurementCollection()->size());

  m->unset(0x2);
  EXPECT_FALSE(m->wrappedObject()->propertyExists(205));
  EXPECT_TRUE(m->valueExists(0xD)) << "unset(0x2) removes property 205 only";
  EXPECT_EQ(0u, m->timeStamp()) << "cell measurements read an absent time stamp as 0";
  m->unset(0xF);
  EXPECT_EQ(0u, m->wrappedObject()->propertyCount());
  EXPECT_FALSE(m->dn()) << "cell measurements read an absent object as empty";

  // Creation from an object checks its key; the lower layers' getters throw.
  EXPECT_FALSE(TestMeasurement::create(gom::GenericObject::create(3)));
  EXPECT_FALSE(PlainMeasurement::wrap(gom::GenericObject::create(3)));
  SharedPointer<PlainMeasurement> plain = PlainMeasurement::wrap(gom::GenericObject::create(2));
  ASSERT_TRUE(plain);
  EXPECT_EQ(NotFound, thrownBy([&] { (void)plain->timeStamp(); }));
  EXPECT_EQ(NotFound, thrownBy([&] { (void)plain->dn(); }));
  plain->setTimeStamp(5);
  plain->setDn(TestDn::create());
  EXPECT_TRUE(plain->valueExists(0x3));
  EXPECT_FALSE(plain->valueExists(0x4));
  SharedPointer<TestMeasurement> same = TestMeasurement::create(plain->wrappedObject());
  EXPECT_TRUE(*same == *plain) << "equality compares the wrapped objects";
}

TEST(MeasurementContainer, Collections) {
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create();
  SharedPointer<gom::GenericObject> wlan = gom::GenericObject::create(20);
  EXPECT_EQ(Refused, c->addGeranMeasurement(wlan));
  EXPECT_EQ(Refused, c->addGeranMeasurement(SharedPointer<gom::GenericObject>()));
  EXPECT_EQ(0u, c->wrappedObject()->propertyCount()) << "a refused add changes nothing";
  EXPECT_FALSE(c->valueExists(0x10));
  ASSERT_EQ(Ok, c->addWlanMeasurement(wlan));
  EXPECT_TRUE(c->wrappedObject()->propertyExists(314));
  EXPECT_EQ(wlan.get(), c->wlanMeasurement(0).get());
  EXPECT_FALSE(c->wlanMeasurement(1)) << "past the end";
  EXPECT_FALSE(c->gnssMeasurement(0)) << "absent collection";

  // The UTRA-TDD row holds flag 0x40 and property 302.
  ASSERT_EQ(Ok, c->addUtraTddMeasurement(gom::GenericObject::create(4)));
  EXPECT_TRUE(c->wrappedObject()->propertyExists(302));
  EXPECT_TRUE(c->valueExists(0x40 | 0x10));
  EXPECT_FALSE(c->valueExists(0x80));
  EXPECT_EQ(NotFound, thrownBy([&] { (void)c->cdmaMeasurementCollection(); }));
  c->unset(0x40);
  EXPECT_FALSE(c->wrappedObject()->propertyExists(302));
  EXPECT_FALSE(MeasurementContainer::create(gom::GenericObject::create(2)));
}
