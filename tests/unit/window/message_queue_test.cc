// Windows and their message queue, dispatched explicitly by the owning thread.
#include "platform/message_queue.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <functional>
#include <future>
#include <memory>
#include <new>
#include <string>
#include <thread>
#include <vector>

#include "platform/window.h"

namespace {

constexpr std::uint32_t kMessage = 0x802A;

// What the test windows saw; reached through the window's user data.
struct Journal {
  std::thread::id dispatcher;
  std::vector<std::intptr_t> payloads;
  std::unique_ptr<ui::Window>* destroyOnFirst = nullptr;  // destroyed by its own handler
  std::function<void()> duringDispatch;                    // run inside each handler
};

std::intptr_t RecordingProcedure(ui::Window& window, std::uint32_t message, std::uintptr_t, std::intptr_t lparam) {
  auto* journal = static_cast<Journal*>(window.UserData());
  EXPECT_EQ(message, kMessage);
  journal->dispatcher = std::this_thread::get_id();
  journal->payloads.push_back(*reinterpret_cast<int*>(lparam));
  delete reinterpret_cast<int*>(lparam);  // the handler owns what it is given
  if (journal->destroyOnFirst) std::exchange(journal->destroyOnFirst, nullptr)->reset();
  if (journal->duringDispatch) journal->duringDispatch();
  return 0;
}

std::atomic<int> droppedPayloads{0};

void DropPayload(std::intptr_t lparam) {
  delete reinterpret_cast<int*>(lparam);
  ++droppedPayloads;
}

void PostNumber(ui::Window& window, int number) {
  window.Post(kMessage, 0, reinterpret_cast<std::intptr_t>(new int(number)), &DropPayload);
}

class WindowMessages : public ::testing::Test {
 protected:
  void SetUp() override {
    ui::RegisterWindowClass(L"Test Window", &RecordingProcedure);
    droppedPayloads = 0;
  }

  std::unique_ptr<ui::Window> MakeWindow(Journal& journal) {
    auto window = ui::Window::Create(L"Test Window");
    window->SetUserData(&journal);
    return window;
  }
};

TEST_F(WindowMessages, PostsFromAnotherThreadArriveInOrderOnTheOwningThread) {
  Journal journal;
  auto window = MakeWindow(journal);
  constexpr int kPosts = 5000;
  std::thread worker([&] {
    for (int i = 0; i < kPosts; ++i) PostNumber(*window, i);
  });
  worker.join();
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), static_cast<std::size_t>(kPosts));
  EXPECT_EQ(journal.dispatcher, std::this_thread::get_id());
  ASSERT_EQ(journal.payloads.size(), static_cast<std::size_t>(kPosts));
  for (int i = 0; i < kPosts; ++i) ASSERT_EQ(journal.payloads[i], i);
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 0u);
}

TEST_F(WindowMessages, DestroyingAWindowDropsAndFreesOnlyItsQueuedMessages) {
  Journal kept, gone;
  auto keptWindow = MakeWindow(kept);
  auto goneWindow = MakeWindow(gone);
  for (int i = 0; i < 3; ++i) {
    PostNumber(*goneWindow, 100 + i);
    PostNumber(*keptWindow, i);
  }
  goneWindow.reset();
  EXPECT_EQ(droppedPayloads, 3);
  ui::MessageQueue::DispatchPending();
  EXPECT_EQ(kept.payloads, (std::vector<std::intptr_t>{0, 1, 2}));
  EXPECT_TRUE(gone.payloads.empty());
}

TEST_F(WindowMessages, AHandlerMayDestroyItsOwnWindowWhileTheQueueDrains) {
  Journal self, other;
  auto selfWindow = MakeWindow(self);
  auto otherWindow = MakeWindow(other);
  self.destroyOnFirst = &selfWindow;
  PostNumber(*selfWindow, 1);
  PostNumber(*otherWindow, 10);
  PostNumber(*selfWindow, 2);
  PostNumber(*selfWindow, 3);
  PostNumber(*otherWindow, 11);
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 3u);
  EXPECT_EQ(selfWindow, nullptr);
  EXPECT_EQ(self.payloads, (std::vector<std::intptr_t>{1}));
  EXPECT_EQ(other.payloads, (std::vector<std::intptr_t>{10, 11}));
  EXPECT_EQ(droppedPayloads, 2);
}

TEST_F(WindowMessages, DestroyingOnAnotherThreadWaitsForTheDispatchUnderWayAndDropsTheRest) {
  Journal journal;
  auto window = MakeWindow(journal);
  std::promise<void> entered;
  std::atomic<bool> first{true}, handlerReturned{false};
  journal.duringDispatch = [&] {
    if (!first.exchange(false)) return;
    entered.set_value();
    // Long enough for the other thread to reach the destruction.
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    handlerReturned = true;
  };
  PostNumber(*window, 1);
  PostNumber(*window, 2);
  std::thread destroyer([&] {
    ASSERT_EQ(entered.get_future().wait_for(std::chrono::seconds(10)), std::future_status::ready);
    window.reset();
    EXPECT_TRUE(handlerReturned);
  });
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 1u);
  destroyer.join();
  EXPECT_EQ(droppedPayloads, 1);
}

// A throw out of a handler would end the process inside the interpreter's
// pending call; it must cost only its own message.
TEST_F(WindowMessages, AHandlerThatThrowsLosesOnlyItsOwnMessage) {
  Journal journal;
  auto window = MakeWindow(journal);
  journal.duringDispatch = [&] {
    if (journal.payloads.size() == 1) throw std::bad_alloc();
  };
  for (int i = 0; i < 3; ++i) PostNumber(*window, i);
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 3u);
  EXPECT_EQ(journal.payloads, (std::vector<std::intptr_t>{0, 1, 2}));
  PostNumber(*window, 3);
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 1u);
}

TEST_F(WindowMessages, MessagesOfAThreadThatNeverDispatchesAreFreedWithItsWindows) {
  std::thread owner([] {
    Journal journal;
    auto window = ui::Window::Create(L"Test Window");
    window->SetUserData(&journal);
    for (int i = 0; i < 4; ++i) PostNumber(*window, i);
  });
  owner.join();
  EXPECT_EQ(droppedPayloads, 4);
}

TEST(WindowClasses, KeepTheirFirstRegistrationAndUnknownClassesMakeNoWindow) {
  auto first = [](ui::Window&, std::uint32_t, std::uintptr_t, std::intptr_t) -> std::intptr_t { return 1; };
  auto second = [](ui::Window&, std::uint32_t, std::uintptr_t, std::intptr_t) -> std::intptr_t { return 2; };
  EXPECT_TRUE(ui::RegisterWindowClass(L"Once", first));
  EXPECT_FALSE(ui::RegisterWindowClass(L"Once", second));
  EXPECT_EQ(ui::Window::Create(L"Never registered"), nullptr);

  static std::intptr_t answer = 0;
  ui::RegisterWindowClass(L"Answering", [](ui::Window& w, std::uint32_t m, std::uintptr_t p, std::intptr_t l) {
    answer = w.ClassName() == L"Answering" ? static_cast<std::intptr_t>(m + p + l) : -1;
    return answer;
  });
  auto window = ui::Window::Create(L"Answering");
  window->Post(1, 2, 3);
  ui::MessageQueue::DispatchPending();
  EXPECT_EQ(answer, 6);
}

}  // namespace
