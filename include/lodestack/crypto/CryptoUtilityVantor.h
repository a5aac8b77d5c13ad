// CryptoUtilityVantor: the key utility of the platform, which keeps each
// store's key and IV (32 bytes) in the platform's secure storage
// (lodestack/platform/SecureStorage.h).
//
// Made by ICryptographyUtility::open; the caller owns it. One thread at a
// time.
#ifndef LODESTACK_CRYPTO_CRYPTOUTILITYVANTOR_H
#define LODESTACK_CRYPTO_CRYPTOUTILITYVANTOR_H

#include "lodestack/crypto/CryptoUtilityAdaptationCommon.h"

namespace lodestack {

class LODESTACK_EXPORT CryptoUtilityVantor : public CryptoUtilityAdaptationCommon {
 public:
  CryptoUtilityVantor();
  ~CryptoUtilityVantor() override;

  // The built-in store needs nothing more. Otherwise the stored 32 bytes
  // become key and IV; when there is no entry, or it cannot be read or is
  // shorter than 32 bytes, fresh ones are generated and stored. Then the
  // cipher is opened. 0 on success; 1 when a fresh key cannot be generated
  // or stored, or the cipher cannot be opened.
  int init(const char* storeName) override;
};

}  // namespace lodestack

#endif  // LODESTACK_CRYPTO_CRYPTOUTILITYVANTOR_H
