// Conversions between the system's wide strings and narrow byte strings.
// Every code page of this platform is UTF-8: undecodable bytes become U+FFFD,
// wide characters that are not Unicode scalar values become U+FFFD as well.
#pragma once

#include <string>
#include <string_view>

namespace text {

std::wstring Utf8ToWide(std::string_view bytes);
std::string WideToUtf8(std::wstring_view wide);
// The bytes with every undecodable sequence replaced by U+FFFD, as Utf8ToWide
// reads them; bytes that are valid UTF-8 already are returned as they are.
std::string ValidUtf8(std::string bytes);

// Length of a zero-terminated wide string that may be null (0 for null).
inline std::wstring_view WideView(const wchar_t* s) {
  return s ? std::wstring_view(s) : std::wstring_view();
}

}  // namespace text
