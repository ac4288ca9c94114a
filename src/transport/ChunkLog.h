// Per-chunk write times for the benchmarks. When PYUPLOADER_CHUNK_LOG names a
// file, every chunk the engine writes appends one line "bytes write_us" to it;
// otherwise each chunk costs one test and nothing else.
#pragma once

#include <chrono>
#include <cstddef>
#include <fstream>
#include <optional>

namespace transport {

class ChunkLog {
 public:
  static constexpr char kPathVariable[] = "PYUPLOADER_CHUNK_LOG";
  using Stamp = std::chrono::steady_clock::time_point;

  // Opens the file named by the variable, if any, for appending.
  ChunkLog();

  // The start of a write (a zero stamp when the log is off).
  Stamp Begin() const { return file_ ? std::chrono::steady_clock::now() : Stamp(); }
  // One line for a write of `bytes` that began at `begin`; flushed, so the line
  // is there as soon as the chunk is.
  void Note(std::size_t bytes, Stamp begin) {
    if (file_) Append(bytes, begin);
  }

 private:
  void Append(std::size_t bytes, Stamp begin);

  std::optional<std::ofstream> file_;
};

}  // namespace transport
