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
//
// Encrypted (--encrypt STORE, decode --decrypt STORE): the same bytes,
// stored through lodestack's encrypted file with the store's key from the
// platform's secure storage (made on first use when writing). A file read
// with another store's key does not show the header and is refused as a
// whole; nothing of it is printed.
#ifndef LODESTACK_SCAN_RESULTSFILE_H
#define LODESTACK_SCAN_RESULTSFILE_H

#include <memory>
#include <string>

#include <lodestack/core/File.h>
#include <lodestack/crypto/ICryptoFile.h>
#include <lodestack/crypto/ICryptographyUtility.h>

#include "Result.h"

namespace lodestack {
namespace scan {

// The file under a results stream: plain, or encrypted with a store's key.
class ResultsStorage {
 public:
  ResultsStorage() = default;
  ~ResultsStorage() { close(); }
  ResultsStorage(const ResultsStorage&) = delete;
  ResultsStorage& operator=(const ResultsStorage&) = delete;

  // Opens `path` (made when `create` and missing); `store` empty for a
  // plain file. False with a one-line `error`.
  bool open(const std::string& path, const std::string& store, bool create, std::string& error);
  // A new stream over the file from its start; null when it cannot be made.
  // One stream at a time: release it before asking for the next.
  IStream* stream();
  bool encrypted() const { return bool(key_); }
  void close();

 private:
  gom::SharedPointer<core::File> file_;
  std::unique_ptr<ICryptographyUtility> key_;
  std::unique_ptr<ICryptoFile> encrypted_;
};

class ResultsWriter {
 public:
  ResultsWriter() = default;
  ~ResultsWriter() { close(); }
  ResultsWriter(const ResultsWriter&) = delete;
  ResultsWriter& operator=(const ResultsWriter&) = delete;

  // Opens `path` for appending, encrypted with `store`'s key unless it is
  // empty; false with a one-line `error` when it cannot be opened or holds
  // something else.
  bool open(const std::string& path, const std::string& store, std::string& error);
  // Appends one record and flushes it; false with `error` on failure.
  bool write(const Result& result, std::string& error);
  void close();

 private:
  ResultsStorage storage_;
  IStream* stream_ = nullptr;
  std::string path_;
};

class ResultsReader {
 public:
  enum Outcome { Record, End, Error };

  ResultsReader() = default;
  ResultsReader(const ResultsReader&) = delete;
  ResultsReader& operator=(const ResultsReader&) = delete;

  // Opens `path`, decrypted with `store`'s key unless it is empty, and
  // checks its header; false with `error` otherwise.
  bool open(const std::string& path, const std::string& store, std::string& error);
  // The next record into `result`; End after the last one; Error with a
  // one-line `error` naming the byte offset of a truncated or corrupt record.
  Outcome next(Result& result, std::string& error);
  // Where the record last returned by next() starts.
  unsigned long long recordOffset() const { return recordOffset_; }

 private:
  ResultsStorage storage_;
  IStream* stream_ = nullptr;
  std::string path_;
  unsigned long long size_ = 0;
  unsigned long long offset_ = 0;
  unsigned long long recordOffset_ = 0;
};

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_RESULTSFILE_H
