// Shared by the fuzz targets: the input bytes as the texts the code under test
// takes, and a check that stops the run when a property does not hold.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>
#include <vector>

#include "platform/text.h"

namespace fuzz {

inline std::string_view Bytes(const std::uint8_t* data, std::size_t size) {
  return {reinterpret_cast<const char*>(data), size};
}

// The bytes read as UTF-8; undecodable bytes become U+FFFD.
inline std::wstring Utf8Text(std::string_view bytes) { return text::Utf8ToWide(bytes); }

// The bytes read as raw 32-bit characters, so that surrogates and values past
// U+10FFFF reach the code too; a last incomplete character is dropped.
inline std::wstring RawCharacters(std::string_view bytes) {
  std::wstring characters(bytes.size() / sizeof(wchar_t), L'\0');
  std::memcpy(characters.data(), bytes.data(), characters.size() * sizeof(wchar_t));
  return characters;
}

// The pieces between zero bytes (an input without one is a single piece).
inline std::vector<std::string> SplitAtZeros(std::string_view bytes) {
  std::vector<std::string> pieces;
  for (;;) {
    const std::size_t zero = bytes.find('\0');
    pieces.emplace_back(bytes.substr(0, zero));
    if (zero == std::string_view::npos) return pieces;
    bytes.remove_prefix(zero + 1);
  }
}

// A finding: libFuzzer saves the input that broke the property.
inline void Require(bool holds, const char* property) {
  if (holds) return;
  std::fprintf(stderr, "property does not hold: %s\n", property);
  std::abort();
}

}  // namespace fuzz
