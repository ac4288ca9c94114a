// Hands a request body to libcurl one piece at a time: the read callback copies
// from the piece on offer and pauses the upload when it is used up, so the
// writer's thread drives the transfer and no other thread is needed.
#pragma once

#include <cstdint>
#include <string_view>

#include "platform/curl_handles.h"

namespace platform::http {

class BodyFeeder {
 public:
  bool Install(CURL* easy);

  void Offer(std::string_view piece);
  // No more pieces: the next read ends the body.
  void Finish();
  // Lets a paused upload ask for bytes again.
  void Resume(CURL* easy);

  // Every byte of the piece on offer has been handed over.
  bool taken() const { return offset_ == piece_.size(); }
  // libcurl has sent what it had and asked for more while none was on offer.
  bool waiting() const { return paused_; }
  std::uint64_t handed_over() const { return handed_over_; }

 private:
  static std::size_t OnRead(char* buffer, std::size_t size, std::size_t count, void* self);

  std::string_view piece_;
  std::size_t offset_ = 0;
  std::uint64_t handed_over_ = 0;
  bool finished_ = false;
  bool paused_ = false;
};

}  // namespace platform::http
