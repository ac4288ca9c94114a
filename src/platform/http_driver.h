// One libcurl transfer run through a multi handle on the caller's thread, so that
// it can stop between steps: when a body piece is taken, when a reply head has
// arrived, or when another thread cancels it.
#pragma once

#include <atomic>
#include <functional>
#include <string>

#include "platform/curl_handles.h"
#include "platform/win_error.h"

namespace http {

class Driver {
 public:
  Driver();
  ~Driver();
  Driver(const Driver&) = delete;
  Driver& operator=(const Driver&) = delete;

  bool ok() const { return multi_ && easy_; }
  CURL* easy() const { return easy_.get(); }

  // The options every exchange shares: target, HTTP/1.1, certificate checks,
  // time limits. An empty agent sends no User-Agent of our own.
  bool SetCommonOptions(const std::string& url, const std::string& agent);
  // Hands the transfer to the multi handle; it runs in the calls of Run.
  win::Status Begin();
  // Runs the transfer until `until` holds, it has finished, or `cancelled` is set.
  void Run(const std::function<bool()>& until, const std::atomic<bool>* cancelled = nullptr);
  // Makes a Run blocked in another thread look at its conditions again.
  void Wakeup();

  bool finished() const { return finished_; }
  // The outcome once finished, as a status code.
  win::Status result() const;

 private:
  bool Perform();
  bool Poll();
  void CollectFinished();

  curl::Multi multi_;
  curl::Easy easy_;
  bool attached_ = false;
  bool finished_ = false;
  CURLcode code_ = CURLE_OK;
};

}  // namespace http
