// The readers of foreign text: XML replies, registry hive files, UTF-8 and the
// Windows meaning of format strings. One row per class of input.
#include <gtest/gtest.h>

#include <cstdarg>

#include "platform/ascii.h"
#include "platform/registry.h"
#include "platform/text.h"
#include "platform/wide_format.h"
#include "platform/xml.h"

namespace {

using namespace std::literals;
using Outcome = platform::xml::Lookup::Outcome;

TEST(Xml, APathFindsTheFirstMatchingNodeAndTheTextOfItAndItsDescendants) {
  const std::tuple<std::wstring, const char*, Outcome, std::wstring> cases[] = {
      {L"<info><a>1</a><a>2</a></info>", "info/a", Outcome::kFound, L"1"},
      {L"<INFO><a>1</a></INFO>", "info/a", Outcome::kAbsent, L""},  // case-sensitive
      {L"<a><b/><b><c>x</c></b></a>", "a/b/c", Outcome::kFound, L"x"},  // first in document order
      {L"<a><b>x<i>y<!--no-->z</i><![CDATA[<w>]]></b></a>", "a/b", Outcome::kFound, L"xyz<w>"},
      {L"<a>&lt;&amp;&quot;&#228;&#x4E2D;\U0001F600</a>", "a", Outcome::kFound, L"<&\"\u00E4\u4E2D\U0001F600"},
      {L"<!DOCTYPE a [<!ENTITY e \"boom\">]><a>&e;</a>", "a", Outcome::kFound, L"&e;"},  // not expanded
      {L"<info><\u540D>v</\u540D></info>", "info/\xE5\x90\x8D", Outcome::kFound, L"v"},
      {L"<a>x</a>\0<b/>"s, "a", Outcome::kFound, L"x"},  // the text ends at its terminator
      {L"<a>x\0</a>"s, "a", Outcome::kAbsent, L""},
      {L"<a><b>x</a>", "a/b", Outcome::kAbsent, L""},
      {L"<a>x</a>", "", Outcome::kFailed, L""},
      {L"<a><b>x</b></a>", "a//b", Outcome::kFailed, L""},
  };
  for (const auto& [text, path, outcome, found] : cases) {
    const platform::xml::Lookup lookup = platform::xml::Document(text).NodeText(path);
    EXPECT_EQ((std::pair{lookup.outcome, lookup.text}), (std::pair{outcome, found})) << path;
  }
  platform::xml::Document first(std::string("<a>x</a>"));  // short enough to live in a string object
  const platform::xml::Document moved(std::move(first));
  first = platform::xml::Document(std::string("<b>y</b>"));  // takes the first one's place
  EXPECT_EQ(moved.NodeText("a").text, L"x") << "a moved document reads its own text";
  // A node record takes 64 bytes: a quarter of the bound's count is read, the whole count is not.
  for (const auto& [count, read] : {std::pair{platform::xml::kMaxTreeBytes / 256, true},
                                    std::pair{platform::xml::kMaxTreeBytes / 64, false}}) {
    std::string text = "<a>";
    for (std::size_t i = 0; i < count; ++i) text += "<b/>";
    EXPECT_EQ(platform::xml::Document(text + "</a>").empty(), !read) << count;
  }
  EXPECT_TRUE(platform::xml::Document(L"<a><b></a>").Top().Children().empty());
}

const std::string kHeader = "Windows Registry Editor Version 5.00\r\n\r\n";
const std::string kSection = "[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\Lumivanta]\r\n";
constexpr wchar_t kSubkey[] = L"SOFTWARE\\Quillmark\\Lumivanta";

std::string Utf16LeWithMark(const std::string& ascii) {
  std::string out = "\xFF\xFE";
  for (const char c : ascii) out += std::string{c, '\0'};
  return out;
}

TEST(RegistryHive, TheSwitchIsReadAsAThirtyTwoBitNumberInEveryFormTheEditorWrites) {
  const std::pair<std::string, std::optional<std::uint32_t>> cases[] = {
      {kHeader + kSection + "\"DumpMsg\"=dword:00000001\r\n", 1},
      {kHeader + "[hkey_local_machine\\software\\QUILLMARK\\lumivanta]\n\"dumpmsg\"=DWORD:0000002A\n", 42},
      {kHeader + kSection + "\"DumpMsg\"=\"1\"\r\n", 0x31},  // UTF-16LE "1" and its terminator
      {kHeader + kSection + "\"DumpMsg\"=hex:01,02\r\n", 0x0201},  // zero-padded
      {kHeader + kSection + "\"DumpMsg\"=hex(4):05,\\\r\n  00,00,00\r\n", 5},
      {kHeader + kSection + "\"DumpMsg\"=dword:1\n\"DumpMsg\"=-\n", std::nullopt},
      {kHeader + kSection + "\"DumpMsg\"=dword:xyz\n", std::nullopt},
      {kHeader + "; x\n[HKEY_LOCAL_MACHINE\\SOFTWARE\\Other]\n\"DumpMsg\"=dword:7\n" + kSection + "; \"DumpMsg\"=dword:1\n",
       std::nullopt},
      {"REGEDIT4\n\n" + kSection + "\"DumpMsg\"=dword:00000003\n", 3},
      {"\xEF\xBB\xBF" + kHeader + kSection + "\"DumpMsg\"=dword:4\n", 4},
      {Utf16LeWithMark(kHeader + kSection + "\"DumpMsg\"=dword:00000009\r\n"), 9}};
  for (const auto& [file, number] : cases) {
    const auto key = platform::RegistryKey::OpenInHiveFile(file, kSubkey);
    ASSERT_TRUE(key.has_value()) << file;
    EXPECT_EQ(key->ReadNumber(L"DumpMsg"), number) << file;
  }
  for (const auto& [file, opens] : std::vector<std::pair<std::string, bool>>{
           {kHeader + "[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\Lumivanta\\Sub]\n", true},
           {kHeader + "[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark]\n", false},
           {kHeader + "[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\LumivantaX]\n", false},
           {kHeader + "[HKEY_CURRENT_USER\\SOFTWARE\\Quillmark\\Lumivanta]\n", false},
           {kHeader + "[-HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\Lumivanta]\n", false},
           {kSection + "\"DumpMsg\"=dword:1\n", false}, {"", false}}) {
    EXPECT_EQ(platform::RegistryKey::OpenInHiveFile(file, kSubkey).has_value(), opens) << file;
  }
}

TEST(Utf8, DecodesOrReplacesEachSequenceAndEncodesEveryPlane) {
  for (const auto& [bytes, wide] : std::vector<std::pair<std::string, std::wstring>>{
           {"a\xC3\xA4\xE4\xB8\xAD\xF0\x9F\x98\x80", L"a\u00E4\u4E2D\U0001F600"}, {"a\0b"s, L"a\0b"s}}) {
    EXPECT_EQ(platform::Utf8ToWide(bytes), wide);
    EXPECT_EQ(platform::WideToUtf8(wide), bytes);
  }
  EXPECT_EQ(platform::Utf8ToWide("\xFF\xC3"), L"\uFFFD\uFFFD");
  EXPECT_EQ(platform::WideToUtf8(std::wstring(1, static_cast<wchar_t>(0xD800))), "\xEF\xBF\xBD");
}

// Only A-Z and a-z have a case and only space, tab, CR and LF are blanks, in any
// locale; a NUL inside a name is compared like any other character.
TEST(Ascii, FoldsTheCaseOfAsciiLettersOnlyAndTrimsBlanksOnly) {
  for (const auto& [a, b, same] : std::vector<std::tuple<std::string, std::string, bool>>{
           {"Content-TYPE", "content-type", true}, {"", "", true}, {"a\0B"s, "A\0b"s, true},
           {"a\0x"s, "a\0y"s, false}, {"ab", "abc", false}, {"[", "{", false}, {"\xC4", "\xE4", false}}) {
    EXPECT_EQ(platform::EqualIgnoringCase(a, b), same) << a;
  }
  EXPECT_EQ(platform::Lowered(L"\u00C4BZ[@"), L"\u00C4bz[@");
  EXPECT_EQ(platform::Trim(" \t\r\na b\n"), "a b");
  EXPECT_EQ(platform::Trim(L"\v x\u00A0 "), L"\v x\u00A0");
  EXPECT_EQ(platform::UpToNul("ab\0c"sv), "ab"sv);
  EXPECT_EQ(platform::UpToNul(L"abc"sv), L"abc"sv);
  // Per character: its value as a hex digit or "-", then "+" for a letter or digit.
  std::wstring seen;
  for (const wchar_t c : L"09afAF/:@G`gZ{\u00E4"sv) {
    const auto hex = platform::HexDigitValue(c);
    seen += {hex ? L"0123456789abcdef"[*hex] : L'-', platform::IsLetterOrDigit(c) ? L'+' : L'-'};
  }
  EXPECT_EQ(seen, L"0+9+a+f+a+f+-------+---+-+----");
}

std::wstring Format(std::size_t capacity, const wchar_t* format, ...) {
  std::wstring buffer(capacity, L'?');
  va_list args;
  va_start(args, format);
  const std::size_t length = platform::FormatCut(buffer.data(), capacity, format, args);
  va_end(args);
  EXPECT_EQ(buffer[length], L'\0');
  return buffer.substr(0, length);
}

TEST(WideFormat, KeepsTheWindowsMeaningOfTextConversionsAndCutsWhatDoesNotFit) {
  EXPECT_EQ(platform::TranslateFormat(L"%s|%S|%c%C|%hs|%ws|%lS|%-10s|%*.*S|%%s %d %5.2f %lu %p|%-5"),
            L"%ls|%s|%lc%c|%s|%ls|%ls|%-10ls|%*.*s|%%s %d %5.2f %lu %p|%-5");
  EXPECT_EQ(Format(64, L"%s|%S|%c|%C|%d", L"w\u00E4\U0001F600", "n\xC3\xA4", L'\u4E2D', 'x', -7),
            L"w\u00E4\U0001F600|n\u00E4|\u4E2D|x|-7");
  EXPECT_EQ((std::vector{Format(6, L"%s", L"abcdefghij"), Format(6, L"abc%S", "defghij"),
                         Format(1, L"ab")}),
            (std::vector<std::wstring>{L"abcde", L"abcde", L""}));
}

}  // namespace
