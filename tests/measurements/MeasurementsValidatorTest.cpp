// The validator on containers built from the schema's records.
#include "radioadaptation/TestPlatform.h"
#include "schema/SampleRecords.h"

namespace lodestack {
namespace testing {
namespace {

using namespace schema;
using V = MeasurementsValidator;

// A container holding the measurement `m` in collection `collection`.
template <class M>
SharedPointer<GenericObject> containerWith(const SharedPointer<M>& m, unsigned short collection) {
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create();
  EXPECT_EQ(c->addMeasurement(m->wrappedObject(), M::kTypeId, collection), Ok);
  return c->wrappedObject();
}

// A sample measurement M changed by `change`, alone in collection `collection`.
template <class M, class Change>
SharedPointer<GenericObject> sampleWith(unsigned short collection, Change change) {
  SharedPointer<M> m = sample::measurement<M>();
  change(*m);
  return containerWith(m, collection);
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
  // A valid CDMA measurement beside an element that holds a number.
  SharedPointer<GenericObject> noObject = containerOf({17});
  (void)measurementsOf(noObject, 312)[0]->setUint32Property(205, 1);
  SharedPointer<gom::ValueCollection> cdma;
  (void)noObject->getCollectionProperty(312, cdma);
  gom::Variant* number = gom::Variant::create();
  (void)number->setUint32Value(5);
  (void)cdma->add(number);

  // Each case breaks one thing of an otherwise valid measurement.
  struct Case {
    const char* what;
    unsigned short collection;
    SharedPointer<GenericObject> container;
    std::size_t left;
  };
  const std::vector<Case> cases = {
      {"GERAN without time stamp", 300,
       sampleWith<GeranCellMeasurement>(300,
                                        [](auto& m) { m.unset(MeasurementBase::kTimeStamp); }),
       0},
      {"UTRA-FDD identity without ucid", 301,
       sampleWith<UtraFddCellMeasurement>(301, [](auto& m) { m.dn()->unset(4); }), 0},
      {"GERAN identity without cid", 300,
       sampleWith<GeranCellMeasurement>(300, [](auto& m) { m.dn()->unset(8); }), 0},
      {"E-UTRA with a UTRA identity", 310,
       sampleWith<EUtraCellMeasurement>(310, [](auto& m) {
         (void)m.object().setObjectProperty(200, sample::full<UtraCellDn>());
       }), 0},
      {"UTRA-TDD measurement in the UTRA-FDD collection", 301,
       sampleWith<UtraTddCellMeasurement>(301, [](auto&) {}), 0},
      {"element holding no object", 312, noObject, 1},
  };
  for (const Case& test : cases) {
    SCOPED_TRACE(test.what);
    SharedPointer<GenericObject> c = test.container;
    validateAll(c);
    SharedPointer<gom::ValueCollection> left;
    ASSERT_EQ(c->getCollectionProperty(test.collection, left), Ok)
        << "a collection emptied by the walk stays";
    EXPECT_EQ(left->size(), test.left);
  }
}

TEST(MeasurementsValidator, IncompleteServingCellsLoseTheirPartOnly) {
  // GERAN: the frequency info lacks its arfcn.
  auto geran = sample::measurement<GeranCellMeasurement>();
  geran->servingCellMeasurement()->frequencyInfo()->unset(2);
  // E-UTRA: the serving network measurement lacks its frequency info.
  auto eutra = sample::measurement<EUtraCellMeasurement>();
  eutra->servingCellMeasurement()->nwMeasurement()->unset(1);
  // UTRA-FDD: a serving cell of another technology's record, dropped whole.
  auto fdd = sample::measurement<UtraFddCellMeasurement>();
  (void)fdd->object().setObjectProperty(202, sample::full<UtraTddServingCellMeasurement>());
  SharedPointer<MeasurementContainer> all = MeasurementContainer::create();
  (void)all->addGeranMeasurement(geran->wrappedObject());
  (void)all->addEUtraMeasurement(eutra->wrappedObject());
  (void)all->addUtraFddMeasurement(fdd->wrappedObject());
  SharedPointer<GenericObject> c = all->wrappedObject();
  validateAll(c);

  for (unsigned short collection : {300, 301, 310})
    EXPECT_EQ(measurementsOf(c, collection).size(), 1u) << "the measurement stays: " << collection;
  ASSERT_TRUE(geran->servingCellMeasurement());
  EXPECT_FALSE(geran->servingCellMeasurement()->valueExists(4));
  EXPECT_TRUE(geran->servingCellMeasurement()->valueExists(1 | 2)) << "its other values stay";
  ASSERT_TRUE(eutra->servingCellMeasurement());
  EXPECT_FALSE(eutra->servingCellMeasurement()->valueExists(1));
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
  gom::Variant* wrongRecord = gom::Variant::create();
  (void)wrongRecord->setObjectValue(sample::full<UtraFddNwMeasurement>());
  (void)geran->nwMeasurementCollection()->add(wrongRecord);

  SharedPointer<GenericObject> c = containerWith(geran, 300);
  validateAll(c);
  // The three complete neighbours of the sample and the one without lac and cid stay.
  EXPECT_EQ(geran->nwMeasurementCollection()->size(), 4u);

  // CDMA neighbours are not checked.
  auto cdma = sample::measurement<CdmaCellMeasurement>();
  ASSERT_EQ(cdma->addNwMeasurement(CdmaNwMeasurement::create()), Ok);
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
