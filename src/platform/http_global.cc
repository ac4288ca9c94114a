#include "platform/http_global.h"

#include <curl/curl.h>

#include <mutex>

namespace platform::http {

void GlobalInit() {
  static std::once_flag once;
  std::call_once(once, [] { curl_global_init(CURL_GLOBAL_DEFAULT); });
}

}  // namespace platform::http
