// Where diagnostic lines go: appended, UTF-8, to the file named by
// PYUPLOADER_DEBUG_OUTPUT, else to standard error. Each line is one write, so
// lines from several threads or processes never interleave.
#pragma once

#include <string_view>

namespace platform {

inline constexpr char kDebugOutputPathVariable[] = "PYUPLOADER_DEBUG_OUTPUT";

// Writes `line` as it is (the caller ends it with a line feed). Failures are silent.
void WriteDebugOutput(std::wstring_view line);

}  // namespace platform
