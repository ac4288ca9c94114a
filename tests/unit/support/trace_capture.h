// Test support: turns the debug trace on or off through a temporary registry hive
// and captures the lines it writes in a temporary file, restoring both settings
// afterwards. The switch is read when a component sets the trace prefix, so
// make the TraceCapture before constructing the object under test.
#pragma once

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <optional>
#include <sstream>
#include <unistd.h>
#include <string>
#include <vector>

#include "platform/debug_output.h"
#include "platform/registry.h"
#include "platform/text.h"

namespace test_support {

// Sets an environment variable for the object's lifetime.
class ScopedEnv {
 public:
  ScopedEnv(const char* name, const std::optional<std::string>& value) : name_(name) {
    if (const char* old = std::getenv(name)) old_ = old;
    if (value) {
      ::setenv(name, value->c_str(), 1);
    } else {
      ::unsetenv(name);
    }
  }
  ~ScopedEnv() {
    if (old_) {
      ::setenv(name_.c_str(), old_->c_str(), 1);
    } else {
      ::unsetenv(name_.c_str());
    }
  }
  ScopedEnv(const ScopedEnv&) = delete;
  ScopedEnv& operator=(const ScopedEnv&) = delete;

 private:
  std::string name_;
  std::optional<std::string> old_;
};

// A file in a fresh temporary folder, removed with the folder.
class TempFile {
 public:
  explicit TempFile(const std::string& name) {
    static int serial = 0;
    dir_ = std::filesystem::temp_directory_path() /
           ("uploader-test-" + std::to_string(::getpid()) + "-" + std::to_string(++serial));
    std::filesystem::create_directories(dir_);
    path_ = (dir_ / name).string();
  }
  ~TempFile() {
    std::error_code ignored;
    std::filesystem::remove_all(dir_, ignored);
  }
  TempFile(const TempFile&) = delete;
  TempFile& operator=(const TempFile&) = delete;

  const std::string& path() const { return path_; }

  void Write(const std::string& bytes) const { std::ofstream(path_, std::ios::binary) << bytes; }

  std::string Read() const {
    std::ifstream in(path_, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
  }

 private:
  std::filesystem::path dir_;
  std::string path_;
};

// A hive whose trace switch ("DumpMsg") holds `dumpMsg`, or that lacks the value.
inline std::string TraceSwitchHive(std::optional<std::uint32_t> dumpMsg) {
  std::ostringstream hive;
  hive << "Windows Registry Editor Version 5.00\r\n\r\n"
       << "[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\Lumivanta]\r\n";
  if (dumpMsg) {
    char digits[9];
    std::snprintf(digits, sizeof digits, "%08x", *dumpMsg);
    hive << "\"DumpMsg\"=dword:" << digits << "\r\n";
  }
  return hive.str();
}

class TraceCapture {
 public:
  explicit TraceCapture(std::optional<std::uint32_t> dumpMsg = 1)
      : hive_("registry.reg"),
        output_("debug.log"),
        hiveEnv_(registry::kHivePathVariable, hive_.path()),
        outputEnv_(debug_output::kOutputPathVariable, output_.path()) {
    hive_.Write(TraceSwitchHive(dumpMsg));
  }

  // Changes the switch that the next prefix change will read.
  void SetSwitch(std::optional<std::uint32_t> dumpMsg) const { hive_.Write(TraceSwitchHive(dumpMsg)); }
  // Makes the hive file hold no key at all.
  void RemoveKey() const { hive_.Write("Windows Registry Editor Version 5.00\r\n"); }

  std::string Bytes() const { return output_.Read(); }
  std::wstring Text() const { return text::Utf8ToWide(Bytes()); }

 private:
  TempFile hive_;
  TempFile output_;
  ScopedEnv hiveEnv_;
  ScopedEnv outputEnv_;
};

}  // namespace test_support
