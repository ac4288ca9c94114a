// Wide-string formatting with the Windows conventions that the system's format
// strings are written for: in a wide format "%s" and "%c" take wide arguments and
// "%S" and "%C" narrow ones; "h" forces narrow and "l" or "w" wide. glibc reads
// these the other way round, so formats are translated before formatting. Narrow
// arguments are decoded as UTF-8, the code page of this platform.
#pragma once

#include <cstdarg>
#include <cstddef>
#include <string>

namespace platform {

// The glibc format that means what the Windows-convention `format` means.
std::wstring TranslateFormat(const wchar_t* format);

// Formats into `buffer`, writing at most capacity - 1 characters and a terminating
// zero; a longer text is cut there. Returns the number of characters written. A
// narrow argument that is not UTF-8 ends the text where it stands.
std::size_t FormatCut(wchar_t* buffer, std::size_t capacity, const wchar_t* format, std::va_list args);

}  // namespace platform
