#include "ResultsFile.h"

#include <cerrno>
#include <cstring>
#include <vector>

#include <lodestack/schema/MeasurementContainer.h>
#include <lodestack/stream/BufferStream.h>

namespace lodestack {
namespace scan {
namespace {

const unsigned char kMagic[8] = {'L', 'O', 'D', 'E', 'S', 'C', 'A', 'N'};
constexpr unsigned int kVersion = 1;
constexpr unsigned int kHeaderSize = 12;
constexpr unsigned int kBodyHeadSize = 6;  // kind, status, request id

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

bool validKind(unsigned char kind) {
  return kind == IMeasurementsObserver::Cellular || kind == IMeasurementsObserver::Wlan ||
         kind == IMeasurementsObserver::Gnss;
}

}  // namespace

bool ResultsWriter::open(const std::string& path, std::string& error) {
  close();
  std::FILE* file = std::fopen(path.c_str(), "ab+");
  if (!file) {
    error = systemError(path);
    return false;
  }
  unsigned char header[kHeaderSize];
  std::fseek(file, 0, SEEK_END);
  const long size = std::ftell(file);
  if (size > 0) {
    std::rewind(file);
    const std::string why = std::fread(header, 1, kHeaderSize, file) == kHeaderSize
                                ? checkHeader(header)
                                : "not a lodestack-scan results file";
    if (!why.empty()) {
      std::fclose(file);
      error = path + ": " + why + "; not appending to it";
      return false;
    }
    std::fseek(file, 0, SEEK_END);
  } else {
    std::memcpy(header, kMagic, sizeof kMagic);
    putUint32(header + sizeof kMagic, kVersion);
    if (std::fwrite(header, 1, kHeaderSize, file) != kHeaderSize || std::fflush(file) != 0) {
      error = systemError(path);
      std::fclose(file);
      return false;
    }
  }
  file_ = file;
  path_ = path;
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
  if (std::fwrite(record.data(), 1, record.size(), file_) != record.size() ||
      std::fflush(file_) != 0) {
    error = systemError(path_);
    return false;
  }
  return true;
}

void ResultsWriter::close() {
  if (file_) std::fclose(file_);
  file_ = nullptr;
}

ResultsReader::~ResultsReader() {
  if (file_) std::fclose(file_);
}

bool ResultsReader::open(const std::string& path, std::string& error) {
  path_ = path;
  file_ = std::fopen(path.c_str(), "rb");
  if (!file_) {
    error = systemError(path);
    return false;
  }
  std::fseek(file_, 0, SEEK_END);
  const long size = std::ftell(file_);
  std::rewind(file_);
  unsigned char header[kHeaderSize];
  const std::string why = size >= static_cast<long>(kHeaderSize) &&
                                  std::fread(header, 1, kHeaderSize, file_) == kHeaderSize
                              ? checkHeader(header)
                              : "not a lodestack-scan results file";
  if (!why.empty()) {
    error = path + ": " + why;
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
  if (left < 4 || std::fread(length, 1, 4, file_) != 4) return fail("truncated");
  const unsigned int bodySize = getUint32(length);
  if (bodySize > left - 4) return fail("truncated");
  if (bodySize < kBodyHeadSize) return fail("corrupt");
  std::vector<unsigned char> body(bodySize);
  if (std::fread(body.data(), 1, bodySize, file_) != bodySize) return fail("truncated");
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
