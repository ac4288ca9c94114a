#include "platform/ascii.h"

#include <curl/curl.h>

#include <algorithm>

namespace platform {
namespace {

wchar_t Lower(wchar_t c) { return c >= L'A' && c <= L'Z' ? c - L'A' + L'a' : c; }

template <typename Char>
std::basic_string_view<Char> TrimBlanks(std::basic_string_view<Char> text) {
  constexpr Char kBlanks[] = {' ', '\t', '\r', '\n', '\0'};
  const auto first = text.find_first_not_of(kBlanks);
  if (first == text.npos) return {};
  return text.substr(first, text.find_last_not_of(kBlanks) - first + 1);
}

template <typename Char>
std::basic_string_view<Char> BeforeNul(std::basic_string_view<Char> text) {
  return text.substr(0, text.find(Char(0)));
}

}  // namespace

// libcurl's comparison ends where both texts hold a NUL, so each stretch
// between NULs is compared on its own.
bool EqualIgnoringCase(std::string_view a, std::string_view b) {
  if (a.size() != b.size()) return false;
  // An empty view may have no data for libcurl to read.
  while (!a.empty()) {
    if (!curl_strnequal(a.data(), b.data(), a.size())) return false;
    const std::size_t nul = std::min(a.find('\0'), a.size() - 1);
    a.remove_prefix(nul + 1);
    b.remove_prefix(nul + 1);
  }
  return true;
}

bool EqualIgnoringCase(std::wstring_view a, std::wstring_view b) {
  return a.size() == b.size() &&
         std::equal(a.begin(), a.end(), b.begin(), [](wchar_t x, wchar_t y) { return Lower(x) == Lower(y); });
}

bool StartsWithIgnoringCase(std::string_view text, std::string_view prefix) {
  return text.size() >= prefix.size() && EqualIgnoringCase(text.substr(0, prefix.size()), prefix);
}

std::wstring Lowered(std::wstring_view text) {
  std::wstring lowered(text);
  for (wchar_t& c : lowered) c = Lower(c);
  return lowered;
}

std::string_view Trim(std::string_view text) { return TrimBlanks(text); }
std::wstring_view Trim(std::wstring_view text) { return TrimBlanks(text); }

bool IsDigit(wchar_t c) { return c >= L'0' && c <= L'9'; }

bool IsLetterOrDigit(wchar_t c) { return IsDigit(c) || (Lower(c) >= L'a' && Lower(c) <= L'z'); }

std::optional<unsigned> HexDigitValue(wchar_t c) {
  if (IsDigit(c)) return c - L'0';
  if (c >= L'a' && c <= L'f') return c - L'a' + 10;
  if (c >= L'A' && c <= L'F') return c - L'A' + 10;
  return std::nullopt;
}

std::string_view UpToNul(std::string_view text) { return BeforeNul(text); }
std::wstring_view UpToNul(std::wstring_view text) { return BeforeNul(text); }

}  // namespace platform
