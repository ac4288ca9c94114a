#include "upload/Thread.h"

#include <system_error>

namespace upload {

Thread::~Thread() {
  if (handle.joinable()) handle.join();
}

bool Thread::Start() {
  try {
    handle = std::thread(&Thread::ThreadEntry, this);
  } catch (const std::system_error&) {
    return false;
  }
  threadId = handle.get_id();
  OpenStartGate();
  return true;
}

// An exception leaving a thread's body would end the whole process.
std::uint32_t Thread::ThreadEntry(Thread* thread) {
  thread->WaitAtStartGate();
  try {
    thread->exitCode_ = thread->Run();
  } catch (...) {
    thread->exitCode_ = kRunFailed;
  }
  return thread->exitCode_;
}

std::uint32_t Thread::Join() {
  if (!handle.joinable()) return 0;
  handle.join();
  handle = std::thread();
  return exitCode_;
}

void Thread::OpenStartGate() {
  {
    std::lock_guard<std::mutex> lock(startGate_.mutex);
    startGate_.open = true;
  }
  startGate_.opened.notify_one();
}

void Thread::WaitAtStartGate() {
  std::unique_lock<std::mutex> lock(startGate_.mutex);
  startGate_.opened.wait(lock, [this] { return startGate_.open; });
}

}  // namespace upload
