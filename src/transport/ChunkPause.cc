#include "transport/ChunkPause.h"

#include <cstdlib>
#include <string>

#include "diag/trace.h"
#include "platform/text.h"

std::uint32_t ChunkPause::FromEnvironment() {
  const char* value = std::getenv(kVariable);
  if (value == nullptr) return kDefaultMs;
  if (const auto pause = Parse(value)) return *pause;
  // Wide first: a value that is not UTF-8 still shows, with replacement characters.
  const std::wstring shown = text::Utf8ToWide(value);
  TraceMessage(L"%S refused: \"%s\" is not a whole number of milliseconds from 0 to %u;"
               L" the pause stays %u ms",
               kVariable, shown.c_str(), kLongestMs, kDefaultMs);
  return kDefaultMs;
}

// Digits only: no sign, no spaces, no other base, and no overflow on the way.
std::optional<std::uint32_t> ChunkPause::Parse(const char* text) {
  if (*text == '\0') return std::nullopt;
  std::uint32_t ms = 0;
  for (const char* c = text; *c != '\0'; ++c) {
    if (*c < '0' || *c > '9') return std::nullopt;
    ms = ms * 10 + static_cast<std::uint32_t>(*c - '0');
    if (ms > kLongestMs) return std::nullopt;
  }
  return ms;
}
