#include <climits>

#include "lodestack/stream/BufferStream.h"
#include "lodestack/stream/ISerializable.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {

IStream::~IStream() = default;

unsigned int IStream::bytesLeftHint() {
  unsigned int size = 0;
  if (!canSeek() || !getSize(size)) return UINT_MAX;
  const unsigned int at = offset();
  return at <= size ? size - at : 0;
}

BufferStream::BufferStream() = default;
BufferStream::BufferStream(Buffer& bytes) : buffer_(bytes) {}
BufferStream::BufferStream(const unsigned char* bytes, unsigned int n) {
  buffer_.append(bytes, n);
}
BufferStream::~BufferStream() = default;

bool BufferStream::good() const { return buffer_.data() != nullptr; }

bool BufferStream::seekFromStart(unsigned int pos) {
  return buffer_.setReadPosition(pos) == Ok;
}

bool BufferStream::seekFromEnd(unsigned int n) {
  return buffer_.setReadPosition(buffer_.size() - n) == Ok;
}

unsigned int BufferStream::offset() const {
  return buffer_.size() - buffer_.leftForReading();
}

bool BufferStream::eof() const { return buffer_.leftForReading() == 0; }

bool BufferStream::getSize(unsigned int& size) {
  size = buffer_.size();
  return true;
}

bool BufferStream::canRead() const { return true; }
bool BufferStream::canSeek() const { return true; }
bool BufferStream::canWrite() const { return true; }

unsigned int BufferStream::read(unsigned char* dst, unsigned int n) {
  return buffer_.read(dst, n, false);
}

unsigned int BufferStream::write(const unsigned char* src, unsigned int n) {
  buffer_.append(src, n);
  return n;
}

bool BufferStream::flush() { return true; }

}  // namespace lodestack
