// Text forms of native values shared by the pointer objects' slots.
#pragma once

#include <cstddef>
#include <string>

namespace runtime {

// An address printed with a printf conversion for uintptr_t ("%" PRIxPTR).
std::string FormatAddress(const char* format, const void* address);

// Each byte in memory order as two lower-case hexadecimal digits, high digit first.
std::string PackBytes(const void* data, size_t size);

}  // namespace runtime
