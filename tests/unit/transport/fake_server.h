// The engine's surroundings for deterministic tests: a virtual clock that moves
// only when the engine sleeps or writes, and a connection that records every
// piece and answers as scripted.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "transport/UploadConnection.h"
#include "transport/UploadEnvironment.h"

namespace test_support {

struct FakeServer {
  std::uint32_t now = 1000;  // milliseconds
  // How long the write of a piece of that many bytes takes.
  std::function<std::uint32_t(std::size_t bytes)> writeMs = [](std::size_t) { return 0u; };
  std::function<void()> onStart = [] {};
  win::Status startStatus = win::kOk;
  std::uint32_t httpStatus = 200;
  std::string reply = "<uploadTemplate/>";

  std::vector<std::string> headers;
  bool started = false;
  std::uint32_t announced = 0;
  std::vector<std::string> writes;
  bool ended = false;
  std::vector<std::uint32_t> sleeps;  // milliseconds of each

  std::string Body() const {
    std::string body;
    for (const std::string& piece : writes) body += piece;
    return body;
  }
  // The boundary named by the content-type header.
  std::string Boundary() const {
    const std::string& line = headers.at(0);
    return line.substr(line.find("boundary=") + 9);
  }

  UploadEnvironment Environment();
};

class FakeConnection : public UploadConnection {
 public:
  explicit FakeConnection(FakeServer& server) : server_(server) {}

  win::Status AddHeader(const std::string& line) override {
    server_.headers.push_back(line);
    return win::kOk;
  }
  win::Status Start(std::uint32_t contentLength) override {
    server_.started = true;
    server_.announced = contentLength;
    server_.onStart();
    return server_.startStatus;
  }
  win::Status Write(std::string_view piece) override {
    server_.writes.emplace_back(piece);
    server_.now += server_.writeMs(piece.size());
    return win::kOk;
  }
  win::Status End() override {
    server_.ended = true;
    return win::kOk;
  }
  bool QueryStatusCode(std::uint32_t* code) override {
    *code = server_.httpStatus;
    return true;
  }
  std::string ReadReply() override { return server_.reply; }

 private:
  FakeServer& server_;
};

inline UploadEnvironment FakeServer::Environment() {
  return UploadEnvironment{
      [this] { return now; },
      [this](std::uint32_t ms) {
        sleeps.push_back(ms);
        now += ms;
      },
      [this](const UploadRequest&, UploadProgress*, std::unique_ptr<UploadConnection>* out) {
        *out = std::make_unique<FakeConnection>(*this);
        return win::kOk;
      }};
}

}  // namespace test_support
