// Uploads a 1 GiB file to a loopback server that discards what it reads, and
// checks that the engine's memory stays bounded by its largest chunk instead of
// growing with the file. Prints the peak growth and the throughput.
//
//   build/bench/bench_upload_memory [size in MiB]
#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>
#include <vector>

#include "transport/HttpUploadConnection.h"
#include "transport/UploadProgress.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"

namespace {

constexpr long kMiB = 1024 * 1024;
// The largest chunk (16 MiB), plus this program's own server, libcurl's buffers
// and the allocator's slack.
constexpr long kAllowedGrowthKiB = 24 * 1024;

// Reads one request to the end of its announced body and answers 200.
class DiscardServer {
 public:
  DiscardServer() {
    listener_ = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t length = sizeof address;
    if (::bind(listener_, reinterpret_cast<sockaddr*>(&address), length) != 0 ||
        ::listen(listener_, 1) != 0 ||
        ::getsockname(listener_, reinterpret_cast<sockaddr*>(&address), &length) != 0) {
      std::perror("listen");
      std::exit(2);
    }
    port_ = ntohs(address.sin_port);
    thread_ = std::thread([this] { Serve(); });
  }
  ~DiscardServer() {
    thread_.join();
    ::close(listener_);
  }
  std::uint16_t port() const { return port_; }

 private:
  void Serve() {
    const int connection = ::accept(listener_, nullptr, nullptr);
    std::vector<char> buffer(kMiB);
    std::string head;
    std::size_t body = 0;
    std::size_t wanted = 0;
    bool headDone = false;
    for (;;) {
      const ssize_t got = ::recv(connection, buffer.data(), buffer.size(), 0);
      if (got <= 0) break;
      if (headDone) {
        body += static_cast<std::size_t>(got);
      } else {
        head.append(buffer.data(), static_cast<std::size_t>(got));
        const std::size_t end = head.find("\r\n\r\n");
        if (end == std::string::npos) continue;
        headDone = true;
        wanted = std::strtoull(head.c_str() + head.find("Content-Length: ") + 16, nullptr, 10);
        body = head.size() - end - 4;
      }
      if (body >= wanted) break;
    }
    const std::string reply = "HTTP/1.1 200 OK\r\nContent-Length: 2\r\n\r\nok";
    ::send(connection, reply.data(), reply.size(), MSG_NOSIGNAL);
    ::close(connection);
  }

  int listener_ = -1;
  std::uint16_t port_ = 0;
  std::thread thread_;
};

class QuietListener : public transport::UploadProgress {
 public:
  void OnResolvingName(const wchar_t*) override {}
  void OnNameResolved(const wchar_t*) override {}
  void OnConnectingToServer(const wchar_t*) override {}
  void OnConnectedToServer(const wchar_t*) override {}
  void OnSendingRequest() override {}
  void OnRequestSent(std::uint32_t) override {}
  void OnReceivingResponse() override {}
  void OnResponseReceived(std::uint32_t) override {}
  void OnClosingConnection() override {}
  void OnConnectionClosed() override {}
  void OnFileBegin(const wchar_t*) override {}
  void OnFileProgress(const wchar_t*, std::uint32_t, std::uint32_t, std::uint32_t, std::uint32_t,
                      std::uint32_t, std::uint32_t, std::uint32_t) override {}
  void OnFileComplete(const wchar_t*, std::int32_t) override {}
  bool IsCancelled() override { return false; }
};

long PeakKiB() {
  rusage usage{};
  ::getrusage(RUSAGE_SELF, &usage);
  return usage.ru_maxrss;
}

}  // namespace

int main(int argc, char** argv) {
  const long mib = argc > 1 ? std::atol(argv[1]) : 1024;
  const std::filesystem::path path =
      std::filesystem::temp_directory_path() / ("upload_memory_" + std::to_string(::getpid()));
  std::ofstream(path).close();
  std::filesystem::resize_file(path, static_cast<std::uintmax_t>(mib) * kMiB);

  DiscardServer server;
  transport::UploadRequest request;
  request.host = "127.0.0.1";
  request.path = "/servlet/uploadTemplate";
  request.AddFile(L"PIPfile", std::wstring(path.wstring()).c_str());
  transport::UploadResult result;
  QuietListener listener;
  transport::UploadEnvironment environment = transport::UploadEnvironment::Platform();
  environment.openConnection = transport::HttpUploadConnection::Opener(server.port());

  const long before = PeakKiB();
  const auto start = std::chrono::steady_clock::now();
  transport::Uploader uploader(&listener, &request, &result, environment);
  const platform::Status status = uploader.Upload();
  const double seconds =
      std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  const long growth = PeakKiB() - before;
  std::filesystem::remove(path);

  std::printf("status 0x%08X, http %u, %ld MiB in %.2f s (%.0f MiB/s), peak memory +%ld KiB\n",
              static_cast<unsigned>(status), result.httpStatus, mib, seconds, mib / seconds,
              growth);
  const bool bounded = growth <= kAllowedGrowthKiB;
  std::printf("%s: memory %s bounded by the chunk size\n", bounded ? "PASS" : "FAIL",
              bounded ? "stays" : "is not");
  return status == platform::kOk && bounded ? 0 : 1;
}
