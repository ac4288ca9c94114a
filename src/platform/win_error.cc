#include "platform/win_error.h"

#include <curl/curl.h>

#include <cerrno>

namespace platform {

Status StatusFromWin32(std::uint32_t code) {
  if (static_cast<std::int32_t>(code) <= 0) return static_cast<Status>(code);
  return static_cast<Status>(0x80070000u | (code & 0xFFFFu));
}

std::uint32_t Win32FromErrno(int error_number) {
  switch (error_number) {
    case ENOENT: return kErrorFileNotFound;
    case ENOTDIR: return kErrorPathNotFound;
    case EMFILE:
    case ENFILE: return kErrorTooManyOpenFiles;
    case EACCES:
    case EPERM:
    case EISDIR:
    case EROFS: return kErrorAccessDenied;
    case ENOMEM: return kErrorNotEnoughMemory;
    case ENAMETOOLONG: return kErrorBufferOverflow;
    case EILSEQ: return kErrorInvalidName;
    case EFBIG:
    case EOVERFLOW: return kErrorFileTooLarge;
    case EIO: return kErrorReadFault;
    default: return kErrorInvalidParameter;
  }
}

std::uint32_t Win32FromCurl(int curl_code) {
  switch (static_cast<CURLcode>(curl_code)) {
    case CURLE_OK: return 0;
    case CURLE_UNSUPPORTED_PROTOCOL: return kErrorInternetUnrecognizedScheme;
    case CURLE_URL_MALFORMAT: return kErrorInternetInvalidUrl;
    case CURLE_COULDNT_RESOLVE_PROXY:
    case CURLE_COULDNT_RESOLVE_HOST: return kErrorInternetNameNotResolved;
    case CURLE_COULDNT_CONNECT: return kErrorInternetCannotConnect;
    case CURLE_OPERATION_TIMEDOUT: return kErrorInternetTimeout;
    case CURLE_SEND_ERROR:
    case CURLE_RECV_ERROR: return kErrorInternetConnectionReset;
    case CURLE_GOT_NOTHING:
    case CURLE_PARTIAL_FILE:
    case CURLE_READ_ERROR: return kErrorInternetConnectionAborted;
    case CURLE_PEER_FAILED_VERIFICATION: return kErrorInternetInvalidCa;
    case CURLE_SSL_CONNECT_ERROR:
    case CURLE_SSL_CACERT_BADFILE: return kErrorInternetSecurityChannelError;
    case CURLE_OUT_OF_MEMORY: return kErrorNotEnoughMemory;
    case CURLE_ABORTED_BY_CALLBACK: return kErrorInternetOperationCancelled;
    case CURLE_WRITE_ERROR:
    case CURLE_FILESIZE_EXCEEDED:
    case CURLE_WEIRD_SERVER_REPLY:
    case CURLE_BAD_CONTENT_ENCODING: return kErrorHttpInvalidServerResponse;
    default: return kErrorInternetInternalError;
  }
}

}  // namespace platform
