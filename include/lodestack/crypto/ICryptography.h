// ICryptography: AES-128 encryption and decryption and MD5 digests over
// OpenSSL's EVP interface.
//
// Made by ICryptography::open; the caller owns the object and deletes it.
// The cipher operations allocate their result, which the caller releases
// with freeMemory (or CryptoLinux::freeMemoryStatic); on failure the result
// is null with length 0. An object keeps an OpenSSL context between calls:
// one thread at a time per object (use one object per thread).
//
// Ciphers are passed as OpenSSL's EVP_CIPHER (for example EVP_aes_128_ctr()
// or EVP_aes_128_cbc()); this header declares the type without including
// OpenSSL.
#ifndef LODESTACK_CRYPTO_ICRYPTOGRAPHY_H
#define LODESTACK_CRYPTO_ICRYPTOGRAPHY_H

#include "lodestack/core/Export.h"
#include "lodestack/core/Status.h"

struct evp_cipher_st;
typedef struct evp_cipher_st EVP_CIPHER;

namespace lodestack {

class LODESTACK_EXPORT ICryptography {
 public:
  static const unsigned long kAesKeyLength = 16;
  static const unsigned long kAesIvLength = 16;
  static const unsigned long kMd5Length = 16;

  virtual ~ICryptography();

  // One pass of `cipher` over `in` (Init, Update, Final) into a new buffer
  // `out` of `outLength` bytes. `keyLength` and `ivLength` must be the
  // cipher's. Returns Ok; InvalidArgument for a null cipher, a wrong key or
  // IV length or an input of 2 GiB or more; OutOfMemory; Failed when OpenSSL
  // refuses (in decryption: a bad CBC padding).
  [[nodiscard]] virtual Status encrypt(const EVP_CIPHER* cipher, const unsigned char* in,
                                       unsigned long inLength, const unsigned char* key,
                                       unsigned long keyLength, const unsigned char* iv,
                                       unsigned long ivLength, unsigned char*& out,
                                       unsigned long& outLength) = 0;
  [[nodiscard]] virtual Status decrypt(const EVP_CIPHER* cipher, const unsigned char* in,
                                       unsigned long inLength, const unsigned char* key,
                                       unsigned long keyLength, const unsigned char* iv,
                                       unsigned long ivLength, unsigned char*& out,
                                       unsigned long& outLength) = 0;
  // AES-128-CBC with PKCS#7 padding: the cipher text is the plain text
  // rounded up to the next multiple of 16 bytes (a full block of padding
  // when it already is one); decryption checks and removes the padding.
  [[nodiscard]] virtual Status encryptAes(const unsigned char* in, unsigned long inLength,
                                          const unsigned char* key, unsigned long keyLength,
                                          const unsigned char* iv, unsigned long ivLength,
                                          unsigned char*& out, unsigned long& outLength) = 0;
  [[nodiscard]] virtual Status decryptAes(const unsigned char* in, unsigned long inLength,
                                          const unsigned char* key, unsigned long keyLength,
                                          const unsigned char* iv, unsigned long ivLength,
                                          unsigned char*& out, unsigned long& outLength) = 0;
  // The 16-byte MD5 digest of `data` into `digest`. Ok, or Failed.
  [[nodiscard]] virtual Status md5Hash(const unsigned char* data, unsigned long length,
                                       unsigned char* digest) = 0;
  // Releases a result of the operations above; null is allowed.
  virtual void freeMemory(unsigned char* memory) = 0;

  // A new CryptoLinux, or null when it cannot be made.
  static ICryptography* open();
};

}  // namespace lodestack

#endif  // LODESTACK_CRYPTO_ICRYPTOGRAPHY_H
