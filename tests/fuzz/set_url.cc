// Upload URLs: SetUrl refuses a URL or keeps a host and path that make a sound
// request line and that name the same place when read again.
#include "fuzz_support.h"
#include "platform/url.h"
#include "transport/UploadRequest.h"

namespace {

constexpr const char* kEarlierHost = "earlier.example";
constexpr const char* kEarlierPath = "/earlier";

bool FitsRequestLine(const std::string& component) {
  for (const char c : component) {
    const auto byte = static_cast<unsigned char>(c);
    if (byte <= ' ' || byte == 0x7F) return false;
  }
  return true;
}

void CheckAccepted(const UploadRequest& request) {
  fuzz::Require(!request.host.empty(), "an accepted URL names a host");
  fuzz::Require(!request.path.empty() && request.path[0] == '/', "an accepted path is absolute");
  fuzz::Require(request.host.size() < url::kComponentCapacity &&
                    request.path.size() < url::kComponentCapacity,
                "accepted components fit their buffers");
  fuzz::Require(FitsRequestLine(request.host) && FitsRequestLine(request.path),
                "an accepted host and path hold no space or control byte");
  fuzz::Require(request.host.find_first_of("/?#@") == std::string::npos,
                "an accepted host is only a host");

  UploadRequest again;
  const std::string rebuilt = "http://" + request.host + request.path;
  fuzz::Require(again.SetUrl(rebuilt.c_str()), "the host and path make an acceptable URL");
  fuzz::Require(again.host == request.host && again.path == request.path,
                "the host and path read again the same");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string url(fuzz::Bytes(data, size));  // read up to its first zero
  UploadRequest request;
  request.host = kEarlierHost;
  request.path = kEarlierPath;
  if (request.SetUrl(url.c_str())) {
    CheckAccepted(request);
  } else {
    fuzz::Require(request.host == kEarlierHost && request.path == kEarlierPath,
                  "a refused URL leaves host and path as they were");
  }
  return 0;
}
