#include "platform/debug_output.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <string>

#include "platform/text.h"

namespace platform {
namespace {

constexpr mode_t kNewFileMode = 0644;

// Closes the descriptor it was given, unless it is standard error.
class OutputFile {
 public:
  OutputFile() {
    const char* path = std::getenv(kDebugOutputPathVariable);
    if (path && *path) {
      fd_ = ::open(path, O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, kNewFileMode);
      owned_ = fd_ >= 0;
    }
  }
  ~OutputFile() {
    if (owned_) ::close(fd_);
  }
  OutputFile(const OutputFile&) = delete;
  OutputFile& operator=(const OutputFile&) = delete;

  int fd() const { return fd_; }

 private:
  int fd_ = STDERR_FILENO;
  bool owned_ = false;
};

}  // namespace

void WriteDebugOutput(std::wstring_view line) {
  const std::string bytes = platform::WideToUtf8(line);
  OutputFile out;
  if (out.fd() < 0) return;
  ssize_t written;
  do {
    written = ::write(out.fd(), bytes.data(), bytes.size());
  } while (written < 0 && errno == EINTR);
}

}  // namespace platform
