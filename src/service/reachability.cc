// The reachability probe: opens a URL on a thread of its own, waited for in
// 500 ms steps, and cancelled by closing its handles when it is still blocked
// after the last step.
#include <chrono>
#include <cstring>
#include <future>
#include <string>
#include <system_error>

#include "platform/http_probe.h"
#include "service/OBLoginData.h"

namespace service {

namespace {

constexpr char kProbeAgent[] = "Microsoft Internet Explorer";
constexpr auto kWaitStep = std::chrono::milliseconds(500);
constexpr int kMostWaits = 11;  // 5.5 s in all

// The members only show the probe's handles: Python can write any value into
// them through their setters, so a value read back from a member is never
// closed. The probe's own handles are closed through the probe (each closes
// once, whichever thread comes first); the members are only cleared.
void ClearHandle(HINTERNET& member) { __atomic_store_n(&member, nullptr, __ATOMIC_RELEASE); }

void PutHandle(HINTERNET& member, platform::http::ProbeHandle& handle) {
  __atomic_store_n(&member, static_cast<HINTERNET>(&handle), __ATOMIC_RELEASE);
}

void CloseHandle(HINTERNET& member, platform::http::ProbeHandle& handle) {
  ClearHandle(member);
  handle.Close();
}

bool WaitForProbe(const std::future<void>& probe) {
  for (int wait = 0; wait < kMostWaits; ++wait) {
    if (probe.wait_for(kWaitStep) == std::future_status::ready) return true;
  }
  return false;
}

}  // namespace

BOOL OBLoginData::CheckServerReachable(const char* url) {
  const std::size_t length = url ? ::strnlen(url, kMaxPath) : kMaxPath;
  if (length == kMaxPath) {  // no room for the terminator: refused unprobed
    m_bServerReachable = 0;
    return m_bServerReachable;
  }
  std::memcpy(m_szChkServerUrl, url, length + 1);

  // Declared first, so that it outlives the thread that uses it.
  platform::http::Probe probe(kProbeAgent);
  std::future<void> finished;
  try {
    finished = std::async(std::launch::async, [this, &probe] { ProbeThreadProc(probe); });
  } catch (const std::system_error&) {
    return m_bServerReachable;  // no thread: nothing to wait for
  }
  if (!WaitForProbe(finished)) {
    CloseHandle(m_hConnect, probe.connection());
    CloseHandle(m_hInternet, probe.session());
  }
  finished.wait();
  return m_bServerReachable;
}

void OBLoginData::ProbeThreadProc(platform::http::Probe& probe) {
  m_bServerReachable = 0;
  ClearHandle(m_hInternet);
  ClearHandle(m_hConnect);
  PutHandle(m_hInternet, probe.session());
  const std::string url(m_szChkServerUrl, ::strnlen(m_szChkServerUrl, kMaxPath));
  if (probe.Open(url)) {
    PutHandle(m_hConnect, probe.connection());
    m_bServerReachable = 1;
    CloseHandle(m_hConnect, probe.connection());
  }
  CloseHandle(m_hInternet, probe.session());
}

}  // namespace service
