// Locale-free ASCII text rules: only the letters A-Z and a-z have a case, only
// space, tab, CR and LF are blanks, whatever the process locale says.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace platform {

inline constexpr char kUpperHexDigits[] = "0123456789ABCDEF";
inline constexpr char kLowerHexDigits[] = "0123456789abcdef";

// Equal when they differ at most in the case of ASCII letters.
bool EqualIgnoringCase(std::string_view a, std::string_view b);
bool EqualIgnoringCase(std::wstring_view a, std::wstring_view b);
bool StartsWithIgnoringCase(std::string_view text, std::string_view prefix);

// The text with A-Z made a-z and every other character as it was.
std::wstring Lowered(std::wstring_view text);

// The text without its leading and trailing blanks.
std::string_view Trim(std::string_view text);
std::wstring_view Trim(std::wstring_view text);

// 0-9, and A-Z or a-z besides.
bool IsDigit(wchar_t c);
bool IsLetterOrDigit(wchar_t c);

// The value of one hexadecimal digit of either case; nothing for any other character.
std::optional<unsigned> HexDigitValue(wchar_t c);

// The text up to its first NUL, the whole text when it holds none.
std::string_view UpToNul(std::string_view text);
std::wstring_view UpToNul(std::wstring_view text);

}  // namespace platform
