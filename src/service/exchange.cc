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

platform::http::Scheme SchemeOf(Transport transport) {
  return transport == Transport::kTls ? platform::http::Scheme::kHttps : platform::http::Scheme::kHttp;
}

std::uint16_t PortOf(Transport transport) {
  return transport == Transport::kTls ? platform::http::kHttpsPort : platform::http::kHttpPort;
}

bool SendRequest(platform::http::Request& request, const ServiceRequest& what) {
  if (!what.headers.empty() && platform::Failed(request.AddHeaders(what.headers))) return false;
  return !platform::Failed(request.Send(what.body));
}

bool MayNotStandInTarget(unsigned char byte) {
  return byte < kFirstPrintable || byte >= kDelete || byte == kFragmentMark;
}

}  // namespace

std::optional<std::string> RunExchange(const ServiceRequest& what) {
  const platform::http::Session session(what.agent);
  const platform::http::Connection connection(session, platform::WideToUtf8(what.host),
                                    PortOf(what.transport), SchemeOf(what.transport));
  platform::http::Request request(connection, what.verb, platform::WideToUtf8(what.path));
  if (!SendRequest(request, what)) return std::nullopt;
  return request.TakeBody();
}

std::string DecodeUtf8Reply(std::string bytes) {
  bytes.resize(platform::UpToNul(bytes).size());
  return platform::ValidUtf8(std::move(bytes));
}

std::string DecodeAnsiReply(std::string bytes) {
  bytes.resize(platform::UpToNul(bytes).size());
  return platform::AnsiToUtf8(std::move(bytes));
}

std::wstring EscapePathValue(std::wstring_view value) {
  return PercentEncode(platform::WideToUtf8(value), MayNotStandInTarget, platform::kUpperHexDigits);
}

}  // namespace service
