// Reading a local file named by a wide path (stored as UTF-8 on disk), with
// failures reported as Windows status codes so they match the system's own.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "platform/win_error.h"

namespace platform {

// An open file for reading; closed by the destructor.
class File {
 public:
  File() = default;
  ~File();
  File(const File&) = delete;
  File& operator=(const File&) = delete;

  // Opens an existing regular file for reading, without ever blocking (open() of
  // a FIFO that has no writer would block for good). A directory is refused with
  // access denied, as the system's file API refuses it; a FIFO, device or socket
  // as a missing file, since only a regular file holds what is to be read.
  platform::Status Open(std::wstring_view path);
  platform::Status Size(std::uint64_t* size) const;
  // Reads up to `capacity` bytes; `*count` is 0 at the end of the file.
  platform::Status Read(char* buffer, std::size_t capacity, std::size_t* count);
  void Close();
  bool is_open() const { return descriptor_ >= 0; }

 private:
  int descriptor_ = -1;
};

// True when the path names a regular file (links followed); asking never blocks.
bool IsRegularFile(std::wstring_view path);

// The bytes of the regular file at the native path when it holds at most `limit`
// of them; empty when it is missing, unreadable, not a regular file or larger.
std::optional<std::string> ReadSmallFile(const std::string& nativePath, std::size_t limit);

}  // namespace platform
