// CryptoUtilityAdaptationCommon: the platform-independent part of the key
// utility: the key and IV, the cipher that uses them, the built-in store
// and key generation. A platform class adds init(), which finds the key.
//
// Owns its ICryptography (opened on demand). One thread at a time.
#ifndef LODESTACK_CRYPTO_CRYPTOUTILITYADAPTATIONCOMMON_H
#define LODESTACK_CRYPTO_CRYPTOUTILITYADAPTATIONCOMMON_H

#include "lodestack/crypto/ICryptography.h"
#include "lodestack/crypto/ICryptographyUtility.h"

namespace lodestack {

class LODESTACK_EXPORT CryptoUtilityAdaptationCommon : public ICryptographyUtility {
 public:
  ~CryptoUtilityAdaptationCommon() override;
  CryptoUtilityAdaptationCommon(const CryptoUtilityAdaptationCommon&) = delete;
  CryptoUtilityAdaptationCommon& operator=(const CryptoUtilityAdaptationCommon&) = delete;

  void getKeyAndIv(unsigned char*& key, unsigned char*& iv) override;
  Status encrypt(const unsigned char* in, unsigned long inLength, unsigned char*& out,
                 unsigned long& outLength) override;
  Status decrypt(const unsigned char* in, unsigned long inLength, unsigned char*& out,
                 unsigned long& outLength) override;
  void freeMemory(unsigned char* memory) override;

  // Finds or makes the key of `storeName`: 0 on success, 1 on failure.
  virtual int init(const char* storeName) = 0;

  // Fills `out` with `n` characters from " " (32) to "}" (125), each equally
  // likely, drawn from OpenSSL's random generator. False when the generator
  // fails (`out` then holds no usable key).
  static bool generateKey(unsigned int n, unsigned char* out);

 protected:
  CryptoUtilityAdaptationCommon();

  // For the built-in store "sltdb": sets the constant key and IV, true.
  // Any other name (or null): false, nothing changed.
  bool baseInit(const char* storeName);
  // Opens the cipher when none is held; false when it cannot be opened.
  bool openCryptography();

  unsigned char key_[kKeyLength];
  unsigned char iv_[kIvLength];
  ICryptography* cryptography_;  // owned; null until opened
};

}  // namespace lodestack

#endif  // LODESTACK_CRYPTO_CRYPTOUTILITYADAPTATIONCOMMON_H
