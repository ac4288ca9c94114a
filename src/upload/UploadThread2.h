// The worker of one preset upload: runs the upload engine over a prepared form,
// keeps the server's reply and reports the completion to its listener.
#pragma once

#include <cstdint>
#include <string>

#include "platform/win_error.h"
#include "upload/Thread.h"

namespace transport {
class BackgroundUploadProgress;
class UploadRequest;
struct UploadResult;
}  // namespace transport

namespace upload {

class UploadThread2 : public Thread {
 public:
  // None of the three is owned; all must outlive the thread's run. The engine
  // pauses `chunkPauseMs` after each chunk.
  UploadThread2(transport::UploadRequest* request, transport::UploadResult* result, transport::BackgroundUploadProgress* listener,
                std::uint32_t chunkPauseMs);
  ~UploadThread2() override = default;

  // The server's reply body; read it only after Join has returned.
  std::string GetReply() const { return reply; }

 protected:
  std::uint32_t Run() override;

 private:
  platform::Status RunUpload();

  transport::UploadRequest* request;
  transport::UploadResult* result;
  transport::BackgroundUploadProgress* listener;
  std::uint32_t chunkPauseMs_;
  std::string reply;
};

}  // namespace upload
