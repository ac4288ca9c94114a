// The HTTP request an upload writes its body into. The engine sees only this,
// so tests can stand in for the network.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "platform/win_error.h"

namespace transport {

class UploadConnection {
 public:
  virtual ~UploadConnection() = default;

  virtual platform::Status AddHeader(const std::string& line) = 0;
  // Sends the request head announcing a body of `contentLength` bytes.
  virtual platform::Status Start(std::uint32_t contentLength) = 0;
  // Returns once the connection has taken the whole piece.
  virtual platform::Status Write(std::string_view piece) = 0;
  // Ends the body; fails only when no reply came.
  virtual platform::Status End() = 0;
  // False when the reply carried no status.
  virtual bool QueryStatusCode(std::uint32_t* code) = 0;
  // The reply body, as much of it as could be read; asked for once.
  virtual std::string ReadReply() = 0;
};

}  // namespace transport
