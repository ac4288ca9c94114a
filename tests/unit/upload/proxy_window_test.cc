// The hand-over of upload events from the worker thread to the window's thread.
#include "upload/CUploadProgressProxyWindow.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "platform/message_queue.h"
#include "platform/text.h"

namespace {

// Writes down each event it receives, and on which thread.
class Target : public BackgroundUploadProgress {
 public:
  std::vector<std::string> log;
  std::vector<std::thread::id> threads;
  std::atomic<bool> cancelled{false};
  std::unique_ptr<CUploadProgressProxyWindow>* destroyOnCompletion = nullptr;

  void OnResolvingName(const wchar_t* text) override { Note("ResolvingName", text); }
  void OnNameResolved(const wchar_t* text) override { Note("NameResolved", text); }
  void OnConnectingToServer(const wchar_t* text) override { Note("Connecting", text); }
  void OnConnectedToServer(const wchar_t* text) override { Note("Connected", text); }
  void OnSendingRequest() override { Note("SendingRequest"); }
  void OnRequestSent(std::uint32_t bytes) override { Note("RequestSent", bytes); }
  void OnReceivingResponse() override { Note("ReceivingResponse"); }
  void OnResponseReceived(std::uint32_t bytes) override { Note("ResponseReceived", bytes); }
  void OnClosingConnection() override { Note("Closing"); }
  void OnConnectionClosed() override { Note("Closed"); }
  void OnFileBegin(const wchar_t* path) override { Note("FileBegin", path); }
  void OnFileProgress(const wchar_t* path, std::uint32_t a, std::uint32_t b, std::uint32_t c,
                      std::uint32_t d, std::uint32_t e, std::uint32_t f, std::uint32_t g) override {
    Note("FileProgress", path, a, b, c, d, e, f, g);
  }
  void OnFileComplete(const wchar_t* path, std::int32_t result) override {
    Note("FileComplete", path, result);
  }
  bool IsCancelled() override { return cancelled; }
  void OnReservedEvent() override { Note("Reserved"); }
  void OnBackgroundUploadComplete(std::int32_t result) override {
    Note("Complete", result);
    if (destroyOnCompletion) destroyOnCompletion->reset();
  }

 private:
  template <typename... Values>
  void Note(const char* event, const Values&... values) {
    std::ostringstream line;
    line << event;
    ((line << ' ' << Text(values)), ...);
    log.push_back(line.str());
    threads.push_back(std::this_thread::get_id());
  }
  static std::string Text(const wchar_t* text) { return text::WideToUtf8(text::WideView(text)); }
  template <typename Number>
  static Number Text(Number value) {
    return value;
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
    "Connecting 127.0.0.5",
    "Connected 127.0.0.5",
    "SendingRequest",
    "RequestSent 321",
    "FileBegin /tmp/preset",
    "FileProgress /tmp/preset 1 2 3 4 5 6 7",
    "FileComplete /tmp/preset -2147024894",
    "ReceivingResponse",
    "ResponseReceived 654",
    "Closing",
    "Closed",
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
  EXPECT_TRUE(target.log.empty());  // nothing runs before the owner dispatches
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), kEveryEvent.size());
  EXPECT_EQ(target.log, kEveryEvent);
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
  EXPECT_EQ(target.log, Without(kEveryEvent, {"SendingRequest", "RequestSent 321"}));

  target.log.clear();
  proxy->SetEventFilter(CUploadProgressProxyWindow::kForwardRequestSent);
  RaiseOnWorker();
  ui::MessageQueue::DispatchPending();
  EXPECT_EQ(target.log, Without(kEveryEvent, {"SendingRequest"}));
}

TEST_F(ProxyWindowTest, TheCancelPollIsAnsweredAtOnceWithoutAMessage) {
  ASSERT_TRUE(proxy->CreateHiddenWindow());
  std::vector<bool> answers;
  std::thread worker([&] {
    answers.push_back(proxy->IsCancelled());
    target.cancelled = true;
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
  EXPECT_TRUE(target.log.empty());

  RaiseOnWorker();  // without a window the events go nowhere
  proxy.reset();
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), 0u);
  EXPECT_TRUE(target.log.empty());
}

TEST_F(ProxyWindowTest, TheCompletionHandlerMayDestroyTheProxyItRunsIn) {
  ASSERT_TRUE(proxy->CreateHiddenWindow());
  target.destroyOnCompletion = &proxy;
  RaiseOnWorker();
  EXPECT_EQ(ui::MessageQueue::DispatchPending(), kEveryEvent.size());
  EXPECT_EQ(proxy, nullptr);
  EXPECT_EQ(target.log.back(), "Complete -2147220735");
}

}  // namespace
