#include "module/runtime/text_form.h"

#include <cstdint>
#include <cstdio>

namespace runtime {

std::string FormatAddress(const char* format, const void* address) {
  char text[32];  // 22 octal digits hold any 64-bit address
  std::snprintf(text, sizeof text, format, reinterpret_cast<uintptr_t>(address));
  return text;
}

std::string PackBytes(const void* data, size_t size) {
  static constexpr char kDigits[] = "0123456789abcdef";
  const auto* bytes = static_cast<const unsigned char*>(data);
  std::string packed;
  packed.reserve(2 * size);
  for (size_t i = 0; i < size; ++i) {
    packed += kDigits[bytes[i] >> 4];
    packed += kDigits[bytes[i] & 0xf];
  }
  return packed;
}

}  // namespace runtime
