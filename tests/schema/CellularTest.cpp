// The cellular families: factory ids, bytes of every record, and what the
// families do differently (masks, widths, delegated properties, type checks).
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "schema/SampleRecords.h"
#include "schema/SchemaTestSupport.h"
#include "support/TemporaryDirectory.h"

namespace {

template <class R>
Bytes bytesAfterVersion(const SharedPointer<R>& r) {
  Bytes b = bytesOf(*r);
  EXPECT_EQ(1, b.at(0)) << "version byte";
  return Bytes(b.begin() + 1, b.end());
}

using Records = std::vector<SharedPointer<gom::ObjectBase>>;

// A generic object holding each record as a code-14 property.
SharedPointer<gom::GenericObject> objectOf(const Records& records) {
  SharedPointer<gom::GenericObject> o = gom::GenericObject::create(500);
  for (const SharedPointer<gom::ObjectBase>& r : records) {
    EXPECT_EQ(Ok, o->setObjectProperty(r->key(), r));
  }
  return o;
}

// Every record type the factory knows: the cellular samples, then the
// position, WLAN and GNSS records with some values set.
Records everyRecordType() {
  Records records = sample::allRecords();
  SharedPointer<PositionEstimate> position =
      PositionEstimate::create(47.5, 8.25, 100.0, 50.0, 30.0, 9u);
  position->setTechnology(PositionEstimate::TechnologyGnss | PositionEstimate::TechnologyWlan);
  const unsigned char mac[6] = {0xA0, 0xB1, 0xC2, 0xD3, 0xE4, 0xF5};
  SharedPointer<WlanDn> dn = WlanDn::create();
  EXPECT_EQ(Ok, dn->setBssid(mac, 6));
  SharedPointer<WlanApMeasurement> ap = WlanApMeasurement::create();
  ap->setRxLevel(-50);
  ap->setRssi(200);
  records.insert(records.end(),
                 {position, dn, ap,
                  GnssMeasurementData::create(Coverage(1, 2, 25.0f), 0.0, 1.0, -180.0, 5.0)});
  return records;
}

}  // namespace

TEST(Cellular, FactoryAndEveryRecordInsideAGenericObject) {
  for (unsigned short id : {0, 99, 136}) EXPECT_FALSE(ObjectBaseFactory::createObject(id)) << id;
  const Records records = everyRecordType();
  SharedPointer<gom::GenericObject> o = objectOf(records);
  const Bytes bytes = bytesOf(*o);
  SharedPointer<gom::GenericObject> back = gom::GenericObject::create(1);
  ASSERT_TRUE(readFrom(*back, bytes));
  EXPECT_TRUE(*back == *o);
  for (const SharedPointer<gom::ObjectBase>& r : records) {
    SharedPointer<gom::ObjectBase> empty = ObjectBaseFactory::createObject(r->key());
    ASSERT_TRUE(empty) << r->key();
    EXPECT_TRUE(empty->key() == r->key() && typeid(*empty) == typeid(*r)) << r->key();
    SharedPointer<gom::ObjectBase> read;
    ASSERT_EQ(Ok, back->getObjectProperty(r->key(), read));
    EXPECT_TRUE(read->compare(r.get())) << r->key();
    SharedPointer<gom::ObjectBase> clone = r->clone();
    EXPECT_TRUE(clone && clone->compare(r.get())) << r->key();
  }
  // Cut anywhere, the object does not read.
  for (std::size_t n = 0; n < bytes.size(); n += 7) {
    EXPECT_FALSE(readFrom(*back, Bytes(bytes.begin(), bytes.begin() + n))) << n;
  }
}

TEST(Cellular, FullContainerRoundTrip) {
  SharedPointer<MeasurementContainer> c = sample::fullContainer();
  EXPECT_TRUE(c->valueExists(0x7F));
  SharedPointer<gom::GenericObject> o = gom::GenericObject::create(1);
  ASSERT_TRUE(readFrom(*o, bytesOf(*c)));
  SharedPointer<MeasurementContainer> back = MeasurementContainer::create(o);
  ASSERT_TRUE(back);
  EXPECT_TRUE(*back == *c);
  EXPECT_FALSE(UtraFddCellMeasurement::create(back->utraTddMeasurement(0)))
      << "the type id of the wrapped object is checked";
}

TEST(Cellular, MasksAndWidths) {
  // GERAN: timing advance 8 bits; UTRA-TDD and E-UTRA: 16 bits.
  SharedPointer<GeranServingCellMeasurement> geran = GeranServingCellMeasurement::create();
  geran->setTimingAdvance(0x12);
  EXPECT_EQ((Bytes{2, 0x12}), bytesAfterVersion(geran));
  SharedPointer<UtraTddServingCellMeasurement> tdd = UtraTddServingCellMeasurement::create();
  tdd->setTimingAdvance(0x1234);
  EXPECT_EQ((Bytes{4, 0x34, 0x12}), bytesAfterVersion(tdd));
  SharedPointer<EUtraServingCellMeasurement> eutra = EUtraServingCellMeasurement::create();
  eutra->setTimingAdvance(0x1234);
  EXPECT_EQ((Bytes{2, 0x34, 0x12}), bytesAfterVersion(eutra));

  // UTRA-FDD serving: nwMeasurement on bit 128; rscp is signed.
  SharedPointer<UtraFddServingCellMeasurement> fdd = UtraFddServingCellMeasurement::create();
  fdd->setLac(0x0102);
  ASSERT_EQ(Ok, fdd->setUarfcnUl(0x0A0B));
  fdd->nwMeasurement()->setRscp(-5);
  EXPECT_EQ((Bytes{0x81, 0x02, 0x01, 1, 2 | 32, 0x0B, 0x0A, 0xFB}), bytesAfterVersion(fdd));

  // UTRA ucid split and merge; the merge does not mask the RNC id.
  EXPECT_EQ(0x12340011u, UtraCellDn::mergeUcid(0x1234, 0x11));
  unsigned short rnc = 0, cid = 0;
  UtraCellDn::splitUcid(0x12340011u, rnc, cid);
  EXPECT_EQ(0x234, rnc);
  EXPECT_EQ(0x11, cid);
  SharedPointer<EUtraCellDn> lte = EUtraCellDn::create(1, 2, 0x0FFFFFFF);
  EXPECT_EQ(0xFFFFFu, lte->eNodeBId());
  EXPECT_EQ(255, lte->lcid());
  EXPECT_EQ(0x123456789u & 0xFFFFFFFFu, EUtraCellDn::mergeUcid(0x1234567, 0x89));

  // CDMA frequency infos carry nothing and always compare equal.
  EXPECT_EQ((Bytes{0}), bytesAfterVersion(CdmaFrequencyInfo::create()));
  EXPECT_TRUE(*CdmaFrequencyInfo::create() == *CdmaFrequencyInfo::create());
}

TEST(Cellular, DelegatedProperties) {
  SharedPointer<GeranServingCellMeasurement> s = GeranServingCellMeasurement::create();
  EXPECT_FALSE(s->valueExists(1));
  ASSERT_EQ(Ok, s->setRxLevel(40));
  EXPECT_EQ(40, s->nwMeasurement()->rxLevel());
  EXPECT_EQ(8, s->nwMeasurement()->presenceMask());
  EXPECT_TRUE(s->valueExists(1 | 16));
  EXPECT_EQ(16, s->presenceMask()) << "delegated bits are not the record's own";
  EXPECT_FALSE(s->valueExists(4)) << "the network measurement lacks frequencyInfo";
  ASSERT_EQ(Ok, s->setFrequencyInfo(GeranFrequencyInfo::create(3, 700)));
  EXPECT_TRUE(s->valueExists(1 | 4 | 16));
  s->unset(1);
  EXPECT_FALSE(s->nwMeasurement()->valueExists(8));

  SharedPointer<GeranNwMeasurement> held = s->nwMeasurement();
  EXPECT_EQ(Refused, s->setNwMeasurement(SharedPointer<GeranNwMeasurement>()));
  EXPECT_EQ(held.get(), s->nwMeasurement().get()) << "an empty pointer changes nothing";

  // Equality sees the delegated values through the network measurement.
  SharedPointer<GeranServingCellMeasurement> copy = GeranServingCellMeasurement::create(s);
  EXPECT_TRUE(*copy == *s);
  copy->setFrequencyInfo(GeranFrequencyInfo::create(3, 701));
  EXPECT_FALSE(*copy == *s);

  // The other families delegate frequencyInfo on their own bits.
  auto delegates = [](auto m, auto info, unsigned int ownMask, unsigned int present) {
    m->setFrequencyInfo(info);
    EXPECT_EQ(ownMask, m->presenceMask()) << "type " << m->key();
    EXPECT_TRUE(m->valueExists(present)) << "type " << m->key();
  };
  delegates(CdmaServingCellMeasurement::create(), CdmaFrequencyInfo::create(), 2, 1 | 2);
  delegates(EUtraServingCellMeasurement::create(), EUtraFrequencyInfo::create(6300, 12), 1, 1 | 4);
  delegates(UtraTddServingCellMeasurement::create(), UtraTddFrequencyInfo::create(10055, 7), 8,
            2 | 8);
}

TEST(Cellular, CellMeasurementsAcceptTheirOwnNetworkMeasurements) {
  const std::vector<SharedPointer<gom::ObjectBase>> nw = {
      GeranNwMeasurement::create(), UtraFddNwMeasurement::create(),
      UtraTddNwMeasurement::create(), EUtraNwMeasurement::create(),
      CdmaNwMeasurement::create()};
  auto flags = [&nw](auto m, std::size_t own, unsigned short typeId) {
    EXPECT_EQ(typeId, m->key());
    for (std::size_t i = 0; i < nw.size(); ++i) {
      EXPECT_EQ(i == own ? Ok : Refused, m->addNwMeasurement(nw[i]))
          << "type " << typeId << " given record " << nw[i]->key();
    }
    EXPECT_EQ(1u, m->nwMeasurementCollection()->size());
    return m->kAllFlags;
  };
  EXPECT_EQ(0xFu, flags(GeranCellMeasurement::create(), 0, 2));
  EXPECT_EQ(0x1Fu, flags(UtraFddCellMeasurement::create(), 1, 3));
  EXPECT_EQ(0x1Fu, flags(UtraTddCellMeasurement::create(), 2, 4));
  EXPECT_EQ(0xFu, flags(EUtraCellMeasurement::create(), 3, 14));
  EXPECT_EQ(0xFu, flags(CdmaCellMeasurement::create(), 4, 17));

  SharedPointer<UtraFddCellMeasurement> fdd = UtraFddCellMeasurement::create();
  fdd->setUnreliableStateTimeStamp(9);
  EXPECT_TRUE(fdd->valueExists(16));
  SharedPointer<GeranCellMeasurement> geran = GeranCellMeasurement::create();
  geran->wrappedObject()->setUint32Property(207, 9);
  EXPECT_FALSE(geran->valueExists(16)) << "GERAN has no flag 0x10 whatever it holds";
}

TEST(Cellular, CellsAndNeighbours) {
  SharedPointer<GeranCell> cell = sample::full<GeranCell>();
  SharedPointer<GeranCell> copy = GeranCell::create(cell);
  EXPECT_TRUE(*copy == *cell);
  EXPECT_NE(copy->neighbors()[0].get(), cell->neighbors()[0].get()) << "deep copy";
  copy->neighbors()[1]->setLac(1);
  EXPECT_FALSE(*copy == *cell);
  copy->neighbors().removeAt(1);
  EXPECT_FALSE(*copy == *cell);

  // The neighbour list travels after the cell's own fields: cut short, the
  // read fails and leaves the cell cleared, neighbours included.
  Bytes bytes = bytesOf(*cell);
  bytes.pop_back();
  EXPECT_FALSE(readFrom(*copy, bytes));
  EXPECT_EQ(0, copy->presenceMask());
  EXPECT_TRUE(copy->currentNeighbors().empty());
}

// The object reader's fuzz seeds double as the pinned byte format of every
// record: each checked-in seed must be exactly what the records write now.
// With LODESTACK_WRITE_FUZZ_SEEDS=<dir> the seeds are written there instead
// (after a deliberate format change).
TEST(Cellular, FuzzSeedsPinTheByteFormat) {
  const char* target = std::getenv("LODESTACK_WRITE_FUZZ_SEEDS");
  const std::string dir = target ? target : LODESTACK_SOURCE_DIR "/fuzz/corpus/object_reader";
  auto check = [&](const std::string& name, unsigned char selector, const ISerializable& s) {
    Bytes bytes = bytesOf(s);
    bytes.insert(bytes.begin(), selector);
    const std::string path = dir + "/" + name;
    if (target) {
      lodestack::testing::writeBytes(path, bytes);
    } else {
      EXPECT_EQ(lodestack::testing::readBytes(path), bytes)
          << name << " no longer matches " << path;
    }
  };
  for (const SharedPointer<gom::ObjectBase>& r : sample::allRecords()) {
    gom::Variant v(7);
    ASSERT_EQ(Ok, v.setObjectValue(r));
    check("record_" + std::to_string(r->key()), 1, v);
  }
  check("all_records", 0, *objectOf(sample::allRecords()));
  check("measurement_container", 0, *sample::fullContainer());
}
