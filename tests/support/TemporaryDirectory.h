// A fresh directory under $TMPDIR (or /tmp) for one test, removed with
// everything in it at the end, and small helpers for the files in it.
#ifndef LODESTACK_TESTS_SUPPORT_TEMPORARYDIRECTORY_H
#define LODESTACK_TESTS_SUPPORT_TEMPORARYDIRECTORY_H

#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <system_error>
#include <vector>

namespace lodestack {
namespace testing {

class TemporaryDirectory {
 public:
  TemporaryDirectory() {
    const char* base = getenv("TMPDIR");
    std::string pattern = std::string(base && *base ? base : "/tmp") + "/lodestack-test-XXXXXX";
    if (mkdtemp(&pattern[0])) path_ = pattern;
  }
  ~TemporaryDirectory() {
    std::error_code ignored;
    if (!path_.empty()) std::filesystem::remove_all(path_, ignored);
  }
  TemporaryDirectory(const TemporaryDirectory&) = delete;
  TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;

  const std::string& path() const { return path_; }
  std::string file(const std::string& name) const { return path_ + "/" + name; }
  std::wstring wide(const std::string& name = "") const {
    const std::string narrow = name.empty() ? path_ : file(name);
    return std::wstring(narrow.begin(), narrow.end());  // the test paths are ASCII
  }

 private:
  std::string path_;
};

inline std::vector<unsigned char> readBytes(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return std::vector<unsigned char>((std::istreambuf_iterator<char>(in)),
                                    std::istreambuf_iterator<char>());
}

inline void writeBytes(const std::string& path, const std::vector<unsigned char>& bytes) {
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
}

inline std::string readText(const std::string& path) {
  const std::vector<unsigned char> bytes = readBytes(path);
  return std::string(bytes.begin(), bytes.end());
}

inline void writeText(const std::string& path, const std::string& text) {
  writeBytes(path, std::vector<unsigned char>(text.begin(), text.end()));
}

}  // namespace testing
}  // namespace lodestack

#endif  // LODESTACK_TESTS_SUPPORT_TEMPORARYDIRECTORY_H
