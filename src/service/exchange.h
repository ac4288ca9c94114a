// One exchange with the community service, written once for every operation:
// open a session, connect to the host, open the request, send it, read the
// reply, close everything in reverse order (the handles' destructors do, on
// every path). Internet errors end the exchange with no reply and no trace line.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace service {

enum class Transport {
  kHttp,  // port 80
  kTls,   // port 443; the certificate's issuer, name and dates are all verified
};

struct ServiceRequest {
  std::wstring host;  // a bare host name
  Transport transport = Transport::kHttp;
  std::string verb = "POST";
  std::wstring path;    // the object path with its query; values already escaped
  std::string agent;    // empty: no User-Agent of the session's own
  std::string headers;  // header lines separated by LF
  std::string body;
};

// The whole reply body, which the transport frames by its announced length
// (cut there), its chunks or the connection's end, whatever the HTTP status; nothing when an internet error
// ended the exchange or the reply could not be read (one announcing more than
// platform::http::kMaxReplyBytes included).
std::optional<std::string> RunExchange(const ServiceRequest& request);

// The reply bytes up to the first zero byte, as UTF-8 text for the XML reader
// (undecodable bytes become U+FFFD). The text stays narrow: a wide copy of a
// large reply would take four times its size.
std::string DecodeUtf8Reply(std::string bytes);
// The same for replies in the thread's ANSI code page.
std::string DecodeAnsiReply(std::string bytes);

// A query value made fit to stand in a request target: its UTF-8 bytes that may
// not (controls, space, DEL, non-ASCII) and "#", which would end the target, are
// percent-encoded; "&", "=", "%" and every other printable byte stay as they are.
std::wstring EscapePathValue(std::wstring_view value);

}  // namespace service
