// Cell, cellular object and GNSS injections and the Injection bag.
#include "schema/SchemaTestSupport.h"

TEST(Injection, CellAndCellularObjectInjections) {
  SharedPointer<GeranServingCellInjection> s =
      GeranServingCellInjection::create(GeranCellDn::create(244, 5, 100, 200), 77);
  ASSERT_TRUE(s);
  EXPECT_FALSE(s->valueExists(0x40)) << "outside the flags";
  EXPECT_FALSE(s->coverage()) << "absent reads empty";
  s->setCoverage(Area::create(1, 2, 30u, 20u, 45.0f));
  s->setServingCellNwMeasurement(GeranNwMeasurement::create());
  EXPECT_TRUE(s->valueExists(0x1B));

  SharedPointer<GeranNeighborCellInjection> n =
      GeranNeighborCellInjection::create(GeranFrequencyInfo::create());
  ASSERT_TRUE(n);
  EXPECT_EQ(s->addNeighborCellInjection(n->wrappedObject()), Ok);
  EXPECT_EQ(s->addNeighborCellInjection(UtraFddNeighborCellInjection::create()->wrappedObject()),
            Refused)
      << "another technology's neighbour";
  EXPECT_EQ(s->neighborCellInjectionCollection()->size(), 1u);
  EXPECT_TRUE(s->valueExists(0x20));
  s->unset(0x21);
  EXPECT_FALSE(s->valueExists(0x20));
  EXPECT_FALSE(s->valueExists(0x1));
  EXPECT_EQ(s->timeStamp(), 77u) << "unset removes the flagged properties only";
  EXPECT_FALSE(UtraFddServingCellInjection::create(s->wrappedObject()));

  EXPECT_EQ(CellularObjectInjection::create()->timeStamp(), 0u) << "absent reads 0";
  SharedPointer<CellularObjectInjection> c = CellularObjectInjection::create(
      CellularObjectDn::create(), 55, Area::create(Coverage(3, 4, 10.0f)));
  ASSERT_TRUE(c);
  EXPECT_TRUE(c->valueExists(0x7));
  EXPECT_FALSE(c->valueExists(0x8));
}

TEST(Injection, BagCollectsByKind) {
  SharedPointer<Injection> bag = Injection::create();
  ASSERT_TRUE(bag);
  SharedPointer<GeranServingCellInjection> geran = GeranServingCellInjection::create();
  SharedPointer<GnssInjection> gnss =
      GnssInjection::create(9u, GnssMeasurementData::create(Coverage(1, 2, 3.0f)));
  EXPECT_EQ(bag->addGnssInjection(geran->wrappedObject()), Refused);
  EXPECT_EQ(bag->addGnssInjection(SharedPointer<gom::GenericObject>()), Refused);
  EXPECT_FALSE(bag->valueExists(Injection::Gnss)) << "a refused addition adds nothing";
  EXPECT_EQ(bag->addGnssInjection(gnss->wrappedObject()), Ok);
  EXPECT_EQ(bag->addGeranInjection(geran->wrappedObject()), Ok);
  EXPECT_EQ(bag->addUtraTddInjection(UtraTddServingCellInjection::create()->wrappedObject()), Ok);
  EXPECT_TRUE(bag->valueExists(64)) << "UTRA-TDD holds bit 64";
  EXPECT_FALSE(bag->valueExists(128));
  EXPECT_EQ(bag->injectionCollection(309)->size(), 1u);
  EXPECT_EQ(bag->utraTddInjectionCollection(), bag->injectionCollection(306));
  EXPECT_FALSE(bag->cdmaInjectionCollection());
  EXPECT_EQ(bag->addCellularObjectInjection(CellularObjectInjection::create()->wrappedObject()),
            Ok);
  EXPECT_EQ(bag->addEUtraInjection(EUtraServingCellInjection::create()->wrappedObject()), Ok);
  EXPECT_EQ(bag->addCdmaInjection(CdmaServingCellInjection::create()->wrappedObject()), Ok);
  EXPECT_EQ(bag->addUtraFddInjection(UtraFddServingCellInjection::create()->wrappedObject()), Ok);
  EXPECT_TRUE(bag->valueExists(0x7F));
  bag->unset(Injection::UtraTdd);
  EXPECT_FALSE(bag->wrappedObject()->propertyExists(306));
}
