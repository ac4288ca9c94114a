// Fixtures of the C++ unit tests: an embedded interpreter, environment
// settings, a temporary working folder, the debug trace captured, and the
// upload engine's surroundings (a virtual clock, a recording connection and a
// listener that writes every event down).
#pragma once

#include <Python.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <memory>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "interpreter/PythonApi.h"
#include "platform/debug_output.h"
#include "platform/registry.h"
#include "platform/text.h"
#include "transport/UploadConnection.h"
#include "transport/UploadEnvironment.h"
#include "transport/UploadProgress.h"

namespace test_support {

// The test thread is the interpreter's main thread and holds its lock. The
// interpreter stays up until the process ends, still reachable for leak checkers.
inline void StartPython() {
  if (!Py_IsInitialized()) python_api::StartHostedInterpreter();
}

// The interpreter keeps objects in memory the leak checker cannot follow.
extern "C" __attribute__((weak, used, visibility("default"))) const char* __lsan_default_suppressions() {
  return "leak:libpython\n";
}

inline void RunPython(const char* code) { ASSERT_EQ(PyRun_SimpleString(code), 0) << code; }

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

inline std::filesystem::path Native(const std::wstring& name) { return std::filesystem::u8path(text::WideToUtf8(name)); }

inline std::wstring MakeFile(const std::wstring& name, const std::string& bytes) {
  return std::ofstream(Native(name), std::ios::binary) << bytes, name;
}

// A file of that size that reads as zeros, without taking the disk space.
inline std::wstring MakeSparseFile(const std::wstring& name, std::uintmax_t size) {
  std::filesystem::resize_file(Native(MakeFile(name, "")), size);
  return name;
}

inline std::string ReadFile(const std::filesystem::path& path) {
  std::ifstream in(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

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

// A hive file holding the trace switch, and the trace lines captured in a
// file; make it before the object under test, which reads the switch.
class TraceCapture {
 public:
  TraceCapture()
      : folder_(std::filesystem::temp_directory_path() / ("trace_" + std::to_string(::getpid()))),
        hiveEnv_(registry::kHivePathVariable, (folder_ / "hive.reg").string()),
        outputEnv_(debug_output::kOutputPathVariable, (folder_ / "out.log").string()) {
    std::filesystem::create_directories(folder_);
    SetSwitch(1);
  }
  ~TraceCapture() { std::filesystem::remove_all(folder_); }
  void SetSwitch(int dumpMsg) const { Hive("[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\Lumivanta]\r\n\"DumpMsg\"=dword:" + std::to_string(dumpMsg)); }
  void RemoveKey() const { Hive(""); }  // the key cannot be opened
  std::string Bytes() const { return ReadFile(folder_ / "out.log"); }

 private:
  void Hive(const std::string& key) const { std::ofstream(folder_ / "hive.reg") << "REGEDIT4\r\n\r\n" << key << "\r\n"; }
  std::filesystem::path folder_;
  ScopedEnv hiveEnv_, outputEnv_;
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
    if (text) line += " " + text::WideToUtf8(text::WideView(text));
    for (const std::uint32_t n : numbers) line += " " + std::to_string(n);
    events.push_back(line);
    threads.push_back(std::this_thread::get_id());
  }
};

// The engine's surroundings: a clock that moves only when the engine sleeps or
// writes, and a connection that records every piece and answers as scripted.
struct FakeServer {
  std::uint32_t now = 1000;  // milliseconds
  std::function<std::uint32_t(std::size_t bytes)> writeMs = [](std::size_t) { return 0u; };
  std::function<void()> onStart = [] {};

  std::vector<std::string> headers, writes;
  std::vector<std::uint32_t> sleeps;  // milliseconds of each
  bool started = false, ended = false;
  std::uint32_t announced = 0;

  std::string Body() const {
    std::string body;
    for (const std::string& piece : writes) body += piece;
    return body;
  }
  std::string Boundary() const { return headers.at(0).substr(headers.at(0).find("boundary=") + 9); }

  UploadEnvironment Environment() {
    return UploadEnvironment{[this] { return now; }, [this](std::uint32_t ms) { sleeps.push_back(ms), now += ms; },
                             [this](const UploadRequest&, UploadProgress*, std::unique_ptr<UploadConnection>* out) {
                               *out = std::make_unique<Connection>(*this);
                               return win::kOk;
                             }};
  }

  class Connection : public UploadConnection {
   public:
    explicit Connection(FakeServer& server) : s_(server) {}
    win::Status AddHeader(const std::string& line) override { return s_.headers.push_back(line), win::kOk; }
    win::Status Start(std::uint32_t contentLength) override {
      s_.started = true;
      s_.announced = contentLength;
      s_.onStart();
      return win::kOk;
    }
    win::Status Write(std::string_view piece) override {
      s_.writes.emplace_back(piece);
      s_.now += s_.writeMs(piece.size());
      return win::kOk;
    }
    win::Status End() override { return s_.ended = true, win::kOk; }
    bool QueryStatusCode(std::uint32_t* code) override { return *code = 200, true; }
    std::string ReadReply() override { return "<uploadTemplate/>"; }

   private:
    FakeServer& s_;
  };
};

}  // namespace test_support
