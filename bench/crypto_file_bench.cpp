// Writing and reading 64 MiB through CryptoFileLin over a File in a
// temporary directory, beside raw EVP AES-128-CTR encryption of the same
// bytes in 512-byte blocks with a fresh EVP_EncryptInit_ex/Update/Final per
// block (the cipher passed as EVP_aes_128_ctr() each time, or fetched once
// with EVP_CIPHER_fetch), all in one run. The File has a 64 KiB buffer. One
// continuous CTR stream over the whole buffer is shown as the ceiling. Target: the encrypted file at least
// half as fast as the faster per-block reference, both ways.
#include <openssl/evp.h>
#include <stdlib.h>
#include <unistd.h>

#include <cstring>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include <lodestack/lodestack.h>

#include "ratio_reporter.h"

using namespace lodestack;

namespace {

const unsigned int kTotal = 64u << 20;
const unsigned int kBlock = 512;
const unsigned int kChunk = 64u << 10;        // what the caller hands over per call
const unsigned int kFileBuffer = 64u << 10;   // the File's standard I/O buffer
const unsigned char kKey[16] = {0x2b, 0x7e, 0x15, 0x16, 0x28, 0xae, 0xd2, 0xa6,
                                0xab, 0xf7, 0x15, 0x88, 0x09, 0xcf, 0x4f, 0x3c};
const unsigned char kIv[16] = {0xf0, 0xf1, 0xf2, 0xf3, 0xf4, 0xf5, 0xf6, 0xf7,
                               0xf8, 0xf9, 0xfa, 0xfb, 0xfc, 0xfd, 0xfe, 0xff};

const std::vector<unsigned char>& plain() {
  static const std::vector<unsigned char> bytes = [] {
    std::vector<unsigned char> b(kTotal);
    std::mt19937 random(1);
    for (unsigned char& c : b) c = static_cast<unsigned char>(random());
    return b;
  }();
  return bytes;
}

const std::string& directory() {
  static const std::string path = [] {
    const char* base = getenv("TMPDIR");
    std::string pattern = std::string(base && *base ? base : "/tmp") + "/crypto-bench-XXXXXX";
    return std::string(mkdtemp(&pattern[0]) ? pattern.c_str() : "/tmp");
  }();
  return path;
}

std::wstring filePath() {
  const std::string path = directory() + "/data";
  return std::wstring(path.begin(), path.end());
}

bool writeFile(unsigned int bufferSize = kFileBuffer) {
  gom::SharedPointer<core::File> file(core::Directory::createFile(filePath(), bufferSize));
  if (!file) return false;
  CryptoFileLin stream(*file, kKey, kIv);
  for (unsigned int done = 0; done < kTotal; done += kChunk)
    if (stream.write(plain().data() + done, kChunk) != kChunk) return false;
  return stream.flush();
}

void BM_CryptoFile_Write(benchmark::State& state) {
  for (auto _ : state)
    if (!writeFile()) state.SkipWithError("write failed");
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kTotal);
}

// With the C library's own buffer (a block of the file system) instead:
// many more system calls (shown, not compared).
void BM_CryptoFile_WriteDefaultBuffer(benchmark::State& state) {
  for (auto _ : state)
    if (!writeFile(0)) state.SkipWithError("write failed");
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kTotal);
}

void BM_CryptoFile_Read(benchmark::State& state) {
  if (!writeFile()) state.SkipWithError("write failed");
  std::vector<unsigned char> out(kTotal);
  for (auto _ : state) {
    gom::SharedPointer<core::File> file(core::Directory::openFile(filePath(), false, kFileBuffer));
    CryptoFileLin stream(*file, kKey, kIv);
    for (unsigned int done = 0; done < kTotal; done += kChunk)
      if (stream.read(out.data() + done, kChunk) != kChunk) state.SkipWithError("short read");
    benchmark::DoNotOptimize(out.data());
  }
  if (std::memcmp(out.data(), plain().data(), kTotal) != 0) state.SkipWithError("wrong contents");
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kTotal);
}

// The same bytes written without encryption: what the file system alone
// costs (shown, not compared).
void BM_PlainFile_Write(benchmark::State& state) {
  for (auto _ : state) {
    gom::SharedPointer<core::File> file(core::Directory::createFile(filePath(), kFileBuffer));
    for (unsigned int done = 0; done < kTotal; done += kChunk)
      if (!file || file->write(plain().data() + done, kChunk) != kChunk) state.SkipWithError("write failed");
    if (file) file->flush();
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kTotal);
}

// The reference: block i with counter 32i, as the encrypted file does it.
void perBlock(benchmark::State& state, const EVP_CIPHER* cipher) {
  std::vector<unsigned char> out(kTotal + 32);
  EVP_CIPHER_CTX* context = EVP_CIPHER_CTX_new();
  for (auto _ : state) {
    for (unsigned int block = 0; block < kTotal / kBlock; ++block) {
      unsigned char counter[16];
      std::memcpy(counter, kIv, 12);
      const unsigned int first = block * (kBlock / 16);
      counter[12] = static_cast<unsigned char>(first >> 24);
      counter[13] = static_cast<unsigned char>(first >> 16);
      counter[14] = static_cast<unsigned char>(first >> 8);
      counter[15] = static_cast<unsigned char>(first);
      unsigned char* to = out.data() + block * kBlock;
      int n = 0, m = 0;
      if (EVP_EncryptInit_ex(context, cipher ? cipher : EVP_aes_128_ctr(), nullptr, kKey, counter) != 1 ||
          EVP_EncryptUpdate(context, to, &n, plain().data() + block * kBlock, kBlock) != 1 ||
          EVP_EncryptFinal_ex(context, to + n, &m) != 1)
        state.SkipWithError("EVP failed");
    }
    benchmark::DoNotOptimize(out.data());
  }
  EVP_CIPHER_CTX_free(context);
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kTotal);
}

void BM_EvpPerBlock_Static(benchmark::State& state) { perBlock(state, nullptr); }

void BM_EvpPerBlock_Fetched(benchmark::State& state) {
  EVP_CIPHER* cipher = EVP_CIPHER_fetch(nullptr, "AES-128-CTR", nullptr);
  perBlock(state, cipher);
  EVP_CIPHER_free(cipher);
}

void BM_EvpOneStream(benchmark::State& state) {
  std::vector<unsigned char> out(kTotal + 32);
  EVP_CIPHER_CTX* context = EVP_CIPHER_CTX_new();
  for (auto _ : state) {
    int n = 0, m = 0;
    EVP_EncryptInit_ex(context, EVP_aes_128_ctr(), nullptr, kKey, kIv);
    EVP_EncryptUpdate(context, out.data(), &n, plain().data(), static_cast<int>(kTotal));
    EVP_EncryptFinal_ex(context, out.data() + n, &m);
    benchmark::DoNotOptimize(out.data());
  }
  EVP_CIPHER_CTX_free(context);
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kTotal);
}

BENCHMARK(BM_CryptoFile_Write)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_CryptoFile_Read)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_CryptoFile_WriteDefaultBuffer)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_PlainFile_Write)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_EvpPerBlock_Static)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_EvpPerBlock_Fetched)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_EvpOneStream)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  lodestack_bench::RatioReporter reporter;
  // Time ratios: at most 2 means at least half the reference's speed.
  reporter.compare("BM_CryptoFile_Write", "BM_EvpPerBlock_Fetched", 2.0);
  reporter.compare("BM_CryptoFile_Read", "BM_EvpPerBlock_Fetched", 2.0);
  reporter.compare("BM_CryptoFile_Write", "BM_EvpPerBlock_Static", 2.0);
  reporter.compare("BM_CryptoFile_Read", "BM_EvpPerBlock_Static", 2.0);
  benchmark::RunSpecifiedBenchmarks(&reporter);
  benchmark::Shutdown();
  unlink((directory() + "/data").c_str());
  rmdir(directory().c_str());
  return 0;
}
