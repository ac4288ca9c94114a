#include "platform/http_probe.h"

#include "platform/http_driver.h"
#include "platform/http_reply_reader.h"

namespace platform::http {

void ProbeHandle::Close() {
  if (!closed_.exchange(true)) probe_.Cancel();
}

Probe::Probe(std::string agent)
    : agent_(std::move(agent)),
      reader_(std::make_unique<ReplyReader>(nullptr)),
      driver_(std::make_unique<Driver>()) {}

Probe::~Probe() = default;

bool Probe::Open(const std::string& url) {
  if (cancelled_.load() || !driver_->ok() || !driver_->SetCommonOptions(url, agent_) ||
      !reader_->Install(driver_->easy()) ||
      curl_easy_setopt(driver_->easy(), CURLOPT_HTTPGET, 1L) != CURLE_OK ||
      platform::Failed(driver_->Begin())) {
    return false;
  }
  driver_->Run([this] { return reader_->head_received(); }, [this] { return cancelled_.load(); });
  return reader_->head_received();
}

// Runs on the closing thread: the flag stops the probe's loop, the wake-up ends
// its wait at once.
void Probe::Cancel() {
  cancelled_.store(true);
  driver_->Wakeup();
}

}  // namespace platform::http
