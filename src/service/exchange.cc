#include "service/exchange.h"

#include <utility>

#include "platform/ascii.h"
#include "platform/http.h"
#include "platform/text.h"
#include "service/percent_encoding.h"

namespace service {
namespace {

constexpr unsigned char kFirstPrintable = 0x21;  // space and controls lie below
constexpr unsigned char kDelete = 0x7F;          // it and every non-ASCII byte lie above
constexpr char kFragmentMark = '#';

http::Scheme SchemeOf(Transport transport) {
  return transport == Transport::kTls ? http::Scheme::kHttps : http::Scheme::kHttp;
}

std::uint16_t PortOf(Transport transport) {
  return transport == Transport::kTls ? http::kHttpsPort : http::kHttpPort;
}

bool SendRequest(http::Request& request, const ServiceRequest& what) {
  if (!what.headers.empty() && win::Failed(request.AddHeaders(what.headers))) return false;
  return !win::Failed(request.Send(what.body));
}

bool MayNotStandInTarget(unsigned char byte) {
  return byte < kFirstPrintable || byte >= kDelete || byte == kFragmentMark;
}

}  // namespace

std::optional<std::string> RunExchange(const ServiceRequest& what) {
  const http::Session session(what.agent);
  const http::Connection connection(session, text::WideToUtf8(what.host),
                                    PortOf(what.transport), SchemeOf(what.transport));
  http::Request request(connection, what.verb, text::WideToUtf8(what.path));
  if (!SendRequest(request, what)) return std::nullopt;
  return request.TakeBody();
}

std::string DecodeUtf8Reply(std::string bytes) {
  bytes.resize(ascii::UpToNul(bytes).size());
  return text::ValidUtf8(std::move(bytes));
}

std::string DecodeAnsiReply(std::string bytes) {
  bytes.resize(ascii::UpToNul(bytes).size());
  return text::AnsiToUtf8(std::move(bytes));
}

std::wstring EscapePathValue(std::wstring_view value) {
  return PercentEncode(text::WideToUtf8(value), MayNotStandInTarget, ascii::kUpperHexDigits);
}

}  // namespace service
