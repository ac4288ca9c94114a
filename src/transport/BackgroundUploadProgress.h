// The upload events together with those of the thread that runs the upload.
#pragma once

#include <cstdint>

#include "transport/UploadProgress.h"

namespace transport {

class BackgroundUploadProgress : public UploadProgress {
 public:
  // Never raised; listeners ignore it or pass it on.
  virtual void OnReservedEvent() = 0;
  // Raised once by the worker after the upload has returned.
  virtual void OnBackgroundUploadComplete(std::int32_t result) = 0;

 protected:
  ~BackgroundUploadProgress() = default;
};

}  // namespace transport
