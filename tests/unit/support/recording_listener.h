// An upload listener that writes every event down as one line of text with the
// thread it came on, and answers the cancel poll from a script.
#pragma once

#include <cstdint>
#include <cstdio>
#include <functional>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "platform/text.h"
#include "transport/UploadProgress.h"

namespace test_support {

template <typename Interface>
class BasicRecordingListener : public Interface {
 public:
  // Called with the number of the poll (1 for the first); true cancels.
  std::function<bool(int poll)> cancelAt = [](int) { return false; };
  std::vector<std::string> events;
  std::vector<std::thread::id> threads;  // of each event
  int polls = 0;

  // The events whose line starts with `prefix`.
  std::vector<std::string> Only(const std::string& prefix) const {
    std::vector<std::string> kept;
    for (const std::string& e : events) {
      if (e.compare(0, prefix.size(), prefix) == 0) kept.push_back(e);
    }
    return kept;
  }

  void OnResolvingName(const wchar_t* text) override { Note("ResolvingName", text); }
  void OnNameResolved(const wchar_t* text) override { Note("NameResolved", text); }
  void OnConnectingToServer(const wchar_t* text) override { Note("ConnectingToServer", text); }
  void OnConnectedToServer(const wchar_t* text) override { Note("ConnectedToServer", text); }
  void OnSendingRequest() override { Add("SendingRequest"); }
  void OnRequestSent(std::uint32_t bytes) override { Add("RequestSent " + std::to_string(bytes)); }
  void OnReceivingResponse() override { Add("ReceivingResponse"); }
  void OnResponseReceived(std::uint32_t bytes) override {
    Add("ResponseReceived " + std::to_string(bytes));
  }
  void OnClosingConnection() override { Add("ClosingConnection"); }
  void OnConnectionClosed() override { Add("ConnectionClosed"); }
  void OnFileBegin(const wchar_t* path) override { Note("FileBegin", path); }
  void OnFileProgress(const wchar_t* path, std::uint32_t fileSent, std::uint32_t fileSize,
                      std::uint32_t fileLeft, std::uint32_t allSent, std::uint32_t allSize,
                      std::uint32_t allLeft, std::uint32_t speed) override {
    Add("FileProgress " + Utf8(path) + " " + Join({fileSent, fileSize, fileLeft, allSent, allSize,
                                                   allLeft, speed}));
  }
  void OnFileComplete(const wchar_t* path, std::int32_t result) override {
    Add("FileComplete " + Utf8(path) + " " + Hex(result));
  }
  bool IsCancelled() override { return cancelAt(++polls); }

 protected:
  void Add(std::string line) {
    events.push_back(std::move(line));
    threads.push_back(std::this_thread::get_id());
  }

 private:
  static std::string Join(std::initializer_list<std::uint32_t> values) {
    std::string joined;
    for (const std::uint32_t v : values) joined += (joined.empty() ? "" : " ") + std::to_string(v);
    return joined;
  }
  static std::string Hex(std::int32_t value) {
    char digits[11];
    std::snprintf(digits, sizeof digits, "0x%08X", static_cast<std::uint32_t>(value));
    return digits;
  }
  static std::string Utf8(const wchar_t* text) { return text::WideToUtf8(text::WideView(text)); }
  void Note(const char* what, const wchar_t* text) { Add(std::string(what) + " " + Utf8(text)); }
};

using RecordingListener = BasicRecordingListener<UploadProgress>;

}  // namespace test_support
