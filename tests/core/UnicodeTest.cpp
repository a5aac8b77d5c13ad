#include <clocale>
#include <string>

#include <gtest/gtest.h>

#include "lodestack/core/Unicode.h"

namespace lodestack::core {
namespace {

const char kGreeting[] = "gr\xc3\xbc\xc3\x9f" "e/\xe6\x97\xa5";  // "grüße/日" in UTF-8
const wchar_t kWideGreeting[] = L"gr\u00fc\u00dfe/\u65e5";

TEST(Unicode, PosixLocaleConvertsAsciiOnly) {
  std::wstring wide = L"kept";
  EXPECT_FALSE(Unicode::convertFromUtf8ToUnicode(kGreeting, wide));
  EXPECT_FALSE(Unicode::convertFromUtf8ToUnicode("", wide)) << "nothing to convert";
  EXPECT_EQ(wide, L"kept") << "a failed conversion leaves the output alone";
  std::string narrow = "kept";
  EXPECT_FALSE(Unicode::convertFromUnicodeToUtf8(kWideGreeting, narrow));
  EXPECT_EQ(narrow, "kept");

  EXPECT_TRUE(Unicode::convertFromUtf8ToUnicode(std::string("/tmp/a b"), wide));
  EXPECT_EQ(wide, L"/tmp/a b");
  EXPECT_TRUE(Unicode::convertFromUnicodeToUtf8(static_cast<const wchar_t*>(nullptr), 5, narrow));
  EXPECT_TRUE(narrow.empty()) << "null empties the output";
}

TEST(Unicode, Utf8LocaleRoundTripsWithinTheLength) {
  const std::string previous = std::setlocale(LC_CTYPE, nullptr);
  ASSERT_NE(std::setlocale(LC_CTYPE, "C.UTF-8"), nullptr);
  std::wstring wide;
  std::string narrow;
  EXPECT_TRUE(Unicode::convertFromUtf8ToUnicode(kGreeting, wide));
  EXPECT_EQ(wide, kWideGreeting);
  EXPECT_TRUE(Unicode::convertFromUnicodeToUtf8(wide, narrow));
  EXPECT_EQ(narrow, kGreeting);

  // The length bounds what is read: no terminator is needed after it.
  const char unterminated[3] = {'a', 'b', 'c'};
  EXPECT_TRUE(Unicode::convertFromUtf8ToUnicode(unterminated, 2, wide));
  EXPECT_EQ(wide, L"ab");
  EXPECT_TRUE(Unicode::convertFromUnicodeToUtf8(kWideGreeting, 3, narrow));
  EXPECT_EQ(narrow, "gr\xc3\xbc");
  EXPECT_FALSE(Unicode::convertFromUtf8ToUnicode(kGreeting, 3, wide)) << "half a character";
  EXPECT_FALSE(Unicode::convertFromUtf8ToUnicode("\xff\xfe", wide));
  std::setlocale(LC_CTYPE, previous.c_str());
}

}  // namespace
}  // namespace lodestack::core
