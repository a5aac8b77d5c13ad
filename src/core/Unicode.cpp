#include "lodestack/core/Unicode.h"

#include <climits>
#include <cstdlib>
#include <cstring>
#include <cwchar>

namespace lodestack {
namespace core {

namespace {

size_t boundedLength(const char* s, unsigned int length) { return strnlen(s, length); }
size_t boundedLength(const wchar_t* s, unsigned int length) { return wcsnlen(s, length); }

size_t convert(wchar_t* to, const char* from, size_t n) { return std::mbstowcs(to, from, n); }
size_t convert(char* to, const wchar_t* from, size_t n) { return std::wcstombs(to, from, n); }

unsigned int clampedSize(size_t size) { return size > UINT_MAX ? UINT_MAX : static_cast<unsigned int>(size); }

// Measures, then converts: a measured length below 1 (the error value
// included) or nothing converted is a failure. The source is first copied up
// to `length` so that the C library never reads past what the caller gave.
template <class To, class From>
bool convertBounded(const From* s, unsigned int length, std::basic_string<To>& out) {
  if (s == nullptr) {
    out.clear();
    return true;
  }
  const std::basic_string<From> source(s, boundedLength(s, length));
  const size_t needed = convert(nullptr, source.c_str(), 0);
  if (needed == static_cast<size_t>(-1) || needed < 1) return false;
  std::basic_string<To> converted(needed, To());
  if (convert(&converted[0], source.c_str(), needed) == 0) return false;
  out.swap(converted);
  return true;
}

}  // namespace

bool Unicode::convertFromUtf8ToUnicode(const char* s, unsigned int length, std::wstring& out) {
  return convertBounded(s, length, out);
}

bool Unicode::convertFromUtf8ToUnicode(const std::string& s, std::wstring& out) {
  return convertBounded(s.c_str(), clampedSize(s.size()), out);
}

bool Unicode::convertFromUtf8ToUnicode(const char* s, std::wstring& out) {
  return convertBounded(s, UINT_MAX, out);
}

bool Unicode::convertFromUnicodeToUtf8(const wchar_t* s, unsigned int length, std::string& out) {
  return convertBounded(s, length, out);
}

bool Unicode::convertFromUnicodeToUtf8(const std::wstring& s, std::string& out) {
  return convertBounded(s.c_str(), clampedSize(s.size()), out);
}

bool Unicode::convertFromUnicodeToUtf8(const wchar_t* s, std::string& out) {
  return convertBounded(s, UINT_MAX, out);
}

}  // namespace core
}  // namespace lodestack
