// The results file: records written and read back, and files that are cut
// short, damaged, of another kind or encrypted with another key.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <string>
#include <vector>

#include <lodestack/lodestack.h>

#include "ResultsFile.h"
#include "schema/SampleRecords.h"
#include "support/TemporaryDirectory.h"

namespace lodestack {
namespace scan {
namespace {

using gom::SharedPointer;
using testing::readBytes;
using testing::writeBytes;
using Bytes = std::vector<unsigned char>;

// Whether two results hold the same kind, request, status and measurements.
bool same(const Result& a, const Result& b) {
  if (a.kind != b.kind || a.requestId != b.requestId || a.status != b.status) return false;
  return a.measurements ? b.measurements && *a.measurements == *b.measurements : !b.measurements;
}

// Where each record starts, from the length prefixes after the 12-byte head.
std::vector<std::size_t> recordOffsets(const Bytes& b) {
  std::vector<std::size_t> offsets;
  for (std::size_t at = 12; at + 4 <= b.size();) {
    offsets.push_back(at);
    at += 4 + (b[at] | b[at + 1] << 8 | b[at + 2] << 16 | static_cast<std::size_t>(b[at + 3]) << 24);
  }
  return offsets;
}

class ResultsFileTest : public ::testing::Test {
 protected:
  // Every kind of record, a timed-out request, and a GNSS fix.
  std::vector<Result> samples() const {
    SharedPointer<schema::MeasurementContainer> fix = schema::MeasurementContainer::create();
    SharedPointer<schema::PositionEstimate> p = schema::PositionEstimate::create(60.0, 25.0, 1700000001u);
    EXPECT_EQ(Ok, fix->addGnssMeasurement(schema::GnssMeasurement::create(*p)->wrappedObject()));
    return {Result{IMeasurementsObserver::Cellular, 1, Ok, sample::fullContainer()->wrappedObject()},
            Result{IMeasurementsObserver::Wlan, 2, Timeout, nullptr},
            Result{IMeasurementsObserver::Gnss, 0, Ok, fix->wrappedObject()}};
  }

  void writeAll(const std::vector<Result>& results, const std::string& store = "") {
    ResultsWriter writer;
    std::string error;
    ASSERT_TRUE(writer.open(path_, store, error)) << error;
    for (const Result& r : results) ASSERT_TRUE(writer.write(r, error)) << error;
  }

  // Reads every record; the error text when reading stops on one.
  std::string readAll(std::vector<Result>& results, const std::string& store = "") {
    ResultsReader reader;
    std::string error;
    if (!reader.open(path_, store, error)) return error;
    Result r;
    ResultsReader::Outcome outcome;
    while ((outcome = reader.next(r, error)) == ResultsReader::Record) results.push_back(r);
    return outcome == ResultsReader::End ? std::string() : error;
  }

  testing::TemporaryDirectory dir_;
  const std::string path_ = dir_.file("results");
};

TEST_F(ResultsFileTest, RecordsComeBackAsWritten) {
  const std::vector<Result> written = samples();
  writeAll({written[0]});
  writeAll({written[1], written[2]});  // a second run appends
  std::vector<Result> read;
  EXPECT_EQ("", readAll(read));
  ASSERT_EQ(3u, read.size());
  for (std::size_t i = 0; i < read.size(); ++i) EXPECT_TRUE(same(written[i], read[i])) << i;
}

// Reading stops at a bad record, naming its offset, after the good ones.
TEST_F(ResultsFileTest, DamagedFilesNameTheOffsetOfTheBadRecord) {
  writeAll(samples());
  const Bytes whole = readBytes(path_);
  const std::vector<std::size_t> at = recordOffsets(whole);
  ASSERT_EQ(3u, at.size());
  const auto check = [&](const Bytes& bytes, const std::string& error, std::size_t good) {
    writeBytes(path_, bytes);
    std::vector<Result> read;
    EXPECT_EQ(path_ + ": " + error, readAll(read)) << bytes.size() << " bytes";
    EXPECT_EQ(good, read.size()) << error;
  };
  const auto changed = [&](std::size_t byte, unsigned char value) {
    Bytes damaged = whole;
    damaged[byte] = value;
    return damaged;
  };
  const auto corrupt = [&](std::size_t record) {
    return "corrupt record at byte offset " + std::to_string(at[record]);
  };

  for (std::size_t size = at[2] + 1; size < whole.size(); ++size)
    check(Bytes(whole.begin(), whole.begin() + size),
          "truncated record at byte offset " + std::to_string(at[2]), 2);
  check(Bytes(whole.begin(), whole.begin() + 7), "not a lodestack-scan results file", 0);
  check(changed(at[1] + 4, 3), corrupt(1), 1);      // no such kind
  check(changed(at[1] + 5, 13), corrupt(1), 1);     // no such status
  check(changed(at[0] + 10, 2), corrupt(0), 0);     // the object's key: no measurement container
  check(changed(at[2] + 12, 0x7F), corrupt(2), 2);  // more properties than the body holds
  Bytes shortBody = changed(at[1], 5);              // a body too short for its head
  shortBody.resize(at[1] + 9);
  check(shortBody, corrupt(1), 1);
  check(Bytes{'L', 'O', 'D', 'E', 'S', 'C', 'A', 'N', 2, 0, 0, 0},
        "results file version 2 is not supported (this tool knows version 1)", 0);
}

TEST_F(ResultsFileTest, OnlyFilesOfTheirOwnKindAndKeyAreReadOrAppendedTo) {
  const Bytes other = {'n', 'o', 't', ' ', 'r', 'e', 's', 'u', 'l', 't', 's', '\n'};
  writeBytes(path_, other);
  std::string error;
  EXPECT_FALSE(ResultsWriter().open(path_, "", error));
  EXPECT_EQ(path_ + ": not a lodestack-scan results file; not appending to it", error);
  EXPECT_EQ(other, readBytes(path_));
  std::remove(path_.c_str());

  // Keys go to a secure storage of the test's own.
  setenv("LODESTACK_SECURE_STORAGE_DIR", dir_.file("keys").c_str(), 1);
  const std::vector<Result> written = samples();
  writeAll({written[0]}, "scan-test");
  writeAll({written[1], written[2]}, "scan-test");  // appended, still encrypted
  const Bytes stored = readBytes(path_);
  const std::string head = "LODESCAN";
  EXPECT_EQ(std::search(stored.begin(), stored.end(), head.begin(), head.end()), stored.end())
      << "the head is not stored in the clear";
  std::vector<Result> read;
  EXPECT_EQ("", readAll(read, "scan-test"));
  ASSERT_EQ(3u, read.size());
  EXPECT_TRUE(same(written[2], read[2]));

  read.clear();
  EXPECT_EQ(path_ + ": not a lodestack-scan results file", readAll(read)) << "read as plain";
  Status status = Ok;
  delete ICryptographyUtility::open("other-store", status);  // a store with another key
  ASSERT_EQ(Ok, status);
  EXPECT_FALSE(ResultsWriter().open(path_, "other-store", error)) << "never appended to with another key";
  EXPECT_EQ(path_ + ": not a lodestack-scan results file, or not encrypted with the key of "
                    "store other-store",
            readAll(read, "other-store"));
  EXPECT_EQ("store unknown-store has no key in the secure storage; nothing was encrypted with it",
            readAll(read, "unknown-store"));
  EXPECT_TRUE(read.empty()) << "nothing of a wrongly keyed file is read";
  EXPECT_EQ(stored, readBytes(path_)) << "a refused file is left as it was";
  unsetenv("LODESTACK_SECURE_STORAGE_DIR");
}

}  // namespace
}  // namespace scan
}  // namespace lodestack
