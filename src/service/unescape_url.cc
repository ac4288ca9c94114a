#include "service/unescape_url.h"

#include <cwchar>

#include "platform/ascii.h"

namespace service {

namespace {

constexpr wchar_t kEscape = L'%';
constexpr std::size_t kEscapeDigits = 2;
constexpr int kHexBase = 16;
constexpr unsigned long kUtf16UnitMask = 0xFFFF;

// The two characters after "%", read as the C library reads an unsigned long in
// base 16: it stops at the first character that is not a hexadecimal digit.
wchar_t DecodeEscape(std::wstring_view digits) {
  const wchar_t terminated[kEscapeDigits + 1] = {digits[0], digits[1], L'\0'};
  return static_cast<wchar_t>(std::wcstoul(terminated, nullptr, kHexBase) & kUtf16UnitMask);
}

}  // namespace

std::wstring UnescapeUrl(std::wstring_view text) {
  text = platform::UpToNul(text);
  std::wstring result;
  result.reserve(text.size());
  std::size_t at = 0;
  while (at < text.size()) {
    const bool escape = text[at] == kEscape && text.size() - at > kEscapeDigits;
    if (!escape) {
      result += text[at++];
      continue;
    }
    const wchar_t decoded = DecodeEscape(text.substr(at + 1, kEscapeDigits));
    if (decoded == L'\0') break;
    result += decoded;
    at += 1 + kEscapeDigits;
  }
  return result;
}

}  // namespace service
