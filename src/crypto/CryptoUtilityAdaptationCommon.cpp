#include "lodestack/crypto/CryptoUtilityAdaptationCommon.h"

#include <openssl/crypto.h>
#include <openssl/rand.h>

#include <cstring>

namespace lodestack {

namespace {

// The built-in store's material. It protects nothing secret: it only keeps
// files of that store from being plain text.
const char kBuiltInStore[] = "sltdb";
const unsigned char kBuiltInKey[ICryptographyUtility::kKeyLength] = {
    0x6c, 0x6f, 0x64, 0x65, 0x73, 0x74, 0x61, 0x63, 0x6b, 0x2d, 0x73, 0x6c, 0x74, 0x64, 0x62, 0x31};
const unsigned char kBuiltInIv[ICryptographyUtility::kIvLength] = {
    0x9e, 0x37, 0x79, 0xb9, 0x7f, 0x4a, 0x7c, 0x15, 0xf3, 0x9c, 0xc0, 0x60, 0x00, 0x00, 0x00, 0x00};

// Characters " " to "}": 94 values. A byte is accepted below 188, the
// largest multiple of 94 in its range, so every character is equally likely.
const unsigned int kFirstCharacter = 32;
const unsigned int kCharacters = 94;
const unsigned int kAcceptBelow = 256 / kCharacters * kCharacters;

}  // namespace

ICryptographyUtility::~ICryptographyUtility() = default;

CryptoUtilityAdaptationCommon::CryptoUtilityAdaptationCommon() : cryptography_(nullptr) {
  std::memset(key_, 0, sizeof key_);
  std::memset(iv_, 0, sizeof iv_);
}

CryptoUtilityAdaptationCommon::~CryptoUtilityAdaptationCommon() {
  delete cryptography_;
  OPENSSL_cleanse(key_, sizeof key_);
  OPENSSL_cleanse(iv_, sizeof iv_);
}

void CryptoUtilityAdaptationCommon::getKeyAndIv(unsigned char*& key, unsigned char*& iv) {
  key = key_;
  iv = iv_;
}

bool CryptoUtilityAdaptationCommon::openCryptography() {
  if (!cryptography_) cryptography_ = ICryptography::open();
  return cryptography_ != nullptr;
}

Status CryptoUtilityAdaptationCommon::encrypt(const unsigned char* in, unsigned long inLength,
                                              unsigned char*& out, unsigned long& outLength) {
  out = nullptr;
  outLength = 0;
  if (!openCryptography()) return Failed;
  return cryptography_->encryptAes(in, inLength, key_, sizeof key_, iv_, sizeof iv_, out,
                                   outLength);
}

Status CryptoUtilityAdaptationCommon::decrypt(const unsigned char* in, unsigned long inLength,
                                              unsigned char*& out, unsigned long& outLength) {
  out = nullptr;
  outLength = 0;
  if (!openCryptography()) return Failed;
  return cryptography_->decryptAes(in, inLength, key_, sizeof key_, iv_, sizeof iv_, out,
                                   outLength);
}

void CryptoUtilityAdaptationCommon::freeMemory(unsigned char* memory) {
  if (cryptography_) {
    cryptography_->freeMemory(memory);
  } else {
    delete[] memory;  // what the cipher would do; nothing was allocated by one
  }
}

bool CryptoUtilityAdaptationCommon::generateKey(unsigned int n, unsigned char* out) {
  unsigned char pool[64];
  unsigned int filled = 0;
  while (filled < n) {
    if (RAND_bytes(pool, sizeof pool) != 1) return false;
    for (unsigned int i = 0; i < sizeof pool && filled < n; ++i)
      if (pool[i] < kAcceptBelow) out[filled++] = static_cast<unsigned char>(kFirstCharacter + pool[i] % kCharacters);
  }
  OPENSSL_cleanse(pool, sizeof pool);
  return true;
}

bool CryptoUtilityAdaptationCommon::baseInit(const char* storeName) {
  if (!storeName || std::strcmp(storeName, kBuiltInStore) != 0) return false;
  std::memcpy(key_, kBuiltInKey, sizeof key_);
  std::memcpy(iv_, kBuiltInIv, sizeof iv_);
  return true;
}

}  // namespace lodestack
