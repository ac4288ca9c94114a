// Conversions between the system's wide strings and narrow byte strings.
// Every code page of this platform is UTF-8: undecodable bytes become U+FFFD,
// wide characters that are not Unicode scalar values become U+FFFD as well.
#pragma once

#include <string>
#include <string_view>
#include <utility>

namespace platform {

std::wstring Utf8ToWide(std::string_view bytes);
std::string WideToUtf8(std::wstring_view wide);
// The bytes with every undecodable sequence replaced by U+FFFD, as Utf8ToWide
// reads them; bytes that are valid UTF-8 already are returned as they are.
std::string ValidUtf8(std::string bytes);

// The ANSI code page, the narrow text of the system's interfaces, is UTF-8 here.
inline std::string WideToAnsi(std::wstring_view wide) { return WideToUtf8(wide); }
// ANSI bytes as valid UTF-8 text.
inline std::string AnsiToUtf8(std::string bytes) { return ValidUtf8(std::move(bytes)); }

// Length of a zero-terminated wide string that may be null (0 for null).
inline std::wstring_view WideView(const wchar_t* s) {
  return s ? std::wstring_view(s) : std::wstring_view();
}

}  // namespace platform
