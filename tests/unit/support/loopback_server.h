// A small real HTTP server on 127.0.0.1 for tests: it accepts one connection per
// scripted reply, records the raw request bytes, and answers as scripted.
#pragma once

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <cstdlib>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace test_support {

struct ScriptedReply {
  std::vector<std::string> pieces;  // sent in order once the request has been read
  int pauseMs = 0;                  // between two pieces
  bool silent = false;              // read the request, then never answer
};

class LoopbackServer {
 public:
  static constexpr int kPollMs = 20;
  static constexpr auto kGiveUp = std::chrono::seconds(60);

  explicit LoopbackServer(std::vector<ScriptedReply> replies) : replies_(std::move(replies)) {
    listener_ = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t length = sizeof address;
    if (::bind(listener_, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 ||
        ::listen(listener_, 8) != 0 ||
        ::getsockname(listener_, reinterpret_cast<sockaddr*>(&address), &length) != 0) {
      std::abort();
    }
    port_ = ntohs(address.sin_port);
    thread_ = std::thread([this] { Serve(); });
  }

  ~LoopbackServer() {
    stop_ = true;
    thread_.join();
    ::close(listener_);
  }

  std::uint16_t port() const { return port_; }

  // The raw bytes of the i-th connection, once it has been served.
  std::string Request(std::size_t i) {
    std::unique_lock<std::mutex> lock(mutex_);
    done_.wait_for(lock, kGiveUp, [&] { return served_ > i; });
    return i < requests_.size() ? requests_[i] : std::string();
  }

  // A port on which nothing listens.
  static std::uint16_t ClosedPort() {
    LoopbackServer probe({});
    return probe.port();
  }

 private:
  void Serve() {
    for (const ScriptedReply& reply : replies_) {
      const int connection = Accept();
      if (connection < 0) return;
      std::string received;
      Answer(connection, reply, &received);
      ::close(connection);
      std::lock_guard<std::mutex> lock(mutex_);
      requests_.push_back(std::move(received));
      ++served_;
      done_.notify_all();
    }
  }

  int Accept() {
    while (!stop_) {
      if (WaitReadable(listener_)) return ::accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
    }
    return -1;
  }

  void Answer(int connection, const ScriptedReply& reply, std::string* received) {
    if (!ReadRequest(connection, received)) return;
    if (reply.silent) {
      while (!stop_) std::this_thread::sleep_for(std::chrono::milliseconds(kPollMs));
      return;
    }
    for (std::size_t i = 0; i < reply.pieces.size(); ++i) {
      if (i > 0) std::this_thread::sleep_for(std::chrono::milliseconds(reply.pauseMs));
      SendAll(connection, reply.pieces[i]);
    }
  }

  // Reads the head and the announced body; false when the client hangs up first.
  bool ReadRequest(int connection, std::string* received) {
    std::size_t head_end = std::string::npos;
    while ((head_end = received->find("\r\n\r\n")) == std::string::npos) {
      if (!ReadSome(connection, received)) return false;
    }
    const std::size_t body_start = head_end + 4;
    const std::size_t wanted = ContentLength(received->substr(0, body_start));
    while (received->size() - body_start < wanted) {
      if (!ReadSome(connection, received)) return false;
    }
    return true;
  }

  static std::size_t ContentLength(std::string head) {
    std::transform(head.begin(), head.end(), head.begin(), ::tolower);
    const std::size_t at = head.find("\r\ncontent-length:");
    return at == std::string::npos ? 0 : std::strtoul(head.c_str() + at + 17, nullptr, 10);
  }

  bool ReadSome(int connection, std::string* received) {
    const auto deadline = std::chrono::steady_clock::now() + kGiveUp;
    while (!stop_ && std::chrono::steady_clock::now() < deadline) {
      if (!WaitReadable(connection)) continue;
      const ssize_t got = ::recv(connection, buffer_.data(), buffer_.size(), 0);
      if (got <= 0) return false;
      received->append(buffer_.data(), static_cast<std::size_t>(got));
      return true;
    }
    return false;
  }

  static bool WaitReadable(int descriptor) {
    pollfd wanted{descriptor, POLLIN, 0};
    return ::poll(&wanted, 1, kPollMs) > 0;
  }

  static void SendAll(int connection, const std::string& bytes) {
    std::size_t sent = 0;
    while (sent < bytes.size()) {
      const ssize_t n = ::send(connection, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
      if (n <= 0) return;
      sent += static_cast<std::size_t>(n);
    }
  }

  std::vector<ScriptedReply> replies_;
  int listener_ = -1;
  std::uint16_t port_ = 0;
  std::atomic<bool> stop_{false};
  std::mutex mutex_;
  std::condition_variable done_;
  std::size_t served_ = 0;
  std::vector<std::string> requests_;
  std::vector<char> buffer_ = std::vector<char>(1 << 20);
  std::thread thread_;
};

// Requests to the loopback server must not go to a proxy named by the environment.
inline void BypassProxies() {
  for (const char* name : {"http_proxy", "HTTP_PROXY", "https_proxy", "HTTPS_PROXY", "all_proxy",
                           "ALL_PROXY"}) {
    ::unsetenv(name);
  }
}

// "HTTP/1.1 <status>" with a Content-Length and the body.
inline std::string HttpReply(int status, const std::string& body) {
  return "HTTP/1.1 " + std::to_string(status) + " Status\r\nContent-Length: " +
         std::to_string(body.size()) + "\r\nConnection: close\r\n\r\n" + body;
}

}  // namespace test_support
