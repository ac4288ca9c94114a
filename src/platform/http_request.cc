#include <algorithm>
#include <string>

#include "platform/ascii.h"
#include "platform/http.h"
#include "platform/http_body_feeder.h"
#include "platform/http_driver.h"
#include "platform/http_event_relay.h"
#include "platform/http_limits.h"
#include "platform/http_reply_reader.h"

namespace platform::http {
namespace {

constexpr std::string_view kPost = "POST";
// libcurl's upload buffer: its default for a small body; for a large one the
// most it allows, so that the body is handed over and sent in fewer rounds
// (about a third less CPU for 1 GiB than with the default).
constexpr std::uint64_t kSmallestUploadBuffer = 64 * 1024;
constexpr std::uint64_t kLargestUploadBuffer = 2 * 1024 * 1024;

platform::Status Fail(std::uint32_t code) { return platform::StatusFromWin32(code); }

std::string_view NameOf(std::string_view line) { return line.substr(0, line.find(':')); }

long UploadBufferSize(std::uint64_t content_length) {
  return static_cast<long>(
      std::clamp(content_length, kSmallestUploadBuffer, kLargestUploadBuffer));
}

bool IsContentType(std::string_view line) {
  return platform::EqualIgnoringCase(NameOf(line), "content-type");
}

}  // namespace

// Declared in this order so that the transfer is released before the reader,
// feeder and relay its callbacks point at.
class Request::State {
 public:
  State(const Connection& connection, std::string verb, std::string path)
      : verb_(std::move(verb)),
        url_(connection.UrlOf(path)),
        agent_(connection.session().agent()),
        events_(connection.session().events()),
        relay_(events_, connection.host()),
        reader_(&relay_) {}

  platform::Status AddHeaders(std::string_view block);
  platform::Status Start(std::uint64_t content_length);
  platform::Status Write(std::string_view piece);
  platform::Status End();
  void LimitTo(std::chrono::seconds seconds) { driver_.LimitTo(seconds); }

  const ReplyReader& reader() const { return reader_; }
  ReplyReader& reader() { return reader_; }

 private:
  bool is_post() const { return verb_ == kPost; }
  bool Configure(std::uint64_t content_length);
  bool AddHeaderLine(const std::string& line);
  // Runs the transfer until `until` holds, it ends, or the listener cancels it.
  void Run(const std::function<bool()>& until);
  bool CancelRequested() const { return events_ && events_->IsCancelled(); }
  // What a transfer that stopped early reports.
  platform::Status Stopped() const;

  std::string verb_;
  std::string url_;
  std::string agent_;
  ConnectionEvents* events_;  // not owned; may be null
  EventRelay relay_;
  ReplyReader reader_;
  BodyFeeder feeder_;
  curl::List headers_;
  bool names_content_type_ = false;
  bool started_ = false;
  std::uint64_t announced_ = 0;
  Driver driver_;
};

platform::Status Request::State::AddHeaders(std::string_view block) {
  if (started_) return Fail(platform::kErrorInvalidParameter);
  while (!block.empty()) {
    const std::size_t end = block.find('\n');
    std::string line(block.substr(0, end));
    block = end == std::string_view::npos ? std::string_view() : block.substr(end + 1);
    if (!line.empty() && line.back() == '\r') line.pop_back();
    if (line.empty()) continue;
    if (!AddHeaderLine(line)) return Fail(platform::kErrorNotEnoughMemory);
    names_content_type_ = names_content_type_ || IsContentType(line);
  }
  return platform::kOk;
}

platform::Status Request::State::Start(std::uint64_t content_length) {
  if (started_ || (!is_post() && content_length != 0)) return Fail(platform::kErrorInvalidParameter);
  started_ = true;
  announced_ = content_length;
  if (!driver_.ok() || !Configure(content_length)) return Fail(platform::kErrorNotEnoughMemory);
  const platform::Status begun = driver_.Begin();
  if (platform::Failed(begun) || content_length == 0) return begun;
  // Run until libcurl has connected, sent the head and asks for the body.
  Run([this] { return feeder_.waiting(); });
  if (driver_.finished()) return driver_.result();
  return feeder_.waiting() ? platform::kOk : Stopped();
}

platform::Status Request::State::Write(std::string_view piece) {
  if (!started_ || !is_post() || feeder_.handed_over() + piece.size() > announced_) {
    return Fail(platform::kErrorInvalidParameter);
  }
  if (piece.empty()) return platform::kOk;
  feeder_.Offer(piece);
  feeder_.Resume(driver_.easy());
  Run([this] {
    return feeder_.taken() && (feeder_.waiting() || feeder_.handed_over() == announced_);
  });
  return feeder_.taken() ? platform::kOk : Stopped();
}

platform::Status Request::State::End() {
  if (!started_) {
    const platform::Status started = Start(0);
    if (platform::Failed(started)) return started;
  }
  feeder_.Finish();
  feeder_.Resume(driver_.easy());
  driver_.LimitTo(kReplyLimit);
  Run([] { return false; });
  return driver_.finished() ? driver_.result() : Stopped();
}

bool Request::State::Configure(std::uint64_t content_length) {
  CURL* easy = driver_.easy();
  bool ok = driver_.SetCommonOptions(url_, agent_) && relay_.Install(easy) &&
            reader_.Install(easy);
  // libcurl's own defaults that the system never sends.
  ok = ok && AddHeaderLine("Expect:") && AddHeaderLine("Accept:");
  if (is_post()) {
    ok = ok && feeder_.Install(easy) &&
         curl_easy_setopt(easy, CURLOPT_POST, 1L) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_POSTFIELDSIZE_LARGE,
                          static_cast<curl_off_t>(content_length)) == CURLE_OK &&
         curl_easy_setopt(easy, CURLOPT_UPLOAD_BUFFERSIZE, UploadBufferSize(content_length)) ==
             CURLE_OK;
    if (!names_content_type_) ok = ok && AddHeaderLine("Content-Type:");
  } else {
    ok = ok && curl_easy_setopt(easy, CURLOPT_HTTPGET, 1L) == CURLE_OK;
  }
  return ok && curl_easy_setopt(easy, CURLOPT_HTTPHEADER, headers_.get()) == CURLE_OK;
}

bool Request::State::AddHeaderLine(const std::string& line) {
  return curl::Append(headers_, line.c_str());
}

void Request::State::Run(const std::function<bool()>& until) {
  driver_.Run(until, [this] { return CancelRequested(); });
}

platform::Status Request::State::Stopped() const {
  if (driver_.finished() && platform::Failed(driver_.result())) return driver_.result();
  if (CancelRequested()) return Fail(platform::kErrorInternetOperationCancelled);
  return Fail(platform::kErrorInternetConnectionAborted);
}

Request::Request(const Connection& connection, std::string verb, std::string path)
    : state_(std::make_unique<State>(connection, std::move(verb), std::move(path))) {}

Request::~Request() = default;

platform::Status Request::AddHeaders(std::string_view block) { return state_->AddHeaders(block); }
platform::Status Request::Start(std::uint64_t content_length) { return state_->Start(content_length); }
platform::Status Request::Write(std::string_view piece) { return state_->Write(piece); }
platform::Status Request::End() { return state_->End(); }

platform::Status Request::Send(std::string_view body) {
  state_->LimitTo(kExchangeLimit);
  platform::Status status = Start(body.size());
  if (!platform::Failed(status) && !body.empty()) status = Write(body);
  if (!platform::Failed(status)) status = End();
  return status;
}

std::uint32_t Request::status_code() const { return state_->reader().status_code(); }

std::string Request::TakeBody() { return state_->reader().TakeBody(); }

}  // namespace platform::http
