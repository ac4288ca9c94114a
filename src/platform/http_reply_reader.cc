#include "platform/http_reply_reader.h"

#include <cstdlib>

#include "platform/ascii.h"
#include "platform/http.h"
#include "platform/http_event_relay.h"

namespace platform::http {
namespace {

// "HTTP/1.1 200 OK" gives 200.
std::uint32_t StatusOf(std::string_view status_line) {
  const std::size_t space = status_line.find(' ');
  if (space == std::string_view::npos) return 0;
  const std::string digits(platform::Trim(status_line.substr(space + 1, 4)));
  return static_cast<std::uint32_t>(std::strtoul(digits.c_str(), nullptr, 10));
}

ReplyReader& Self(void* self) { return *static_cast<ReplyReader*>(self); }

}  // namespace

ReplyReader::ReplyReader(EventRelay* relay) : relay_(relay) {}

bool ReplyReader::Install(CURL* easy) {
  const curl_off_t most = static_cast<curl_off_t>(kMaxReplyBytes);
  return curl_easy_setopt(easy, CURLOPT_HEADERFUNCTION, &OnHeader) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_HEADERDATA, this) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_WRITEFUNCTION, &OnBody) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_WRITEDATA, this) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_MAXFILESIZE_LARGE, most) == CURLE_OK;
}

std::size_t ReplyReader::OnHeader(char* data, std::size_t size, std::size_t count, void* self) {
  Self(self).TakeHeadLine(std::string_view(data, size * count));
  return size * count;
}

// Refusing bytes past the bound makes libcurl fail the transfer.
std::size_t ReplyReader::OnBody(char* data, std::size_t size, std::size_t count, void* self) {
  ReplyReader& reader = Self(self);
  const std::size_t bytes = size * count;
  if (reader.body_.size() + bytes > kMaxReplyBytes) return 0;
  reader.body_.append(data, bytes);
  return bytes;
}

void ReplyReader::TakeHeadLine(std::string_view line) {
  if (!started_) {
    started_ = true;
    if (relay_) relay_->ResponseStarted();
  }
  if (line.substr(0, 5) == "HTTP/") {  // a new head: an interim one is forgotten
    status_code_ = StatusOf(line);
    head_bytes_ = 0;
  }
  head_bytes_ += static_cast<std::uint32_t>(line.size());
  if (platform::Trim(line).empty()) {
    if (status_code_ >= 200 && !head_received_) {
      head_received_ = true;
      if (relay_) relay_->ResponseHeadEnded(head_bytes_);
    }
  }
}

}  // namespace platform::http
