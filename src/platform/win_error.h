// Status codes in the Windows HRESULT form the system reports, and the mapping of
// this platform's error numbers (errno, libcurl codes) to Windows error codes.
#pragma once

#include <cstdint>

namespace platform {

// A 32-bit HRESULT: 0 is success, negative values are failures.
using Status = std::int32_t;

constexpr Status kOk = 0;

// Windows error codes the system reports or compares against.
constexpr std::uint32_t kErrorFileNotFound = 2;
constexpr std::uint32_t kErrorPathNotFound = 3;
constexpr std::uint32_t kErrorTooManyOpenFiles = 4;
constexpr std::uint32_t kErrorAccessDenied = 5;
constexpr std::uint32_t kErrorNotEnoughMemory = 8;
constexpr std::uint32_t kErrorReadFault = 30;
constexpr std::uint32_t kErrorInvalidParameter = 87;
constexpr std::uint32_t kErrorBufferOverflow = 111;
constexpr std::uint32_t kErrorInvalidName = 123;
constexpr std::uint32_t kErrorFileTooLarge = 223;
constexpr std::uint32_t kErrorFileInvalid = 1006;
constexpr std::uint32_t kErrorInternetTimeout = 12002;
constexpr std::uint32_t kErrorInternetInternalError = 12004;
constexpr std::uint32_t kErrorInternetInvalidUrl = 12005;
constexpr std::uint32_t kErrorInternetUnrecognizedScheme = 12006;
constexpr std::uint32_t kErrorInternetNameNotResolved = 12007;
constexpr std::uint32_t kErrorInternetOperationCancelled = 12017;
constexpr std::uint32_t kErrorInternetCannotConnect = 12029;
constexpr std::uint32_t kErrorInternetConnectionAborted = 12030;
constexpr std::uint32_t kErrorInternetConnectionReset = 12031;
constexpr std::uint32_t kErrorInternetInvalidCa = 12045;
constexpr std::uint32_t kErrorHttpInvalidServerResponse = 12152;
constexpr std::uint32_t kErrorInternetSecurityChannelError = 12157;

// HRESULT_FROM_WIN32: a code above 0 becomes 0x8007xxxx with its low 16 bits;
// 0 or less is taken unchanged.
Status StatusFromWin32(std::uint32_t code);

inline bool Failed(Status status) { return status < 0; }

// The Windows error code nearest in meaning to an errno value.
std::uint32_t Win32FromErrno(int error_number);

// The Windows (WinInet) error code nearest in meaning to a libcurl CURLcode.
std::uint32_t Win32FromCurl(int curl_code);

}  // namespace platform
