#pragma once

namespace interpreter {

// Releases the interpreter lock for the guard's scope when the calling thread
// holds it, so that blocking work lets other Python threads run; does nothing
// for callers without the lock. Create and destroy it on the same thread.
class AllowThreadsGuard {
 public:
  AllowThreadsGuard() : released_(ReleaseInterpreterLock()) {}
  ~AllowThreadsGuard() { RetakeInterpreterLock(released_); }
  AllowThreadsGuard(const AllowThreadsGuard&) = delete;
  AllowThreadsGuard& operator=(const AllowThreadsGuard&) = delete;

  // The same as two calls, for those that cannot name the interpreter's types
  // (the lower layers' BlockingScope): the thread state let go of, or null when
  // the lock was not held; retaking null does nothing.
  static void* ReleaseInterpreterLock();
  static void RetakeInterpreterLock(void* released);

 private:
  void* const released_;
};

}  // namespace interpreter
