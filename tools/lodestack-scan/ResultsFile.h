// The results file of --out: every result of a run, appended as it arrives,
// readable again by `lodestack-scan decode`. All numbers little-endian.
//
//   header   8 bytes "LODESCAN", then the format version, 4 bytes (1)
//   record   length N of the body, 4 bytes; then the body of N bytes:
//              kind        1 byte (1 cellular, 2 WLAN, 4 GNSS)
//              status      1 byte (the Status value)
//              requestId   4 bytes
//              container   N - 6 bytes: the measurement container as
//                          GenericObject::write gives it (key 1); none (N = 6)
//                          when the result carried no container
//
// A new or empty file gets the header first; an existing one is appended to
// only when its header is this format's. Each record is written whole and
// flushed, so a run that is stopped leaves only whole records behind.
#ifndef LODESTACK_SCAN_RESULTSFILE_H
#define LODESTACK_SCAN_RESULTSFILE_H

#include <cstdio>
#include <string>

#include "Result.h"

namespace lodestack {
namespace scan {

class ResultsWriter {
 public:
  ResultsWriter() = default;
  ~ResultsWriter() { close(); }
  ResultsWriter(const ResultsWriter&) = delete;
  ResultsWriter& operator=(const ResultsWriter&) = delete;

  // Opens `path` for appending; false with a one-line `error` when it cannot
  // be opened or holds something else.
  bool open(const std::string& path, std::string& error);
  // Appends one record and flushes it; false with `error` on failure.
  bool write(const Result& result, std::string& error);
  void close();

 private:
  std::FILE* file_ = nullptr;
  std::string path_;
};

class ResultsReader {
 public:
  enum Outcome { Record, End, Error };

  ResultsReader() = default;
  ~ResultsReader();
  ResultsReader(const ResultsReader&) = delete;
  ResultsReader& operator=(const ResultsReader&) = delete;

  // Opens `path` and checks its header; false with `error` otherwise.
  bool open(const std::string& path, std::string& error);
  // The next record into `result`; End after the last one; Error with a
  // one-line `error` naming the byte offset of a truncated or corrupt record.
  Outcome next(Result& result, std::string& error);
  // Where the record last returned by next() starts.
  unsigned long long recordOffset() const { return recordOffset_; }

 private:
  std::FILE* file_ = nullptr;
  std::string path_;
  unsigned long long size_ = 0;
  unsigned long long offset_ = 0;
  unsigned long long recordOffset_ = 0;
};

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_RESULTSFILE_H
