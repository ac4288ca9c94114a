// Long waits of the lower layers (a sign-in or discovery exchange, a destruction
// waiting for running operations) run inside a BlockingScope. What such a wait
// lets go of is the hosting program's business: the Python module installs the
// release of the interpreter lock, so that other Python threads run meanwhile.
// With nothing installed a scope does nothing.
#pragma once

namespace platform {

struct BlockingRelease {
  void* (*release)();              // null result: nothing was let go
  void (*retake)(void* released);  // given what release returned, when not null
};

// Installed before any scope opens (at module init); later scopes use it.
void InstallBlockingRelease(BlockingRelease release);

// Create and destroy on the same thread.
class BlockingScope {
 public:
  BlockingScope();
  ~BlockingScope();
  BlockingScope(const BlockingScope&) = delete;
  BlockingScope& operator=(const BlockingScope&) = delete;

 private:
  void (*const retake_)(void*);
  void* const released_;
};

}  // namespace platform
