// Links as the service may send them, decoded as every link handed to Python is.
#include <algorithm>
#include <vector>

#include "fuzz_support.h"
#include "service/unescape_url.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::wstring link = fuzz::Utf8Text(fuzz::Bytes(data, size));
  // A buffer of exactly the link's length, so that a read past its end is caught.
  const std::vector<wchar_t> exact(link.begin(), link.end());
  const std::wstring decoded = UnescapeUrl(std::wstring_view(exact.data(), exact.size()));

  const std::wstring_view read = std::wstring_view(link).substr(0, link.find(L'\0'));
  fuzz::Require(decoded.size() <= read.size(), "decoding never lengthens a link");
  fuzz::Require(decoded.find(L'\0') == std::wstring::npos, "a decoded link holds no zero");
  if (read.find(L'%') == std::wstring_view::npos) {
    fuzz::Require(decoded == read, "a link without escapes comes back as it is");
  }
  return 0;
}
