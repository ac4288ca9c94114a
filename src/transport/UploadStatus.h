// Status codes of the upload transport's own.
#pragma once

#include "platform/win_error.h"

namespace transport {

// The listener's IsCancelled answered true: while a file streamed, or while the
// request ran (connecting, sending, awaiting the reply).
constexpr platform::Status UPLOAD_E_CANCELLED = static_cast<platform::Status>(0x80040301u);

}  // namespace transport
