// The events of an upload, raised on the uploading thread. Listeners are never
// deleted through this interface.
#pragma once

#include <cstdint>

namespace transport {

class UploadProgress {
 public:
  // Connection notifications; the texts are only passed on, never read.
  virtual void OnResolvingName(const wchar_t* text) = 0;
  virtual void OnNameResolved(const wchar_t* text) = 0;
  virtual void OnConnectingToServer(const wchar_t* text) = 0;
  virtual void OnConnectedToServer(const wchar_t* text) = 0;
  virtual void OnSendingRequest() = 0;
  virtual void OnRequestSent(std::uint32_t bytes) = 0;
  virtual void OnReceivingResponse() = 0;
  virtual void OnResponseReceived(std::uint32_t bytes) = 0;
  virtual void OnClosingConnection() = 0;
  virtual void OnConnectionClosed() = 0;

  // File events. Times are in half-seconds, the speed in bytes per half-second.
  virtual void OnFileBegin(const wchar_t* path) = 0;
  virtual void OnFileProgress(const wchar_t* path, std::uint32_t fileSent, std::uint32_t fileSize,
                              std::uint32_t fileTimeLeft, std::uint32_t allSent,
                              std::uint32_t allSize, std::uint32_t allTimeLeft,
                              std::uint32_t speed) = 0;
  virtual void OnFileComplete(const wchar_t* path, std::int32_t result) = 0;
  // Polled while a file streams; must answer at once. True stops the upload.
  virtual bool IsCancelled() = 0;

 protected:
  ~UploadProgress() = default;
};

}  // namespace transport
