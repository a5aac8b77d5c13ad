// The results file: records written and read back, and files that are cut
// short, damaged or of another kind.
#include <gtest/gtest.h>

#include <unistd.h>

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

  void writeAll(const std::vector<Result>& results) {
    ResultsWriter writer;
    std::string error;
    ASSERT_TRUE(writer.open(path_, error)) << error;
    for (const Result& r : results) ASSERT_TRUE(writer.write(r, error)) << error;
  }

  // Reads every record; the error text when reading stops on one.
  std::string readAll(std::vector<Result>& results) {
    ResultsReader reader;
    std::string error;
    if (!reader.open(path_, error)) return error;
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
  EXPECT_FALSE(writer.open(path_, error));
  EXPECT_EQ(path_ + ": not a lodestack-scan results file; not appending to it", error);
  EXPECT_EQ(12u, bytes().size());

  setBytes(Bytes{'L', 'O', 'D', 'E', 'S', 'C', 'A', 'N', 2, 0, 0, 0});
  std::vector<Result> read;
  EXPECT_EQ(path_ + ": results file version 2 is not supported (this tool knows version 1)",
            readAll(read));
}

}  // namespace
}  // namespace scan
}  // namespace lodestack
