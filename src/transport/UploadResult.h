// The outcome of one upload.
#pragma once

#include <cstdint>

#include "platform/win_error.h"

struct UploadResult {
  win::Status hr = win::kOk;
  std::uint32_t httpStatus = 0xFFFFFFFFu;  // not yet known
};
