// Percent-encoding shared by the query values of request paths and the values of
// the sign-in form.
#pragma once

#include <string>
#include <string_view>

#include "platform/ascii.h"

namespace service {

// The bytes as wide text, each byte for which `mustEscape` holds written as "%"
// and two hex digits taken from `digits`.
template <typename Predicate>
std::wstring PercentEncode(std::string_view bytes, Predicate mustEscape, const char* digits) {
  std::wstring encoded;
  encoded.reserve(bytes.size());
  for (const char c : bytes) {
    const auto byte = static_cast<unsigned char>(c);
    if (!mustEscape(byte)) {
      encoded += static_cast<wchar_t>(byte);
      continue;
    }
    encoded += L'%';
    encoded += static_cast<wchar_t>(digits[byte >> 4]);
    encoded += static_cast<wchar_t>(digits[byte & 0xF]);
  }
  return encoded;
}

}  // namespace service
