#include "lodestack/crypto/CryptoFileLin.h"

#include <openssl/crypto.h>
#include <openssl/evp.h>

#include <cstring>
#include <new>

#include "lodestack/crypto/ICryptographyUtility.h"

namespace lodestack {

ICryptoFile* ICryptoFile::open(core::IFile& file, ICryptographyUtility& utility) {
  unsigned char* key = nullptr;
  unsigned char* iv = nullptr;
  utility.getKeyAndIv(key, iv);
  if (!key || !iv) return nullptr;
  return new (std::nothrow) CryptoFileLin(file, key, iv);
}

CryptoFileLin::CryptoFileLin(core::IFile& file, const unsigned char* key, const unsigned char* iv)
    : CryptoFileCommon(file) {
  std::memcpy(key_, key, sizeof key_);
  std::memcpy(iv_, iv, sizeof iv_);
}

CryptoFileLin::~CryptoFileLin() {
  settle();
  OPENSSL_cleanse(key_, sizeof key_);
  OPENSSL_cleanse(iv_, sizeof iv_);
}

// Block i starts at counter 32i (512 bytes are 32 AES blocks), so the file
// is one continuous CTR key stream and each block can be done alone.
// CTR decryption is the same key stream as encryption; both go one way so
// that the cipher context keeps its key schedule between blocks.
bool CryptoFileLin::transformBlock(unsigned int blockIndex, const unsigned char* in,
                                   unsigned int length, unsigned char* out) {
  unsigned char counter[16];
  std::memcpy(counter, iv_, sizeof counter);
  const unsigned int first = blockIndex * (kBlockSize / 16);
  counter[12] = static_cast<unsigned char>(first >> 24);
  counter[13] = static_cast<unsigned char>(first >> 16);
  counter[14] = static_cast<unsigned char>(first >> 8);
  counter[15] = static_cast<unsigned char>(first);
  unsigned long produced = 0;
  return cryptography_.transform(true, EVP_aes_128_ctr(), in, length, key_, sizeof key_,
                                 counter, sizeof counter, out, produced) == Ok &&
         produced == length;
}

bool CryptoFileLin::encryptBlock(unsigned int blockIndex, const unsigned char* in,
                                 unsigned int length, unsigned char* out) {
  return transformBlock(blockIndex, in, length, out);
}

bool CryptoFileLin::decryptBlock(unsigned int blockIndex, const unsigned char* in,
                                 unsigned int length, unsigned char* out) {
  return transformBlock(blockIndex, in, length, out);
}

}  // namespace lodestack
