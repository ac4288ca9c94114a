// The hand-over from the worker to the UI thread: the worker thread's start
// gate, window message queues, the pump that drains them whenever the main
// thread runs Python code, the proxy window that copies every upload event
// into a message, and the percentages the uploader reports.
// ctest timeout: 90
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <functional>
#include <future>
#include <numeric>

#include "fixtures.h"
#include "platform/message_queue.h"
#include "platform/window.h"
#include "upload/CUploadProgressProxyWindow.h"
#include "upload/PendingCallPump.h"
#include "upload/PyPresetUploader.h"
#include "upload/Thread.h"

namespace {

using namespace test_support;
using Lines = std::vector<std::string>;
constexpr std::uint32_t kMessage = 0x802A;

// Busy threads on every core make it likely that the starting thread is
// preempted between creating the thread and storing what it got. A body that
// throws would end the process: its thread ends with kRunFailed instead.
TEST(WorkerThread, RunBeginsOnlyAfterHandleAndIdAreStoredAndJoinGivesItsResultOnce) {
  struct Probe : upload::Thread {
    bool throws = false;
    std::atomic<bool> sawItself{false};
    std::uint32_t Run() override {
      if (throws) throw std::bad_alloc();
      sawItself = HasHandle() && ThreadId() == std::this_thread::get_id();
      return 0x80040301u;
    }
  };
  std::atomic<bool> busy{true};
  std::vector<std::thread> spinners;
  for (unsigned i = 0; i < std::max(2u, std::thread::hardware_concurrency()); ++i) {
    spinners.emplace_back([&] { while (busy) {} });
  }
  for (int i = 0; i < 2000; ++i) {
    Probe thread;
    ASSERT_TRUE(thread.Start());
    ASSERT_EQ(thread.Join(), 0x80040301u);
    ASSERT_TRUE(thread.sawItself) << "start " << i;
    ASSERT_EQ(thread.Join(), 0u);
  }
  busy = false;
  for (std::thread& spinner : spinners) spinner.join();
  EXPECT_EQ(Probe().Join(), 0u) << "a thread never started joins at once";
  Probe throwing;
  throwing.throws = true;
  ASSERT_TRUE(throwing.Start());
  EXPECT_EQ(throwing.Join(), upload::Thread::kRunFailed);
}

// What a test window saw, reached through its user data.
struct Journal {
  std::vector<std::intptr_t> payloads;
  bool onOwner = true;
  std::thread::id owner = std::this_thread::get_id();
  std::unique_ptr<platform::Window>* destroyOnFirst = nullptr;  // by its own handler
  std::function<void()> duringDispatch = [] {};            // run inside each handler
};

std::atomic<int> g_dropped{0};

std::intptr_t Record(platform::Window& window, std::uint32_t, std::uintptr_t, std::intptr_t lparam) {
  auto* journal = static_cast<Journal*>(window.UserData());
  journal->onOwner = journal->onOwner && std::this_thread::get_id() == journal->owner;
  journal->payloads.push_back(*reinterpret_cast<int*>(lparam));
  delete reinterpret_cast<int*>(lparam);  // the handler owns what it is given
  if (journal->destroyOnFirst) std::exchange(journal->destroyOnFirst, nullptr)->reset();
  journal->duringDispatch();
  return 0;
}

void PostNumber(platform::Window& window, int number) {
  window.Post(kMessage, 0, reinterpret_cast<std::intptr_t>(new int(number)), [](std::intptr_t lparam) {
    delete reinterpret_cast<int*>(lparam);
    ++g_dropped;
  });
}

class Windows : public ::testing::Test {
 protected:
  static void SetUpTestSuite() {
    StartPython();
    platform::RegisterWindowClass(L"Test Window", &Record);
  }
  void SetUp() override { g_dropped = 0; }
  std::unique_ptr<platform::Window> MakeWindow(Journal& journal) {
    auto window = platform::Window::Create(L"Test Window");
    window->SetUserData(&journal);
    return window;
  }
};

// Leak checkers see whether dropped messages are freed.
TEST_F(Windows, DestroyingAWindowDropsItsMessagesAndAHandlerMayDestroyItsOwn) {
  Journal kept, gone, self;
  auto keptWindow = MakeWindow(kept), goneWindow = MakeWindow(gone), selfWindow = MakeWindow(self);
  self.destroyOnFirst = &selfWindow;
  for (int i = 0; i < 3; ++i) {
    PostNumber(*goneWindow, 100 + i);
    PostNumber(*selfWindow, 10 + i);
    PostNumber(*keptWindow, i);
  }
  goneWindow.reset();
  EXPECT_EQ(g_dropped, 3);
  EXPECT_EQ(platform::MessageQueue::DispatchPending(), 4u);
  EXPECT_EQ((std::vector{kept.payloads, gone.payloads, self.payloads}),
            (std::vector<std::vector<std::intptr_t>>{{0, 1, 2}, {}, {10}}));
  EXPECT_EQ((std::pair{selfWindow.get(), g_dropped.load()}), (std::pair{(platform::Window*)nullptr, 5}));
  std::thread([] {
    auto window = platform::Window::Create(L"Test Window");
    for (int i = 0; i < 4; ++i) PostNumber(*window, i);
  }).join();
  EXPECT_EQ(g_dropped, 9) << "a thread that never dispatches frees its messages with its windows";
}

// A throw out of a handler would end the process inside the interpreter's
// pending call: it costs only its own message. A window destroyed on another
// thread waits for the dispatch under way and drops the rest.
TEST_F(Windows, AThrowingHandlerLosesOnlyItsMessageAndADestroyWaitsForTheDispatchUnderWay) {
  Journal journal;
  auto window = MakeWindow(journal);
  journal.duringDispatch = [&] { if (journal.payloads.size() == 1) throw std::bad_alloc(); };
  for (int i = 0; i < 3; ++i) PostNumber(*window, i);
  EXPECT_EQ(platform::MessageQueue::DispatchPending(), 3u);
  EXPECT_EQ(journal.payloads, (std::vector<std::intptr_t>{0, 1, 2}));
  std::promise<void> entered;
  std::atomic<bool> returned{false};
  journal.duringDispatch = [&] {
    entered.set_value();
    std::this_thread::sleep_for(std::chrono::milliseconds(50));  // the other thread reaches the destruction
    returned = true;
    journal.duringDispatch = [] {};
  };
  PostNumber(*window, 3);
  PostNumber(*window, 4);
  std::thread destroyer([&] {
    ASSERT_EQ(entered.get_future().wait_for(std::chrono::seconds(10)), std::future_status::ready);
    window.reset();
    EXPECT_TRUE(returned);
  });
  EXPECT_EQ(platform::MessageQueue::DispatchPending(), 1u);
  destroyer.join();
  EXPECT_EQ(g_dropped, 1);
}

// Posted from a worker, thousands arrive in order while the main thread only
// runs Python code; a post that the full pending-call queue refuses is retried.
TEST_F(Windows, ThePumpDeliversEveryPostInOrderWhenPythonRunsEvenAfterARefusal) {
  upload::InstallPendingCallPump();
  static std::atomic<int> othersRun{0};
  int others = 0;
  while (Py_AddPendingCall([](void*) { return ++othersRun, 0; }, nullptr) == 0) ++others;
  Journal journal;
  auto window = MakeWindow(journal);
  constexpr int kPosts = 20000;
  std::atomic<int> posted{0};
  std::thread worker([&] {
    for (int i = 0; i < kPosts; ++i, ++posted) PostNumber(*window, i);
  });
  std::this_thread::sleep_for(std::chrono::milliseconds(100));
  EXPECT_EQ(posted, 0) << "the first post keeps retrying while the queue is full";
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
  // The loop never lets go of the lock: a registration from another thread must
  // reach a main thread that only runs Python code.
  while (journal.payloads.size() < kPosts && std::chrono::steady_clock::now() < deadline) {
    ASSERT_EQ(PyRun_SimpleString("for i in range(200): pass"), 0);
  }
  const std::size_t deliveredWhileSpinning = journal.payloads.size();
  // Letting go of the lock frees a worker still retrying, so that a failure ends.
  while (posted < kPosts) ASSERT_EQ(PyRun_SimpleString("import time; time.sleep(0.001)"), 0);
  worker.join();
  std::vector<std::intptr_t> inOrder(kPosts);
  std::iota(inOrder.begin(), inOrder.end(), 0);
  EXPECT_EQ(deliveredWhileSpinning, inOrder.size());
  EXPECT_EQ(journal.payloads, inOrder);
  EXPECT_TRUE(journal.onOwner);
  EXPECT_EQ(othersRun, others);
}

class Target : public RecordingListener<transport::BackgroundUploadProgress> {
 public:
  std::unique_ptr<upload::CUploadProgressProxyWindow>* destroyOnCompletion = nullptr;
  void OnReservedEvent() override { Add("Reserved"); }
  void OnBackgroundUploadComplete(std::int32_t result) override {
    Add("Complete", nullptr, {static_cast<std::uint32_t>(result)});
    if (destroyOnCompletion) destroyOnCompletion->reset();
  }
};

// Every event once, from a worker, with its text in a buffer overwritten right after.
void RaiseEveryEvent(upload::CUploadProgressProxyWindow& proxy) {
  std::thread([&] {
    std::wstring buffer;
    auto with = [&](const wchar_t* text) { return (buffer = text).c_str(); };
    proxy.OnResolvingName(with(L"host"));
    proxy.OnNameResolved(with(L"127.0.0.5"));
    proxy.OnConnectingToServer(with(L"127.0.0.6"));
    proxy.OnConnectedToServer(with(L"127.0.0.7"));
    proxy.OnSendingRequest();
    proxy.OnRequestSent(321);
    proxy.OnFileBegin(with(L"/tmp/a"));
    proxy.OnFileProgress(with(L"/tmp/b"), 1, 2, 3, 4, 5, 6, 7);
    proxy.OnFileComplete(with(L"/tmp/c"), -2147024894);
    buffer.assign(buffer.size(), L'#');
    proxy.OnReceivingResponse();
    proxy.OnResponseReceived(654);
    proxy.OnClosingConnection();
    proxy.OnConnectionClosed();
    proxy.OnReservedEvent();
    proxy.OnBackgroundUploadComplete(7);
  }).join();
}

const Lines kEveryEvent = {
    "ResolvingName host", "NameResolved 127.0.0.5", "ConnectingToServer 127.0.0.6", "ConnectedToServer 127.0.0.7",
    "SendingRequest", "RequestSent 321", "FileBegin /tmp/a", "FileProgress /tmp/b 1 2 3 4 5 6 7",
    "FileComplete /tmp/c 0x80070002", "ReceivingResponse", "ResponseReceived 654", "ClosingConnection",
    "ConnectionClosed", "Reserved", "Complete 7"};

TEST_F(Windows, TheProxyCopiesEveryEventToTheWindowsThreadAndAnswersTheCancelPollAtOnce) {
  Target target;
  auto proxy = std::make_unique<upload::CUploadProgressProxyWindow>(&target);
  ASSERT_TRUE(proxy->CreateHiddenWindow());
  RaiseEveryEvent(*proxy);
  EXPECT_EQ(platform::MessageQueue::DispatchPending(), kEveryEvent.size());
  EXPECT_EQ(target.events, kEveryEvent);
  EXPECT_EQ(target.threads, std::vector(kEveryEvent.size(), std::this_thread::get_id()));

  target.events.clear();
  proxy->SetEventFilter(upload::CUploadProgressProxyWindow::kForwardRequestSent);  // all but SendingRequest
  target.cancelAt = [](int poll) { return poll == 2; };
  std::vector<bool> answers;
  std::thread([&] { answers = {proxy->IsCancelled(), proxy->IsCancelled()}; }).join();
  EXPECT_EQ(answers, (std::vector<bool>{false, true}));
  target.destroyOnCompletion = &proxy;
  RaiseEveryEvent(*proxy);
  EXPECT_EQ(platform::MessageQueue::DispatchPending(), kEveryEvent.size() - 1);
  EXPECT_EQ(proxy, nullptr) << "the completion handler may destroy the proxy it runs in";
  Lines filtered = kEveryEvent;
  filtered.erase(filtered.begin() + 4);
  EXPECT_EQ(target.events, filtered);
  Target untouched;
  upload::CUploadProgressProxyWindow destroyed(&untouched);
  ASSERT_TRUE(destroyed.CreateHiddenWindow());
  RaiseEveryEvent(destroyed);
  destroyed.DestroyWindow();  // leak checkers see the dropped commands freed
  RaiseEveryEvent(destroyed);  // without a window the events go nowhere
  EXPECT_EQ((std::pair{platform::MessageQueue::DispatchPending(), untouched.events.size()}), (std::pair{0ul, 0ul}));
}

TEST_F(Windows, ProgressCarriesTheWholePercentOfAllFilesAndTheFilesTimeLeft) {
  ASSERT_EQ(PyRun_SimpleString("reports = []\ndef record(*args): reports.append(args)"), 0);
  upload::PyPresetUploader uploader(L"api.orbishare.com", L"token", L"5.0", L"Retail", L"uuid");
  uploader.SetCallback(PyDict_GetItemString(PyModule_GetDict(PyImport_AddModule("__main__")), "record"));
  // sent, size, file's time left; nothing to send is all sent, never a division by zero
  for (const auto& [sent, size, left] : std::vector<std::array<std::uint32_t, 3>>{
           {333, 1000, 9}, {2, 3, 1}, {0xFFFFFFFFu, 0xFFFFFFFFu, 0}, {0, 0, 0}}) {
    uploader.OnFileProgress(L"/tmp/p", 1, 2, left, sent, size, 3, 4);
  }
  uploader.OnBackgroundUploadComplete(0);
  // Compared as repr, so that the texts' and numbers' types count too (unicode and
  // int on 2.7, str and int on 3).
  ASSERT_EQ(PyRun_SimpleString("assert repr(reports) == repr(["
            "(u'PROGRESS', u'ProgressChanged', 33, 9), (u'PROGRESS', u'ProgressChanged', 66, 1), "
            "(u'PROGRESS', u'ProgressChanged', 100, 0), (u'PROGRESS', u'ProgressChanged', 100, 0), "
            "(u'PROGRESS', u'UploadComplete', 100, 0, u'', u'')]), repr(reports)"), 0);
}

}  // namespace
