// Cells from ModemManager, mocked on a private bus, reaching observers
// through the factory's adaptation and a provider; and what a missing,
// failing, malformed, silent or vanishing ModemManager leads to.
#include "platform/BusServiceFixture.h"

namespace lodestack {
namespace testing {
namespace {

using namespace schema;

// GSM serving cell with two neighbours (one bare), UMTS and TD-SCDMA
// serving cells with a neighbour each, an LTE serving cell and neighbour,
// and an NR and a CDMA cell.
const char* const kCells =
    "ret = ["
    "{\"cell-type\": dbus.UInt32(2), \"serving\": True, \"operator-id\": \"24491\", "
    "\"lac\": \"1234\", \"ci\": \"5BA0\", \"rx-level\": dbus.UInt32(40), "
    "\"timing-advance\": dbus.UInt32(3)}, "
    "{\"cell-type\": dbus.UInt32(2), \"serving\": False, \"arfcn\": dbus.UInt32(62), "
    "\"base-station-id\": \"11\", \"lac\": \"1234\", \"ci\": \"5BA1\", \"rx-level\": dbus.UInt32(31)}, "
    "{\"cell-type\": dbus.UInt32(2), \"serving\": False, \"arfcn\": dbus.UInt32(95), "
    "\"base-station-id\": \"15\"}, "
    "{\"cell-type\": dbus.UInt32(3), \"serving\": False, \"uarfcn\": dbus.UInt32(10763), "
    "\"psc\": dbus.UInt32(117), \"ci\": \"1010FB6\", \"ecio\": dbus.Double(-12.0), "
    "\"rscp\": dbus.Double(-85.4), \"path-loss\": dbus.UInt32(121)}, "
    "{\"cell-type\": dbus.UInt32(3), \"serving\": True, \"operator-id\": \"24405\", "
    "\"lac\": \"1001\", \"ci\": \"1010FB5\", \"rscp\": dbus.Double(-70.0)}, "
    "{\"cell-type\": dbus.UInt32(4), \"serving\": True, \"operator-id\": \"46000\", \"ci\": \"220022\"}, "
    "{\"cell-type\": dbus.UInt32(4), \"serving\": False, \"uarfcn\": dbus.UInt32(10055), "
    "\"cell-parameter-id\": dbus.UInt32(44), \"rscp\": dbus.Double(-90.0)}, "
    "{\"cell-type\": dbus.UInt32(5), \"serving\": True, \"operator-id\": \"24491\", \"tac\": \"2B\", "
    "\"ci\": \"121E303\", \"physical-ci\": \"1F\", \"earfcn\": dbus.UInt32(6300), "
    "\"rsrp\": dbus.Double(-95.0)}, "
    "{\"cell-type\": dbus.UInt32(5), \"serving\": False, \"physical-ci\": \"20\", "
    "\"earfcn\": dbus.UInt32(6300)}, "
    "{\"cell-type\": dbus.UInt32(6), \"serving\": True, \"operator-id\": \"24491\", "
    "\"nrarfcn\": dbus.UInt32(632628)}, "
    "{\"cell-type\": dbus.UInt32(1), \"serving\": False}]";

template <class Record>
SharedPointer<Record> neighbour(const SharedPointer<gom::ValueCollection>& collection,
                                unsigned int i) {
  SharedPointer<gom::ObjectBase> record;
  if (!collection || collection->item(i)->getObjectValue(record) != Ok) return SharedPointer<Record>();
  return SharedPointer<Record>::cast(record);
}

using ModemManagerCells = BusServiceFixture;

TEST_P(ModemManagerCells, EveryTechnologyBecomesItsElementAndNrAndCdmaAreSkipped) {
  auto mm = startModemManager(bus);
  ASSERT_EQ(mm->error(), "");
  ASSERT_EQ(addModem(*mm, kCells), "");
  ASSERT_TRUE(openWith(nullptr, "modemmanager", kCellular)) << platform::lastError();

  const Delivery d = requestAndWait(kCellular);
  ASSERT_EQ(d.status, Ok) << platform::lastError();
  SharedPointer<MeasurementContainer> c = MeasurementContainer::create(d.measurements);
  ASSERT_TRUE(c);

  // GERAN: identity from operator-id and the hexadecimal lac and ci, the
  // RXLEV index and timing advance; neighbours by BSIC and ARFCN.
  ASSERT_EQ(c->geranMeasurementCollection()->size(), 1u);
  SharedPointer<GeranCellMeasurement> gsm = GeranCellMeasurement::create(c->geranMeasurement(0));
  EXPECT_EQ(*gsm->dn(), GeranCellDn(244, 91, 0x1234, 0x5BA0));
  EXPECT_EQ(gsm->servingCellMeasurement()->rxLevel(), 40);
  EXPECT_EQ(gsm->servingCellMeasurement()->timingAdvance(), 3);
  ASSERT_EQ(gsm->nwMeasurementCollection()->size(), 2u);
  auto full = neighbour<GeranNwMeasurement>(gsm->nwMeasurementCollection(), 0);
  EXPECT_EQ(*full->frequencyInfo(), GeranFrequencyInfo(0x11, 62));
  EXPECT_EQ(full->lac(), 0x1234);
  EXPECT_EQ(full->cid(), 0x5BA1);
  EXPECT_EQ(full->rxLevel(), 31);
  auto bare = neighbour<GeranNwMeasurement>(gsm->nwMeasurementCollection(), 1);
  EXPECT_EQ(*bare->frequencyInfo(), GeranFrequencyInfo(0x15, 95));
  EXPECT_FALSE(bare->valueExists(2) || bare->valueExists(4) || bare->valueExists(8))
      << "unset values stay unset";

  // UTRA-FDD: the 28-bit cell id and lac; the neighbour that came first in
  // the list joins its serving cell, Ec/Io as the index, RSCP rounded.
  SharedPointer<UtraFddCellMeasurement> fdd = UtraFddCellMeasurement::create(c->utraFddMeasurement(0));
  EXPECT_EQ(*fdd->dn(), UtraCellDn(244, 5, 0x1010FB5));
  EXPECT_EQ(fdd->servingCellMeasurement()->lac(), 0x1001);
  ASSERT_EQ(fdd->nwMeasurementCollection()->size(), 1u);
  auto fddNw = neighbour<UtraFddNwMeasurement>(fdd->nwMeasurementCollection(), 0);
  EXPECT_EQ(*fddNw->frequencyInfo(), UtraFddFrequencyInfo(10763, 117));
  EXPECT_EQ(fddNw->ucid(), 0x1010FB6u);
  EXPECT_EQ(fddNw->ecNo(), 25) << "-12 dB";
  EXPECT_EQ(fddNw->rscp(), -85);
  EXPECT_EQ(fddNw->pathloss(), 121);

  // UTRA-TDD: no lac given; the neighbour by UARFCN and cell parameter id.
  SharedPointer<UtraTddCellMeasurement> tdd = UtraTddCellMeasurement::create(c->utraTddMeasurement(0));
  EXPECT_EQ(*tdd->dn(), UtraCellDn(460, 0, 0x220022));
  EXPECT_FALSE(tdd->servingCellMeasurement()->valueExists(1));
  auto tddNw = neighbour<UtraTddNwMeasurement>(tdd->nwMeasurementCollection(), 0);
  EXPECT_EQ(*tddNw->frequencyInfo(), UtraTddFrequencyInfo(10055, 44));
  EXPECT_EQ(tddNw->rscp(), -90);

  // E-UTRA: the serving cell's identity; the neighbour has no place.
  ASSERT_EQ(c->eutraMeasurementCollection()->size(), 1u);
  EXPECT_EQ(*EUtraCellMeasurement::create(c->eutraMeasurement(0))->dn(),
            EUtraCellDn(244, 91, 0x121E303));

  EXPECT_FALSE(d.measurements->propertyExists(312)) << "no CDMA records";
  EXPECT_EQ(platform::lastSkippedCells().nr, 1u);
  EXPECT_EQ(platform::lastSkippedCells().cdma, 1u);
}

LODESTACK_ON_BOTH_LOOPS(ModemManagerCells);

// Time-outs take the engine's 3 s: one dispatcher kind is enough.
using ModemManagerFailures = BusServiceFixture;

// Each failure ends the request, in the time-out where the service was
// asked, and the next request tries again.
TEST_P(ModemManagerFailures, AbsentEmptyRefusingMalformedSilentVanishingAndBack) {
  ASSERT_TRUE(openWith(nullptr, "modemmanager", kCellular));
  letWatchesSettle();
  unsigned int id = 99;
  EXPECT_EQ(request(kCellular, id), Failed) << "known to be absent: fails at once";
  EXPECT_EQ(id, 0u);
  EXPECT_EQ(platform::lastError(), "ModemManager (org.freedesktop.ModemManager1) is not on the system bus");

  auto mm = startModemManager(bus);
  ASSERT_EQ(mm->error(), "");
  letWatchesSettle();
  EXPECT_EQ(requestUntilTimedOut(kCellular), Timeout);
  EXPECT_EQ(platform::lastError(), "ModemManager: no modem");

  const std::string modem = kModemPath;
  const std::pair<std::string, std::string> answers[] = {
      {"ret = []", "no cell info from " + modem},
      {"raise dbus.exceptions.DBusException(\"Cell info unsupported\", "
       "name=\"org.freedesktop.ModemManager1.Error.Core.Unsupported\")",
       "GetCellInfo on " + modem +
           " failed: org.freedesktop.ModemManager1.Error.Core.Unsupported: Cell info unsupported"},
      {"ret = [{\"cell-type\": dbus.UInt32(2), \"serving\": True, "
       "\"operator-id\": dbus.UInt32(24491)}]",
       "cell 0 of " + modem + ": operator-id has type u, expected s"},
      {"import time; time.sleep(60)",
       "no answer to GetCellInfo on " + modem + " before the request ended"}};
  ASSERT_EQ(addModem(*mm, "ret = []"), "");
  for (const auto& [code, why] : answers) {
    SCOPED_TRACE(code);
    ASSERT_EQ(replaceCellInfo(*mm, code), "");
    EXPECT_EQ(requestUntilTimedOut(kCellular), Timeout);
    EXPECT_EQ(platform::lastError(), "ModemManager: " + why);
  }

  // The mock still sleeps: the next call waits until the service goes.
  ASSERT_EQ(request(kCellular, id), Ok);
  settle(500);
  mm->stop();
  ASSERT_TRUE(runUntil([&] { return observer.last(kCellular)->requestId == id; }, 10.0));
  EXPECT_EQ(observer.last(kCellular)->status, Timeout);
  EXPECT_EQ(platform::lastError().rfind("ModemManager: GetManagedObjects on /org/freedesktop/ModemManager1 failed: org.freedesktop.DBus.Error.NoReply", 0), 0u)
      << platform::lastError();

  // A restarted service is found again.
  mm = startModemManager(bus);
  ASSERT_EQ(mm->error(), "");
  ASSERT_EQ(addModem(*mm, kCells), "");
  letWatchesSettle();
  const Delivery d = requestAndWait(kCellular);
  EXPECT_EQ(d.status, Ok) << platform::lastError();
  EXPECT_TRUE(d.measurements && d.measurements->propertyExists(300));
}

INSTANTIATE_TEST_SUITE_P(Loops, ModemManagerFailures,
                         ::testing::Values(core::AsyncCallDispatcher::MainLoopPoll), loopName);

// The choices of the environment, and a machine without a system bus.
TEST(BusServiceChoices, UnknownChoicesAndAMissingBusAreRefused) {
  const std::pair<const char*, const char*> unknown[] = {
      {"LODESTACK_WLAN",
       "LODESTACK_WLAN: expected scenario, wpa_supplicant, networkmanager or auto, got \"bogus\""},
      {"LODESTACK_CELLS", "LODESTACK_CELLS: expected scenario or modemmanager, got \"bogus\""}};
  for (const auto& [variable, message] : unknown) {
    EnvScope choice(variable, "bogus");
    EXPECT_THROW(RadioMeasurements(), std::runtime_error);
    EXPECT_EQ(platform::lastError(), message);
    EXPECT_FALSE(std::unique_ptr<radioadaptation::IRadioAdaptation>(
        radioadaptation::RadioAdaptationFactory::createRadioAdaptation()));
  }

  EnvScope cells("LODESTACK_CELLS", "modemmanager");
  EnvScope noBus("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent/lodestack-test-bus");
  RadioMeasurements library;
  EXPECT_THROW(library.startCellMeasurements([](void*, OxelMeasurements) {}, nullptr),
               std::runtime_error);
  EXPECT_NE(platform::lastError().find(": no system bus at unix:path=/nonexistent/lodestack-test-bus: "),
            std::string::npos)
      << platform::lastError();
}

}  // namespace
}  // namespace testing
}  // namespace lodestack
