#include "lodestack/crypto/CryptoUtilityVantor.h"

#include <openssl/crypto.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <new>

#include "lodestack/debug/Debug.h"
#include "lodestack/platform/SecureStorage.h"

namespace lodestack {

namespace {

const size_t kMaterialLength = ICryptographyUtility::kKeyLength + ICryptographyUtility::kIvLength;

}  // namespace

CryptoUtilityVantor::CryptoUtilityVantor() = default;
CryptoUtilityVantor::~CryptoUtilityVantor() = default;

int CryptoUtilityVantor::init(const char* storeName) {
  if (baseInit(storeName)) return 0;
  if (!storeName) return 1;
  char* stored = nullptr;
  size_t length = 0;
  const int got = ssa_get(storeName, &stored, &length);
  const bool found = got == 0 && length >= kMaterialLength;
  if (found) {
    std::memcpy(key_, stored, kKeyLength);
    std::memcpy(iv_, stored + kKeyLength, kIvLength);
  }
  if (stored) {
    OPENSSL_cleanse(stored, length);
    std::free(stored);
  }
  if (!found) {
    // Deliberately not an error: an unreadable key is replaced, and what was
    // encrypted with it is lost.
    unsigned char fresh[kMaterialLength];
    if (!generateKey(kMaterialLength, fresh)) return 1;
    const int put = ssa_put(storeName, reinterpret_cast<const char*>(fresh), kMaterialLength);
    std::memcpy(key_, fresh, kKeyLength);
    std::memcpy(iv_, fresh + kKeyLength, kIvLength);
    OPENSSL_cleanse(fresh, sizeof fresh);
    Debug::log(Debug::Level1, gCryptoDebugComponentName,
               "CryptoUtilityVantor::init: new key for store %s (read %d, store %d)\n", storeName,
               got, put);
    if (put < 0) return 1;
  }
  return openCryptography() ? 0 : 1;
}

ICryptographyUtility* ICryptographyUtility::open(const char* storeName, Status& status) {
  CryptoUtilityVantor* utility = new (std::nothrow) CryptoUtilityVantor;
  if (!utility) {
    status = OutOfMemory;
    return nullptr;
  }
  if (utility->init(storeName) != 0) {
    delete utility;
    status = Failed;
    return nullptr;
  }
  status = Ok;
  return utility;
}

bool ICryptographyUtility::clear(const char* storeName) {
  const int result = ssa_delete(storeName);
  return result == 0 || result == -ENOENT;
}

}  // namespace lodestack
