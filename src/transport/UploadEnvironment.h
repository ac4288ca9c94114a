// What the upload engine takes from its surroundings: the clock, the pause and
// the connection. Production uses the platform's; tests inject their own.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>

#include "platform/win_error.h"
#include "transport/ChunkPause.h"
#include "transport/UploadConnection.h"

namespace transport {

class UploadProgress;
class UploadRequest;

// Opens the POST for the request's path on its host; connection notifications
// go to the listener.
using UploadConnectionOpener = std::function<platform::Status(
    const UploadRequest& request, UploadProgress* listener, std::unique_ptr<UploadConnection>* out)>;

struct UploadEnvironment {
  std::function<std::uint32_t()> tickCount;  // milliseconds, wrapping at 2^32
  std::function<void(std::uint32_t)> sleep;  // milliseconds
  UploadConnectionOpener openConnection;
  std::uint32_t pauseAfterChunkMs = ChunkPause::kDefaultMs;

  // The steady clock, a real sleep, HTTP on port 80 and the default pause.
  static UploadEnvironment Platform();
};

}  // namespace transport
