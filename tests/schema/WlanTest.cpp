// WLAN records and measurement, and the trimming of WLAN collections.
#include "schema/SchemaTestSupport.h"

// The identity's forms and bytes, and the access point measurement's bytes.
TEST(Wlan, RecordFormsAndBytes) {
  SharedPointer<WlanDn> dn = WlanDn::create();
  unsigned int length = 99;
  EXPECT_EQ(dn->bssid(), 0u);
  EXPECT_EQ(dn->getBssid(length), nullptr);
  EXPECT_EQ(length, 0u);
  EXPECT_EQ(dn->text(), "");

  ASSERT_EQ(dn->setBssid(0x0102030405060708ull), Ok);
  const unsigned char* bytes = dn->getBssid(length);
  ASSERT_EQ(length, 8u);
  EXPECT_EQ(Bytes(bytes, bytes + 8), Bytes({1, 2, 3, 4, 5, 6, 7, 8}));
  EXPECT_EQ(dn->text(), "01:02:03:04:05:06:07:08");

  const unsigned char seven[7] = {9, 9, 9, 9, 9, 9, 9};
  EXPECT_EQ(dn->setBssid(seven, 7), InvalidArgument);
  EXPECT_EQ(dn->bssid(), 0x0102030405060708ull) << "a refused length changes nothing";

  const unsigned char mac[6] = {0x11, 0x22, 0x33, 0x44, 0x55, 0x66};
  SharedPointer<WlanDn> six = WlanDn::create();
  ASSERT_EQ(six->setBssid(mac, 6), Ok);
  EXPECT_EQ(six->bssid(), 0x112233FFFF445566ull) << "widened with FF FF";
  EXPECT_EQ(six->text(), "11:22:33:44:55:66");
  SharedPointer<WlanDn> eight = WlanDn::create(0x112233FFFF445566ull);
  EXPECT_EQ(eight->bssid(), six->bssid());
  EXPECT_FALSE(*eight == *six) << "6- and 8-byte identities never compare equal";
  EXPECT_TRUE(*WlanDn::create(six) == *six);
  EXPECT_EQ(bytesOf(*six), Bytes({1, 1, 6, 0x11, 0x22, 0x33, 0x44, 0x55, 0x66}));

  // A length above 8, a wrong version and a short stream are refused and
  // leave the identity cleared.
  for (const Bytes& bad : {Bytes({1, 1, 9, 1, 2, 3, 4, 5, 6, 7, 8, 9}),
                           Bytes({2, 1, 6, 1, 2, 3, 4, 5, 6}), Bytes({1, 1, 8, 1, 2, 3})}) {
    SharedPointer<WlanDn> back = WlanDn::create(7ull);
    EXPECT_FALSE(readFrom(*back, bad));
    EXPECT_FALSE(back->valueExists(WlanDn::kBssid));
  }

  SharedPointer<WlanApMeasurement> ap = WlanApMeasurement::create();
  ap->setRxLevel(-50);
  ap->setRssi(200);
  ap->setDistance(7);
  // Version, 16-bit mask 0x010A (rssi on 256), then rxLevel, rssi, distance
  // in field order.
  EXPECT_EQ(bytesOf(*ap), Bytes({1, 0x0A, 0x01, 0xCE, 200, 7}));
}

// The access point measurement's flag joins the measurement layer's.
TEST(Wlan, Measurement) {
  SharedPointer<WlanMeasurement> m = WlanMeasurement::create(WlanDn::create(42ull), 1000);
  ASSERT_TRUE(m);
  m->setWlanApMeasurement(WlanApMeasurement::create());
  EXPECT_TRUE(m->valueExists(0x7));
  EXPECT_FALSE(m->valueExists(0x8)) << "outside the flags";
  m->unset(0x5);
  EXPECT_FALSE(m->valueExists(0x4) || m->valueExists(0x1));
  EXPECT_TRUE(m->valueExists(0x2));
}

TEST(Wlan, TrimKeepsTheStrongest) {
  // Received levels; 1 stands for "no rxLevel", 2 for "no access point
  // measurement at all".
  const int levels[] = {-80, -40, 1, -60, -90, 2};
  SharedPointer<gom::ValueCollection> c = gom::ValueCollection::create();
  SharedPointer<gom::GenericObject> dropped;
  for (int level : levels) {
    SharedPointer<WlanMeasurement> m = WlanMeasurement::create(WlanDn::create(1ull), 5);
    if (level != 2) {
      SharedPointer<WlanApMeasurement> ap = WlanApMeasurement::create();
      if (level != 1) ap->setRxLevel(static_cast<signed char>(level));
      m->setWlanApMeasurement(ap);
    }
    if (level == -90) dropped = m->wrappedObject();
    gom::Variant* v = gom::Variant::create();
    ASSERT_EQ(v->setGenericObjectValue(m->wrappedObject()), Ok);
    ASSERT_EQ(c->add(v), Ok);
  }
  EXPECT_TRUE(Utility::sortWlans(c->item(2), c->item(0))) << "no level sorts first";
  EXPECT_FALSE(Utility::sortWlans(c->item(2), c->item(5))) << "both without a level";
  EXPECT_TRUE(Utility::sortWlans(c->item(0), c->item(1)));

  EXPECT_TRUE(Utility::trimWlanCollection(6, c));
  EXPECT_EQ(c->size(), 6u) << "nothing to trim";
  ASSERT_TRUE(Utility::trimWlanCollection(3, c));
  ASSERT_EQ(c->size(), 3u);
  const int kept[] = {-80, -60, -40};
  for (unsigned int i = 0; i < 3; ++i) {
    SharedPointer<gom::GenericObject> o;
    ASSERT_EQ(c->item(i)->getGenericObjectValue(o), Ok);
    EXPECT_EQ(WlanMeasurement::create(o)->wlanApMeasurement()->rxLevel(), kept[i]) << i;
  }
  EXPECT_EQ(dropped->referenceCount(), 1) << "a dropped entry is released";
  EXPECT_FALSE(Utility::trimWlanCollection(1, SharedPointer<gom::ValueCollection>()));
  ASSERT_TRUE(Utility::trimWlanCollection(0, c));
  EXPECT_EQ(c->size(), 0u);
}
