#include "platform/large_buffer.h"

#include <sys/mman.h>

#include <cstdint>

namespace platform {
namespace {

constexpr std::size_t kHugePage = 2 * 1024 * 1024;

std::size_t RoundUp(std::size_t value) { return (value + kHugePage - 1) / kHugePage * kHugePage; }

char* At(std::size_t address) { return reinterpret_cast<char*>(address); }

}  // namespace

// Huge pages need an aligned range: one huge page more is mapped, and what lies
// before and after the aligned range is given back at once.
LargeBuffer::LargeBuffer(std::size_t size) {
  const std::size_t length = RoundUp(size);
  const std::size_t over = length + kHugePage;
  void* mapped = ::mmap(nullptr, over, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  if (mapped == MAP_FAILED) return;
  const auto start = reinterpret_cast<std::uintptr_t>(mapped);
  const std::uintptr_t aligned = RoundUp(start);
  const std::size_t head = aligned - start;
  if (head != 0) ::munmap(At(start), head);
  if (over - head - length != 0) ::munmap(At(aligned + length), over - head - length);
  // Only advice: without huge pages the buffer works the same, more slowly.
  ::madvise(At(aligned), length, MADV_HUGEPAGE);
  data_ = At(aligned);
  mapped_ = length;
}

LargeBuffer::~LargeBuffer() {
  if (data_ != nullptr) ::munmap(data_, mapped_);
}

}  // namespace platform
