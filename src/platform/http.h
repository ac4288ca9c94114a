// Synchronous HTTP on the caller's thread: a session (agent and listener), a
// connection (host, port, plain or TLS) and a request whose body may be written
// piece by piece after its length was announced. Failures come back as status
// codes; nothing here throws.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "platform/http_events.h"
#include "platform/win_error.h"

namespace platform::http {

constexpr std::uint16_t kHttpPort = 80;
constexpr std::uint16_t kHttpsPort = 443;
// The most a reply body may hold; a reply announcing or sending more is refused.
constexpr std::size_t kMaxReplyBytes = 16u * 1024 * 1024;

enum class Scheme { kHttp, kHttps };

class Session {
 public:
  // `agent` is sent as the User-Agent; empty sends none of our own, so a header
  // block may name it. `events` (not owned) hears every request's notifications.
  explicit Session(std::string agent = {}, ConnectionEvents* events = nullptr);

  const std::string& agent() const { return agent_; }
  ConnectionEvents* events() const { return events_; }

 private:
  std::string agent_;
  ConnectionEvents* events_;
};

class Connection {
 public:
  // TLS verifies the server's certificate and name against the system's CAs.
  Connection(const Session& session, std::string host, std::uint16_t port, Scheme scheme);

  const Session& session() const { return session_; }
  const std::string& host() const { return host_; }
  // The URL of a path on this server; a path without a leading "/" gets one.
  std::string UrlOf(std::string_view path) const;

 private:
  const Session& session_;
  std::string host_;
  std::uint16_t port_;
  Scheme scheme_;
};

// One exchange. The verb is "GET" or "POST"; a GET has no body. Its handles are
// released by the destructor, which abandons an exchange that was not ended. A
// call that runs the transfer returns early when the session's events answer
// IsCancelled; the time limits are those of http_limits.h.
class Request {
 public:
  Request(const Connection& connection, std::string verb, std::string path);
  ~Request();
  Request(const Request&) = delete;
  Request& operator=(const Request&) = delete;

  // Header lines "Name: value", separated by LF or CRLF; call before Start.
  platform::Status AddHeaders(std::string_view block);
  // Connects and sends the head, announcing a body of `content_length` bytes.
  platform::Status Start(std::uint64_t content_length);
  // Returns once every byte of the piece has been taken for sending. Writing
  // past the announced length is refused.
  platform::Status Write(std::string_view piece);
  // Ends the body and reads the reply to its end, for at most kReplyLimit.
  platform::Status End();
  // Start, Write and End for a body known whole, within kExchangeLimit in all.
  platform::Status Send(std::string_view body);

  // 0 until a final reply head has arrived.
  std::uint32_t status_code() const;
  // The reply body read, moved out so that a large one is not copied; empty
  // afterwards.
  std::string TakeBody();

 private:
  class State;
  std::unique_ptr<State> state_;
};

}  // namespace platform::http
