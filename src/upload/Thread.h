// One operating-system thread whose body a derived class supplies.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <mutex>
#include <thread>

namespace upload {

class Thread {
 public:
  Thread() = default;
  // Owners join first; a thread still running here is waited for, so it never
  // outlives the object it runs on.
  virtual ~Thread();
  Thread(const Thread&) = delete;
  Thread& operator=(const Thread&) = delete;

  // Starts the thread; false when it could not be created. Run begins only once
  // `handle` and `threadId` are both stored.
  bool Start();
  // Waits without a time-out for the thread to end and returns what Run
  // returned (kRunFailed when it threw); 0 when no thread was started.
  std::uint32_t Join();

  static constexpr std::uint32_t kRunFailed = 0x8000FFFFu;  // E_UNEXPECTED

 protected:
  // The thread's body; its result is the thread's exit code.
  virtual std::uint32_t Run() = 0;

  bool HasHandle() const { return handle.joinable(); }
  std::thread::id ThreadId() const { return threadId; }

 private:
  // Holds the new thread back until its creator has stored the handle and the
  // id, as a thread created suspended and resumed afterwards would be.
  struct StartGate {
    std::mutex mutex;
    std::condition_variable opened;
    bool open = false;
  };

  static std::uint32_t ThreadEntry(Thread* thread);
  void OpenStartGate();
  void WaitAtStartGate();

  std::thread handle;
  std::thread::id threadId;
  StartGate startGate_;
  std::uint32_t exitCode_ = 0;  // written by the thread, read after the join
};

}  // namespace upload
