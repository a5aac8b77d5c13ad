// Helpers shared by the crypto tests: hex bytes, a private secure storage
// for one test, and the whole-file CTR reference.
#ifndef LODESTACK_TESTS_CRYPTO_CRYPTOTESTSUPPORT_H
#define LODESTACK_TESTS_CRYPTO_CRYPTOTESTSUPPORT_H

#include <openssl/evp.h>
#include <stdlib.h>

#include <string>
#include <vector>

#include "lodestack/crypto/ICryptographyUtility.h"
#include "support/TemporaryDirectory.h"

namespace lodestack {
namespace testing {

using Bytes = std::vector<unsigned char>;

inline Bytes fromHex(const std::string& hex) {
  Bytes bytes;
  for (size_t i = 0; i + 1 < hex.size(); i += 2)
    bytes.push_back(static_cast<unsigned char>(std::stoi(hex.substr(i, 2), nullptr, 16)));
  return bytes;
}

inline std::string toHex(const Bytes& bytes) {
  std::string hex;
  for (unsigned char b : bytes) hex += "0123456789abcdef"[b >> 4] + std::string(1, "0123456789abcdef"[b & 15]);
  return hex;
}

// Points the host secure storage at a fresh directory, `path()`, for one
// scope; the directory itself is made by the storage when it first keeps a
// key.
class SecureStorageScope {
 public:
  SecureStorageScope() { setenv("LODESTACK_SECURE_STORAGE_DIR", path().c_str(), 1); }
  ~SecureStorageScope() { unsetenv("LODESTACK_SECURE_STORAGE_DIR"); }

  std::string path() const { return directory_.file("storage"); }
  std::string entry(const std::string& name) const { return path() + "/" + name; }

 private:
  TemporaryDirectory directory_;
};

inline Bytes keyAndIvOf(ICryptographyUtility& utility) {
  unsigned char *key = nullptr, *iv = nullptr;
  utility.getKeyAndIv(key, iv);
  Bytes both(key, key + 16);
  both.insert(both.end(), iv, iv + 16);
  return both;
}

// The whole file as one AES-128-CTR stream whose counter bytes 12 to 15
// start at zero: what the encrypted file must equal.
inline Bytes ctrStream(const Bytes& key, const Bytes& iv, const Bytes& data) {
  Bytes counter(iv.begin(), iv.begin() + 12), out(data.size() + 16);
  counter.resize(16, 0);
  int n = 0, m = 0;
  EVP_CIPHER_CTX* context = EVP_CIPHER_CTX_new();
  EVP_EncryptInit_ex(context, EVP_aes_128_ctr(), nullptr, key.data(), counter.data());
  EVP_EncryptUpdate(context, out.data(), &n, data.data(), static_cast<int>(data.size()));
  EVP_EncryptFinal_ex(context, out.data() + n, &m);
  EVP_CIPHER_CTX_free(context);
  out.resize(static_cast<size_t>(n + m));
  return out;
}

}  // namespace testing
}  // namespace lodestack

#endif  // LODESTACK_TESTS_CRYPTO_CRYPTOTESTSUPPORT_H
