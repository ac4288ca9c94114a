#include "transport/ChunkPause.h"

#include "platform/ascii.h"

namespace transport {

// Digits only: no sign, no spaces, no other base, and no overflow on the way.
std::optional<std::uint32_t> ChunkPause::Parse(const char* text) {
  if (*text == '\0') return std::nullopt;
  std::uint32_t ms = 0;
  for (const char* c = text; *c != '\0'; ++c) {
    if (!platform::IsDigit(static_cast<unsigned char>(*c))) return std::nullopt;
    ms = ms * 10 + static_cast<std::uint32_t>(*c - '0');
    if (ms > kLongestMs) return std::nullopt;
  }
  return ms;
}

}  // namespace transport
