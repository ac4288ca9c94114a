#include "service/escape_form_value.h"

#include <gtest/gtest.h>

#include <string>

namespace {

struct FormValueCase {
  const char* name;
  std::wstring value;
  std::wstring escaped;
};

class FormValues : public ::testing::TestWithParam<FormValueCase> {};

TEST_P(FormValues, ReachTheServiceAsTyped) {
  EXPECT_EQ(EscapeFormValue(GetParam().value), GetParam().escaped);
}

INSTANTIATE_TEST_SUITE_P(
    Cases, FormValues,
    ::testing::Values(
        FormValueCase{"Empty", L"", L""},
        FormValueCase{"Space", L"Ann Lee", L"Ann%20Lee"},
        FormValueCase{"FieldSeparatorsKeepSixFields", L"a&pwd=b", L"a%26pwd%3db"},
        FormValueCase{"PercentIsEscapedToo", L"%41%", L"%2541%25"},
        FormValueCase{"NonAsciiAsLowerCaseUtf8", L"\u00E4", L"%c3%a4"},
        FormValueCase{"ControlsAndDelete", L"\n\x01\x7F", L"%0a%01%7f"},
        FormValueCase{"EveryUnsafePrintable", L" \"#$&+,;<=>?@[\\]^`{|}",
                      L"%20%22%23%24%26%2b%2c%3b%3c%3d%3e%3f%40%5b%5c%5d%5e%60%7b%7c%7d"},
        FormValueCase{"SafePrintablesStay", L"Az09!'()*-./:_~", L"Az09!'()*-./:_~"}),
    [](const auto& info) { return info.param.name; });

TEST(FormValueLength, ALongValueIsEscapedWhole) {
  const std::wstring value(3000, L' ');
  std::wstring expected;
  for (int i = 0; i < 3000; ++i) expected += L"%20";
  EXPECT_EQ(EscapeFormValue(value), expected);
}

}  // namespace
