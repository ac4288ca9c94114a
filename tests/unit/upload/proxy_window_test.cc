// The hand-over of upload events from the worker thread to the window's thread.
#include "upload/CUploadProgressProxyWindow.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "platform/message_queue.h"
#include "support/recording_listener.h"

namespace {

// Writes down each event it receives, and on which thread.
class Target : public test_support::BasicRecordingListener<BackgroundUploadProgress> {
 public:
  std::unique_ptr<CUploadProgressProxyWindow>* destroyOnCompletion = nullptr;

  void OnReservedEvent() override { Add("Reserved"); }
  void OnBackgroundUploadComplete(std::int32_t result) override {
    Add("Complete " + std::to_string(result));
    if (destroyOnCompletion) destroyOnCompletion->reset();
  }
};

// Every event, raised once each, with arguments in buffers that are changed
// right after each event has been raised.
void RaiseEveryEvent(BackgroundUploadProgress& listener) {
  std::wstring buffer = L"host";
  auto raiseWith = [&](void (BackgroundUploadProgress::*event)(const wchar_t*)) {
    (listener.*event)(buffer.c_str());
    buffer.assign(buffer.size(), L'#');
  };
  raiseWith(&BackgroundUploadProgress::OnResolvingName);
  buffer = L"127.0.0.5";
  raiseWith(&BackgroundUploadProgress::OnNameResolved);
  buffer = L"127.0.0.5";
  raiseWith(&BackgroundUploadProgress::OnConnectingToServer);
  buffer = L"127.0.0.5";
  raiseWith(&BackgroundUploadProgress::OnConnectedToServer);
  listener.OnSendingRequest();
  listener.OnRequestSent(321);
  buffer = L"/tmp/preset";
  raiseWith(&BackgroundUploadProgress::OnFileBegin);
  buffer = L"/tmp/preset";
  listener.OnFileProgress(buffer.c_str(), 1, 2, 3, 4, 5, 6, 7);
  listener.OnFileComplete(buffer.c_str(), -2147024894);
  buffer.clear();
  listener.OnReceivingResponse();
  listener.OnResponseReceived(654);
  listener.OnClosingConnection();
  listener.OnConnectionClosed();
  listener.OnReservedEvent();
  listener.OnBackgroundUploadComplete(-2147220735);
}

const std::vector<std::string> kEveryEvent = {
    "ResolvingName host",
    "NameResolved 127.0.0.5",
    "ConnectingToServer 127.0.0.5",
    "ConnectedToServer 127.0.0.5",
    "SendingRequest",
    "RequestSent 321",
    "FileBegin /tmp/preset",
    "FileProgress /tmp/preset 1 2 3 4 5 6 7",
    "FileComplete /tmp/preset 0x80070002",
    "ReceivingResponse",
    "ResponseReceived 654",
    "ClosingConnection",
    "ConnectionClosed",
    "Reserved",
    "Complete -2147220735",
};

std::vector<std::string> Without(std::vector<std::string> events,
                                 const std::vector<std::string>& dropped) {
  for (const std::string& d : dropped) events.erase(std::find(events.begin(), events.end(), d));
  return events;
}

class ProxyWindowTest : public ::testing::Test {
 protected:
  void SetUp() override { ui::MessageQueue::DispatchPending(); }  // nothing left from others

  void RaiseOnWorker() {
    std::thread worker([this] { RaiseEveryEvent(*proxy); });
    worker.join();
  }

  Target target;
  std::unique_ptr<CUploadProgressProxyWindow> proxy =
      std::make_unique<CUploadProgressProxyWindow>(&target);
};

TEST_F(ProxyWindowTest, EventsArriveInOrderOnTheWindowsThreadWithTheirArgumentsCopied) {
  ASSERT_TRUE(proxy->CreateHiddenWindow());
  RaiseOnWorker();
  EXPECT_TRUE(target.events.empty());  // nothing runs before the owner dispatches
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), kEveryEvent.size());
  EXPECT_EQ(target.events, kEveryEvent);
  for (const std::thread::id& thread : target.threads)
    EXPECT_EQ(thread, std::this_thread::get_id());
}

TEST_F(ProxyWindowTest, TheFilterDropsOnlyTheTwoRequestNotifications) {
  proxy->SetEventFilter(proxy->GetEventFilter() &
                        ~(CUploadProgressProxyWindow::kForwardSendingRequest |
                          CUploadProgressProxyWindow::kForwardRequestSent));
  ASSERT_TRUE(proxy->CreateHiddenWindow());
  RaiseOnWorker();
  ui::MessageQueue::DispatchPending();
  EXPECT_EQ(target.events, Without(kEveryEvent, {"SendingRequest", "RequestSent 321"}));

  target.events.clear();
  proxy->SetEventFilter(CUploadProgressProxyWindow::kForwardRequestSent);
  RaiseOnWorker();
  ui::MessageQueue::DispatchPending();
  EXPECT_EQ(target.events, Without(kEveryEvent, {"SendingRequest"}));
}

TEST_F(ProxyWindowTest, TheCancelPollIsAnsweredAtOnceWithoutAMessage) {
  ASSERT_TRUE(proxy->CreateHiddenWindow());
  target.cancelAt = [](int poll) { return poll == 2; };
  std::vector<bool> answers;
  std::thread worker([&] {
    answers.push_back(proxy->IsCancelled());
    answers.push_back(proxy->IsCancelled());
  });
  worker.join();
  EXPECT_EQ(answers, (std::vector<bool>{false, true}));
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 0u);
}

TEST_F(ProxyWindowTest, CommandsQueuedWhenTheWindowIsDestroyedNeverRun) {
  ASSERT_TRUE(proxy->CreateHiddenWindow());
  RaiseOnWorker();
  proxy->DestroyWindow();  // the leak checker sees the dropped commands freed
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 0u);
  EXPECT_TRUE(target.events.empty());

  RaiseOnWorker();  // without a window the events go nowhere
  proxy.reset();
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 0u);
  EXPECT_TRUE(target.events.empty());
}

TEST_F(ProxyWindowTest, TheCompletionHandlerMayDestroyTheProxyItRunsIn) {
  ASSERT_TRUE(proxy->CreateHiddenWindow());
  target.destroyOnCompletion = &proxy;
  RaiseOnWorker();
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), kEveryEvent.size());
  EXPECT_EQ(proxy, nullptr);
  EXPECT_EQ(target.events.back(), "Complete -2147220735");
}

}  // namespace
