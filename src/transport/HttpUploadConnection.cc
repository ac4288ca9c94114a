#include "transport/HttpUploadConnection.h"

#include "platform/text.h"
#include "transport/UploadProgress.h"
#include "transport/UploadRequest.h"
#include "transport/UploadStatus.h"

namespace transport {

namespace {

// A call abandoned at the listener's request ends the upload as cancelled.
platform::Status CancelledOr(platform::Status status) {
  const bool cancelled = status == platform::StatusFromWin32(platform::kErrorInternetOperationCancelled);
  return cancelled ? UPLOAD_E_CANCELLED : status;
}

}  // namespace

UploadConnectionOpener HttpUploadConnection::Opener(std::uint16_t port) {
  return [port](const UploadRequest& request, UploadProgress* listener,
                std::unique_ptr<UploadConnection>* out) {
    *out = std::make_unique<HttpUploadConnection>(request.host, port, request.path, listener);
    return platform::kOk;
  };
}

HttpUploadConnection::HttpUploadConnection(const std::string& host, std::uint16_t port,
                                           const std::string& path, UploadProgress* listener)
    : listener_(listener),
      session_(kAgent, this),
      connection_(session_, host, port, platform::http::Scheme::kHttp),
      request_(connection_, "POST", path) {}

platform::Status HttpUploadConnection::AddHeader(const std::string& line) {
  return request_.AddHeaders(line);
}

platform::Status HttpUploadConnection::Start(std::uint32_t contentLength) {
  return CancelledOr(request_.Start(contentLength));
}

platform::Status HttpUploadConnection::Write(std::string_view piece) {
  return CancelledOr(request_.Write(piece));
}

// A reply whose head arrived has ended the request, even when its body could
// not be read whole.
platform::Status HttpUploadConnection::End() {
  const platform::Status ended = CancelledOr(request_.End());
  return request_.status_code() != 0 ? platform::kOk : ended;
}

bool HttpUploadConnection::QueryStatusCode(std::uint32_t* code) {
  *code = request_.status_code();
  return *code != 0;
}

std::string HttpUploadConnection::ReadReply() { return request_.TakeBody(); }

void HttpUploadConnection::OnResolvingName(const std::string& host) {
  listener_->OnResolvingName(platform::Utf8ToWide(host).c_str());
}

void HttpUploadConnection::OnNameResolved(const std::string& address) {
  listener_->OnNameResolved(platform::Utf8ToWide(address).c_str());
}

void HttpUploadConnection::OnConnectingToServer(const std::string& address) {
  listener_->OnConnectingToServer(platform::Utf8ToWide(address).c_str());
}

void HttpUploadConnection::OnConnectedToServer(const std::string& address) {
  listener_->OnConnectedToServer(platform::Utf8ToWide(address).c_str());
}

void HttpUploadConnection::OnSendingRequest() { listener_->OnSendingRequest(); }
void HttpUploadConnection::OnRequestSent(std::uint32_t bytes) { listener_->OnRequestSent(bytes); }
void HttpUploadConnection::OnReceivingResponse() { listener_->OnReceivingResponse(); }
void HttpUploadConnection::OnResponseReceived(std::uint32_t bytes) {
  listener_->OnResponseReceived(bytes);
}
void HttpUploadConnection::OnClosingConnection() { listener_->OnClosingConnection(); }
void HttpUploadConnection::OnConnectionClosed() { listener_->OnConnectionClosed(); }
bool HttpUploadConnection::IsCancelled() { return listener_->IsCancelled(); }

}  // namespace transport
