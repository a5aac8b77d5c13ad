// Fuzzes the encrypted file: arbitrary stored bytes, then a sequence of
// seeks, reads, writes, flushes and re-openings. Every result is checked
// against a plain copy of the contents, and at the end the stored bytes
// must be the contents under one continuous AES-128-CTR stream (computed
// with OpenSSL directly).
//
// Input: two bytes of stored length L (little-endian, cut to what is
// there), L stored bytes, then operations of three bytes each: an opcode and
// a 16-bit argument.
#include <openssl/evp.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <vector>

#include <lodestack/lodestack.h>

using namespace lodestack;
using Bytes = std::vector<unsigned char>;

namespace {

const unsigned char kKey[16] = {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16};
const unsigned char kIv[16] = {0xf0, 0xe1, 0xd2, 0xc3, 0xb4, 0xa5, 0x96, 0x87,
                               0x78, 0x69, 0x5a, 0x4b, 0x3c, 0x2d, 0x1e, 0x0f};

void check(bool condition) {
  if (!condition) std::abort();
}

// A file in memory with the positioning rules of a standard I/O file.
class MemoryFile : public core::IFile {
 public:
  explicit MemoryFile(Bytes bytes) : bytes_(std::move(bytes)), at_(0) {}
  bool good() const override { return true; }
  bool seekFromStart(unsigned int pos) override {
    at_ = pos;
    return true;
  }
  bool seekFromEnd(unsigned int n) override {
    if (n > bytes_.size()) return false;
    at_ = static_cast<unsigned int>(bytes_.size()) - n;
    return true;
  }
  unsigned int offset() const override { return at_; }
  bool eof() const override { return at_ >= bytes_.size(); }
  bool getSize(unsigned int& size) override {
    size = static_cast<unsigned int>(bytes_.size());
    return true;
  }
  bool canRead() const override { return true; }
  bool canSeek() const override { return true; }
  bool canWrite() const override { return true; }
  unsigned int read(unsigned char* dst, unsigned int n) override {
    const unsigned int count = at_ >= bytes_.size() ? 0 : std::min<unsigned int>(n, bytes_.size() - at_);
    if (count > 0) std::memcpy(dst, bytes_.data() + at_, count);
    at_ += count;
    return count;
  }
  unsigned int write(const unsigned char* src, unsigned int n) override {
    if (n == 0) return 0;
    if (bytes_.size() < at_ + n) bytes_.resize(at_ + n);
    std::memcpy(bytes_.data() + at_, src, n);
    at_ += n;
    return n;
  }
  bool flush() override { return true; }
  const Bytes& bytes() const { return bytes_; }

 private:
  Bytes bytes_;
  unsigned int at_;
};

Bytes ctrStream(const Bytes& data) {
  unsigned char counter[16];
  std::memcpy(counter, kIv, 12);
  std::memset(counter + 12, 0, 4);
  Bytes out(data.size() + 16);
  int n = 0, m = 0;
  EVP_CIPHER_CTX* context = EVP_CIPHER_CTX_new();
  EVP_EncryptInit_ex(context, EVP_aes_128_ctr(), nullptr, kKey, counter);
  EVP_EncryptUpdate(context, out.data(), &n, data.data(), static_cast<int>(data.size()));
  EVP_EncryptFinal_ex(context, out.data() + n, &m);
  EVP_CIPHER_CTX_free(context);
  out.resize(static_cast<size_t>(n + m));
  return out;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  if (size < 2) return 0;
  const size_t stored = std::min<size_t>(data[0] | data[1] << 8, size - 2);
  const Bytes initial(data + 2, data + 2 + stored);
  MemoryFile file(initial);
  Bytes model = ctrStream(initial);  // CTR decryption is the same stream
  unsigned int at = 0;
  enum { Untouched, Reading, Writing } mode = Untouched;
  auto stream = std::make_unique<CryptoFileLin>(file, kKey, kIv);
  unsigned char buffer[4096];

  for (size_t i = 2 + stored; i + 3 <= size; i += 3) {
    const unsigned int argument = data[i + 1] | data[i + 2] << 8;
    const unsigned int length = static_cast<unsigned int>(model.size());
    switch (data[i] % 7) {
      case 0: {
        const unsigned int target = argument % (length + 8);
        check(stream->seekFromStart(target) == (target <= length));
        if (target <= length) at = target;
        break;
      }
      case 1:
        check(stream->seekFromEnd(argument) == (argument <= length));
        if (argument <= length) at = length - argument;
        break;
      case 2: {
        const unsigned int n = argument % sizeof buffer;
        const unsigned int expected = std::min(n, length - at);
        check(stream->read(buffer, n) == expected);
        check(std::equal(buffer, buffer + expected, model.begin() + at));
        at += expected;
        if (n > 0 && mode == Untouched) mode = Reading;
        break;
      }
      case 3: {
        const unsigned int n = argument % sizeof buffer;
        for (unsigned int k = 0; k < n; ++k) buffer[k] = static_cast<unsigned char>(argument + k);
        const unsigned int expected = mode == Reading ? 0 : n;
        check(stream->write(buffer, n) == expected);
        if (expected > 0) {
          mode = Writing;
          if (model.size() < at + n) model.resize(at + n);
          std::copy(buffer, buffer + n, model.begin() + at);
          at += n;
        }
        break;
      }
      case 4:
        check(stream->flush());
        break;
      case 5: {
        unsigned int reported = 0;
        check(stream->getSize(reported) && reported == length);
        check(stream->eof() == (at >= length));
        check(stream->canWrite() == (mode != Reading));
        break;
      }
      case 6:
        stream.reset();
        file.seekFromStart(argument % (length + 1));
        at = argument % (length + 1);
        mode = Untouched;
        stream = std::make_unique<CryptoFileLin>(file, kKey, kIv);
        break;
    }
    check(stream->offset() == at);
  }
  stream.reset();
  check(file.bytes() == ctrStream(model));
  return 0;
}
