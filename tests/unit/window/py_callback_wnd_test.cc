#include "upload/PyCallbackWnd.h"

#include <gtest/gtest.h>

#include <vector>

#include "platform/message_queue.h"
#include "support/embedded_python.h"

namespace {

constexpr std::uint32_t kMessage = 0x8003;

class RecordingWnd : public PyCallbackWnd {
 public:
  using PyCallbackWnd::PyCallbackWnd;
  std::intptr_t WindowProc(std::uint32_t message, std::uintptr_t wparam, std::intptr_t lparam) override {
    received.push_back(static_cast<std::intptr_t>(message + wparam + lparam));
    return 0;
  }
  ui::Window& window() { return *hwnd; }
  std::uint32_t mark() const { return liveMark; }

  std::vector<std::intptr_t> received;
};

TEST(PyCallbackWndTest, EachObjectHasItsOwnWindowOfTheSharedClassAndGetsItsMessages) {
  RecordingWnd target, bystander;
  EXPECT_EQ(target.window().ClassName(), L"Callback Window");
  EXPECT_EQ(bystander.window().ClassName(), L"Callback Window");
  EXPECT_EQ(target.window().UserData(), &target);
  EXPECT_EQ(target.mark(), PyCallbackWnd::kLiveMark);
  EXPECT_EQ(RecordingWnd(L"Named Callback Window").window().ClassName(), L"Named Callback Window");

  target.window().Post(kMessage, 1, 2);
  ui::MessageQueue::DispatchPending();
  EXPECT_EQ(target.received, (std::vector<std::intptr_t>{kMessage + 3}));
  EXPECT_TRUE(bystander.received.empty());
}

TEST(PyCallbackWndTest, AWindowWithoutItsObjectGetsDefaultProcessing) {
  RecordingWnd object;
  object.window().SetUserData(nullptr);
  object.window().Post(kMessage, 0, 0);
  ui::MessageQueue::DispatchPending();
  EXPECT_TRUE(object.received.empty());
}

TEST(PyCallbackWndTest, MessagesQueuedForADestroyedObjectAreNeverDelivered) {
  {
    RecordingWnd doomed;
    doomed.window().Post(kMessage, 0, 0);
  }
  RecordingWnd survivor;
  survivor.window().Post(kMessage, 0, 1);
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 1u);
  EXPECT_EQ(survivor.received, (std::vector<std::intptr_t>{kMessage + 1}));
}

}  // namespace
