#include "platform/text.h"

#include <gtest/gtest.h>

namespace {

struct Utf8Case {
  std::string bytes;
  std::wstring wide;
};

class Utf8Decoding : public ::testing::TestWithParam<Utf8Case> {};

TEST_P(Utf8Decoding, DecodesOrReplacesEachSequence) {
  EXPECT_EQ(text::Utf8ToWide(GetParam().bytes), GetParam().wide);
}

INSTANTIATE_TEST_SUITE_P(
    Cases, Utf8Decoding,
    ::testing::Values(Utf8Case{"", L""}, Utf8Case{"abc", L"abc"},
                      Utf8Case{"\xC3\xA4", L"\u00E4"}, Utf8Case{"\xE4\xB8\xAD", L"\u4E2D"},
                      Utf8Case{"\xF0\x9F\x98\x80", L"\U0001F600"},
                      Utf8Case{std::string("a\0b", 3), std::wstring(L"a\0b", 3)}));

TEST(Utf8Encoding, RoundTripsEveryPlaneAndReplacesSurrogates) {
  const std::wstring wide = L"a\u00E4\u4E2D\U0001F600";
  EXPECT_EQ(text::WideToUtf8(wide), "a\xC3\xA4\xE4\xB8\xAD\xF0\x9F\x98\x80");
  EXPECT_EQ(text::Utf8ToWide(text::WideToUtf8(wide)), wide);
  EXPECT_EQ(text::WideToUtf8(std::wstring(1, static_cast<wchar_t>(0xD800))), "\xEF\xBF\xBD");
}

}  // namespace
