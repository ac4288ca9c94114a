#include "platform/blocking_scope.h"

#include <atomic>

namespace platform {

namespace {

std::atomic<void* (*)()> g_release{nullptr};
std::atomic<void (*)(void*)> g_retake{nullptr};

void* ReleaseInstalled() {
  void* (*release)() = g_release.load();
  return release ? release() : nullptr;
}

}  // namespace

void InstallBlockingRelease(BlockingRelease release) {
  // The retake first: a scope that sees the release must see it too.
  g_retake.store(release.retake);
  g_release.store(release.release);
}

BlockingScope::BlockingScope() : retake_(g_retake.load()), released_(ReleaseInstalled()) {}

BlockingScope::~BlockingScope() {
  if (released_ != nullptr) retake_(released_);
}

}  // namespace platform
