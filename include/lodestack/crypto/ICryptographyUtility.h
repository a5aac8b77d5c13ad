// ICryptographyUtility: the key and IV of one named data store, and the
// buffer encryption that uses them.
//
// ICryptographyUtility::open makes the platform's utility for a store: the
// built-in store "sltdb" uses constant material of the library; any other
// store keeps its 16-byte key and 16-byte IV in the platform's secure
// storage, created with fresh random bytes on first use. The caller owns the
// utility and deletes it; an encrypted file keyed through it copies the key
// when it is made. One thread at a time.
#ifndef LODESTACK_CRYPTO_ICRYPTOGRAPHYUTILITY_H
#define LODESTACK_CRYPTO_ICRYPTOGRAPHYUTILITY_H

#include "lodestack/core/Export.h"
#include "lodestack/core/Status.h"

namespace lodestack {

class LODESTACK_EXPORT ICryptographyUtility {
 public:
  static const unsigned int kKeyLength = 16;
  static const unsigned int kIvLength = 16;

  virtual ~ICryptographyUtility();

  // Points `key` and `iv` at the utility's 16-byte key and IV (owned by the
  // utility, valid while it lives).
  virtual void getKeyAndIv(unsigned char*& key, unsigned char*& iv) = 0;
  // AES-128-CBC with the store's key and IV (PKCS#7 padding) into a new
  // buffer, released with freeMemory. Status as ICryptography::encryptAes;
  // Failed when no cipher could be opened.
  [[nodiscard]] virtual Status encrypt(const unsigned char* in, unsigned long inLength,
                                       unsigned char*& out, unsigned long& outLength) = 0;
  [[nodiscard]] virtual Status decrypt(const unsigned char* in, unsigned long inLength,
                                       unsigned char*& out, unsigned long& outLength) = 0;
  virtual void freeMemory(unsigned char* memory) = 0;

  // The utility of `storeName`, or null. `status`: Ok; Failed when the key
  // could neither be read from nor stored into the secure storage (or the
  // name is null); OutOfMemory. A key that cannot be read is replaced by a
  // fresh one, so data encrypted with the old key becomes unreadable.
  static ICryptographyUtility* open(const char* storeName, Status& status);
  // Removes the store's key from the secure storage. True when the store
  // has no key afterwards (it was removed or there was none); false when the
  // storage refused.
  static bool clear(const char* storeName);
};

}  // namespace lodestack

#endif  // LODESTACK_CRYPTO_ICRYPTOGRAPHYUTILITY_H
