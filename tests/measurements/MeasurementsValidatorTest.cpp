// The validator on containers built from the schema's records.
#include <gtest/gtest.h>

#include <lodestack/lodestack.h>

#include "radioadaptation/TestPlatform.h"
#include "schema/SampleRecords.h"

namespace lodestack {
namespace testing {
namespace {

using namespace schema;
using V = MeasurementsValidator;

// A container holding the measurement `m` in its technology's collection.
template <class M>
SharedPointer<GenericObject> containerWith(const SharedPointer<M>& m, unsigned short collection) {
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create();
  EXPECT_EQ(c->addMeasurement(m->wrappedObject(), M::kTypeId, collection), Ok);
  return c->wrappedObject();
}

// Runs the validator on every cellular collection, as the provider does.
void validateAll(SharedPointer<GenericObject>& c) {
  for (unsigned short id : {300, 301, 302, 310, 312}) V::validateMeasurementCollection(id, c);
}

TEST(MeasurementsValidator, CompleteMeasurementsPassUnchanged) {
  SharedPointer<GenericObject> c = sample::fullContainer()->wrappedObject();
  SharedPointer<GenericObject> before = c->clone();
  validateAll(c);
  EXPECT_TRUE(*c == *before);
}

TEST(MeasurementsValidator, MeasurementsWithoutWhatPositioningNeedsAreRemoved) {
  // Each case breaks one thing of an otherwise valid GERAN or UTRA-FDD
  // measurement and expects it gone from its collection.
  struct Case {
    const char* what;
    std::function<SharedPointer<GenericObject>()> make;
    unsigned short collection;
  };
  const std::vector<Case> cases = {
      {"GERAN without time stamp",
       [] {
         auto m = sample::measurement<GeranCellMeasurement>();
         m->unset(MeasurementBase::kTimeStamp);
         return containerWith(m, 300);
       },
       300},
      {"UTRA-FDD identity without ucid",
       [] {
         auto m = sample::measurement<UtraFddCellMeasurement>();
         m->dn()->unset(4);
         return containerWith(m, 301);
       },
       301},
      {"GERAN identity without cid",
       [] {
         auto m = sample::measurement<GeranCellMeasurement>();
         m->dn()->unset(8);
         return containerWith(m, 300);
       },
       300},
      {"E-UTRA with a UTRA identity",
       [] {
         auto m = sample::measurement<EUtraCellMeasurement>();
         (void)m->object().setObjectProperty(200, sample::full<UtraCellDn>());
         return containerWith(m, 310);
       },
       310},
      {"UTRA-TDD measurement in the UTRA-FDD collection",
       [] {
         SharedPointer<MeasurementContainer> c = MeasurementContainer::create();
         (void)c->addMeasurement(sample::measurement<UtraTddCellMeasurement>()->wrappedObject(), 4,
                                 301);
         return c->wrappedObject();
       },
       301},
      {"element holding no object",
       [] {
         SharedPointer<GenericObject> c = containerOf({17});
         SharedPointer<gom::ValueCollection> collection;
         (void)c->getCollectionProperty(312, collection);
         gom::Variant* number = gom::Variant::create();
         (void)number->setUint32Value(5);
         (void)collection->add(number);
         (void)measurementsOf(c, 312)[0]->setUint32Property(205, 1);
         return c;
       },
       312},
  };
  for (const Case& test : cases) {
    SharedPointer<GenericObject> c = test.make();
    const std::size_t validBefore = test.collection == 312 ? 1 : 0;
    validateAll(c);
    SharedPointer<gom::ValueCollection> left;
    ASSERT_EQ(c->getCollectionProperty(test.collection, left), Ok)
        << test.what << ": a collection emptied by the walk stays";
    EXPECT_EQ(left->size(), validBefore) << test.what;
  }
}

TEST(MeasurementsValidator, IncompleteServingCellsLoseTheirPartOnly) {
  // GERAN: the frequency info lacks its arfcn; the serving cell stays
  // without it and keeps its other values.
  auto geran = sample::measurement<GeranCellMeasurement>();
  geran->servingCellMeasurement()->frequencyInfo()->unset(2);
  SharedPointer<GenericObject> c = containerWith(geran, 300);
  validateAll(c);
  ASSERT_EQ(measurementsOf(c, 300).size(), 1u);
  SharedPointer<GeranServingCellMeasurement> serving = geran->servingCellMeasurement();
  ASSERT_TRUE(serving);
  EXPECT_FALSE(serving->valueExists(4));
  EXPECT_TRUE(serving->valueExists(1 | 2));

  // E-UTRA: the serving network measurement lacks its frequency info.
  auto eutra = sample::measurement<EUtraCellMeasurement>();
  eutra->servingCellMeasurement()->nwMeasurement()->unset(1);
  c = containerWith(eutra, 310);
  validateAll(c);
  ASSERT_TRUE(eutra->servingCellMeasurement());
  EXPECT_FALSE(eutra->servingCellMeasurement()->valueExists(1));

  // A serving cell of another technology's record is dropped whole.
  auto fdd = sample::measurement<UtraFddCellMeasurement>();
  (void)fdd->object().setObjectProperty(202, sample::full<UtraTddServingCellMeasurement>());
  c = containerWith(fdd, 301);
  validateAll(c);
  ASSERT_EQ(measurementsOf(c, 301).size(), 1u);
  EXPECT_FALSE(fdd->object().propertyExists(202));
}

TEST(MeasurementsValidator, NeighbourEntries) {
  auto geran = sample::measurement<GeranCellMeasurement>();
  SharedPointer<GeranNwMeasurement> lacOnly = sample::full<GeranNwMeasurement>();
  lacOnly->unset(4);
  SharedPointer<GeranNwMeasurement> neither = sample::full<GeranNwMeasurement>();
  neither->unset(2 | 4);
  SharedPointer<GeranNwMeasurement> noFrequency = sample::full<GeranNwMeasurement>();
  noFrequency->unset(1);
  SharedPointer<GeranNwMeasurement> badFrequency = sample::full<GeranNwMeasurement>();
  badFrequency->frequencyInfo()->unset(1);
  for (const auto& nw : {lacOnly, neither, noFrequency, badFrequency})
    ASSERT_EQ(geran->addNwMeasurement(nw), Ok);
  SharedPointer<gom::ValueCollection> neighbours = geran->nwMeasurementCollection();
  gom::Variant* wrongRecord = gom::Variant::create();
  (void)wrongRecord->setObjectValue(sample::full<UtraFddNwMeasurement>());
  (void)neighbours->add(wrongRecord);

  SharedPointer<GenericObject> c = containerWith(geran, 300);
  validateAll(c);
  // The three complete neighbours of the sample and the one without lac and cid stay.
  EXPECT_EQ(geran->nwMeasurementCollection()->size(), 4u);

  // CDMA neighbours are not checked.
  auto cdma = sample::measurement<CdmaCellMeasurement>();
  SharedPointer<CdmaNwMeasurement> bare = CdmaNwMeasurement::create();
  ASSERT_EQ(cdma->addNwMeasurement(bare), Ok);
  c = containerWith(cdma, 312);
  validateAll(c);
  EXPECT_EQ(cdma->nwMeasurementCollection()->size(), 4u);
}

TEST(MeasurementsValidator, EmptyOnEntryIsRemovedEmptiedByTheWalkStays) {
  SharedPointer<GenericObject> c = containerOf({});
  (void)c->setCollectionProperty(300, gom::ValueCollection::create());
  V::validateMeasurementCollection(300, c);
  EXPECT_FALSE(c->propertyExists(300));

  // Neighbours: an empty collection goes, one whose entries all fail stays.
  auto empty = sample::measurement<UtraTddCellMeasurement>();
  empty->setNwMeasurementCollection(gom::ValueCollection::create());
  auto failing = sample::measurement<UtraTddCellMeasurement>();
  for (unsigned int i = 0; i < failing->nwMeasurementCollection()->size(); ++i) {
    SharedPointer<gom::ObjectBase> record;
    (void)failing->nwMeasurementCollection()->item(i)->getObjectValue(record);
    SharedPointer<UtraTddNwMeasurement>::cast(record)->unset(1);
  }
  SharedPointer<MeasurementContainer> both = MeasurementContainer::create();
  (void)both->addUtraTddMeasurement(empty->wrappedObject());
  (void)both->addUtraTddMeasurement(failing->wrappedObject());
  c = both->wrappedObject();
  validateAll(c);
  EXPECT_EQ(measurementsOf(c, 302).size(), 2u);
  EXPECT_FALSE(empty->object().propertyExists(303));
  ASSERT_TRUE(failing->object().propertyExists(303));
  EXPECT_EQ(failing->nwMeasurementCollection()->size(), 0u);

  // Collections the validator does not know are left alone.
  SharedPointer<GenericObject> other = containerOf({20});
  (void)other->setCollectionProperty(315, gom::ValueCollection::create());
  V::validateMeasurementCollection(314, other);
  V::validateMeasurementCollection(315, other);
  EXPECT_EQ(measurementsOf(other, 314).size(), 1u);
}

}  // namespace
}  // namespace testing
}  // namespace lodestack
