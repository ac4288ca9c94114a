// The outcome of one upload.
#pragma once

#include <cstdint>

#include "platform/win_error.h"

namespace transport {

struct UploadResult {
  platform::Status hr = platform::kOk;
  std::uint32_t httpStatus = 0xFFFFFFFFu;  // not yet known
};

}  // namespace transport
