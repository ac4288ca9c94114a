// The two escapes of values sent to the service, and the reply decodings.
#include <gtest/gtest.h>

#include <string>

#include "service/escape_form_value.h"
#include "service/exchange.h"

namespace {

using Escape = std::wstring (*)(std::wstring_view);

struct EscapeCase {
  const char* name;
  Escape escape;
  std::wstring value;
  std::wstring escaped;
};

class Escapes : public ::testing::TestWithParam<EscapeCase> {};

TEST_P(Escapes, SendValuesAsTyped) {
  EXPECT_EQ(GetParam().escape(GetParam().value), GetParam().escaped);
}

constexpr Escape kPath = &service::EscapePathValue;
constexpr Escape kForm = &EscapeFormValue;

INSTANTIATE_TEST_SUITE_P(
    Cases, Escapes,
    ::testing::Values(
        EscapeCase{"QueryPlain", kPath, L"5.0", L"5.0"},
        EscapeCase{"QueryEmpty", kPath, L"", L""},
        EscapeCase{"QuerySpace", kPath, L"Home Edition", L"Home%20Edition"},
        EscapeCase{"QueryLineBreaksCannotInjectAHeader", kPath, L"a\r\nX-Evil: 1",
                   L"a%0D%0AX-Evil:%201"},
        EscapeCase{"QueryTabAndDelete", kPath, L"\t\x7F", L"%09%7F"},
        EscapeCase{"QueryNonAsciiAsUtf8Bytes", kPath, L"\u00E4\u20AC", L"%C3%A4%E2%82%AC"},
        EscapeCase{"QueryOutsideTheBasicPlane", kPath, L"\U0001F600", L"%F0%9F%98%80"},
        EscapeCase{"QueryFragmentMarkWouldEndTheTarget", kPath, L"a#b", L"a%23b"},
        EscapeCase{"QuerySeparatorsStayAsSentToday", kPath, L"a&b=c", L"a&b=c"},
        EscapeCase{"QueryPercentAndOtherPrintablesStay", kPath, L"%41\"<>[]{}|\\^`?/:@!$'()*+,;~",
                   L"%41\"<>[]{}|\\^`?/:@!$'()*+,;~"},
        EscapeCase{"FormEmpty", kForm, L"", L""},
        EscapeCase{"FormSpace", kForm, L"Ann Lee", L"Ann%20Lee"},
        EscapeCase{"FormFieldSeparatorsKeepSixFields", kForm, L"a&pwd=b", L"a%26pwd%3db"},
        EscapeCase{"FormPercentIsEscapedToo", kForm, L"%41%", L"%2541%25"},
        EscapeCase{"FormNonAsciiAsLowerCaseUtf8", kForm, L"\u00E4", L"%c3%a4"},
        EscapeCase{"FormControlsAndDelete", kForm, L"\n\x01\x7F", L"%0a%01%7f"},
        EscapeCase{"FormEveryUnsafePrintable", kForm, L" \"#$&+,;<=>?@[\\]^`{|}",
                   L"%20%22%23%24%26%2b%2c%3b%3c%3d%3e%3f%40%5b%5c%5d%5e%60%7b%7c%7d"},
        EscapeCase{"FormSafePrintablesStay", kForm, L"Az09!'()*-./:_~", L"Az09!'()*-./:_~"}),
    [](const auto& info) { return info.param.name; });

TEST(FormValueLength, ALongValueIsEscapedWhole) {
  std::wstring expected;
  for (int i = 0; i < 3000; ++i) expected += L"%20";
  EXPECT_EQ(EscapeFormValue(std::wstring(3000, L' ')), expected);
}

TEST(ReplyDecoding, EndsAtTheFirstZeroByte) {
  using namespace std::string_literals;
  EXPECT_EQ(service::DecodeUtf8Reply("<a>\xC3\xA4</a>\0<b/>"s), "<a>\xC3\xA4</a>");
  EXPECT_EQ(service::DecodeAnsiReply("x\0y"s), "x");
  EXPECT_EQ(service::DecodeUtf8Reply("bad \xFF \xEF\xBF\xBD \xE4<"), "bad \xEF\xBF\xBD \xEF\xBF\xBD \xEF\xBF\xBD<");
}

}  // namespace
