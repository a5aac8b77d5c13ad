// CryptoLinux: the ICryptography of this library, over OpenSSL 3 EVP.
//
// The AES-128 ciphers are fetched from OpenSSL's default provider once per
// object and reused, and the cipher context is kept between calls; a call
// that repeats the previous cipher, direction and key only loads the new IV.
// So the object is cheap to call block by block, and must be used by one
// thread at a time. Results come from new[] and go back through
// freeMemory or freeMemoryStatic.
#ifndef LODESTACK_CRYPTO_CRYPTOLINUX_H
#define LODESTACK_CRYPTO_CRYPTOLINUX_H

#include "lodestack/crypto/ICryptography.h"

struct evp_cipher_ctx_st;

namespace lodestack {

class LODESTACK_EXPORT CryptoLinux : public ICryptography {
 public:
  CryptoLinux();
  ~CryptoLinux() override;
  CryptoLinux(const CryptoLinux&) = delete;
  CryptoLinux& operator=(const CryptoLinux&) = delete;

  Status encrypt(const EVP_CIPHER* cipher, const unsigned char* in, unsigned long inLength,
                 const unsigned char* key, unsigned long keyLength, const unsigned char* iv,
                 unsigned long ivLength, unsigned char*& out, unsigned long& outLength) override;
  Status decrypt(const EVP_CIPHER* cipher, const unsigned char* in, unsigned long inLength,
                 const unsigned char* key, unsigned long keyLength, const unsigned char* iv,
                 unsigned long ivLength, unsigned char*& out, unsigned long& outLength) override;
  Status encryptAes(const unsigned char* in, unsigned long inLength, const unsigned char* key,
                    unsigned long keyLength, const unsigned char* iv, unsigned long ivLength,
                    unsigned char*& out, unsigned long& outLength) override;
  Status decryptAes(const unsigned char* in, unsigned long inLength, const unsigned char* key,
                    unsigned long keyLength, const unsigned char* iv, unsigned long ivLength,
                    unsigned char*& out, unsigned long& outLength) override;
  Status md5Hash(const unsigned char* data, unsigned long length, unsigned char* digest) override;
  void freeMemory(unsigned char* memory) override;

  static void freeMemoryStatic(unsigned char* memory);

  // The same pass as encrypt/decrypt into a caller's buffer of at least
  // inLength + 32 bytes: the block-by-block form the encrypted file uses.
  [[nodiscard]] Status transform(bool encrypting, const EVP_CIPHER* cipher,
                                 const unsigned char* in, unsigned long inLength,
                                 const unsigned char* key, unsigned long keyLength,
                                 const unsigned char* iv, unsigned long ivLength,
                                 unsigned char* out, unsigned long& outLength);

 private:
  const EVP_CIPHER* fetched(const EVP_CIPHER* cipher);
  Status allocatingTransform(bool encrypting, const EVP_CIPHER* cipher, const unsigned char* in,
                             unsigned long inLength, const unsigned char* key,
                             unsigned long keyLength, const unsigned char* iv,
                             unsigned long ivLength, unsigned char*& out,
                             unsigned long& outLength);

  evp_cipher_ctx_st* context_;
  EVP_CIPHER* ctr_;  // fetched AES-128-CTR, or null when the fetch failed
  EVP_CIPHER* cbc_;
  // What the context was last initialised with; a repeat loads the IV only.
  const EVP_CIPHER* lastCipher_;
  int lastDirection_;  // 1 encrypt, 0 decrypt, -1 none
  unsigned long lastKeyLength_;
  unsigned char lastKey_[64];
};

}  // namespace lodestack

#endif  // LODESTACK_CRYPTO_CRYPTOLINUX_H
