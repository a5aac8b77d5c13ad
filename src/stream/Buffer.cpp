#include "lodestack/stream/Buffer.h"

#include <cstring>
#include <limits>
#include <new>

namespace lodestack {

Buffer::Buffer() : data_(nullptr), size_(0), capacity_(0), readPos_(0) {}

Buffer::Buffer(unsigned int) : Buffer() {}

Buffer::Buffer(auto_array_proxy<unsigned char> proxy)
    : data_(proxy.data), size_(proxy.data ? proxy.size : 0),
      capacity_(size_), readPos_(0) {}

Buffer::Buffer(Buffer& source) : Buffer() { takeFrom(source); }

Buffer::Buffer(Buffer&& source) : Buffer() { takeFrom(source); }

Buffer& Buffer::operator=(Buffer& source) {
  if (this != &source) {
    delete[] data_;
    data_ = nullptr;
    size_ = capacity_ = 0;
    takeFrom(source);
  }
  return *this;
}

Buffer& Buffer::operator=(Buffer&& source) { return *this = source; }

Buffer& Buffer::operator=(auto_array_proxy<unsigned char> proxy) {
  if (proxy.data == data_) return *this;
  delete[] data_;
  data_ = proxy.data;
  size_ = proxy.data ? proxy.size : 0;
  capacity_ = size_;
  return *this;
}

Buffer::~Buffer() { delete[] data_; }

Buffer::operator auto_array_proxy<unsigned char>() {
  auto_array_proxy<unsigned char> proxy(data_, size_);
  data_ = nullptr;
  size_ = capacity_ = 0;
  return proxy;
}

void Buffer::takeFrom(Buffer& source) {
  data_ = source.data_;
  size_ = source.size_;
  capacity_ = source.capacity_;
  source.data_ = nullptr;
  source.size_ = source.capacity_ = 0;
}

// Returns where the n new bytes go, growing the array when needed. The size
// is not changed here, so a throwing allocation leaves the buffer intact.
unsigned char* Buffer::grow(unsigned int n) {
  const unsigned int needed = size_ + n;
  if (needed < size_) throw std::bad_alloc();  // past 4 GiB
  if (needed > capacity_) {
    unsigned long long target = capacity_ ? 2ull * capacity_ : 64ull;
    if (target < needed) target = needed;
    if (target > std::numeric_limits<unsigned int>::max())
      target = std::numeric_limits<unsigned int>::max();
    unsigned char* bigger = new unsigned char[target];
    if (size_) std::memcpy(bigger, data_, size_);
    delete[] data_;
    data_ = bigger;
    capacity_ = static_cast<unsigned int>(target);
  }
  return data_ + size_;
}

void Buffer::reserve(unsigned int n) {
  if (n == 0 || capacity_ - size_ >= n) return;
  grow(n);
}

void Buffer::fill(unsigned char value, unsigned int n) {
  if (n == 0) return;
  unsigned char* dst = grow(n);
  std::memset(dst, value, n);
  size_ += n;
}

Status Buffer::setReadPosition(unsigned int pos) {
  // A cursor may only stand on an existing byte: pos == size is refused.
  if (pos >= size_) return InvalidArgument;
  readPos_ = pos;
  return Ok;
}

Buffer Buffer::clone() const { return extract(0, size_); }

Buffer Buffer::extract(unsigned int begin, unsigned int end) const {
  Buffer copy;
  copy.append(data_ + begin, end - begin);
  return copy;
}

void Buffer::reset() {
  delete[] data_;
  data_ = nullptr;
  size_ = capacity_ = readPos_ = 0;
}

}  // namespace lodestack
