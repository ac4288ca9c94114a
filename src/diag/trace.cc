#include "diag/trace.h"

#include <algorithm>
#include <atomic>
#include <cstdarg>
#include <cstring>
#include <cwchar>
#include <mutex>
#include <string>

#include "platform/debug_output.h"
#include "platform/registry.h"
#include "platform/text.h"
#include "platform/wide_format.h"

namespace diag {

namespace {

constexpr wchar_t kSwitchKey[] = L"SOFTWARE\\Quillmark\\Lumivanta";
constexpr wchar_t kSwitchValue[] = L"DumpMsg";
constexpr std::size_t kPrefixCapacity = 30;  // characters, the terminating zero included
constexpr std::size_t kTextCapacity = kTraceTextLimit + 1;

std::atomic<bool> traceEnabled{false};

// Lines may be written on worker threads while a constructor on the UI thread
// sets a new prefix; the lock keeps a line from seeing half of it. It is taken
// only when the trace is on.
std::mutex prefixLock;
wchar_t tracePrefix[kPrefixCapacity] = {};

// "[name]", cut to the buffer's 29 characters.
void FormatPrefix(const char* name) {
  const std::wstring prefix = L"[" + platform::Utf8ToWide(name) + L"]";
  const std::size_t length = std::min(prefix.size(), kPrefixCapacity - 1);
  std::lock_guard<std::mutex> lock(prefixLock);
  std::wmemcpy(tracePrefix, prefix.data(), length);
  tracePrefix[length] = L'\0';
}

std::wstring CurrentPrefix() {
  std::lock_guard<std::mutex> lock(prefixLock);
  return tracePrefix;
}

bool ReadSwitch(bool& enabled) {
  const auto key = platform::RegistryKey::OpenLocalMachine(kSwitchKey);
  if (!key) return false;
  enabled = key->ReadNumber(kSwitchValue).value_or(0) != 0;
  return true;
}

}  // namespace

void TraceSetPrefix(const char* name) {
  bool enabled = false;
  if (!ReadSwitch(enabled)) return;
  traceEnabled.store(enabled, std::memory_order_relaxed);
  if (name == nullptr || std::strlen(name) >= kPrefixCapacity) return;
  FormatPrefix(name);
}

void TraceMessage(const wchar_t* format, ...) {
  if (!traceEnabled.load(std::memory_order_relaxed)) return;
  wchar_t text[kTextCapacity];
  std::va_list args;
  va_start(args, format);
  const std::size_t length = platform::FormatCut(text, kTextCapacity, format, args);
  va_end(args);
  platform::WriteDebugOutput(CurrentPrefix().append(text, length).append(L"\n"));
}

}  // namespace diag
