// Collects a reply: the status of its final head and its body, which
// may not grow past the bound of http::kMaxReplyBytes.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <utility>

#include "platform/curl_handles.h"

namespace platform::http {

class EventRelay;

class ReplyReader {
 public:
  explicit ReplyReader(EventRelay* relay);

  bool Install(CURL* easy);

  // True once a final (non-1xx) head has ended.
  bool head_received() const { return head_received_; }
  std::uint32_t status_code() const { return head_received_ ? status_code_ : 0; }
  std::string TakeBody() { return std::move(body_); }

 private:
  static std::size_t OnHeader(char* data, std::size_t size, std::size_t count, void* self);
  static std::size_t OnBody(char* data, std::size_t size, std::size_t count, void* self);
  void TakeHeadLine(std::string_view line);

  EventRelay* relay_;
  bool started_ = false;
  bool head_received_ = false;
  std::uint32_t status_code_ = 0;
  std::uint32_t head_bytes_ = 0;
  std::string body_;
};

}  // namespace platform::http
