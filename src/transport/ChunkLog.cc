#include "transport/ChunkLog.h"

#include <cstdlib>

namespace transport {

ChunkLog::ChunkLog() {
  const char* path = std::getenv(kPathVariable);
  if (path == nullptr || *path == '\0') return;
  file_.emplace(path, std::ios::app);
  if (!*file_) file_.reset();
}

void ChunkLog::Append(std::size_t bytes, Stamp begin) {
  const auto micros = std::chrono::duration_cast<std::chrono::microseconds>(
      std::chrono::steady_clock::now() - begin);
  *file_ << bytes << ' ' << micros.count() << '\n' << std::flush;
}

}  // namespace transport
