// IStream: an abstract byte stream with fixed-width, little-endian typed
// operations, the medium of the object model's byte format.
//
// The typed operations transfer a value's memory image: widths 1, 2, 4, 8
// for the integers, IEEE 754 single and double precision for float and
// double, all little-endian. Signed values travel through the unsigned
// operation of the same width. Each returns true exactly when the full width
// was transferred; none of them looks at good().
//
// A stream is used by one thread at a time.
#ifndef LODESTACK_STREAM_ISTREAM_H
#define LODESTACK_STREAM_ISTREAM_H

#include <cstring>

#include "lodestack/core/Export.h"

namespace lodestack {

class LODESTACK_EXPORT IStream {
 public:
  virtual ~IStream();

  virtual bool good() const = 0;
  virtual bool seekFromStart(unsigned int pos) = 0;
  virtual bool seekFromEnd(unsigned int n) = 0;
  virtual unsigned int offset() const = 0;
  virtual bool eof() const = 0;
  virtual bool getSize(unsigned int& size) = 0;
  virtual bool canRead() const = 0;
  virtual bool canSeek() const = 0;
  virtual bool canWrite() const = 0;
  // Returns the number of bytes transferred; fewer than n is a short read or
  // write, not an error at this level.
  virtual unsigned int read(unsigned char* dst, unsigned int n) = 0;
  virtual unsigned int write(const unsigned char* src, unsigned int n) = 0;
  virtual bool flush() = 0;

  bool readUint8(unsigned char& v) { return readRaw(v); }
  bool readUint16(unsigned short& v) { return readRaw(v); }
  bool readUint32(unsigned int& v) { return readRaw(v); }
  bool readUint64(unsigned long long& v) { return readRaw(v); }
  bool readFloat(float& v) { return readRaw(v); }
  bool readDouble(double& v) { return readRaw(v); }
  bool writeUint8(unsigned char v) { return writeRaw(v); }
  bool writeUint16(unsigned short v) { return writeRaw(v); }
  bool writeUint32(unsigned int v) { return writeRaw(v); }
  bool writeUint64(unsigned long long v) { return writeRaw(v); }
  bool writeFloat(float v) { return writeRaw(v); }
  bool writeDouble(double v) { return writeRaw(v); }

  // How many bytes are certainly left to read, or UINT_MAX when the stream
  // cannot tell. Readers use it to refuse a claimed length before
  // allocating for it.
  unsigned int bytesLeftHint();

 private:
  static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__,
                "the byte format is the memory image of a little-endian host");

  template <class T>
  bool readRaw(T& v) {
    unsigned char bytes[sizeof(T)];
    if (read(bytes, sizeof(T)) != sizeof(T)) return false;
    std::memcpy(&v, bytes, sizeof(T));
    return true;
  }
  template <class T>
  bool writeRaw(T v) {
    unsigned char bytes[sizeof(T)];
    std::memcpy(bytes, &v, sizeof(T));
    return write(bytes, sizeof(T)) == sizeof(T);
  }
};

}  // namespace lodestack

#endif  // LODESTACK_STREAM_ISTREAM_H
