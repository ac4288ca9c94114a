// An upload listener that writes every event down as one line of text, and
// answers the cancel poll from a script.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "platform/text.h"
#include "transport/UploadProgress.h"

namespace test_support {

class RecordingListener : public UploadProgress {
 public:
  // Called with the number of the poll (1 for the first); true cancels.
  std::function<bool(int poll)> cancelAt = [](int) { return false; };
  std::vector<std::string> events;
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
  void OnSendingRequest() override { events.push_back("SendingRequest"); }
  void OnRequestSent(std::uint32_t bytes) override { Note("RequestSent", bytes); }
  void OnReceivingResponse() override { events.push_back("ReceivingResponse"); }
  void OnResponseReceived(std::uint32_t bytes) override { Note("ResponseReceived", bytes); }
  void OnClosingConnection() override { events.push_back("ClosingConnection"); }
  void OnConnectionClosed() override { events.push_back("ConnectionClosed"); }
  void OnFileBegin(const wchar_t* path) override { Note("FileBegin", path); }
  void OnFileProgress(const wchar_t* path, std::uint32_t fileSent, std::uint32_t fileSize,
                      std::uint32_t fileLeft, std::uint32_t allSent, std::uint32_t allSize,
                      std::uint32_t allLeft, std::uint32_t speed) override {
    events.push_back("FileProgress " + text::WideToUtf8(path) + " " + Join({fileSent, fileSize,
                     fileLeft, allSent, allSize, allLeft, speed}));
  }
  void OnFileComplete(const wchar_t* path, std::int32_t result) override {
    events.push_back("FileComplete " + text::WideToUtf8(path) + " " +
                     Hex(static_cast<std::uint32_t>(result)));
  }
  bool IsCancelled() override { return cancelAt(++polls); }

  static std::string Join(std::initializer_list<std::uint32_t> values) {
    std::string joined;
    for (const std::uint32_t v : values) joined += (joined.empty() ? "" : " ") + std::to_string(v);
    return joined;
  }
  static std::string Hex(std::uint32_t value) {
    char digits[11];
    std::snprintf(digits, sizeof digits, "0x%08X", value);
    return digits;
  }

 private:
  void Note(const char* what, const wchar_t* text) {
    events.push_back(std::string(what) + " " + text::WideToUtf8(text::WideView(text)));
  }
  void Note(const char* what, std::uint32_t value) {
    events.push_back(std::string(what) + " " + std::to_string(value));
  }
};

}  // namespace test_support
