#pragma once

#include <string>
#include <string_view>

namespace service {

// A value made fit for an application/x-www-form-urlencoded body: its UTF-8
// bytes, with controls, non-ASCII bytes, "%" and the characters that a form or
// a URL gives a meaning to written as "%" and two lower-case hex digits. The
// result has whatever length the value needs.
std::wstring EscapeFormValue(std::wstring_view text);

}  // namespace service
