// Fixtures of more than one C++ unit test: an embedded interpreter, environment
// settings, a temporary working folder and a listener that writes every upload
// event down.
#pragma once

#include <Python.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <functional>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "interpreter/PythonApi.h"
#include "platform/text.h"

namespace test_support {

// The test thread is the interpreter's main thread and holds its lock. The
// interpreter stays up until the process ends, still reachable for leak checkers.
inline void StartPython() {
  if (!Py_IsInitialized()) interpreter::StartHostedInterpreter();
}

// The interpreter keeps objects in memory the leak checker cannot follow.
extern "C" __attribute__((weak, used, visibility("default"))) const char* __lsan_default_suppressions() {
  return "leak:libpython\n";
}

// Sets (or, without a value, unsets) an environment variable for its lifetime.
class ScopedEnv {
 public:
  ScopedEnv(const char* name, const std::optional<std::string>& value) : name_(name) {
    if (const char* old = std::getenv(name)) old_ = old;
    value ? ::setenv(name, value->c_str(), 1) : ::unsetenv(name);
  }
  ~ScopedEnv() { old_ ? ::setenv(name_.c_str(), old_->c_str(), 1) : ::unsetenv(name_.c_str()); }

 private:
  std::string name_;
  std::optional<std::string> old_;
};

// A fresh folder per test that is also the working directory.
class TempFolderTest : public ::testing::Test {
 protected:
  void SetUp() override {
    folder_ = std::filesystem::temp_directory_path() / ("unit_test_" + std::to_string(::getpid()));
    std::filesystem::remove_all(folder_);
    std::filesystem::create_directories(folder_);
    std::filesystem::current_path(folder_);
  }
  void TearDown() override {
    std::filesystem::current_path("/");
    std::filesystem::remove_all(folder_);
  }
  std::filesystem::path folder_;
};

// Writes each event down as a line, with the thread it came on; the cancel poll
// is answered by cancelAt(number of the poll).
template <typename Interface>
class RecordingListener : public Interface {
 public:
  std::function<bool(int poll)> cancelAt = [](int) { return false; };
  std::vector<std::string> events;
  std::vector<std::thread::id> threads;
  int polls = 0;

  std::vector<std::string> Only(const std::string& prefix) const {
    std::vector<std::string> kept;
    for (const std::string& e : events) {
      if (e.rfind(prefix, 0) == 0) kept.push_back(e);
    }
    return kept;
  }

  void OnResolvingName(const wchar_t* text) override { Add("ResolvingName", text); }
  void OnNameResolved(const wchar_t* text) override { Add("NameResolved", text); }
  void OnConnectingToServer(const wchar_t* text) override { Add("ConnectingToServer", text); }
  void OnConnectedToServer(const wchar_t* text) override { Add("ConnectedToServer", text); }
  void OnSendingRequest() override { Add("SendingRequest"); }
  void OnRequestSent(std::uint32_t bytes) override { Add("RequestSent", nullptr, {bytes}); }
  void OnReceivingResponse() override { Add("ReceivingResponse"); }
  void OnResponseReceived(std::uint32_t bytes) override { Add("ResponseReceived", nullptr, {bytes}); }
  void OnClosingConnection() override { Add("ClosingConnection"); }
  void OnConnectionClosed() override { Add("ConnectionClosed"); }
  void OnFileBegin(const wchar_t* path) override { Add("FileBegin", path); }
  void OnFileProgress(const wchar_t* path, std::uint32_t fileSent, std::uint32_t fileSize,
                      std::uint32_t fileLeft, std::uint32_t allSent, std::uint32_t allSize,
                      std::uint32_t allLeft, std::uint32_t speed) override {
    Add("FileProgress", path, {fileSent, fileSize, fileLeft, allSent, allSize, allLeft, speed});
  }
  void OnFileComplete(const wchar_t* path, std::int32_t result) override {
    char hex[12];
    std::snprintf(hex, sizeof hex, " 0x%08X", static_cast<std::uint32_t>(result));
    Add("FileComplete", path);
    events.back() += hex;
  }
  bool IsCancelled() override { return cancelAt(++polls); }

 protected:
  void Add(const char* what, const wchar_t* text = nullptr, std::vector<std::uint32_t> numbers = {}) {
    std::string line = what;
    if (text) line += " " + platform::WideToUtf8(platform::WideView(text));
    for (const std::uint32_t n : numbers) line += " " + std::to_string(n);
    events.push_back(line);
    threads.push_back(std::this_thread::get_id());
  }
};

}  // namespace test_support
