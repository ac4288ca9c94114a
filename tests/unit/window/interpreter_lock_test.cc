#include <gtest/gtest.h>

#include <thread>

#include "interpreter/AllowThreadsGuard.h"
#include "interpreter/GilStateGuard.h"
#include "interpreter/InterpreterLockHeld.h"
#include "support/embedded_python.h"

namespace {

TEST(InterpreterLock, AllowThreadsGuardReleasesTheLockForItsScope) {
  ASSERT_TRUE(InterpreterLockHeld());
  {
    AllowThreadsGuard outer;
    EXPECT_FALSE(InterpreterLockHeld());
    {
      AllowThreadsGuard inner;  // nothing to release: a no-op
      EXPECT_FALSE(InterpreterLockHeld());
    }
    bool heldByWorker = false;
    std::thread([&] {
      GilStateGuard lock;
      heldByWorker = InterpreterLockHeld();
    }).join();
    EXPECT_TRUE(heldByWorker);
  }
  EXPECT_TRUE(InterpreterLockHeld());
}

TEST(InterpreterLock, ThreadsThatNeverTookItDoNotHoldIt) {
  AllowThreadsGuard letOthersRun;
  bool held = true;
  std::thread([&] {
    held = InterpreterLockHeld();
    AllowThreadsGuard nothingToRelease;
  }).join();
  EXPECT_FALSE(held);
}

TEST(InterpreterLock, GilStateGuardNestsOnTheThreadHoldingTheLock) {
  {
    GilStateGuard again;
    EXPECT_TRUE(InterpreterLockHeld());
  }
  EXPECT_TRUE(InterpreterLockHeld());
}

}  // namespace
