#pragma once

#include <cxxabi.h>

#include <chrono>
#include <thread>

namespace interpreter {

// Runs `takeLock`, a call that takes the interpreter lock. Once the interpreter
// has begun to finalize, Python 3 stops any other thread that takes the lock with
// pthread_exit, whose unwinding would end the whole process where it crosses a
// destructor or a noexcept function (the guards retake the lock in destructors).
// Such a thread is parked here instead, without the lock, until the process ends.
template <typename TakeLock>
void ParkIfStopped(const TakeLock& takeLock) {
  try {
    takeLock();
  } catch (abi::__forced_unwind&) {
    for (;;) std::this_thread::sleep_for(std::chrono::hours(1));
  }
}

}  // namespace interpreter
