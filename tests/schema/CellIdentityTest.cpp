// Cell identities, the layered CellularObjectDn, Coverage and Area.
#include <cmath>

#include "schema/SchemaTestSupport.h"

using Dn = CellularObjectDn;

TEST(CellularObjectDn, Factories) {
  // The value constructors of the identities mark every field present.
  EXPECT_EQ(15, GeranCellDn::create(244, 5, 100, 7)->presenceMask());
  EXPECT_EQ(7, CdmaCellDn::create(1, 2, 3)->presenceMask());

  EXPECT_FALSE(Dn::create(Dn::NwType(6), 1));
  EXPECT_FALSE(Dn::create(Dn::NwType(0), 1, 2));
  EXPECT_TRUE(Dn::create(Dn::NwType(5), 1, 2, Dn::L3IdType(3), 7));
  EXPECT_FALSE(Dn::create(Dn::NwType(1), 1, 2, Dn::L3IdType(4), 7));
  EXPECT_TRUE(Dn::create()->idType() == 1 && Dn::create()->nwType() == 0) << "the empty identity";

  SharedPointer<Dn> g = Dn::create(GeranCellDn::create(244, 5, 100, 9), Dn::Layer3);
  ASSERT_TRUE(g);
  EXPECT_TRUE(*g == *Dn::create(Dn::Geran, 244, 5, Dn::LocationAreaCode, 100));
  EXPECT_FALSE(Dn::create(SharedPointer<GeranCellDn>(), Dn::Layer1));
  EXPECT_FALSE(Dn::create(GeranCellDn::create(), Dn::IdType(4)));

  SharedPointer<UtraCellDn> utra = UtraCellDn::create(244, 5, UtraCellDn::mergeUcid(300, 17));
  SharedPointer<Dn> u = Dn::create(Dn::UtraFdd, utra, Dn::Layer3);
  EXPECT_EQ(2, u->l3IdType());
  EXPECT_EQ(300u, u->layer3()) << "the RNC id, not the cell id";
  SharedPointer<Dn> u2 = Dn::create(Dn::NwType(9), utra, Dn::Layer2);
  ASSERT_TRUE(u2) << "this path does not check nwType";
  EXPECT_EQ(2, u2->idType());
  EXPECT_EQ(0u, u2->layer3());
}

TEST(CellularObjectDn, LayeredEqualityAndBytes) {
  EXPECT_FALSE(Dn(Dn::Geran, 244) == Dn(Dn::Geran, 244, 7)) << "idType differs";
  SharedPointer<Dn> a = Dn::create(Dn::Geran, 244, 5, Dn::LocationAreaCode, 1);
  SharedPointer<Dn> b = Dn::create(Dn::Geran, 244, 5, Dn::LocationAreaCode, 2);
  EXPECT_FALSE(*a == *b);
  EXPECT_FALSE(*Dn::create(Dn::Geran, 244, 5) == *Dn::create(Dn::Geran, 244, 6));

  // Fields beyond the valid layers are ignored: only reading can put them there.
  Bytes bytes = bytesOf(*a);
  ASSERT_EQ(12u, bytes.size());
  bytes[1] = 1;  // idType 1: layer2 and layer3 no longer count
  SharedPointer<Dn> read = Dn::create();
  ASSERT_TRUE(readFrom(*read, bytes));
  EXPECT_TRUE(*read == *Dn::create(Dn::Geran, 244));
  EXPECT_EQ(1u, read->layer3());
  bytes[0] = 2;
  EXPECT_FALSE(readFrom(*read, bytes));
  EXPECT_EQ(0, read->idType());

  SharedPointer<CellularObject> o = CellularObject::create(a);
  EXPECT_TRUE(o->valueExists(1));
  EXPECT_FALSE(o->valueExists(2));
  SharedPointer<CellularObject> p = CellularObject::create(b);
  EXPECT_FALSE(*o == *p);
  p->setDn(Dn::create(a));
  EXPECT_TRUE(*o == *p);
  p->setCoverage(Area::create(1, 2, 3, 4, 5.0f));
  EXPECT_FALSE(*o == *p);
}

TEST(Coverage, ConstructorsAndChecks) {
  EXPECT_EQ(131, Coverage(1, 2, 30.0f).presenceMask());
  EXPECT_EQ(59, Coverage(1, 2, 30, 20, 45.0f).presenceMask());
  EXPECT_EQ(127, Coverage(1, 2, 30, 20, 45.0f, 100.0f, 10.0f).presenceMask());
  Coverage c;
  EXPECT_EQ(Ok, c.setHorizontalCepUncertainty(0.0f));
  EXPECT_EQ(InvalidArgument, c.setHorizontalCepUncertainty(-1.0f));
  EXPECT_EQ(InvalidArgument, c.setHorizontalCepUncertainty(std::nanf("")));
  EXPECT_EQ(128, c.presenceMask());

  SharedPointer<Area> area = Area::create(Coverage(-5, 6, 30.0f));
  EXPECT_TRUE(area->coverage() == Coverage(-5, 6, 30.0f));
  EXPECT_FALSE(*Area::create(1, 2, 30, 20, 45.0f) == *area);

  // Bytes: version, mask, then the fields in their order (latitude,
  // longitude, axes, angle, altitude, ...), not in bit order.
  SharedPointer<Area> alt = Area::create(Coverage(1, 2, 3, 4, 0.0f, 1.0f, 0.0f));
  alt->unset(Coverage::Latitude | Coverage::Longitude | Coverage::MajorAxis |
             Coverage::MinorAxis | Coverage::AltitudeUncertainty);
  EXPECT_EQ(Bytes({1, 32 | 4, 0, 0, 0, 0, 0, 0, 0x80, 0x3F}), bytesOf(*alt));
}
