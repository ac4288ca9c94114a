#include "platform/http_event_relay.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

namespace platform::http {
namespace {

std::string AddressText(const curl_sockaddr& address) {
  char text[INET6_ADDRSTRLEN] = {};
  const void* raw = nullptr;
  if (address.family == AF_INET) {
    raw = &reinterpret_cast<const sockaddr_in*>(&address.addr)->sin_addr;
  } else if (address.family == AF_INET6) {
    raw = &reinterpret_cast<const sockaddr_in6*>(&address.addr)->sin6_addr;
  }
  if (!raw || !inet_ntop(address.family, raw, text, sizeof text)) return {};
  return text;
}

EventRelay& Self(void* self) { return *static_cast<EventRelay*>(self); }

}  // namespace

EventRelay::EventRelay(ConnectionEvents* events, std::string host)
    : events_(events), host_(std::move(host)) {}

bool EventRelay::Install(CURL* easy) {
  easy_ = easy;
  if (!events_) return true;
  return curl_easy_setopt(easy, CURLOPT_RESOLVER_START_FUNCTION, &OnResolverStart) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_RESOLVER_START_DATA, this) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_OPENSOCKETFUNCTION, &OnOpenSocket) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_OPENSOCKETDATA, this) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_PREREQFUNCTION, &OnPreRequest) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_PREREQDATA, this) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_CLOSESOCKETFUNCTION, &OnCloseSocket) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_CLOSESOCKETDATA, this) == CURLE_OK;
}

void EventRelay::ResponseStarted() {
  if (!events_) return;
  events_->OnRequestSent(BytesSent());
  events_->OnReceivingResponse();
}

void EventRelay::ResponseHeadEnded(std::uint32_t head_bytes) {
  if (events_) events_->OnResponseReceived(head_bytes);
}

int EventRelay::OnResolverStart(void*, void*, void* self) {
  EventRelay& relay = Self(self);
  relay.events_->OnResolvingName(relay.host_);
  return 0;
}

// libcurl asks us to make each socket it connects, which is the moment an
// address has been chosen: the name is resolved and the connect begins.
curl_socket_t EventRelay::OnOpenSocket(void* self, curlsocktype, curl_sockaddr* address) {
  EventRelay& relay = Self(self);
  const std::string text = AddressText(*address);
  if (!relay.name_resolved_) {
    relay.name_resolved_ = true;
    relay.events_->OnNameResolved(text);
  }
  relay.events_->OnConnectingToServer(text);
  const int made = ::socket(address->family, address->socktype | SOCK_CLOEXEC, address->protocol);
  return made < 0 ? CURL_SOCKET_BAD : made;
}

int EventRelay::OnPreRequest(void* self, char* primary_ip, char*, int, int) {
  EventRelay& relay = Self(self);
  relay.events_->OnConnectedToServer(primary_ip ? primary_ip : "");
  relay.events_->OnSendingRequest();
  return CURL_PREREQFUNC_OK;
}

int EventRelay::OnCloseSocket(void* self, curl_socket_t socket) {
  EventRelay& relay = Self(self);
  relay.events_->OnClosingConnection();
  const int closed = ::close(socket);
  relay.events_->OnConnectionClosed();
  return closed;
}

std::uint32_t EventRelay::BytesSent() const {
  long head = 0;
  curl_off_t body = 0;
  curl_easy_getinfo(easy_, CURLINFO_REQUEST_SIZE, &head);
  curl_easy_getinfo(easy_, CURLINFO_SIZE_UPLOAD_T, &body);
  return static_cast<std::uint32_t>(head + body);
}

}  // namespace platform::http
