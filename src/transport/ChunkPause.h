// The pause after every chunk the engine writes, which keeps the machine
// responsive during a long upload. PYUPLOADER_CHUNK_PAUSE_MS sets it for users
// who would rather have the upload done.
#pragma once

#include <cstdint>
#include <optional>

namespace transport {

struct ChunkPause {
  static constexpr char kVariable[] = "PYUPLOADER_CHUNK_PAUSE_MS";
  static constexpr std::uint32_t kDefaultMs = 50;
  static constexpr std::uint32_t kLongestMs = 1000;

  // The milliseconds that `text` gives, or nothing when it is refused.
  static std::optional<std::uint32_t> Parse(const char* text);
};

}  // namespace transport
