#include "service/unescape_url.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <string>

namespace {

struct UnescapeCase {
  const char* name;
  std::wstring text;
  std::wstring decoded;
};

class Unescaping : public ::testing::TestWithParam<UnescapeCase> {};

TEST_P(Unescaping, DecodesEachEscapeIntoOneCharacter) {
  EXPECT_EQ(UnescapeUrl(GetParam().text), GetParam().decoded);
}

INSTANTIATE_TEST_SUITE_P(
    Cases, Unescaping,
    ::testing::Values(
        UnescapeCase{"Space", L"a%20b", L"a b"},
        UnescapeCase{"Adjacent", L"%41%42", L"AB"},
        UnescapeCase{"LowerCaseDigits", L"x%2fy%2Fz", L"x/y/z"},
        UnescapeCase{"ZeroEndsTheResult", L"a%00b", L"a"},
        UnescapeCase{"StopsAtTheFirstNonDigit", L"%4Gz", L"\u0004z"},
        UnescapeCase{"NoDigitAtAllIsZero", L"a%GGb", L"a"},
        UnescapeCase{"Utf8BytesStaySeparate", L"%C3%A9", L"\u00C3\u00A9"},
        UnescapeCase{"OtherCharactersAreCopied", L"http://h/p?a=1&b=\u00E4", L"http://h/p?a=1&b=\u00E4"},
        UnescapeCase{"EscapedPercent", L"100%25%41", L"100%A"},
        UnescapeCase{"Empty", L"", L""},
        // A "%" among the last two characters is no escape: the rest is copied.
        UnescapeCase{"PercentLast", L"ab%", L"ab%"},
        UnescapeCase{"PercentAndOneDigitLast", L"ab%4", L"ab%4"},
        UnescapeCase{"OnlyAPercent", L"%", L"%"},
        UnescapeCase{"EscapeThenCutEscape", L"%41%4", L"A%4"},
        UnescapeCase{"EscapeEndingExactlyAtTheEnd", L"ab%41", L"abA"},
        // The text ends at its first zero character, even inside an escape.
        UnescapeCase{"ZeroCharacterEndsTheText", std::wstring(L"a%4\0" L"1b", 6), L"a%4"},
        UnescapeCase{"ZeroCharacterAfterText", std::wstring(L"ab\0%41", 6), L"ab"}),
    [](const ::testing::TestParamInfo<UnescapeCase>& info) { return info.param.name; });

TEST(UnescapingLongText, KeepsAResultOfAnyLengthWhole) {
  std::wstring text;
  std::wstring expected;
  for (int i = 0; i < 1000; ++i) {
    text += L"%41bcd";
    expected += L"Abcd";
  }
  ASSERT_EQ(text.size(), 6000u);
  EXPECT_EQ(UnescapeUrl(text), expected);
  const std::wstring plain(5000, L'x');
  EXPECT_EQ(UnescapeUrl(plain), plain);
}

TEST(UnescapingLongText, ReadsNothingPastAnEscapeCutAtTheEndOfALongText) {
  // Copied into a buffer of exactly this size, so a sanitizer build sees any overread.
  const std::wstring text = std::wstring(4998, L'y') + L"%4";
  std::unique_ptr<wchar_t[]> exact(new wchar_t[text.size()]);
  std::copy(text.begin(), text.end(), exact.get());
  EXPECT_EQ(UnescapeUrl(std::wstring_view(exact.get(), text.size())), text);
}

}  // namespace
