// The Windows names that the system's own interfaces use, in one place.
#pragma once

#include <cstddef>
#include <cstdint>

typedef void* HINTERNET;  // an internet handle, a pointer type Python sees
typedef int BOOL;

inline constexpr std::size_t kMaxPath = 260;  // MAX_PATH, terminator included

inline constexpr std::uint32_t WM_APP = 0x8000;  // the first message number free for programs
