// The upload's POST over the platform's HTTP, with its connection notifications
// handed to the upload listener.
#pragma once

#include <cstdint>
#include <string>

#include "platform/http.h"
#include "transport/UploadConnection.h"
#include "transport/UploadEnvironment.h"

namespace transport {

class HttpUploadConnection : public UploadConnection, private platform::http::ConnectionEvents {
 public:
  static constexpr const char* kAgent = "WinInetPost/0.0.4";

  // Connections to `port`: 80 in the product; tests point it at their own server.
  static UploadConnectionOpener Opener(std::uint16_t port);

  HttpUploadConnection(const std::string& host, std::uint16_t port, const std::string& path,
                       UploadProgress* listener);

  platform::Status AddHeader(const std::string& line) override;
  platform::Status Start(std::uint32_t contentLength) override;
  platform::Status Write(std::string_view piece) override;
  platform::Status End() override;
  bool QueryStatusCode(std::uint32_t* code) override;
  std::string ReadReply() override;

 private:
  void OnResolvingName(const std::string& host) override;
  void OnNameResolved(const std::string& address) override;
  void OnConnectingToServer(const std::string& address) override;
  void OnConnectedToServer(const std::string& address) override;
  void OnSendingRequest() override;
  void OnRequestSent(std::uint32_t bytes) override;
  void OnReceivingResponse() override;
  void OnResponseReceived(std::uint32_t bytes) override;
  void OnClosingConnection() override;
  void OnConnectionClosed() override;
  bool IsCancelled() override;

  // Closed in reverse order: request, connection, session.
  UploadProgress* listener_;
  platform::http::Session session_;
  platform::http::Connection connection_;
  platform::http::Request request_;
};

}  // namespace transport
