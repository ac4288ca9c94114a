// The UI thread is the interpreter's main thread: posted messages are dispatched
// whenever it runs Python code, without any explicit dispatch.
#include "upload/PendingCallPump.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <thread>
#include <vector>

#include "platform/window.h"
#include "support/embedded_python.h"

namespace {

using Clock = std::chrono::steady_clock;
constexpr auto kNoHangBound = std::chrono::seconds(120);
constexpr std::uint32_t kMessage = 0x8001;

struct Received {
  std::vector<std::intptr_t> numbers;
  bool allOnMainThread = true;
  std::thread::id mainThread = std::this_thread::get_id();
};

std::intptr_t Receive(ui::Window& window, std::uint32_t, std::uintptr_t, std::intptr_t lparam) {
  auto* received = static_cast<Received*>(window.UserData());
  received->allOnMainThread = received->allOnMainThread && std::this_thread::get_id() == received->mainThread;
  received->numbers.push_back(lparam);
  return 0;
}

class PendingCallPumpTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ui::RegisterWindowClass(L"Pump Test Window", &Receive);
    InstallPendingCallPump();
    window_ = ui::Window::Create(L"Pump Test Window");
    window_->SetUserData(&received_);
  }

  // Runs Python code, and nothing else, until `count` messages have arrived.
  void RunPythonUntilReceived(std::size_t count) {
    const auto deadline = Clock::now() + kNoHangBound;
    while (received_.numbers.size() < count && Clock::now() < deadline) {
      test_support::RunPython("for i in range(200): pass");
    }
  }

  void ExpectInOrder(int count) {
    ASSERT_EQ(received_.numbers.size(), static_cast<std::size_t>(count));
    for (int i = 0; i < count; ++i) ASSERT_EQ(received_.numbers[i], i);
    EXPECT_TRUE(received_.allOnMainThread);
  }

  Received received_;
  std::unique_ptr<ui::Window> window_;
};

TEST_F(PendingCallPumpTest, ThousandsOfPostsFromAWorkerAllArriveInOrder) {
  constexpr int kPosts = 20000;
  std::thread worker([&] {
    for (int i = 0; i < kPosts; ++i) window_->Post(kMessage, 0, i);
  });
  RunPythonUntilReceived(kPosts);
  worker.join();
  ExpectInOrder(kPosts);
}

std::atomic<int> othersRun{0};
int OtherPendingCall(void*) {
  ++othersRun;
  return 0;
}

TEST_F(PendingCallPumpTest, APostThatTheFullPendingCallQueueRefusesIsRetriedNotLost) {
  othersRun = 0;
  int others = 0;
  while (Py_AddPendingCall(&OtherPendingCall, nullptr) == 0) ++others;
  ASSERT_GT(others, 0);

  constexpr int kPosts = 100;
  std::atomic<int> postsReturned{0};
  std::thread worker([&] {
    for (int i = 0; i < kPosts; ++i) {
      window_->Post(kMessage, 0, i);
      ++postsReturned;
    }
  });
  // The first post cannot register its drain while the queue is full and the
  // main thread runs no Python code: it keeps retrying.
  std::this_thread::sleep_for(std::chrono::milliseconds(100));
  EXPECT_EQ(postsReturned, 0);

  RunPythonUntilReceived(kPosts);
  worker.join();
  ExpectInOrder(kPosts);
  EXPECT_EQ(othersRun, others);
}

}  // namespace
