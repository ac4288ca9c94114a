#include "upload/UploadThread2.h"

#include "transport/BackgroundUploadProgress.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"

UploadThread2::UploadThread2(UploadRequest* request, UploadResult* result,
                             BackgroundUploadProgress* listener, std::uint32_t chunkPauseMs)
    : request(request), result(result), listener(listener), chunkPauseMs(chunkPauseMs) {}

std::uint32_t UploadThread2::Run() {
  UploadEnvironment environment = UploadEnvironment::Platform();
  environment.pauseAfterChunkMs = chunkPauseMs;
  Uploader uploader(listener, request, result, std::move(environment));
  const win::Status status = uploader.Upload();
  result->hr = status;
  reply = uploader.reply;
  // Raised last, so that it reaches the UI thread after every other event.
  listener->OnBackgroundUploadComplete(status);
  return static_cast<std::uint32_t>(status);
}
