#include "lodestack/core/File.h"

#include <sys/stat.h>
#include <sys/types.h>

#include <climits>
#include <new>

#include "lodestack/core/Status.h"
#include "lodestack/core/Unicode.h"

namespace lodestack {
namespace core {

IFile::~IFile() = default;

File::File(FILE* file, unsigned int capabilities)
    : file_(file), capabilities_(capabilities), last_(None), buffer_(nullptr) {}

// The C library is given the memory too: without it, glibc keeps its own
// block-sized buffer and ignores the size.
bool File::setBuffer(unsigned int size) {
  unsigned char* buffer = new (std::nothrow) unsigned char[size];
  if (!buffer || std::setvbuf(file_, reinterpret_cast<char*>(buffer), _IOFBF, size) != 0) {
    delete[] buffer;
    return false;
  }
  delete[] buffer_;
  buffer_ = buffer;
  return true;
}

File::~File() {
  if (file_) std::fclose(file_);
  delete[] buffer_;  // after the stream that used it
}

// Standard I/O needs a flush or a seek between output and input, and a seek
// between input and output; a seek to the current position does both.
void File::switchTo(LastOperation next) {
  if (last_ != None && last_ != next) fseeko(file_, 0, SEEK_CUR);
  last_ = next;
}

bool File::good() const { return file_ && !std::ferror(file_); }

bool File::seekFromStart(unsigned int pos) {
  if (!file_ || fseeko(file_, static_cast<off_t>(pos), SEEK_SET) != 0) return false;
  last_ = None;
  return true;
}

bool File::seekFromEnd(unsigned int n) {
  if (!file_ || fseeko(file_, -static_cast<off_t>(n), SEEK_END) != 0) return false;
  last_ = None;
  return true;
}

unsigned int File::offset() const {
  if (!file_) return 0;
  const off_t at = ftello(file_);
  return at < 0 || at > static_cast<off_t>(UINT_MAX) ? 0 : static_cast<unsigned int>(at);
}

bool File::eof() const { return !file_ || std::feof(file_); }

bool File::getSize(unsigned int& size) {
  if (!file_) return false;
  if (last_ == Writing && std::fflush(file_) != 0) return false;
  struct stat info;
  if (fstat(fileno(file_), &info) != 0 || !S_ISREG(info.st_mode) ||
      info.st_size > static_cast<off_t>(UINT_MAX))
    return false;
  size = static_cast<unsigned int>(info.st_size);
  return true;
}

bool File::canRead() const { return capabilities_ & CanRead; }
bool File::canSeek() const { return capabilities_ & CanSeek; }
bool File::canWrite() const { return capabilities_ & CanWrite; }

unsigned int File::read(unsigned char* dst, unsigned int n) {
  if (!file_ || n == 0) return 0;
  switchTo(Reading);
  return static_cast<unsigned int>(std::fread(dst, 1, n, file_));
}

unsigned int File::write(const unsigned char* src, unsigned int n) {
  if (!file_ || n == 0) return 0;
  switchTo(Writing);
  return static_cast<unsigned int>(std::fwrite(src, 1, n, file_));
}

bool File::flush() { return file_ && std::fflush(file_) == 0; }

File* openCrtFile(const std::wstring& path, const char* mode, unsigned int bufferSize) {
  std::string name;
  if (mode == nullptr || !Unicode::convertFromUnicodeToUtf8(path, name)) return nullptr;
  FILE* stream = std::fopen(name.c_str(), mode);
  if (!stream) return nullptr;
  File* file = new (std::nothrow) File(stream, File::CanAll);
  if (!file) {
    std::fclose(stream);
    return nullptr;
  }
  if (bufferSize != 0 && !file->setBuffer(bufferSize)) {
    delete file;
    throw FileError;
  }
  return file;
}

}  // namespace core
}  // namespace lodestack
