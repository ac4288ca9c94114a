#include "platform/url.h"

#include <cstdlib>

#include "platform/curl_handles.h"

namespace platform {
namespace {

// Reads one part; a part the URL lacks reads as empty text.
bool GetPart(CURLU* handle, CURLUPart part, unsigned flags, std::string* out) {
  char* raw = nullptr;
  const CURLUcode code = curl_url_get(handle, part, &raw, flags);
  const curl::Text owned(raw);
  if (code == CURLUE_OK) {
    *out = raw;
    return true;
  }
  out->clear();
  return code == CURLUE_NO_USER || code == CURLUE_NO_PASSWORD;
}

// The system's parser keeps percent-escapes in a host name as written; curl
// decodes them, so "a%2541" would become "a%41" and, read again, "aA". Such a
// host is refused rather than turned into another one. IPv6 literals keep
// their escaped zone ("[fe80::1%25eth0]").
bool HostHasEscape(std::string_view authority) {
  const std::size_t at = authority.rfind('@');
  const std::string_view host = at == std::string_view::npos ? authority : authority.substr(at + 1);
  return !host.empty() && host.front() != '[' && host.find('%') != std::string_view::npos;
}

bool Fits(const std::string& component) { return component.size() < kUrlComponentCapacity; }

bool AllFit(const UrlComponents& c) {
  return Fits(c.scheme) && Fits(c.host) && Fits(c.user) && Fits(c.password) && Fits(c.path) &&
         Fits(c.extra);
}

}  // namespace

bool SplitUrl(std::string_view text, UrlComponents* components) {
  if (text.find('\0') != std::string_view::npos) return false;
  // Only absolute URLs with an authority: "scheme://host...". libcurl would
  // read "http:///p" as the host "p"; the system's parser finds no host there.
  const std::size_t colon = text.find(':');
  if (colon == std::string_view::npos || text.substr(colon + 1, 2) != "//") return false;
  const std::size_t authority = colon + 3;
  if (authority >= text.size() || text[authority] == '/') return false;
  if (HostHasEscape(text.substr(authority, text.find_first_of("/?#", authority) - authority))) {
    return false;
  }
  const curl::Url handle(curl_url());
  if (!handle) return false;
  const std::string whole(text);
  // Paths go out as written: no dot-segment folding, no re-escaping.
  if (curl_url_set(handle.get(), CURLUPART_URL, whole.c_str(), CURLU_PATH_AS_IS) != CURLUE_OK) {
    return false;
  }
  UrlComponents parts;
  parts.scheme = std::string(text.substr(0, colon));
  std::string port;
  if (!GetPart(handle.get(), CURLUPART_HOST, 0, &parts.host) ||
      !GetPart(handle.get(), CURLUPART_USER, 0, &parts.user) ||
      !GetPart(handle.get(), CURLUPART_PASSWORD, 0, &parts.password) ||
      !GetPart(handle.get(), CURLUPART_PORT, CURLU_DEFAULT_PORT, &port) ||
      !GetPart(handle.get(), CURLUPART_PATH, 0, &parts.path)) {
    return false;
  }
  parts.port = static_cast<unsigned>(std::strtoul(port.c_str(), nullptr, 10));
  const std::size_t extra = text.find_first_of("?#");
  if (extra != std::string_view::npos) parts.extra = std::string(text.substr(extra));
  if (!AllFit(parts)) return false;
  *components = std::move(parts);
  return true;
}

}  // namespace platform
