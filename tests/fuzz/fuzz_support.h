// Shared by the fuzz targets: the input as the texts the code under test takes,
// and a check that stops the run (libFuzzer keeps the input) when a property fails.
#pragma once

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

// The bytes as UTF-8 (undecodable bytes become U+FFFD).
inline std::wstring Utf8Text(std::string_view bytes) { return text::Utf8ToWide(bytes); }

// The bytes as raw 32-bit characters, surrogates and values past U+10FFFF among them.
inline std::wstring RawCharacters(std::string_view bytes) {
  std::wstring characters(bytes.size() / sizeof(wchar_t), L'\0');
  std::memcpy(characters.data(), bytes.data(), characters.size() * sizeof(wchar_t));
  return characters;
}

inline void Require(bool holds, const char* property) {
  if (holds) return;
  std::fprintf(stderr, "property does not hold: %s\n", property);
  std::abort();
}

}  // namespace fuzz
