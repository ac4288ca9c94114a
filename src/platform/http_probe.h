// The reachability probe: opens an http URL and reports whether any answer came.
// It runs on a thread of its own while another thread may give up on it; both
// sides close the probe's two handles, and each handle closes exactly once.
#pragma once

#include <atomic>
#include <memory>
#include <string>

namespace platform::http {

class Driver;
class Probe;
class ReplyReader;

// One of the probe's two handles. Close is thread-safe and idempotent: the
// first call closes, later ones do nothing. Closing either handle makes a
// blocked Probe::Open return promptly.
class ProbeHandle {
 public:
  void Close();
  bool is_open() const { return !closed_.load(); }

 private:
  friend class Probe;
  explicit ProbeHandle(Probe& probe) : probe_(probe) {}

  Probe& probe_;
  std::atomic<bool> closed_{false};
};

class Probe {
 public:
  explicit Probe(std::string agent);
  ~Probe();
  Probe(const Probe&) = delete;
  Probe& operator=(const Probe&) = delete;

  // Sends a GET for the URL and blocks until its reply head arrives (true,
  // whatever the status), the request fails, or a handle is closed (false).
  bool Open(const std::string& url);

  // Stands for the session (internet) handle.
  ProbeHandle& session() { return session_; }
  // Stands for the URL handle.
  ProbeHandle& connection() { return connection_; }

 private:
  friend class ProbeHandle;
  void Cancel();

  std::string agent_;
  // The reader outlives the driver, whose callbacks point at it; both live until
  // the probe is destroyed, after its thread has finished.
  std::unique_ptr<ReplyReader> reader_;
  std::unique_ptr<Driver> driver_;
  std::atomic<bool> cancelled_{false};
  ProbeHandle session_{*this};
  ProbeHandle connection_{*this};
};

}  // namespace platform::http
