// Memory for a buffer of several megabytes, backed by huge pages where the
// system allows them: filling it then costs one page fault per 2 MiB instead of
// one per 4 KiB, which counts on virtual machines, where a fault is dear. Pages
// are only taken when first touched.
#pragma once

#include <cstddef>

namespace platform {

class LargeBuffer {
 public:
  // data() is null when the memory cannot be had.
  explicit LargeBuffer(std::size_t size);
  ~LargeBuffer();
  LargeBuffer(const LargeBuffer&) = delete;
  LargeBuffer& operator=(const LargeBuffer&) = delete;

  char* data() const { return data_; }

 private:
  char* data_ = nullptr;
  std::size_t mapped_ = 0;
};

}  // namespace platform
