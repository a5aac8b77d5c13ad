#include <openssl/evp.h>

#include <memory>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "crypto/CryptoTestSupport.h"
#include "lodestack/crypto/CryptoLinux.h"
#include "lodestack/crypto/CryptoUtilityVantor.h"

namespace lodestack {
namespace {

using testing::Bytes;
using testing::fromHex;

// The result of one allocating cipher call, released by the object.
struct Result {
  Status status = Failed;
  unsigned char* data = nullptr;
  unsigned long length = 0;
  ~Result() { CryptoLinux::freeMemoryStatic(data); }
  Bytes bytes() const { return data ? Bytes(data, data + length) : Bytes(); }
};

const Bytes kKey = fromHex("2b7e151628aed2a6abf7158809cf4f3c");

TEST(CryptoLinux, KnownAnswers) {
  CryptoLinux crypto;
  const Bytes plain = fromHex("6bc1bee22e409f96e93d7e117393172a");
  Result ctr;
  const Bytes counter = fromHex("f0f1f2f3f4f5f6f7f8f9fafbfcfdfeff");
  ctr.status = crypto.encrypt(EVP_aes_128_ctr(), plain.data(), plain.size(), kKey.data(), 16,
                              counter.data(), 16, ctr.data, ctr.length);
  ASSERT_EQ(ctr.status, Ok);
  EXPECT_EQ(ctr.bytes(), fromHex("874d6191b620e3261bef6864990db6ce"));

  Result cbc;
  const Bytes iv = fromHex("000102030405060708090a0b0c0d0e0f");
  cbc.status = crypto.encryptAes(plain.data(), plain.size(), kKey.data(), 16, iv.data(), 16,
                                 cbc.data, cbc.length);
  ASSERT_EQ(cbc.status, Ok);
  ASSERT_EQ(cbc.length, 32u) << "a full block of padding after a whole block";
  EXPECT_EQ(Bytes(cbc.data, cbc.data + 16), fromHex("7649abac8119b246cee98e9b12e9197d"));

  unsigned char digest[16];
  ASSERT_EQ(crypto.md5Hash(reinterpret_cast<const unsigned char*>("abc"), 3, digest), Ok);
  EXPECT_EQ(Bytes(digest, digest + 16), fromHex("900150983cd24fb0d6963f7d28e17f72"));
  ASSERT_EQ(crypto.md5Hash(nullptr, 0, digest), Ok);
  EXPECT_EQ(Bytes(digest, digest + 16), fromHex("d41d8cd98f00b204e9800998ecf8427e"));
}

TEST(CryptoLinux, CbcRoundTripsAndRefusals) {
  CryptoLinux crypto;
  const Bytes iv(16, 7);
  for (size_t n : {0, 1, 15, 16, 17, 100}) {
    const Bytes plain(n, static_cast<unsigned char>(n));
    Result sealed, opened;
    sealed.status = crypto.encryptAes(plain.data(), n, kKey.data(), 16, iv.data(), 16, sealed.data,
                                      sealed.length);
    ASSERT_EQ(sealed.status, Ok);
    EXPECT_EQ(sealed.length, (n / 16 + 1) * 16) << n;
    opened.status = crypto.decryptAes(sealed.data, sealed.length, kKey.data(), 16, iv.data(), 16,
                                      opened.data, opened.length);
    ASSERT_EQ(opened.status, Ok) << n;
    EXPECT_EQ(opened.bytes(), plain);

    if (n == 17) {
      Result tampered;
      sealed.data[sealed.length - 1] ^= 0x55;
      tampered.status = crypto.decryptAes(sealed.data, sealed.length, kKey.data(), 16, iv.data(),
                                          16, tampered.data, tampered.length);
      EXPECT_EQ(tampered.status, Failed) << "bad padding";
      EXPECT_TRUE(tampered.data == nullptr && tampered.length == 0);
    }
  }
  Result refused;
  refused.status = crypto.encryptAes(iv.data(), 16, kKey.data(), 15, iv.data(), 16, refused.data,
                                     refused.length);
  EXPECT_EQ(refused.status, InvalidArgument) << "key length";
  refused.status = crypto.encrypt(nullptr, iv.data(), 16, kKey.data(), 16, iv.data(), 16,
                                  refused.data, refused.length);
  EXPECT_EQ(refused.status, InvalidArgument) << "no cipher";
  refused.status = crypto.decryptAes(iv.data(), 15, kKey.data(), 16, iv.data(), 16, refused.data,
                                     refused.length);
  EXPECT_EQ(refused.status, Failed) << "not a whole number of blocks";
}

// The context keeps the last key between calls: changing key, cipher or
// direction must still give what a fresh object gives.
TEST(CryptoLinux, ReusedContextFollowsEveryChange) {
  CryptoLinux reused;
  const Bytes otherKey(16, 0xA5);
  const Bytes plain(100, 0x3C);
  struct Call {
    bool encrypting;
    const EVP_CIPHER* cipher;
    const Bytes* key;
    unsigned char ivByte;
  };
  const Call calls[] = {{true, EVP_aes_128_ctr(), &kKey, 1},    {true, EVP_aes_128_ctr(), &kKey, 2},
                        {true, EVP_aes_128_ctr(), &otherKey, 2}, {false, EVP_aes_128_ctr(), &otherKey, 3},
                        {true, EVP_aes_128_cbc(), &otherKey, 3}, {true, EVP_aes_128_ctr(), &kKey, 1}};
  for (const Call& call : calls) {
    const Bytes iv(16, call.ivByte);
    Result got, expected;
    CryptoLinux fresh;
    got.status = call.encrypting
                     ? reused.encrypt(call.cipher, plain.data(), plain.size(), call.key->data(), 16,
                                      iv.data(), 16, got.data, got.length)
                     : reused.decrypt(call.cipher, plain.data(), plain.size(), call.key->data(), 16,
                                      iv.data(), 16, got.data, got.length);
    expected.status = call.encrypting
                          ? fresh.encrypt(call.cipher, plain.data(), plain.size(), call.key->data(),
                                          16, iv.data(), 16, expected.data, expected.length)
                          : fresh.decrypt(call.cipher, plain.data(), plain.size(), call.key->data(),
                                          16, iv.data(), 16, expected.data, expected.length);
    ASSERT_EQ(got.status, Ok);
    ASSERT_EQ(expected.status, Ok);
    EXPECT_EQ(got.bytes(), expected.bytes()) << "call with iv byte " << int(call.ivByte);
  }
}

TEST(CryptoUtility, GeneratedKeysArePrintableAndUniform) {
  std::vector<unsigned char> key(94 * 300);
  ASSERT_TRUE(CryptoUtilityAdaptationCommon::generateKey(static_cast<unsigned int>(key.size()), key.data()));
  std::vector<int> seen(256);
  for (unsigned char c : key) ++seen[c];
  for (int c = 0; c < 256; ++c) {
    if (c < 32 || c > 125)
      EXPECT_EQ(seen[c], 0) << "character " << c << " is outside blank to }";
    else
      EXPECT_GT(seen[c], 150) << "character " << c << " is rarer than a uniform draw allows";
  }
  unsigned char a[32], b[32];
  ASSERT_TRUE(CryptoUtilityAdaptationCommon::generateKey(32, a));
  ASSERT_TRUE(CryptoUtilityAdaptationCommon::generateKey(32, b));
  EXPECT_NE(Bytes(a, a + 32), Bytes(b, b + 32));
}

TEST(CryptoUtility, BuiltInStoreNeedsNoStorage) {
  testing::SecureStorageScope storage;  // empty: nothing may be written there
  Status status = Failed;
  std::unique_ptr<ICryptographyUtility> utility(ICryptographyUtility::open("sltdb", status));
  ASSERT_EQ(status, Ok);
  ASSERT_TRUE(utility);
  EXPECT_TRUE(storage.entries().empty());
  unsigned char *key = nullptr, *iv = nullptr;
  utility->getKeyAndIv(key, iv);
  std::unique_ptr<ICryptographyUtility> again(ICryptographyUtility::open("sltdb", status));
  unsigned char *key2 = nullptr, *iv2 = nullptr;
  again->getKeyAndIv(key2, iv2);
  EXPECT_EQ(Bytes(key, key + 16), Bytes(key2, key2 + 16)) << "constant material";
  EXPECT_EQ(Bytes(iv, iv + 16), Bytes(iv2, iv2 + 16));

  // The cipher opens on demand although the built-in store skips init.
  const Bytes plain(40, 9);
  unsigned char* sealed = nullptr;
  unsigned long sealedLength = 0;
  ASSERT_EQ(utility->encrypt(plain.data(), plain.size(), sealed, sealedLength), Ok);
  unsigned char* opened = nullptr;
  unsigned long openedLength = 0;
  ASSERT_EQ(again->decrypt(sealed, sealedLength, opened, openedLength), Ok);
  EXPECT_EQ(Bytes(opened, opened + openedLength), plain);
  utility->freeMemory(sealed);
  again->freeMemory(opened);
}

TEST(CryptoUtility, StoreKeyIsCreatedOnceAndCleared) {
  testing::SecureStorageScope storage;
  Status status = Failed;
  std::unique_ptr<ICryptographyUtility> first(ICryptographyUtility::open("results", status));
  ASSERT_EQ(status, Ok);
  const Bytes stored = storage.entry("results");
  ASSERT_EQ(stored.size(), 32u);
  for (unsigned char c : stored) EXPECT_TRUE(c >= 32 && c <= 125);
  EXPECT_EQ(testing::keyAndIvOf(*first), stored);

  std::unique_ptr<ICryptographyUtility> second(ICryptographyUtility::open("results", status));
  ASSERT_EQ(status, Ok);
  EXPECT_EQ(testing::keyAndIvOf(*second), stored) << "the stored key is reused";

  EXPECT_TRUE(ICryptographyUtility::clear("results"));
  EXPECT_TRUE(storage.entries().empty());
  EXPECT_TRUE(ICryptographyUtility::clear("results")) << "no key afterwards either way";
  std::unique_ptr<ICryptographyUtility> third(ICryptographyUtility::open("results", status));
  ASSERT_EQ(status, Ok);
  EXPECT_NE(testing::keyAndIvOf(*third), stored);

  EXPECT_EQ(ICryptographyUtility::open(nullptr, status), nullptr);
  EXPECT_EQ(status, Failed);
}

TEST(CryptoUtility, UnusableStoredKeysAreReplacedOrFail) {
  testing::SecureStorageScope storage;
  storage.put("short", Bytes(10, 'a'));
  Status status = Failed;
  std::unique_ptr<ICryptographyUtility> replaced(ICryptographyUtility::open("short", status));
  ASSERT_EQ(status, Ok);
  EXPECT_EQ(storage.entry("short").size(), 32u) << "a short entry gives way to a fresh key";
  EXPECT_EQ(testing::keyAndIvOf(*replaced), storage.entry("short"));

  // A directory where the entry should be: unreadable, and the fresh key
  // cannot take its place, so opening fails.
  storage.makeDirectoryEntry("blocked");
  EXPECT_EQ(ICryptographyUtility::open("blocked", status), nullptr);
  EXPECT_EQ(status, Failed);
  EXPECT_FALSE(ICryptographyUtility::clear("blocked"));
}

}  // namespace
}  // namespace lodestack
