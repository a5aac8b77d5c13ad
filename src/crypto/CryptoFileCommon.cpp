#include "lodestack/crypto/CryptoFileCommon.h"

#include <algorithm>
#include <cstring>

namespace lodestack {

ICryptoFile::~ICryptoFile() = default;

CryptoFileCommon::CryptoFileCommon(core::IFile& file)
    : file_(file),
      mode_(Untouched),
      block_(file.offset() / kBlockSize),
      position_(file.offset() % kBlockSize),
      valid_(0),
      loaded_(false),
      dirty_(false),
      fileOffsetKnown_(false),
      fileOffset_(0),
      sizeKnown_(false),
      size_(0) {
  std::memset(buffer_, 0, sizeof buffer_);
}

CryptoFileCommon::~CryptoFileCommon() { explicit_bzero(buffer_, sizeof buffer_); }

bool CryptoFileCommon::positionFile(unsigned int at) {
  if (fileOffsetKnown_ && fileOffset_ == at) return true;
  fileOffsetKnown_ = file_.seekFromStart(at);
  fileOffset_ = at;
  return fileOffsetKnown_;
}

bool CryptoFileCommon::storedSize(unsigned int& size) const {
  if (!sizeKnown_) sizeKnown_ = file_.getSize(size_);
  size = size_;
  return sizeKnown_;
}

bool CryptoFileCommon::contentsSize(unsigned int& size) const {
  if (!storedSize(size)) return false;
  if (loaded_) size = std::max(size, block_ * kBlockSize + valid_);
  return true;
}

// A block wholly overwritten, or lying past the stored contents, is not
// read: sequential writing then costs no read and no seek per block.
bool CryptoFileCommon::loadBlock(bool forWrite, bool wholeBlock) {
  std::memset(buffer_, 0, kBlockSize);
  valid_ = 0;
  dirty_ = false;
  loaded_ = false;
  const unsigned int start = block_ * kBlockSize;
  unsigned int size = 0;
  if (forWrite && (wholeBlock || (storedSize(size) && start >= size))) {
    loaded_ = true;
    return true;
  }
  if (!positionFile(start)) return false;
  const unsigned int count = file_.read(cipherText_, kBlockSize);
  fileOffset_ += count;
  if (count > 0 && !decryptBlock(block_, cipherText_, count, buffer_)) {
    std::memset(buffer_, 0, kBlockSize);
    return false;
  }
  valid_ = count;
  loaded_ = true;
  return true;
}

bool CryptoFileCommon::settle() {
  if (!dirty_) return true;
  const unsigned int start = block_ * kBlockSize;
  if (!encryptBlock(block_, buffer_, valid_, cipherText_) || !positionFile(start)) return false;
  const unsigned int written = file_.write(cipherText_, valid_);
  fileOffset_ += written;
  if (written != valid_) {
    fileOffsetKnown_ = false;
    return false;
  }
  dirty_ = false;
  if (sizeKnown_) size_ = std::max(size_, start + valid_);
  return true;
}

void CryptoFileCommon::nextBlock() {
  ++block_;
  position_ = 0;
  loaded_ = false;
}

unsigned int CryptoFileCommon::read(unsigned char* dst, unsigned int n) {
  if (n == 0) return 0;
  if (mode_ == Untouched) mode_ = Reading;
  unsigned int done = 0;
  while (done < n) {
    if (position_ == kBlockSize) {
      if (!settle()) break;
      nextBlock();
    }
    if (!loaded_ && !loadBlock(false, false)) break;
    if (position_ >= valid_) break;  // the end of the contents
    const unsigned int count = std::min(n - done, valid_ - position_);
    std::memcpy(dst + done, buffer_ + position_, count);
    position_ += count;
    done += count;
  }
  return done;
}

unsigned int CryptoFileCommon::write(const unsigned char* src, unsigned int n) {
  if (n == 0 || !canWrite()) return 0;
  mode_ = Writing;
  unsigned int done = 0;
  while (done < n) {
    if (position_ == kBlockSize) {
      if (!settle()) break;
      nextBlock();
    }
    if (!loaded_ && !loadBlock(true, position_ == 0 && n - done >= kBlockSize)) break;
    const unsigned int count = std::min(n - done, kBlockSize - position_);
    std::memcpy(buffer_ + position_, src + done, count);
    position_ += count;
    done += count;
    dirty_ = true;
    valid_ = std::max(valid_, position_);
    if (position_ == kBlockSize && !settle()) break;
  }
  return done;
}

bool CryptoFileCommon::flush() {
  const bool settled = settle();
  return file_.flush() && settled;
}

bool CryptoFileCommon::seekFromStart(unsigned int pos) {
  unsigned int size = 0;
  if (!contentsSize(size) || pos > size) return false;
  const unsigned int block = pos / kBlockSize;
  if (!(loaded_ && block == block_)) {
    if (!settle()) return false;
    block_ = block;
    loaded_ = false;
  }
  position_ = pos % kBlockSize;
  return true;
}

bool CryptoFileCommon::seekFromEnd(unsigned int n) {
  unsigned int size = 0;
  return contentsSize(size) && n <= size && seekFromStart(size - n);
}

unsigned int CryptoFileCommon::offset() const { return block_ * kBlockSize + position_; }

bool CryptoFileCommon::eof() const {
  unsigned int size = 0;
  return contentsSize(size) ? offset() >= size : file_.eof();
}

bool CryptoFileCommon::getSize(unsigned int& size) { return contentsSize(size); }

bool CryptoFileCommon::good() const { return file_.good(); }
bool CryptoFileCommon::canRead() const { return file_.canRead(); }
bool CryptoFileCommon::canSeek() const { return file_.canSeek(); }
bool CryptoFileCommon::canWrite() const { return mode_ != Reading && file_.canWrite(); }

}  // namespace lodestack
