#include "platform/http.h"

namespace platform::http {

Session::Session(std::string agent, ConnectionEvents* events)
    : agent_(std::move(agent)), events_(events) {}

Connection::Connection(const Session& session, std::string host, std::uint16_t port,
                       Scheme scheme)
    : session_(session), host_(std::move(host)), port_(port), scheme_(scheme) {}

std::string Connection::UrlOf(std::string_view path) const {
  std::string url = scheme_ == Scheme::kHttps ? "https://" : "http://";
  url += host_;
  url += ':';
  url += std::to_string(port_);
  if (path.empty() || path.front() != '/') url += '/';
  url += path;
  return url;
}

}  // namespace platform::http
