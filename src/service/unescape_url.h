// Percent-decoding of the links handed to Python.
#pragma once

#include <string>
#include <string_view>

namespace service {

// Decodes "%XY" escapes, each into one UTF-16 unit read as an unsigned long in base
// 16 from the two characters after the "%" (so "%4G" gives U+0004 and consumes both
// characters). An escape that decodes to 0 ends the result. A "%" with fewer than two
// characters after it is not an escape: the rest is copied as it stands. The text ends
// at its end or at its first zero character; the result is never cut short.
std::wstring UnescapeUrl(std::wstring_view text);

}  // namespace service
