// Reading a local file named by a wide path (stored as UTF-8 on disk), with
// failures reported as Windows status codes so they match the system's own.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

#include "platform/win_error.h"

namespace file {

// An open file for reading; closed by the destructor.
class File {
 public:
  File() = default;
  ~File();
  File(const File&) = delete;
  File& operator=(const File&) = delete;

  // Opens an existing regular file for reading. A directory is refused with
  // access denied, as the system's file API refuses it.
  win::Status Open(std::wstring_view path);
  win::Status Size(std::uint64_t* size) const;
  // Reads up to `capacity` bytes; `*count` is 0 at the end of the file.
  win::Status Read(char* buffer, std::size_t capacity, std::size_t* count);
  void Close();
  bool is_open() const { return descriptor_ >= 0; }

 private:
  int descriptor_ = -1;
};

// True when something (a file or a folder) exists at the path.
bool PathExists(std::wstring_view path);

}  // namespace file
