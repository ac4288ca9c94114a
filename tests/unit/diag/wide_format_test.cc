#include "platform/wide_format.h"

#include <gtest/gtest.h>

#include <string>

namespace {

struct TranslationCase {
  const wchar_t* windows;
  const wchar_t* glibc;
};

class WindowsFormatTranslation : public ::testing::TestWithParam<TranslationCase> {};

TEST_P(WindowsFormatTranslation, KeepsTheWindowsMeaningOfTextConversions) {
  EXPECT_EQ(wide_format::TranslateFormat(GetParam().windows), GetParam().glibc);
}

INSTANTIATE_TEST_SUITE_P(
    Formats, WindowsFormatTranslation,
    ::testing::Values(TranslationCase{L"plain", L"plain"}, TranslationCase{L"%s", L"%ls"},
                      TranslationCase{L"%S", L"%s"}, TranslationCase{L"%c%C", L"%lc%c"},
                      TranslationCase{L"%hs|%ls|%ws|%hS|%lS", L"%s|%ls|%ls|%s|%ls"},
                      TranslationCase{L"%-10s|%*.*S", L"%-10ls|%*.*s"},
                      TranslationCase{L"100%% %s", L"100%% %ls"}, TranslationCase{L"%%s", L"%%s"},
                      TranslationCase{L"%d %5.2f %lu %x %p", L"%d %5.2f %lu %x %p"},
                      TranslationCase{L"cut %", L"cut %"}, TranslationCase{L"cut %-5", L"cut %-5"}));

std::wstring Format(std::size_t capacity, const wchar_t* format, ...) {
  std::wstring buffer(capacity, L'?');
  va_list args;
  va_start(args, format);
  const std::size_t length = wide_format::FormatCut(buffer.data(), capacity, format, args);
  va_end(args);
  EXPECT_EQ(buffer[length], L'\0');
  return buffer.substr(0, length);
}

TEST(WideFormatting, TakesWideAndUtf8NarrowArguments) {
  EXPECT_EQ(Format(64, L"%s|%S|%c|%C|%d", L"w\u00E4\U0001F600", "n\xC3\xA4", L'\u4E2D', 'x', -7),
            L"w\u00E4\U0001F600|n\u00E4|\u4E2D|x|-7");
}

TEST(WideFormatting, CutsWhatDoesNotFitAndAlwaysTerminates) {
  EXPECT_EQ(Format(6, L"%s", L"abcdefghij"), L"abcde");
  EXPECT_EQ(Format(6, L"abc%S", "defghij"), L"abcde");
  EXPECT_EQ(Format(6, L"ab"), L"ab");
  EXPECT_EQ(Format(1, L"ab"), L"");
}

}  // namespace
