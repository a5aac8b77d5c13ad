// The results file: records written and read back, and files that are cut
// short, damaged or of another kind.
#include <gtest/gtest.h>

#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include <lodestack/lodestack.h>

#include "ResultsFile.h"

namespace lodestack {
namespace scan {
namespace {

using gom::SharedPointer;
using Bytes = std::vector<char>;

class ResultsFileTest : public ::testing::Test {
 protected:
  void TearDown() override { std::remove(path_.c_str()); }

  std::vector<Result> samples() const {
    SharedPointer<schema::MeasurementContainer> cells = schema::MeasurementContainer::create();
    EXPECT_EQ(Ok, cells->addGeranMeasurement(
                      schema::GeranCellMeasurement::create(schema::GeranCellDn::create(244, 5, 1, 2),
                                                           1700000000u)
                          ->wrappedObject()));
    SharedPointer<schema::MeasurementContainer> fix = schema::MeasurementContainer::create();
    SharedPointer<schema::PositionEstimate> p = schema::PositionEstimate::create(60.0, 25.0, 1700000001u);
    EXPECT_EQ(Ok, fix->addGnssMeasurement(schema::GnssMeasurement::create(*p)->wrappedObject()));
    return {Result{IMeasurementsObserver::Cellular, 1, Ok, cells->wrappedObject()},
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

  Bytes bytes() const {
    std::ifstream in(path_, std::ios::binary);
    return Bytes(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
  }
  void setBytes(const Bytes& b) const {
    std::ofstream(path_, std::ios::binary | std::ios::trunc).write(b.data(), b.size());
  }
  // Where each record starts, from the length prefixes.
  std::vector<std::size_t> recordOffsets() const {
    const Bytes b = bytes();
    std::vector<std::size_t> offsets;
    for (std::size_t at = 12; at + 4 <= b.size();) {
      offsets.push_back(at);
      const auto* p = reinterpret_cast<const unsigned char*>(b.data() + at);
      at += 4 + (p[0] | p[1] << 8 | p[2] << 16 | static_cast<std::size_t>(p[3]) << 24);
    }
    return offsets;
  }

  const std::string path_ = ::testing::TempDir() + "results_" + std::to_string(getpid());
};

TEST_F(ResultsFileTest, RecordsComeBackAsWritten) {
  const std::vector<Result> written = samples();
  writeAll({written[0]});
  writeAll({written[1], written[2]});  // a second run appends
  std::vector<Result> read;
  EXPECT_EQ("", readAll(read));
  ASSERT_EQ(3u, read.size());
  for (std::size_t i = 0; i < read.size(); ++i) {
    EXPECT_EQ(written[i].kind, read[i].kind) << i;
    EXPECT_EQ(written[i].requestId, read[i].requestId) << i;
    EXPECT_EQ(written[i].status, read[i].status) << i;
    ASSERT_EQ(bool(written[i].measurements), bool(read[i].measurements)) << i;
    if (read[i].measurements) {
      EXPECT_TRUE(*written[i].measurements == *read[i].measurements) << i;
    }
  }
}

TEST_F(ResultsFileTest, TruncatedFileNamesTheOffsetOfItsLastRecord) {
  writeAll(samples());
  const Bytes whole = bytes();
  const std::size_t last = recordOffsets().back();
  for (std::size_t size = last + 1; size < whole.size(); ++size) {
    setBytes(Bytes(whole.begin(), whole.begin() + size));
    std::vector<Result> read;
    EXPECT_EQ(path_ + ": truncated record at byte offset " + std::to_string(last), readAll(read))
        << size;
    EXPECT_EQ(2u, read.size()) << size;
  }
  setBytes(Bytes(whole.begin(), whole.begin() + 7));
  std::vector<Result> read;
  EXPECT_EQ(path_ + ": not a lodestack-scan results file", readAll(read));
}

TEST_F(ResultsFileTest, CorruptRecordsNameTheirOffset) {
  writeAll(samples());
  const Bytes whole = bytes();
  const std::vector<std::size_t> at = recordOffsets();
  const auto corruptAt = [&](std::size_t byte, char value, std::size_t record) {
    Bytes damaged = whole;
    damaged[byte] = value;
    setBytes(damaged);
    std::vector<Result> read;
    EXPECT_EQ(path_ + ": corrupt record at byte offset " + std::to_string(at[record]),
              readAll(read))
        << "byte " << byte;
    EXPECT_EQ(record, read.size()) << "byte " << byte;
  };
  corruptAt(at[1] + 4, 3, 1);       // no such kind
  corruptAt(at[1] + 5, 13, 1);      // no such status
  corruptAt(at[0] + 10, 2, 0);      // the object's key: no measurement container
  corruptAt(at[2] + 12, 0x7F, 2);   // more properties than the body holds
  Bytes shortBody = whole;          // a body too short for its head
  shortBody[at[1]] = 5;
  setBytes(Bytes(shortBody.begin(), shortBody.begin() + at[1] + 9));
  std::vector<Result> read;
  EXPECT_EQ(path_ + ": corrupt record at byte offset " + std::to_string(at[1]), readAll(read));
}

TEST_F(ResultsFileTest, OtherFilesAreNeitherReadNorAppendedTo) {
  setBytes(Bytes{'n', 'o', 't', ' ', 'r', 'e', 's', 'u', 'l', 't', 's', '\n'});
  ResultsWriter writer;
  std::string error;
  EXPECT_FALSE(writer.open(path_, "", error));
  EXPECT_EQ(path_ + ": not a lodestack-scan results file; not appending to it", error);
  EXPECT_EQ(12u, bytes().size());

  setBytes(Bytes{'L', 'O', 'D', 'E', 'S', 'C', 'A', 'N', 2, 0, 0, 0});
  std::vector<Result> read;
  EXPECT_EQ(path_ + ": results file version 2 is not supported (this tool knows version 1)",
            readAll(read));
}

TEST_F(ResultsFileTest, EncryptedFilesReadBackOnlyWithTheirStoresKey) {
  // Keys go to a secure storage of the test's own.
  const std::string storage = ::testing::TempDir() + "keys_" + std::to_string(getpid());
  setenv("LODESTACK_SECURE_STORAGE_DIR", storage.c_str(), 1);
  const std::vector<Result> written = samples();
  writeAll({written[0]}, "scan-test");
  writeAll({written[1], written[2]}, "scan-test");  // appended, still encrypted
  const Bytes stored = bytes();
  EXPECT_EQ(std::search(stored.begin(), stored.end(), std::begin("LODESCAN"),
                        std::end("LODESCAN") - 1),
            stored.end())
      << "the header is not stored in the clear";

  std::vector<Result> read;
  EXPECT_EQ("", readAll(read, "scan-test"));
  ASSERT_EQ(3u, read.size());
  EXPECT_TRUE(*written[2].measurements == *read[2].measurements);

  read.clear();
  EXPECT_EQ(path_ + ": not a lodestack-scan results file", readAll(read)) << "read as plain";
  Status status = Ok;
  delete ICryptographyUtility::open("other-store", status);  // a store with another key
  ASSERT_EQ(Ok, status);
  ResultsWriter writer;
  std::string error;
  EXPECT_FALSE(writer.open(path_, "other-store", error)) << "never appended to with another key";
  EXPECT_EQ(path_ + ": not a lodestack-scan results file, or not encrypted with the key of "
                    "store other-store",
            readAll(read, "other-store"));
  EXPECT_EQ("store unknown-store has no key in the secure storage; nothing was encrypted with it",
            readAll(read, "unknown-store"));
  EXPECT_TRUE(read.empty()) << "nothing of a wrongly keyed file is read";
  EXPECT_EQ(stored, bytes()) << "a refused file is left as it was";
  unsetenv("LODESTACK_SECURE_STORAGE_DIR");
}

}  // namespace
}  // namespace scan
}  // namespace lodestack
