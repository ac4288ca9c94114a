#include "service/escape_form_value.h"

#include "platform/text.h"
#include "service/percent_encoding.h"

namespace service {

namespace {

constexpr unsigned char kFirstPrintable = 0x20;
constexpr unsigned char kLastPrintable = 0x7E;
// "%" among them, so that a value holding "%41" reaches the service unchanged.
constexpr std::string_view kUnsafeCharacters = " \"#$%&+,;<=>?@[\\]^`{|}";

bool IsUnsafe(unsigned char byte) {
  return byte < kFirstPrintable || byte > kLastPrintable ||
         kUnsafeCharacters.find(static_cast<char>(byte)) != std::string_view::npos;
}

}  // namespace

std::wstring EscapeFormValue(std::wstring_view text) {
  return PercentEncode(platform::WideToUtf8(text), IsUnsafe, platform::kLowerHexDigits);
}

}  // namespace service
