#include "platform/file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "platform/text.h"

namespace platform {
namespace {

constexpr std::size_t kReadPieceBytes = 16 * 1024;

platform::Status StatusFromErrno(int error_number) {
  return platform::StatusFromWin32(platform::Win32FromErrno(error_number));
}

// A path with an embedded zero cannot name a file: it is refused, not cut short.
bool ToNativePath(std::wstring_view path, std::string* native) {
  if (path.find(L'\0') != std::wstring_view::npos) return false;
  *native = platform::WideToUtf8(path);
  return true;
}

// The errno a file that is not regular is refused with.
int NotRegularError(mode_t mode) { return S_ISDIR(mode) ? EISDIR : ENOENT; }

// A descriptor of the regular file, or -1 with the reason in *error_number.
int OpenRegular(const std::string& native, int* error_number) {
  const int descriptor = ::open(native.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
  if (descriptor < 0) {
    *error_number = errno;
    return -1;
  }
  struct stat info;
  if (::fstat(descriptor, &info) != 0) {
    *error_number = errno;
  } else if (!S_ISREG(info.st_mode)) {
    *error_number = NotRegularError(info.st_mode);
  } else {
    return descriptor;
  }
  ::close(descriptor);
  return -1;
}

ssize_t ReadRetrying(int descriptor, char* buffer, std::size_t capacity) {
  for (;;) {
    const ssize_t got = ::read(descriptor, buffer, capacity);
    if (got >= 0 || errno != EINTR) return got;
  }
}

}  // namespace

File::~File() { Close(); }

platform::Status File::Open(std::wstring_view path) {
  Close();
  std::string native;
  if (!ToNativePath(path, &native)) return platform::StatusFromWin32(platform::kErrorInvalidName);
  int error_number = 0;
  descriptor_ = OpenRegular(native, &error_number);
  return descriptor_ < 0 ? StatusFromErrno(error_number) : platform::kOk;
}

platform::Status File::Size(std::uint64_t* size) const {
  struct stat info;
  if (::fstat(descriptor_, &info) != 0) return StatusFromErrno(errno);
  *size = static_cast<std::uint64_t>(info.st_size);
  return platform::kOk;
}

platform::Status File::Read(char* buffer, std::size_t capacity, std::size_t* count) {
  const ssize_t got = ReadRetrying(descriptor_, buffer, capacity);
  *count = got > 0 ? static_cast<std::size_t>(got) : 0;
  return got < 0 ? StatusFromErrno(errno) : platform::kOk;
}

void File::Close() {
  if (descriptor_ >= 0) ::close(descriptor_);
  descriptor_ = -1;
}

bool IsRegularFile(std::wstring_view path) {
  std::string native;
  struct stat info;
  return ToNativePath(path, &native) && ::stat(native.c_str(), &info) == 0 && S_ISREG(info.st_mode);
}

std::optional<std::string> ReadSmallFile(const std::string& nativePath, std::size_t limit) {
  int error_number = 0;
  const int descriptor = OpenRegular(nativePath, &error_number);
  if (descriptor < 0) return std::nullopt;
  std::string bytes;
  char piece[kReadPieceBytes];
  ssize_t got = 0;
  while ((got = ReadRetrying(descriptor, piece, sizeof piece)) > 0 &&
         bytes.size() + static_cast<std::size_t>(got) <= limit) {
    bytes.append(piece, static_cast<std::size_t>(got));
  }
  ::close(descriptor);
  if (got != 0) return std::nullopt;  // a read failed, or the file is larger
  return bytes;
}

}  // namespace platform
