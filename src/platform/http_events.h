// The connection notifications of an HTTP request, raised on the thread that
// drives the request, inside the call that is running.
#pragma once

#include <cstdint>
#include <string>

namespace platform::http {

class ConnectionEvents {
 public:
  virtual void OnResolvingName(const std::string& host) = 0;
  virtual void OnNameResolved(const std::string& address) = 0;
  virtual void OnConnectingToServer(const std::string& address) = 0;
  virtual void OnConnectedToServer(const std::string& address) = 0;
  virtual void OnSendingRequest() = 0;
  // The request head and body have gone out; `bytes` counts both.
  virtual void OnRequestSent(std::uint32_t bytes) = 0;
  virtual void OnReceivingResponse() = 0;
  // The reply head has arrived; `bytes` counts its lines.
  virtual void OnResponseReceived(std::uint32_t bytes) = 0;
  virtual void OnClosingConnection() = 0;
  virtual void OnConnectionClosed() = 0;
  // Asked while the request runs, at least every kStopPollInterval; true abandons
  // it, and the call running fails with ERROR_INTERNET_OPERATION_CANCELLED.
  virtual bool IsCancelled() { return false; }

 protected:
  ~ConnectionEvents() = default;
};

}  // namespace platform::http
