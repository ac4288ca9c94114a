#include "service/exchange.h"

#include <gtest/gtest.h>

#include <string>

namespace {

struct PathValueCase {
  const char* name;
  std::wstring value;
  std::wstring escaped;
};

class PathValues : public ::testing::TestWithParam<PathValueCase> {};

TEST_P(PathValues, KeepOnlyWhatMayStandInARequestTarget) {
  EXPECT_EQ(service::EscapePathValue(GetParam().value), GetParam().escaped);
}

INSTANTIATE_TEST_SUITE_P(
    Cases, PathValues,
    ::testing::Values(
        PathValueCase{"Plain", L"5.0", L"5.0"},
        PathValueCase{"Empty", L"", L""},
        PathValueCase{"Space", L"Home Edition", L"Home%20Edition"},
        PathValueCase{"LineBreaksCannotInjectAHeader", L"a\r\nX-Evil: 1",
                      L"a%0D%0AX-Evil:%201"},
        PathValueCase{"TabAndDelete", L"\t\x7F", L"%09%7F"},
        PathValueCase{"NonAsciiAsUtf8Bytes", L"\u00E4\u20AC", L"%C3%A4%E2%82%AC"},
        PathValueCase{"OutsideTheBasicPlane", L"\U0001F600", L"%F0%9F%98%80"},
        PathValueCase{"FragmentMarkWouldEndTheTarget", L"a#b", L"a%23b"},
        PathValueCase{"SeparatorsStayAsSentToday", L"a&b=c", L"a&b=c"},
        PathValueCase{"PercentAndOtherPrintablesStay", L"%41\"<>[]{}|\\^`?/:@!$'()*+,;~",
                      L"%41\"<>[]{}|\\^`?/:@!$'()*+,;~"}),
    [](const auto& info) { return info.param.name; });

TEST(ReplyDecoding, EndsAtTheFirstZeroByte) {
  using namespace std::string_literals;
  EXPECT_EQ(service::DecodeUtf8Reply("<a>\xC3\xA4</a>\0<b/>"s), L"<a>\u00E4</a>");
  EXPECT_EQ(service::DecodeAnsiReply("x\0y"s), L"x");
  EXPECT_EQ(service::DecodeUtf8Reply("bad \xFF"), L"bad \uFFFD");
}

}  // namespace
