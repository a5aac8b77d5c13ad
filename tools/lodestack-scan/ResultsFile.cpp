#include "ResultsFile.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <vector>

#include <lodestack/platform/SecureStorage.h>
#include <lodestack/schema/MeasurementContainer.h>
#include <lodestack/stream/BufferStream.h>

namespace lodestack {
namespace scan {
namespace {

const unsigned char kMagic[8] = {'L', 'O', 'D', 'E', 'S', 'C', 'A', 'N'};
constexpr unsigned int kVersion = 1;
constexpr unsigned int kHeaderSize = 12;
constexpr unsigned int kBodyHeadSize = 6;  // kind, status, request id
constexpr unsigned int kFileBuffer = 64 * 1024;
// The store whose key is built into the library rather than kept.
const char kBuiltInStore[] = "sltdb";

void putUint32(unsigned char* p, unsigned int v) {
  for (int i = 0; i < 4; ++i) p[i] = static_cast<unsigned char>(v >> (8 * i));
}

unsigned int getUint32(const unsigned char* p) {
  return p[0] | p[1] << 8 | p[2] << 16 | static_cast<unsigned int>(p[3]) << 24;
}

// Empty when `header` opens a results file of this version, else why not.
std::string checkHeader(const unsigned char* header) {
  if (std::memcmp(header, kMagic, sizeof kMagic) != 0) return "not a lodestack-scan results file";
  const unsigned int version = getUint32(header + sizeof kMagic);
  if (version != kVersion) {
    return "results file version " + std::to_string(version) + " is not supported (this tool " +
           "knows version " + std::to_string(kVersion) + ")";
  }
  return std::string();
}

std::string systemError(const std::string& path) { return path + ": " + std::strerror(errno); }

// Whether the secure storage holds a key for `store`.
bool storeHasKey(const std::string& store) {
  char* data = nullptr;
  std::size_t length = 0;
  const int got = ssa_get(store.c_str(), &data, &length);
  std::free(data);
  return got == 0;
}

std::string notResults(const std::string& why, bool encrypted, const std::string& store) {
  return encrypted && why.rfind("not a", 0) == 0
             ? why + ", or not encrypted with the key of store " + store
             : why;
}

bool validKind(unsigned char kind) {
  return kind == IMeasurementsObserver::Cellular || kind == IMeasurementsObserver::Wlan ||
         kind == IMeasurementsObserver::Gnss;
}

}  // namespace

bool ResultsStorage::open(const std::string& path, const std::string& store, bool create,
                          std::string& error) {
  close();
  std::FILE* stream = std::fopen(path.c_str(), create ? "rb+" : "rb");
  if (!stream && create && errno == ENOENT) stream = std::fopen(path.c_str(), "wb+");
  if (!stream) {
    error = systemError(path);
    return false;
  }
  file_ = gom::SharedPointer<core::File>(new core::File(stream, core::File::CanAll));
  // The encrypted file rewrites whole blocks: a large buffer keeps that cheap.
  file_->setBuffer(kFileBuffer);
  if (store.empty()) return true;
  // Reading never makes a key: a store without one encrypted nothing.
  if (!create && store != kBuiltInStore && !storeHasKey(store)) {
    error = "store " + store + " has no key in the secure storage; nothing was encrypted with it";
    close();
    return false;
  }
  Status status = Ok;
  key_.reset(ICryptographyUtility::open(store.c_str(), status));
  if (!key_) {
    error = "store " + store + ": its key could not be read or made (" + statusName(status) + ")";
    close();
    return false;
  }
  return true;
}

IStream* ResultsStorage::stream() {
  encrypted_.reset();
  if (!file_ || !file_->seekFromStart(0)) return nullptr;
  if (!key_) return file_.get();
  encrypted_.reset(ICryptoFile::open(*file_, *key_));
  return encrypted_.get();
}

void ResultsStorage::close() {
  encrypted_.reset();  // writes its last block back into the file
  file_.clear();
  key_.reset();
}

bool ResultsWriter::open(const std::string& path, const std::string& store, std::string& error) {
  close();
  path_ = path;
  if (!storage_.open(path, store, true, error)) return false;
  IStream* stream = storage_.stream();
  unsigned int size = 0;
  if (!stream || !stream->getSize(size)) {
    error = path + ": cannot be read";
    close();
    return false;
  }
  unsigned char header[kHeaderSize];
  if (size > 0) {
    const std::string why = stream->read(header, kHeaderSize) == kHeaderSize
                                ? checkHeader(header)
                                : "not a lodestack-scan results file";
    if (!why.empty()) {
      error = path + ": " + notResults(why, storage_.encrypted(), store) + "; not appending to it";
      close();
      return false;
    }
    // A stream that has been read from is not written through: a fresh one.
    stream = storage_.stream();
    if (!stream || !stream->seekFromEnd(0)) {
      error = path + ": cannot be appended to";
      close();
      return false;
    }
  } else {
    std::memcpy(header, kMagic, sizeof kMagic);
    putUint32(header + sizeof kMagic, kVersion);
    if (stream->write(header, kHeaderSize) != kHeaderSize || !stream->flush()) {
      error = systemError(path);
      close();
      return false;
    }
  }
  stream_ = stream;
  return true;
}

bool ResultsWriter::write(const Result& result, std::string& error) {
  BufferStream container;
  if (result.measurements && !result.measurements->write(container)) {
    error = path_ + ": the result could not be serialised";
    return false;
  }
  const unsigned int containerSize = container.buffer().size();
  std::vector<unsigned char> record(4 + kBodyHeadSize + containerSize);
  putUint32(record.data(), kBodyHeadSize + containerSize);
  record[4] = static_cast<unsigned char>(result.kind);
  record[5] = static_cast<unsigned char>(result.status);
  putUint32(record.data() + 6, result.requestId);
  if (containerSize) std::memcpy(record.data() + 10, container.buffer().data(), containerSize);
  const unsigned int size = static_cast<unsigned int>(record.size());
  if (!stream_ || stream_->write(record.data(), size) != size || !stream_->flush()) {
    error = systemError(path_);
    return false;
  }
  return true;
}

void ResultsWriter::close() {
  stream_ = nullptr;
  storage_.close();
}

bool ResultsReader::open(const std::string& path, const std::string& store, std::string& error) {
  path_ = path;
  if (!storage_.open(path, store, false, error)) return false;
  stream_ = storage_.stream();
  unsigned int size = 0;
  if (!stream_ || !stream_->getSize(size)) {
    error = path + ": cannot be read";
    return false;
  }
  unsigned char header[kHeaderSize];
  const std::string why = size >= kHeaderSize && stream_->read(header, kHeaderSize) == kHeaderSize
                              ? checkHeader(header)
                              : "not a lodestack-scan results file";
  if (!why.empty()) {
    error = path + ": " + notResults(why, storage_.encrypted(), store);
    return false;
  }
  size_ = static_cast<unsigned long long>(size);
  offset_ = kHeaderSize;
  return true;
}

ResultsReader::Outcome ResultsReader::next(Result& result, std::string& error) {
  if (offset_ == size_) return End;
  recordOffset_ = offset_;
  const auto fail = [&](const char* what) {
    error = path_ + ": " + what + " record at byte offset " + std::to_string(recordOffset_);
    return Error;
  };
  const unsigned long long left = size_ - offset_;
  unsigned char length[4];
  if (left < 4 || stream_->read(length, 4) != 4) return fail("truncated");
  const unsigned int bodySize = getUint32(length);
  if (bodySize > left - 4) return fail("truncated");
  if (bodySize < kBodyHeadSize) return fail("corrupt");
  std::vector<unsigned char> body(bodySize);
  if (stream_->read(body.data(), bodySize) != bodySize) return fail("truncated");
  if (!validKind(body[0]) || body[1] > FileError) return fail("corrupt");

  Result read;
  read.kind = body[0];
  read.status = static_cast<Status>(body[1]);
  read.requestId = getUint32(body.data() + 2);
  if (bodySize > kBodyHeadSize) {
    BufferStream bytes(body.data() + kBodyHeadSize, bodySize - kBodyHeadSize);
    read.measurements = gom::GenericObject::create(bytes);
    // A measurement container that fills the body exactly.
    if (!read.measurements || read.measurements->key() != schema::MeasurementContainer::kTypeId ||
        !bytes.eof()) {
      return fail("corrupt");
    }
  }
  offset_ += 4 + bodySize;
  result = read;
  return Record;
}

}  // namespace scan
}  // namespace lodestack
