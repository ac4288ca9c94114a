// Turns libcurl's callbacks into the connection notifications of a request:
// resolver start, socket open, pre-request, reply head and socket close.
#pragma once

#include <cstdint>
#include <string>

#include "platform/curl_handles.h"
#include "platform/http_events.h"

namespace platform::http {

class EventRelay {
 public:
  EventRelay(ConnectionEvents* events, std::string host);

  // Registers the callbacks on the transfer; nothing when there is no listener.
  bool Install(CURL* easy);
  // Called by the reply reader at the first line of the reply.
  void ResponseStarted();
  // Called by the reply reader when the final reply head has ended.
  void ResponseHeadEnded(std::uint32_t head_bytes);

 private:
  static int OnResolverStart(void* resolver_state, void* reserved, void* self);
  static curl_socket_t OnOpenSocket(void* self, curlsocktype purpose, curl_sockaddr* address);
  static int OnPreRequest(void* self, char* primary_ip, char* local_ip, int primary_port,
                          int local_port);
  static int OnCloseSocket(void* self, curl_socket_t socket);

  std::uint32_t BytesSent() const;

  ConnectionEvents* events_;
  std::string host_;
  CURL* easy_ = nullptr;
  bool name_resolved_ = false;
};

}  // namespace platform::http
