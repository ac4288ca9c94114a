// The worker thread base: its start gate and its join.
#include "upload/Thread.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <new>
#include <vector>

namespace {

constexpr int kStarts = 2000;

// Records what the thread could see of itself when its body began.
class ProbeThread : public Thread {
 public:
  explicit ProbeThread(std::uint32_t exitCode) : exitCode_(exitCode) {}

  std::atomic<bool> sawHandle{false};
  std::atomic<bool> sawOwnId{false};

 protected:
  std::uint32_t Run() override {
    sawHandle = HasHandle();
    sawOwnId = ThreadId() == std::this_thread::get_id();
    return exitCode_;
  }

 private:
  const std::uint32_t exitCode_;
};

// Busy threads on every core make it likely that the starting thread is
// preempted between creating the thread and storing what it got.
TEST(ThreadTest, RunBeginsOnlyAfterHandleAndIdAreStored) {
  std::atomic<bool> busy{true};
  std::vector<std::thread> spinners;
  for (unsigned i = 0; i < std::max(2u, std::thread::hardware_concurrency()); ++i) {
    spinners.emplace_back([&] {
      while (busy) {
      }
    });
  }
  for (int i = 0; i < kStarts; ++i) {
    ProbeThread thread(0);
    ASSERT_TRUE(thread.Start());
    thread.Join();
    ASSERT_TRUE(thread.sawHandle) << "start " << i;
    ASSERT_TRUE(thread.sawOwnId) << "start " << i;
  }
  busy = false;
  for (std::thread& spinner : spinners) spinner.join();
}

TEST(ThreadTest, JoinReturnsWhatRunReturnedAndOnlyOnce) {
  ProbeThread thread(0x80040301u);
  ASSERT_TRUE(thread.Start());
  EXPECT_EQ(thread.Join(), 0x80040301u);
  EXPECT_EQ(thread.Join(), 0u);  // nothing left to wait for
}

// An exception leaving the body would end the process.
TEST(ThreadTest, ABodyThatThrowsEndsItsThreadWithAFailure) {
  struct Throwing : Thread {
    std::uint32_t Run() override { throw std::bad_alloc(); }
  } thread;
  ASSERT_TRUE(thread.Start());
  EXPECT_EQ(thread.Join(), Thread::kRunFailed);
}

TEST(ThreadTest, AThreadNeverStartedJoinsAtOnceAndDestroysCleanly) {
  ProbeThread thread(7);
  EXPECT_EQ(thread.Join(), 0u);
  EXPECT_FALSE(thread.sawHandle);
}

}  // namespace
