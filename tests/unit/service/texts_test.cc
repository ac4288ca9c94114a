// The texts the session sends and receives: the two escapes of values sent to
// the service, the decodings of replies and links, the token guarded against a
// racing reader.
// ctest timeout: 60
#include <gtest/gtest.h>

#include <atomic>
#include <thread>

#include "service/OBLoginData.h"
#include "service/escape_form_value.h"
#include "service/exchange.h"
#include "service/unescape_url.h"

namespace {

using namespace std::string_literals;

// One row per class of character: each escape keeps what its reader takes as it stands.
TEST(Escapes, QueryValuesKeepTheirSeparatorsAndFormValuesKeepTheSixFields) {
  const std::pair<std::wstring, std::wstring> query[] = {
      {L"5.0", L"5.0"}, {L"Home Edition", L"Home%20Edition"}, {L"a\r\nX-Evil: 1", L"a%0D%0AX-Evil:%201"},
      {L"\t\x7F", L"%09%7F"}, {L"\u00E4\U0001F600", L"%C3%A4%F0%9F%98%80"}, {L"a#b", L"a%23b"},
      {L"a&b=c", L"a&b=c"}, {L"%41\"<>[]{}|\\^`?/:@!$'()*+,;~", L"%41\"<>[]{}|\\^`?/:@!$'()*+,;~"}};
  for (const auto& [value, escaped] : query) EXPECT_EQ(service::EscapePathValue(value), escaped);
  const std::pair<std::wstring, std::wstring> form[] = {
      {L"", L""}, {L"a&pwd=b", L"a%26pwd%3db"}, {L"%41%", L"%2541%25"}, {L"\u00E4", L"%c3%a4"},
      {L"\n\x01\x7F", L"%0a%01%7f"},
      {L" \"#$&+,;<=>?@[\\]^`{|}", L"%20%22%23%24%26%2b%2c%3b%3c%3d%3e%3f%40%5b%5c%5d%5e%60%7b%7c%7d"},
      {L"Az09!'()*-./:_~", L"Az09!'()*-./:_~"}};
  for (const auto& [value, escaped] : form) EXPECT_EQ(service::EscapeFormValue(value), escaped);
}

TEST(Decoding, RepliesEndAtTheirFirstZeroAndLinksDecodeEachEscapeIntoOneCharacter) {
  EXPECT_EQ(service::DecodeUtf8Reply("<a>\xC3\xA4</a>\0<b/>"s), "<a>\xC3\xA4</a>");
  EXPECT_EQ(service::DecodeAnsiReply("x\0y"s), "x");
  EXPECT_EQ(service::DecodeUtf8Reply("bad \xFF \xEF\xBF\xBD \xE4<"),
            "bad \xEF\xBF\xBD \xEF\xBF\xBD \xEF\xBF\xBD<");
  const std::pair<std::wstring, std::wstring> links[] = {
      {L"a%20b%41%42", L"a bAB"}, {L"x%2fy%2Fz", L"x/y/z"}, {L"a%00b", L"a"}, {L"%4Gz", L"\u0004z"},
      {L"a%GGb", L"a"}, {L"%C3%A9", L"\u00C3\u00A9"}, {L"h/p?a=1&b=\u00E4", L"h/p?a=1&b=\u00E4"},
      {L"100%25%41", L"100%A"}, {L"", L""}, {std::wstring(5000, L'y'), std::wstring(5000, L'y')},
      // A "%" among the last two characters is no escape; the text ends at a zero.
      {L"ab%", L"ab%"}, {L"ab%4", L"ab%4"}, {L"ab%41", L"abA"},
      {L"a%4\0" L"1b"s, L"a%4"}, {L"ab\0%41"s, L"ab"}};
  for (const auto& [link, decoded] : links) EXPECT_EQ(service::UnescapeUrl(link), decoded);
  const wchar_t unterminated[] = {L'a', L'%', L'4'};  // a sanitizer sees an overread
  EXPECT_EQ(service::UnescapeUrl(std::wstring_view(unterminated, 3)), L"a%4");
}

TEST(SessionToken, AReaderRacingAWriterSeesTheOldOrTheNewTokenNeverAMixture) {
  service::OBLoginData session(L"5.0", L"", L"");
  const std::wstring tokens[] = {std::wstring(200, L'A'), std::wstring(7, L'b')};
  session.SetLoginTokenID(tokens[0]);
  std::atomic<bool> stop{false};
  std::atomic<long> torn{0};
  std::vector<std::thread> readers;
  for (int r = 0; r < 3; ++r) {
    readers.emplace_back([&] {
      while (!stop) {
        const std::wstring seen = session.GetToken();
        torn += seen != tokens[0] && seen != tokens[1];
      }
    });
  }
  for (int i = 0; i < 200000; ++i) session.SetLoginTokenID(tokens[i % 2]);
  stop = true;
  for (auto& reader : readers) reader.join();
  EXPECT_EQ(torn, 0);
}

}  // namespace
