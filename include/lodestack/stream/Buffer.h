// Buffer: an owning, growable byte array with a read cursor.
//
// Writing appends at the end; reading delivers bytes from the cursor on. A
// Buffer moves, it is never copied implicitly: the constructor and assignment
// from Buffer& take the source's bytes and leave it empty, in the manner of
// the old auto pointers. clone() and extract() make real copies.
//
// Growth keeps spare capacity behind the valid bytes (doubling), so a run of
// small appends costs amortised linear time. The capacity is invisible:
// size(), data(), leftForReading() and the array handed out through
// auto_array_proxy describe exactly the valid bytes; the receiver of such an
// array owns it and frees it with delete[].
//
// Allocation failure throws std::bad_alloc and leaves the buffer as it was.
// Not thread-safe: one thread at a time.
#ifndef LODESTACK_STREAM_BUFFER_H
#define LODESTACK_STREAM_BUFFER_H

#include <cstring>

#include "lodestack/core/Export.h"
#include "lodestack/core/Status.h"

namespace lodestack {

// An owned array and its size in transit into or out of a Buffer. Holding one
// does not own anything by itself: whoever takes the pair takes the array.
template <class T>
struct auto_array_proxy {
  auto_array_proxy() : data(nullptr), size(0) {}
  auto_array_proxy(T* d, unsigned int n) : data(d), size(n) {}
  T* data;
  unsigned int size;
};

class LODESTACK_EXPORT Buffer {
 public:
  Buffer();
  // The size is accepted and ignored on purpose: the buffer starts empty.
  explicit Buffer(unsigned int ignoredSize);
  // Takes ownership of the proxy's array (allocated with new[]).
  Buffer(auto_array_proxy<unsigned char> proxy);
  // Moves: takes the source's bytes and leaves it empty (its cursor stays).
  Buffer(Buffer& source);
  Buffer(Buffer&& source);
  // Moves; frees this buffer's old bytes; this buffer's cursor stays.
  Buffer& operator=(Buffer& source);
  Buffer& operator=(Buffer&& source);
  // Takes the proxy's array unless it is the one already held.
  Buffer& operator=(auto_array_proxy<unsigned char> proxy);
  ~Buffer();

  // Hands the bytes over (exactly size() of them) and leaves the buffer empty.
  operator auto_array_proxy<unsigned char>();

  unsigned int size() const { return size_; }
  unsigned char* data() { return data_; }
  const unsigned char* data() const { return data_; }
  unsigned int readPosition() const { return readPos_; }
  // The cursor survives assignments of other bytes, so it may stand past a
  // smaller new end; nothing is left to read then.
  unsigned int leftForReading() const {
    return readPos_ < size_ ? size_ - readPos_ : 0;
  }

  // Appends n bytes; appending nothing changes nothing (an empty buffer
  // stays without an array).
  void append(const unsigned char* src, unsigned int n) {
    if (n == 0) return;
    unsigned char* dst = capacity_ - size_ >= n ? data_ + size_ : grow(n);
    copyBytes(dst, src, n);
    size_ += n;
  }
  // Appends n bytes of `value`.
  void fill(unsigned char value, unsigned int n);
  // Copies up to n bytes from the cursor to dst and advances the cursor;
  // with `rewind` the cursor goes to 0 first. Returns the bytes copied.
  unsigned int read(unsigned char* dst, unsigned int n, bool rewind) {
    if (rewind) readPos_ = 0;
    const unsigned int left = leftForReading();
    const unsigned int m = n < left ? n : left;
    if (m == 0) return 0;
    copyBytes(dst, data_ + readPos_, m);
    readPos_ += m;
    return m;
  }
  // Moves the cursor onto an existing byte: pos must be below size().
  // InvalidArgument (and no move) otherwise.
  [[nodiscard]] Status setReadPosition(unsigned int pos);

  // Deep copies, cursor at 0. extract's range must satisfy
  // begin <= end <= size(); it is not checked.
  Buffer clone() const;
  Buffer extract(unsigned int begin, unsigned int end) const;
  // Frees the bytes; size and cursor become 0.
  void reset();

  // Makes room for `n` more bytes without changing the contents. For callers
  // that know how much they will write.
  void reserve(unsigned int n);

 private:
  // The byte format moves many fields of 1 to 12 bytes: copy those with two
  // overlapping fixed-width moves instead of a call.
  static void copyBytes(unsigned char* dst, const unsigned char* src, unsigned int n) {
    if (n >= 8 && n <= 16) {
      std::memcpy(dst, src, 8);
      std::memcpy(dst + n - 8, src + n - 8, 8);
    } else if (n >= 4 && n < 8) {
      std::memcpy(dst, src, 4);
      std::memcpy(dst + n - 4, src + n - 4, 4);
    } else if (n >= 2 && n < 4) {
      std::memcpy(dst, src, 2);
      std::memcpy(dst + n - 2, src + n - 2, 2);
    } else if (n == 1) {
      *dst = *src;
    } else {
      std::memcpy(dst, src, n);
    }
  }
  void takeFrom(Buffer& source);
  unsigned char* grow(unsigned int n);

  unsigned char* data_;
  unsigned int size_;
  unsigned int capacity_;
  unsigned int readPos_;
};

}  // namespace lodestack

#endif  // LODESTACK_STREAM_BUFFER_H
