#pragma once

struct _ts;

// Releases the interpreter lock for the guard's scope when the calling thread
// holds it, so that blocking work lets other Python threads run; does nothing
// for callers without the lock. Create and destroy it on the same thread.
class AllowThreadsGuard {
 public:
  AllowThreadsGuard();
  ~AllowThreadsGuard();
  AllowThreadsGuard(const AllowThreadsGuard&) = delete;
  AllowThreadsGuard& operator=(const AllowThreadsGuard&) = delete;

 private:
  _ts* savedThreadState_;  // null when the lock was not held
};
