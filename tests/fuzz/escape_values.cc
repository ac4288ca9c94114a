// Values escaped for the sign-in form body and for the query of a request
// path, from any text Python may pass, valid Unicode or not.
#include "fuzz_support.h"
#include "service/escape_form_value.h"
#include "service/exchange.h"

namespace {

bool IsLowerHexDigit(wchar_t c) { return (c >= L'0' && c <= L'9') || (c >= L'a' && c <= L'f'); }

int HexValue(wchar_t c) { return c <= L'9' ? c - L'0' : c - L'a' + 10; }

// Printable ASCII a form reader takes as it stands: not a separator ("&", "="),
// not "+" (read as a space), not "%" (an escape), not "#" (the end of a target).
bool StandsInForm(wchar_t c) {
  return c > L' ' && c < 0x7F && std::wstring_view(L"&=+%#").find(c) == std::wstring_view::npos;
}

// Reads the form value back as the service does; false when something in it
// would not survive the form body.
bool DecodeForm(std::wstring_view escaped, std::string* bytes) {
  for (std::size_t at = 0; at < escaped.size(); ++at) {
    const wchar_t c = escaped[at];
    if (c == L'%') {
      if (escaped.size() - at < 3 || !IsLowerHexDigit(escaped[at + 1]) ||
          !IsLowerHexDigit(escaped[at + 2])) {
        return false;
      }
      *bytes += static_cast<char>(HexValue(escaped[at + 1]) * 16 + HexValue(escaped[at + 2]));
      at += 2;
    } else if (StandsInForm(c)) {
      *bytes += static_cast<char>(c);
    } else {
      return false;
    }
  }
  return true;
}

bool MayNotStandInTarget(unsigned char byte) { return byte <= ' ' || byte >= 0x7F || byte == '#'; }

void CheckFormValue(const std::wstring& value, const std::string& utf8) {
  std::string decoded;
  fuzz::Require(DecodeForm(EscapeFormValue(value), &decoded), "a form value holds only safe bytes");
  fuzz::Require(decoded == utf8, "a form value decodes to the UTF-8 of the text");
}

void CheckPathValue(const std::wstring& value, const std::string& utf8) {
  const std::wstring escaped = service::EscapePathValue(value);
  std::size_t escapes = 0;
  for (const char byte : utf8) escapes += MayNotStandInTarget(static_cast<unsigned char>(byte));
  fuzz::Require(escaped.size() == utf8.size() + 2 * escapes,
                "a query value escapes exactly the bytes a target may not hold");
  for (const wchar_t c : escaped) {
    fuzz::Require(c > L' ' && c < 0x7F && c != L'#', "a query value can stand in a request target");
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view bytes = fuzz::Bytes(data, size);
  for (const std::wstring& value : {fuzz::Utf8Text(bytes), fuzz::RawCharacters(bytes)}) {
    const std::string utf8 = text::WideToUtf8(value);
    CheckFormValue(value, utf8);
    CheckPathValue(value, utf8);
  }
  return 0;
}
