// One libcurl transfer run through a multi handle on the caller's thread, so that
// it can stop between steps: when a body piece is taken, when a reply head has
// arrived, when its deadline has passed, or when it is asked to stop.
#pragma once

#include <chrono>
#include <functional>
#include <optional>
#include <string>

#include "platform/curl_handles.h"
#include "platform/win_error.h"

namespace platform::http {

class Driver {
 public:
  using Clock = std::chrono::steady_clock;
  // Asked at least every kStopPollInterval while the transfer runs; true stops it.
  using StopPoll = std::function<bool()>;

  Driver();
  ~Driver();
  Driver(const Driver&) = delete;
  Driver& operator=(const Driver&) = delete;

  bool ok() const { return multi_ && easy_; }
  CURL* easy() const { return easy_.get(); }

  // The options every exchange shares: target, HTTP/1.1, certificate checks,
  // connect and stall limits. An empty agent sends no User-Agent of our own.
  bool SetCommonOptions(const std::string& url, const std::string& agent);
  // Hands the transfer to the multi handle; it runs in the calls of Run.
  platform::Status Begin();
  // Runs the transfer until `until` holds, it has finished, or `stop` holds.
  void Run(const std::function<bool()>& until, const StopPoll& stop = {});
  // Makes a Run blocked in another thread look at its conditions again.
  void Wakeup();
  // Gives the transfer up as timed out once `seconds` from now have passed;
  // of several limits the earliest holds.
  void LimitTo(std::chrono::seconds seconds);

  bool finished() const { return finished_; }
  // The outcome once finished, as a status code.
  platform::Status result() const;

 private:
  bool Perform();
  bool Poll();
  void CollectFinished();
  bool PassedDeadline();

  curl::Multi multi_;
  curl::Easy easy_;
  bool attached_ = false;
  bool finished_ = false;
  CURLcode code_ = CURLE_OK;
  std::optional<Clock::time_point> deadline_;
};

}  // namespace platform::http
