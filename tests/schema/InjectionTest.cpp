// Cell, cellular object and GNSS injections and the Injection bag.
#include <gtest/gtest.h>

#include <lodestack/lodestack.h>

using namespace lodestack;
using namespace lodestack::schema;
using gom::SharedPointer;

TEST(Injection, ServingAndNeighbourCellInjections) {
  SharedPointer<GeranServingCellInjection> s =
      GeranServingCellInjection::create(GeranCellDn::create(244, 5, 100, 200), 77);
  ASSERT_TRUE(s);
  EXPECT_EQ(s->key(), 6);
  EXPECT_TRUE(s->valueExists(0x3));
  EXPECT_FALSE(s->valueExists(0x4));
  EXPECT_FALSE(s->valueExists(0x40)) << "outside the flags";
  EXPECT_EQ(s->dn()->cid(), 200);
  EXPECT_EQ(s->timeStamp(), 77u);
  EXPECT_FALSE(s->coverage()) << "absent reads empty";
  s->setCoverage(Area::create(1, 2, 30u, 20u, 45.0f));
  s->setServingCellNwMeasurement(GeranNwMeasurement::create());
  EXPECT_TRUE(s->valueExists(0x18));
  EXPECT_EQ(s->coverage()->majorAxis(), 30u);

  SharedPointer<GeranNeighborCellInjection> n =
      GeranNeighborCellInjection::create(GeranFrequencyInfo::create());
  ASSERT_TRUE(n);
  EXPECT_EQ(n->key(), 9);
  EXPECT_TRUE(n->valueExists(0x1));
  EXPECT_FALSE(n->valueExists(0x8));
  EXPECT_EQ(s->addNeighborCellInjection(n->wrappedObject()), Ok);
  EXPECT_EQ(s->addNeighborCellInjection(UtraFddNeighborCellInjection::create()->wrappedObject()),
            Refused)
      << "another technology's neighbour";
  EXPECT_EQ(s->addNeighborCellInjection(SharedPointer<gom::GenericObject>()), Refused);
  EXPECT_EQ(s->neighborCellInjectionCollection()->size(), 1u);
  EXPECT_TRUE(s->valueExists(0x20));
  s->unset(0x21);
  EXPECT_FALSE(s->valueExists(0x20));
  EXPECT_FALSE(s->valueExists(0x1));
  EXPECT_EQ(s->timeStamp(), 77u) << "unset removes the flagged properties only";

  EXPECT_EQ(CdmaNeighborCellInjection::create()->key(), 19);
  EXPECT_TRUE(GeranServingCellInjection::create(s->wrappedObject()));
  EXPECT_FALSE(UtraFddServingCellInjection::create(s->wrappedObject()));
}

TEST(Injection, CellularObjectInjection) {
  SharedPointer<CellularObjectInjection> fresh = CellularObjectInjection::create();
  EXPECT_EQ(fresh->timeStamp(), 0u);
  EXPECT_FALSE(fresh->valueExists(0x8));
  EXPECT_TRUE(fresh->valueExists(0));
  SharedPointer<CellularObjectInjection> c = CellularObjectInjection::create(
      CellularObjectDn::create(), 55, Area::create(Coverage(3, 4, 10.0f)));
  ASSERT_TRUE(c);
  EXPECT_EQ(c->key(), 12);
  EXPECT_TRUE(c->valueExists(0x7));
  EXPECT_EQ(c->timeStamp(), 55u);
  EXPECT_TRUE(c->coverage()->valueExists(Coverage::Latitude | Coverage::Longitude |
                                         Coverage::HorizontalCepUncertainty));
  EXPECT_FALSE(c->coverage()->valueExists(Coverage::MajorAxis));
  c->unset(0x4);
  EXPECT_FALSE(c->valueExists(0x4));
  EXPECT_TRUE(c->valueExists(0x3));
}

TEST(Injection, BagCollectsByKind) {
  SharedPointer<Injection> bag = Injection::create();
  ASSERT_TRUE(bag);
  EXPECT_EQ(bag->key(), 5);
  SharedPointer<GeranServingCellInjection> geran = GeranServingCellInjection::create();
  SharedPointer<GnssInjection> gnss =
      GnssInjection::create(9u, GnssMeasurementData::create(Coverage(1, 2, 3.0f)));
  EXPECT_EQ(bag->addGnssInjection(geran->wrappedObject()), Refused);
  EXPECT_EQ(bag->addGnssInjection(SharedPointer<gom::GenericObject>()), Refused);
  EXPECT_FALSE(bag->valueExists(Injection::Gnss)) << "a refused addition adds nothing";
  EXPECT_EQ(bag->addGnssInjection(gnss->wrappedObject()), Ok);
  EXPECT_EQ(bag->addGeranInjection(geran->wrappedObject()), Ok);
  EXPECT_EQ(bag->addUtraTddInjection(UtraTddServingCellInjection::create()->wrappedObject()), Ok);
  EXPECT_TRUE(bag->valueExists(Injection::Gnss | Injection::Geran));
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
  EXPECT_FALSE(bag->valueExists(Injection::UtraTdd));

  // The whole bag travels in bytes and reads back equal.
  BufferStream out;
  ASSERT_TRUE(bag->wrappedObject()->write(out));
  BufferStream in(out.buffer().data(), out.buffer().size());
  SharedPointer<gom::GenericObject> back = gom::GenericObject::create(in);
  ASSERT_TRUE(back);
  EXPECT_TRUE(*back == *bag->wrappedObject());
  EXPECT_TRUE(Injection::create(back));
}
