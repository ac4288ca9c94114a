#include "platform/http_driver.h"

#include <algorithm>

#include "platform/http_limits.h"

namespace platform::http {
namespace {

constexpr long kLowestSpeedBytesPerSecond = 1;

}  // namespace

Driver::Driver() : multi_(curl_multi_init()), easy_(curl_easy_init()) {}

Driver::~Driver() {
  if (attached_) curl_multi_remove_handle(multi_.get(), easy_.get());
  easy_.reset();
  multi_.reset();
}

bool Driver::SetCommonOptions(const std::string& url, const std::string& agent) {
  CURL* e = easy_.get();
  bool ok = curl_easy_setopt(e, CURLOPT_URL, url.c_str()) == CURLE_OK &&
            curl_easy_setopt(e, CURLOPT_PROTOCOLS_STR, "http,https") == CURLE_OK &&
            curl_easy_setopt(e, CURLOPT_PATH_AS_IS, 1L) == CURLE_OK &&
            curl_easy_setopt(e, CURLOPT_HTTP_VERSION, CURL_HTTP_VERSION_1_1) == CURLE_OK &&
            curl_easy_setopt(e, CURLOPT_NOSIGNAL, 1L) == CURLE_OK &&
            curl_easy_setopt(e, CURLOPT_SSL_VERIFYPEER, 1L) == CURLE_OK &&
            curl_easy_setopt(e, CURLOPT_SSL_VERIFYHOST, 2L) == CURLE_OK &&
            curl_easy_setopt(e, CURLOPT_CONNECTTIMEOUT, long{kConnectLimit.count()}) == CURLE_OK &&
            curl_easy_setopt(e, CURLOPT_LOW_SPEED_LIMIT, kLowestSpeedBytesPerSecond) == CURLE_OK &&
            curl_easy_setopt(e, CURLOPT_LOW_SPEED_TIME, long{kStallLimit.count()}) == CURLE_OK;
  if (ok && !agent.empty()) ok = curl_easy_setopt(e, CURLOPT_USERAGENT, agent.c_str()) == CURLE_OK;
  return ok;
}

platform::Status Driver::Begin() {
  if (curl_multi_add_handle(multi_.get(), easy_.get()) != CURLM_OK) {
    return platform::StatusFromWin32(platform::kErrorInternetInternalError);
  }
  attached_ = true;
  return platform::kOk;
}

void Driver::Run(const std::function<bool()>& until, const StopPoll& stop) {
  for (;;) {
    if (!Perform() || finished_ || until()) return;
    if ((stop && stop()) || PassedDeadline()) return;
    if (!Poll()) return;
  }
}

void Driver::Wakeup() { curl_multi_wakeup(multi_.get()); }

void Driver::LimitTo(std::chrono::seconds seconds) {
  const Clock::time_point deadline = Clock::now() + seconds;
  if (!deadline_ || deadline < *deadline_) deadline_ = deadline;
}

// A transfer past its deadline ends as libcurl's own time limits end one.
bool Driver::PassedDeadline() {
  if (!deadline_ || Clock::now() < *deadline_) return false;
  finished_ = true;
  code_ = CURLE_OPERATION_TIMEDOUT;
  return true;
}

platform::Status Driver::result() const {
  return platform::StatusFromWin32(platform::Win32FromCurl(code_));
}

// Lets libcurl do what it can without waiting.
bool Driver::Perform() {
  int running = 0;
  if (curl_multi_perform(multi_.get(), &running) != CURLM_OK) {
    finished_ = true;
    code_ = CURLE_OUT_OF_MEMORY;
    return false;
  }
  CollectFinished();
  return true;
}

// Waits for the network, one of libcurl's timers or a wake-up.
bool Driver::Poll() {
  auto wait = std::chrono::duration_cast<std::chrono::milliseconds>(kStopPollInterval);
  if (deadline_) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(*deadline_ - Clock::now());
    wait = std::clamp(left, std::chrono::milliseconds::zero(), wait);
  }
  return curl_multi_poll(multi_.get(), nullptr, 0, static_cast<int>(wait.count()), nullptr) ==
         CURLM_OK;
}

void Driver::CollectFinished() {
  int left = 0;
  while (CURLMsg* message = curl_multi_info_read(multi_.get(), &left)) {
    if (message->msg == CURLMSG_DONE && message->easy_handle == easy_.get()) {
      finished_ = true;
      code_ = message->data.result;
    }
  }
}

}  // namespace platform::http
