#include "lodestack/crypto/CryptoLinux.h"

#include <openssl/evp.h>
#include <openssl/obj_mac.h>

#include <climits>
#include <cstring>
#include <new>

namespace lodestack {

namespace {

// Room a result needs beyond its input: a block of CBC padding, with margin.
const unsigned long kSlack = EVP_MAX_BLOCK_LENGTH;

}  // namespace

ICryptography::~ICryptography() = default;

ICryptography* ICryptography::open() { return new (std::nothrow) CryptoLinux; }

CryptoLinux::CryptoLinux()
    : context_(EVP_CIPHER_CTX_new()),
      ctr_(EVP_CIPHER_fetch(nullptr, "AES-128-CTR", nullptr)),
      cbc_(EVP_CIPHER_fetch(nullptr, "AES-128-CBC", nullptr)),
      lastCipher_(nullptr),
      lastDirection_(-1),
      lastKeyLength_(0) {}

CryptoLinux::~CryptoLinux() {
  EVP_CIPHER_CTX_free(context_);  // before the ciphers it may reference
  EVP_CIPHER_free(ctr_);
  EVP_CIPHER_free(cbc_);
  OPENSSL_cleanse(lastKey_, sizeof lastKey_);
}

// Passing EVP_aes_128_ctr() makes OpenSSL fetch the implementation on every
// initialisation; the copies fetched once at construction avoid that.
const EVP_CIPHER* CryptoLinux::fetched(const EVP_CIPHER* cipher) {
  const int nid = EVP_CIPHER_get_nid(cipher);
  if (nid == NID_aes_128_ctr && ctr_) return ctr_;
  if (nid == NID_aes_128_cbc && cbc_) return cbc_;
  return cipher;
}

Status CryptoLinux::transform(bool encrypting, const EVP_CIPHER* cipher, const unsigned char* in,
                              unsigned long inLength, const unsigned char* key,
                              unsigned long keyLength, const unsigned char* iv,
                              unsigned long ivLength, unsigned char* out,
                              unsigned long& outLength) {
  outLength = 0;
  if (!cipher || !key || !out || (!in && inLength != 0) || inLength > INT_MAX - kSlack)
    return InvalidArgument;
  if (keyLength != static_cast<unsigned long>(EVP_CIPHER_get_key_length(cipher)) ||
      keyLength > sizeof lastKey_ ||
      ivLength != static_cast<unsigned long>(EVP_CIPHER_get_iv_length(cipher)) ||
      (ivLength != 0 && !iv))
    return InvalidArgument;
  if (!context_) return OutOfMemory;
  cipher = fetched(cipher);
  const int direction = encrypting ? 1 : 0;
  const bool sameKey = cipher == lastCipher_ && direction == lastDirection_ &&
                       keyLength == lastKeyLength_ && std::memcmp(key, lastKey_, keyLength) == 0;
  const int initialised = sameKey ? EVP_CipherInit_ex(context_, nullptr, nullptr, nullptr, iv, -1)
                                  : EVP_CipherInit_ex(context_, cipher, nullptr, key, iv, direction);
  if (initialised != 1) {
    lastCipher_ = nullptr;
    return Failed;
  }
  if (!sameKey) {
    lastCipher_ = cipher;
    lastDirection_ = direction;
    lastKeyLength_ = keyLength;
    std::memcpy(lastKey_, key, keyLength);
  }
  int updated = 0, finished = 0;
  static const unsigned char kNothing = 0;
  if (EVP_CipherUpdate(context_, out, &updated, in ? in : &kNothing, static_cast<int>(inLength)) != 1 ||
      EVP_CipherFinal_ex(context_, out + updated, &finished) != 1) {
    lastCipher_ = nullptr;  // the next call starts from a full initialisation
    return Failed;
  }
  outLength = static_cast<unsigned long>(updated) + static_cast<unsigned long>(finished);
  return Ok;
}

Status CryptoLinux::allocatingTransform(bool encrypting, const EVP_CIPHER* cipher,
                                        const unsigned char* in, unsigned long inLength,
                                        const unsigned char* key, unsigned long keyLength,
                                        const unsigned char* iv, unsigned long ivLength,
                                        unsigned char*& out, unsigned long& outLength) {
  out = nullptr;
  outLength = 0;
  if (inLength > INT_MAX - kSlack) return InvalidArgument;
  unsigned char* result = new (std::nothrow) unsigned char[inLength + kSlack];
  if (!result) return OutOfMemory;
  const Status status =
      transform(encrypting, cipher, in, inLength, key, keyLength, iv, ivLength, result, outLength);
  if (status != Ok) {
    delete[] result;
    outLength = 0;
    return status;
  }
  out = result;
  return Ok;
}

Status CryptoLinux::encrypt(const EVP_CIPHER* cipher, const unsigned char* in,
                            unsigned long inLength, const unsigned char* key,
                            unsigned long keyLength, const unsigned char* iv,
                            unsigned long ivLength, unsigned char*& out,
                            unsigned long& outLength) {
  return allocatingTransform(true, cipher, in, inLength, key, keyLength, iv, ivLength, out,
                             outLength);
}

Status CryptoLinux::decrypt(const EVP_CIPHER* cipher, const unsigned char* in,
                            unsigned long inLength, const unsigned char* key,
                            unsigned long keyLength, const unsigned char* iv,
                            unsigned long ivLength, unsigned char*& out,
                            unsigned long& outLength) {
  return allocatingTransform(false, cipher, in, inLength, key, keyLength, iv, ivLength, out,
                             outLength);
}

Status CryptoLinux::encryptAes(const unsigned char* in, unsigned long inLength,
                               const unsigned char* key, unsigned long keyLength,
                               const unsigned char* iv, unsigned long ivLength,
                               unsigned char*& out, unsigned long& outLength) {
  return encrypt(EVP_aes_128_cbc(), in, inLength, key, keyLength, iv, ivLength, out, outLength);
}

Status CryptoLinux::decryptAes(const unsigned char* in, unsigned long inLength,
                               const unsigned char* key, unsigned long keyLength,
                               const unsigned char* iv, unsigned long ivLength,
                               unsigned char*& out, unsigned long& outLength) {
  return decrypt(EVP_aes_128_cbc(), in, inLength, key, keyLength, iv, ivLength, out, outLength);
}

Status CryptoLinux::md5Hash(const unsigned char* data, unsigned long length,
                            unsigned char* digest) {
  if (!digest || (!data && length != 0)) return InvalidArgument;
  unsigned int size = 0;
  static const unsigned char kNothing = 0;
  return EVP_Digest(data ? data : &kNothing, length, digest, &size, EVP_md5(), nullptr) == 1 &&
                 size == kMd5Length
             ? Ok
             : Failed;
}

void CryptoLinux::freeMemory(unsigned char* memory) { freeMemoryStatic(memory); }

void CryptoLinux::freeMemoryStatic(unsigned char* memory) { delete[] memory; }

}  // namespace lodestack
