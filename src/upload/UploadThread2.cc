#include "upload/UploadThread2.h"

#include <new>
#include <utility>

#include "transport/BackgroundUploadProgress.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"

namespace upload {

UploadThread2::UploadThread2(transport::UploadRequest* request, transport::UploadResult* result,
                             transport::BackgroundUploadProgress* listener, std::uint32_t chunkPauseMs)
    : request(request), result(result), listener(listener), chunkPauseMs_(chunkPauseMs) {}

std::uint32_t UploadThread2::Run() {
  const platform::Status status = RunUpload();
  // Raised last, so that it reaches the UI thread after every other event.
  listener->OnBackgroundUploadComplete(status);
  return static_cast<std::uint32_t>(status);
}

// Memory running out on this thread fails the upload like a chunk buffer that
// cannot be had, and the completion is still reported.
platform::Status UploadThread2::RunUpload() {
  try {
    transport::UploadEnvironment environment = transport::UploadEnvironment::Platform();
    environment.pauseAfterChunkMs = chunkPauseMs_;
    transport::Uploader uploader(listener, request, result, std::move(environment));
    const platform::Status status = uploader.Upload();
    reply = std::move(uploader.reply);
    return status;
  } catch (const std::bad_alloc&) {
    return platform::StatusFromWin32(platform::kErrorNotEnoughMemory);
  }
}

}  // namespace upload
