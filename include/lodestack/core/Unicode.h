// Unicode: conversions between wide strings and multibyte strings, the
// boundary every path of the core layer crosses before a system call.
//
// Both directions follow the process's current LC_CTYPE locale (mbstowcs and
// wcstombs): a program that never calls setlocale runs in the "C" locale,
// where only ASCII converts, so a name with any other character fails. Call
// setlocale(LC_CTYPE, "") (or a UTF-8 locale) to handle UTF-8 names. Stateless;
// any thread may call, as long as no thread changes the locale meanwhile.
#ifndef LODESTACK_CORE_UNICODE_H
#define LODESTACK_CORE_UNICODE_H

#include <string>

#include "lodestack/core/Export.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT Unicode {
 public:
  Unicode() = delete;

  // Converts at most `length` bytes of `s` (fewer when a NUL comes first).
  // A null `s` empties `out` and gives true. Returns false, leaving `out`
  // as it was, for an empty string and for a byte sequence the locale
  // cannot convert.
  static bool convertFromUtf8ToUnicode(const char* s, unsigned int length, std::wstring& out);
  static bool convertFromUtf8ToUnicode(const std::string& s, std::wstring& out);
  // `s` up to its NUL.
  static bool convertFromUtf8ToUnicode(const char* s, std::wstring& out);

  // The mirror image: at most `length` wide characters of `s`; same results.
  static bool convertFromUnicodeToUtf8(const wchar_t* s, unsigned int length, std::string& out);
  static bool convertFromUnicodeToUtf8(const std::wstring& s, std::string& out);
  static bool convertFromUnicodeToUtf8(const wchar_t* s, std::string& out);
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_UNICODE_H
