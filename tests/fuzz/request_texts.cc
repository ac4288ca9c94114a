// Texts that go into requests, from any bytes Python may pass: values escaped
// for the sign-in form and for a request target's query, and upload URLs.
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "platform/text.h"
#include "platform/url.h"
#include "service/escape_form_value.h"
#include "service/exchange.h"
#include "transport/UploadRequest.h"

namespace {

void Require(bool holds, const char* property) {
  if (!holds) std::fprintf(stderr, "property does not hold: %s\n", property), std::abort();
}

// Printable ASCII a form reader takes as it stands: not a separator ("&", "="),
// not "+" (read as a space), not "%" (an escape), not "#" (the end of a target).
bool StandsInForm(wchar_t c) { return c > L' ' && c < 0x7F && std::wstring_view(L"&=+%#").find(c) == std::wstring_view::npos; }

int LowerHex(wchar_t c) { return c >= L'0' && c <= L'9' ? c - L'0' : c >= L'a' && c <= L'f' ? c - L'a' + 10 : -1; }

// The form value read back as the service does; "\x01" for what would not survive the body.
std::string DecodeForm(std::wstring_view escaped) {
  std::string bytes;
  for (std::size_t at = 0; at < escaped.size(); ++at) {
    if (escaped[at] != L'%') {
      bytes += StandsInForm(escaped[at]) ? static_cast<char>(escaped[at]) : '\x01';
    } else if (escaped.size() - at >= 3 && LowerHex(escaped[at + 1]) >= 0 && LowerHex(escaped[at + 2]) >= 0) {
      bytes += static_cast<char>(LowerHex(escaped[at + 1]) * 16 + LowerHex(escaped[at + 2]));
      at += 2;
    } else {
      bytes += '\x01';
    }
  }
  return bytes;
}

bool FitsRequestLine(const std::string& text) {
  for (const char c : text) {
    if (static_cast<unsigned char>(c) <= ' ' || c == 0x7F) return false;
  }
  return true;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view bytes(reinterpret_cast<const char*>(data), size);
  std::wstring raw(size / sizeof(wchar_t), L'\0');  // surrogates and values past U+10FFFF too
  std::memcpy(raw.data(), data, raw.size() * sizeof(wchar_t));
  for (const std::wstring& value : {platform::Utf8ToWide(bytes), raw}) {
    const std::string utf8 = platform::WideToUtf8(value);
    Require(DecodeForm(service::EscapeFormValue(value)) == utf8, "a form value decodes to the UTF-8 of the text");
    const std::wstring escaped = service::EscapePathValue(value);
    std::size_t unfit = 0;
    for (const char c : utf8) unfit += static_cast<unsigned char>(c) <= ' ' || static_cast<unsigned char>(c) >= 0x7F || c == '#';
    Require(escaped.size() == utf8.size() + 2 * unfit, "a query value escapes exactly the bytes a target may not hold");
    const std::string target = platform::WideToUtf8(escaped);
    Require(FitsRequestLine(target) && target.size() == escaped.size() && target.find('#') == std::string::npos,
                  "a query value can stand in a request target");
  }
  transport::UploadRequest request;
  request.host = "earlier.example";
  request.path = "/earlier";
  if (!request.SetUrl(std::string(bytes).c_str())) {
    Require(request.host == "earlier.example" && request.path == "/earlier", "a refused URL changes nothing");
    return 0;
  }
  Require(!request.host.empty() && request.host.find_first_of("/?#@") == std::string::npos &&
                    request.path[0] == '/' && FitsRequestLine(request.host) && FitsRequestLine(request.path) &&
                    request.host.size() < platform::kUrlComponentCapacity && request.path.size() < platform::kUrlComponentCapacity,
                "an accepted URL gives a host and an absolute path that fit a request line and their buffers");
  transport::UploadRequest again;
  Require(again.SetUrl(("http://" + request.host + request.path).c_str()) && again.host == request.host &&
                    again.path == request.path,
                "the host and path read again the same");
  return 0;
}
