// CryptoFileLin: the encrypted file of this library: each 512-byte block is
// AES-128-CTR through CryptoLinux, with the counter 32 x (block index) in
// the IV's last four bytes, big-endian (the format of ICryptoFile).
//
// Made by ICryptoFile::open; keeps copies of the key and IV. Destroying it
// writes the buffered block back (errors are lost there: call flush() first
// to see them). One thread at a time.
#ifndef LODESTACK_CRYPTO_CRYPTOFILELIN_H
#define LODESTACK_CRYPTO_CRYPTOFILELIN_H

#include "lodestack/crypto/CryptoFileCommon.h"
#include "lodestack/crypto/CryptoLinux.h"

namespace lodestack {

class LODESTACK_EXPORT CryptoFileLin : public CryptoFileCommon {
 public:
  // `key` and `iv` are 16 bytes each.
  CryptoFileLin(core::IFile& file, const unsigned char* key, const unsigned char* iv);
  ~CryptoFileLin() override;

 protected:
  bool encryptBlock(unsigned int blockIndex, const unsigned char* in, unsigned int length,
                    unsigned char* out) override;
  bool decryptBlock(unsigned int blockIndex, const unsigned char* in, unsigned int length,
                    unsigned char* out) override;

 private:
  bool transformBlock(unsigned int blockIndex, const unsigned char* in, unsigned int length,
                      unsigned char* out);

  unsigned char key_[16];
  unsigned char iv_[16];
  CryptoLinux cryptography_;
};

}  // namespace lodestack

#endif  // LODESTACK_CRYPTO_CRYPTOFILELIN_H
