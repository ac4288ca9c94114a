// Owners of libcurl's handles, for the platform's own sources only: each handle
// has exactly one owner and is released by its destructor.
#pragma once

#include <curl/curl.h>

#include <memory>

namespace platform::curl {

struct EasyDeleter {
  void operator()(CURL* handle) const { curl_easy_cleanup(handle); }
};
struct MultiDeleter {
  void operator()(CURLM* handle) const { curl_multi_cleanup(handle); }
};
struct UrlDeleter {
  void operator()(CURLU* handle) const { curl_url_cleanup(handle); }
};
struct ListDeleter {
  void operator()(curl_slist* list) const { curl_slist_free_all(list); }
};
struct TextDeleter {
  void operator()(char* text) const { curl_free(text); }
};

using Easy = std::unique_ptr<CURL, EasyDeleter>;
using Multi = std::unique_ptr<CURLM, MultiDeleter>;
using Url = std::unique_ptr<CURLU, UrlDeleter>;
using List = std::unique_ptr<curl_slist, ListDeleter>;
using Text = std::unique_ptr<char, TextDeleter>;

// Appends a line to a header list; false when libcurl is out of memory.
inline bool Append(List& list, const char* line) {
  curl_slist* grown = curl_slist_append(list.get(), line);
  if (!grown) return false;
  list.release();
  list.reset(grown);
  return true;
}

}  // namespace platform::curl
