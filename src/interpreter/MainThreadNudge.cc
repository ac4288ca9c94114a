#include <Python.h>

#include "interpreter/MainThreadNudge.h"

#include <atomic>
#include <condition_variable>
#include <exception>
#include <mutex>
#include <new>
#include <thread>

#include "interpreter/ParkIfStopped.h"
#include "interpreter/PythonApi.h"

namespace interpreter {

#if PYUPLOADER_PENDING_CALLS_NEED_NUDGE

namespace {

// Shared with a detached thread that waits on it until the process ends, so it
// is never destroyed (no static destructor runs under a waiting thread).
struct Nudger {
  const std::thread::id mainThread = std::this_thread::get_id();
  std::mutex lock;
  std::condition_variable changed;
  bool ready = false;             // guarded by lock
  bool requested = false;         // guarded by lock
  PyThreadState* state = nullptr;  // the helper's own, made before it is ready
};

std::atomic<Nudger*> g_nudger{nullptr};  // set once on the main thread, read by posters

void WaitForRequest(Nudger& nudger) {
  std::unique_lock<std::mutex> lock(nudger.lock);
  nudger.changed.wait(lock, [&] { return nudger.requested; });
  nudger.requested = false;
}

// The helper holds nothing that the main thread could wait for, so the main
// thread may keep the lock as long as it likes. It asks for no lock once the
// interpreter has begun to finalize; when it loses that race, ParkIfStopped
// parks it, and a parked or waiting helper never keeps the process from exiting.
void Serve(Nudger& nudger) {
  {
    std::lock_guard<std::mutex> lock(nudger.lock);
    // Made here, so that the state carries this thread's id, while the main
    // thread waits and so cannot finalize; taking one needs no lock.
    nudger.state = PyThreadState_New(PyInterpreterState_Main());
    nudger.ready = true;
  }
  nudger.changed.notify_all();
  if (!nudger.state) return;
  for (;;) {
    WaitForRequest(nudger);
    if (!interpreter::TakesPendingCalls()) return;
    ParkIfStopped([&] { PyEval_RestoreThread(nudger.state); });
    PyEval_SaveThread();
  }
}

}  // namespace

void PrepareMainThreadNudge() {
  if (g_nudger) return;
  auto* nudger = new (std::nothrow) Nudger;
  if (!nudger) return;  // tried again by the next preparation
  try {
    std::thread(Serve, std::ref(*nudger)).detach();
  } catch (const std::exception&) {  // no thread or no memory for one
    delete nudger;
    return;
  }
  std::unique_lock<std::mutex> lock(nudger->lock);
  nudger->changed.wait(lock, [&] { return nudger->ready; });
  if (nudger->state) g_nudger = nudger;  // else the helper has ended (and keeps it)
}

void NudgeMainThread() {
  Nudger* nudger = g_nudger;
  if (!nudger || std::this_thread::get_id() == nudger->mainThread) return;
  {
    std::lock_guard<std::mutex> lock(nudger->lock);
    nudger->requested = true;
  }
  nudger->changed.notify_one();
}

#else

void PrepareMainThreadNudge() {}
void NudgeMainThread() {}

#endif

}  // namespace interpreter
