#include "platform/http_body_feeder.h"

#include <algorithm>
#include <cstring>

namespace platform::http {

bool BodyFeeder::Install(CURL* easy) {
  return curl_easy_setopt(easy, CURLOPT_READFUNCTION, &OnRead) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_READDATA, this) == CURLE_OK;
}

void BodyFeeder::Offer(std::string_view piece) {
  piece_ = piece;
  offset_ = 0;
}

void BodyFeeder::Finish() {
  piece_ = {};
  offset_ = 0;
  finished_ = true;
}

void BodyFeeder::Resume(CURL* easy) {
  if (!paused_) return;
  paused_ = false;
  curl_easy_pause(easy, CURLPAUSE_CONT);
}

std::size_t BodyFeeder::OnRead(char* buffer, std::size_t size, std::size_t count, void* self) {
  BodyFeeder& feeder = *static_cast<BodyFeeder*>(self);
  const std::size_t left = feeder.piece_.size() - feeder.offset_;
  if (left == 0) {
    if (feeder.finished_) return 0;
    feeder.paused_ = true;
    return CURL_READFUNC_PAUSE;
  }
  const std::size_t bytes = std::min(left, size * count);
  std::memcpy(buffer, feeder.piece_.data() + feeder.offset_, bytes);
  feeder.offset_ += bytes;
  feeder.handed_over_ += bytes;
  return bytes;
}

}  // namespace platform::http
