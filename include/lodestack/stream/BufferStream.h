// BufferStream: the in-memory IStream over a Buffer.
//
// Writes append to the buffer, reads consume from its cursor. A stream that
// never received a byte holds no array and is not good(). The owner takes
// the written bytes through buffer() (for example by moving them out with
// Buffer's move constructor). One thread at a time.
#ifndef LODESTACK_STREAM_BUFFERSTREAM_H
#define LODESTACK_STREAM_BUFFERSTREAM_H

#include "lodestack/stream/Buffer.h"
#include "lodestack/stream/IStream.h"

namespace lodestack {

class LODESTACK_EXPORT BufferStream final : public IStream {
 public:
  BufferStream();
  // Reads from (or appends to) the given bytes, which the stream takes over.
  explicit BufferStream(Buffer& bytes);
  // Copies n bytes to read them.
  BufferStream(const unsigned char* bytes, unsigned int n);
  ~BufferStream() override;

  bool good() const override;
  // Both seeks move the cursor onto an existing byte or fail; seekFromEnd(n)
  // aims at size - n in unsigned arithmetic, so seekFromEnd(0) fails.
  bool seekFromStart(unsigned int pos) override;
  bool seekFromEnd(unsigned int n) override;
  unsigned int offset() const override;
  bool eof() const override;
  bool getSize(unsigned int& size) override;
  bool canRead() const override;
  bool canSeek() const override;
  bool canWrite() const override;
  unsigned int read(unsigned char* dst, unsigned int n) override;
  unsigned int write(const unsigned char* src, unsigned int n) override;
  bool flush() override;

  Buffer& buffer() { return buffer_; }
  const Buffer& buffer() const { return buffer_; }

 private:
  Buffer buffer_;
};

}  // namespace lodestack

#endif  // LODESTACK_STREAM_BUFFERSTREAM_H
