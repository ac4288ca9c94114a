#include "platform/file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "platform/text.h"

namespace file {
namespace {

win::Status StatusFromErrno(int error_number) {
  return win::StatusFromWin32(win::Win32FromErrno(error_number));
}

// A path with an embedded zero cannot name a file: it is refused, not cut short.
bool ToNativePath(std::wstring_view path, std::string* native) {
  if (path.find(L'\0') != std::wstring_view::npos) return false;
  *native = text::WideToUtf8(path);
  return true;
}

}  // namespace

File::~File() { Close(); }

win::Status File::Open(std::wstring_view path) {
  Close();
  std::string native;
  if (!ToNativePath(path, &native)) return win::StatusFromWin32(win::kErrorInvalidName);
  const int descriptor = ::open(native.c_str(), O_RDONLY | O_CLOEXEC);
  if (descriptor < 0) return StatusFromErrno(errno);
  struct stat info;
  int error_number = 0;
  if (::fstat(descriptor, &info) != 0) {
    error_number = errno;
  } else if (S_ISDIR(info.st_mode)) {
    error_number = EISDIR;
  }
  if (error_number != 0) {
    ::close(descriptor);
    return StatusFromErrno(error_number);
  }
  descriptor_ = descriptor;
  return win::kOk;
}

win::Status File::Size(std::uint64_t* size) const {
  struct stat info;
  if (::fstat(descriptor_, &info) != 0) return StatusFromErrno(errno);
  *size = static_cast<std::uint64_t>(info.st_size);
  return win::kOk;
}

win::Status File::Read(char* buffer, std::size_t capacity, std::size_t* count) {
  *count = 0;
  for (;;) {
    const ssize_t got = ::read(descriptor_, buffer, capacity);
    if (got >= 0) {
      *count = static_cast<std::size_t>(got);
      return win::kOk;
    }
    if (errno != EINTR) return StatusFromErrno(errno);
  }
}

void File::Close() {
  if (descriptor_ >= 0) ::close(descriptor_);
  descriptor_ = -1;
}

bool PathExists(std::wstring_view path) {
  std::string native;
  struct stat info;
  return ToNativePath(path, &native) && ::stat(native.c_str(), &info) == 0;
}

}  // namespace file
