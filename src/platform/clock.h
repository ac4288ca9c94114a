// Millisecond time as the system counts it: a 32-bit tick that wraps, and a sleep.
#pragma once

#include <cstdint>

namespace platform {

// Milliseconds of a steady clock, wrapping at 2^32 (about 49.7 days).
std::uint32_t TickCount();

void Sleep(std::uint32_t milliseconds);

}  // namespace platform
