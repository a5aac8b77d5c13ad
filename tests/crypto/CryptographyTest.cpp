#include <openssl/evp.h>
#include <sys/stat.h>

#include <filesystem>
#include <memory>
#include <vector>

#include <gtest/gtest.h>

#include "crypto/CryptoTestSupport.h"
#include "lodestack/crypto/CryptoLinux.h"
#include "lodestack/crypto/CryptoUtilityVantor.h"

namespace lodestack {
namespace {

using testing::Bytes;
using testing::fromHex;

// One allocating cipher call; the result is released with the object.
struct Call {
  Status status = Failed;
  unsigned char* data = nullptr;
  unsigned long length = 0;
  ~Call() { CryptoLinux::freeMemoryStatic(data); }
  Bytes bytes() const { return data ? Bytes(data, data + length) : Bytes(); }
};

Bytes run(CryptoLinux& crypto, bool encrypting, const EVP_CIPHER* cipher, const Bytes& in,
          const Bytes& key, const Bytes& iv, Status* status = nullptr) {
  Call call;
  call.status = encrypting ? crypto.encrypt(cipher, in.data(), in.size(), key.data(), key.size(),
                                            iv.data(), iv.size(), call.data, call.length)
                           : crypto.decrypt(cipher, in.data(), in.size(), key.data(), key.size(),
                                            iv.data(), iv.size(), call.data, call.length);
  if (status) *status = call.status;
  EXPECT_TRUE(call.status == Ok || (call.data == nullptr && call.length == 0));
  return call.bytes();
}

const Bytes kKey = fromHex("2b7e151628aed2a6abf7158809cf4f3c");
const Bytes kPlain = fromHex("6bc1bee22e409f96e93d7e117393172a");

TEST(CryptoLinux, KnownAnswersPaddingAndRefusals) {
  CryptoLinux crypto;
  EXPECT_EQ(run(crypto, true, EVP_aes_128_ctr(), kPlain, kKey, fromHex("f0f1f2f3f4f5f6f7f8f9fafbfcfdfeff")),
            fromHex("874d6191b620e3261bef6864990db6ce"));
  const Bytes cbc = run(crypto, true, EVP_aes_128_cbc(), kPlain, kKey, fromHex("000102030405060708090a0b0c0d0e0f"));
  ASSERT_EQ(cbc.size(), 32u) << "a whole block of padding after a whole block";
  EXPECT_EQ(Bytes(cbc.begin(), cbc.begin() + 16), fromHex("7649abac8119b246cee98e9b12e9197d"));
  unsigned char digest[16];
  ASSERT_EQ(crypto.md5Hash(reinterpret_cast<const unsigned char*>("abc"), 3, digest), Ok);
  EXPECT_EQ(Bytes(digest, digest + 16), fromHex("900150983cd24fb0d6963f7d28e17f72"));

  const Bytes iv(16, 7);
  for (size_t n : {0, 15, 17}) {
    const Bytes plain(n, static_cast<unsigned char>(n));
    Bytes sealed = run(crypto, true, EVP_aes_128_cbc(), plain, kKey, iv);
    EXPECT_EQ(sealed.size(), (n / 16 + 1) * 16);
    EXPECT_EQ(run(crypto, false, EVP_aes_128_cbc(), sealed, kKey, iv), plain);
    sealed.back() ^= 0x55;
    Status status = Ok;
    run(crypto, false, EVP_aes_128_cbc(), sealed, kKey, iv, &status);
    EXPECT_EQ(status, Failed) << "bad padding after " << n << " bytes";
  }
  Status status = Ok;
  run(crypto, true, EVP_aes_128_cbc(), kPlain, Bytes(15, 1), iv, &status);
  EXPECT_EQ(status, InvalidArgument) << "key length";
  run(crypto, true, nullptr, kPlain, kKey, iv, &status);
  EXPECT_EQ(status, InvalidArgument) << "no cipher";
}

// The context keeps the last key between calls: changing key, cipher or
// direction must still give what a fresh object gives.
TEST(CryptoLinux, ReusedContextFollowsEveryChange) {
  CryptoLinux reused;
  const Bytes other(16, 0xA5), plain(100, 0x3C);
  struct Step {
    bool encrypting;
    const EVP_CIPHER* cipher;
    const Bytes* key;
    unsigned char ivByte;
  };
  for (const Step& s : {Step{true, EVP_aes_128_ctr(), &kKey, 1}, Step{true, EVP_aes_128_ctr(), &kKey, 2},
                        Step{true, EVP_aes_128_ctr(), &other, 2}, Step{false, EVP_aes_128_ctr(), &other, 3},
                        Step{true, EVP_aes_128_cbc(), &other, 3}, Step{true, EVP_aes_128_ctr(), &kKey, 1}}) {
    CryptoLinux fresh;
    const Bytes iv(16, s.ivByte);
    EXPECT_EQ(run(reused, s.encrypting, s.cipher, plain, *s.key, iv),
              run(fresh, s.encrypting, s.cipher, plain, *s.key, iv))
        << "iv byte " << int(s.ivByte);
  }
}

TEST(CryptoUtility, GeneratedKeysArePrintableAndUniform) {
  Bytes key(94 * 300);
  ASSERT_TRUE(CryptoUtilityAdaptationCommon::generateKey(static_cast<unsigned int>(key.size()), key.data()));
  std::vector<int> seen(256);
  for (unsigned char c : key) ++seen[c];
  for (int c = 0; c < 256; ++c) {
    if (c < 32 || c > 125)
      EXPECT_EQ(seen[c], 0) << "character " << c << " is outside blank to }";
    else
      EXPECT_GT(seen[c], 150) << "character " << c << " is rarer than a uniform draw allows";
  }
}

TEST(CryptoUtility, BuiltInStoreNeedsNoStorage) {
  testing::SecureStorageScope storage;
  Status status = Failed;
  std::unique_ptr<ICryptographyUtility> one(ICryptographyUtility::open("sltdb", status));
  std::unique_ptr<ICryptographyUtility> two(ICryptographyUtility::open("sltdb", status));
  ASSERT_TRUE(one && two);
  EXPECT_EQ(testing::keyAndIvOf(*one), testing::keyAndIvOf(*two)) << "constant material";
  EXPECT_FALSE(std::filesystem::exists(storage.path()));
  // The cipher opens on demand although the built-in store skips init.
  Call sealed, opened;
  ASSERT_EQ(one->encrypt(kPlain.data(), kPlain.size(), sealed.data, sealed.length), Ok);
  ASSERT_EQ(two->decrypt(sealed.data, sealed.length, opened.data, opened.length), Ok);
  EXPECT_EQ(opened.bytes(), kPlain);
}

TEST(CryptoUtility, StoreKeysAreCreatedOnceReplacedWhenUnusableAndCleared) {
  testing::SecureStorageScope storage;
  Status status = Failed;
  std::unique_ptr<ICryptographyUtility> first(ICryptographyUtility::open("results", status));
  ASSERT_EQ(status, Ok);
  const Bytes stored = testing::readBytes(storage.entry("results"));
  ASSERT_EQ(stored.size(), 32u);
  EXPECT_EQ(testing::keyAndIvOf(*first), stored);
  std::unique_ptr<ICryptographyUtility> second(ICryptographyUtility::open("results", status));
  ASSERT_EQ(status, Ok);
  EXPECT_EQ(testing::keyAndIvOf(*second), stored) << "the stored key is reused";

  EXPECT_TRUE(ICryptographyUtility::clear("results"));
  EXPECT_TRUE(std::filesystem::is_empty(storage.path()));
  EXPECT_TRUE(ICryptographyUtility::clear("results")) << "no key afterwards either way";
  std::unique_ptr<ICryptographyUtility> third(ICryptographyUtility::open("results", status));
  ASSERT_EQ(status, Ok);
  EXPECT_NE(testing::keyAndIvOf(*third), stored);

  testing::writeBytes(storage.entry("short"), Bytes(10, 'a'));
  std::unique_ptr<ICryptographyUtility> replaced(ICryptographyUtility::open("short", status));
  ASSERT_EQ(status, Ok);
  EXPECT_EQ(testing::keyAndIvOf(*replaced), testing::readBytes(storage.entry("short")))
      << "a fresh key took its place";

  // A directory where the entry should be: unreadable, and the fresh key
  // cannot take its place, so opening fails.
  ASSERT_EQ(0, mkdir(storage.entry("blocked").c_str(), 0700));
  EXPECT_EQ(ICryptographyUtility::open("blocked", status), nullptr);
  EXPECT_EQ(status, Failed);
  EXPECT_FALSE(ICryptographyUtility::clear("blocked"));
}

}  // namespace
}  // namespace lodestack
