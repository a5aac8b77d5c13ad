#include <clocale>
#include <string>

#include <gtest/gtest.h>

#include "lodestack/core/Unicode.h"

namespace lodestack::core {
namespace {

// Switches LC_CTYPE for one scope.
class CtypeLocale {
 public:
  explicit CtypeLocale(const char* name) : previous_(std::setlocale(LC_CTYPE, nullptr)) {
    ok_ = std::setlocale(LC_CTYPE, name) != nullptr;
  }
  ~CtypeLocale() { std::setlocale(LC_CTYPE, previous_.c_str()); }
  bool ok() const { return ok_; }

 private:
  std::string previous_;
  bool ok_;
};

const char kGreeting[] = "gr\xc3\xbc\xc3\x9f" "e/\xe6\x97\xa5";  // "grüße/日" in UTF-8
const wchar_t kWideGreeting[] = L"gr\u00fc\u00dfe/\u65e5";

TEST(Unicode, AsciiOnlyInThePosixLocale) {
  CtypeLocale posix("C");
  std::wstring wide = L"kept";
  EXPECT_FALSE(Unicode::convertFromUtf8ToUnicode(kGreeting, wide));
  EXPECT_EQ(wide, L"kept") << "a failed conversion leaves the output alone";
  std::string narrow = "kept";
  EXPECT_FALSE(Unicode::convertFromUnicodeToUtf8(kWideGreeting, narrow));
  EXPECT_EQ(narrow, "kept");

  EXPECT_TRUE(Unicode::convertFromUtf8ToUnicode(std::string("/tmp/a b"), wide));
  EXPECT_EQ(wide, L"/tmp/a b");
  EXPECT_TRUE(Unicode::convertFromUnicodeToUtf8(std::wstring(L"x.log"), narrow));
  EXPECT_EQ(narrow, "x.log");
}

TEST(Unicode, EmptyAndNullInputs) {
  std::wstring wide = L"kept";
  EXPECT_FALSE(Unicode::convertFromUtf8ToUnicode("", wide)) << "nothing to convert is a failure";
  EXPECT_EQ(wide, L"kept");
  EXPECT_TRUE(Unicode::convertFromUtf8ToUnicode(static_cast<const char*>(nullptr), 5, wide));
  EXPECT_TRUE(wide.empty()) << "null empties the output";
  std::string narrow = "kept";
  EXPECT_FALSE(Unicode::convertFromUnicodeToUtf8(std::wstring(), narrow));
  EXPECT_TRUE(Unicode::convertFromUnicodeToUtf8(static_cast<const wchar_t*>(nullptr), 5, narrow));
  EXPECT_TRUE(narrow.empty());
}

TEST(Unicode, Utf8RoundTripAndLengthBound) {
  CtypeLocale utf8("C.UTF-8");
  ASSERT_TRUE(utf8.ok());
  std::wstring wide;
  ASSERT_TRUE(Unicode::convertFromUtf8ToUnicode(kGreeting, wide));
  EXPECT_EQ(wide, kWideGreeting);
  std::string narrow;
  ASSERT_TRUE(Unicode::convertFromUnicodeToUtf8(wide, narrow));
  EXPECT_EQ(narrow, kGreeting);

  // The length bounds what is read: no terminator is needed after it.
  const char unterminated[3] = {'a', 'b', 'c'};
  ASSERT_TRUE(Unicode::convertFromUtf8ToUnicode(unterminated, 2, wide));
  EXPECT_EQ(wide, L"ab");
  ASSERT_TRUE(Unicode::convertFromUnicodeToUtf8(kWideGreeting, 3, narrow));
  EXPECT_EQ(narrow, "gr\xc3\xbc");
  // Cutting a multibyte character in half makes the rest unconvertible.
  EXPECT_FALSE(Unicode::convertFromUtf8ToUnicode(kGreeting, 3, wide));
  EXPECT_FALSE(Unicode::convertFromUtf8ToUnicode("\xff\xfe", wide));
}

}  // namespace
}  // namespace lodestack::core
