#include "platform/message_queue.h"

#include <algorithm>
#include <iterator>

namespace platform {

std::shared_ptr<MessageQueue> MessageQueue::ForCurrentThread() {
  thread_local std::shared_ptr<MessageQueue> queue;
  if (!queue) queue = std::make_shared<MessageQueue>();
  return queue;
}

std::size_t MessageQueue::DispatchPending() { return ForCurrentThread()->Drain(); }

MessageQueue::~MessageQueue() { Drop(entries_); }

void MessageQueue::SetWakeHandler(WakeHandler wake) {
  std::lock_guard<std::mutex> lock(lock_);
  wake_ = wake;
}

void MessageQueue::Post(Window& window, std::uint32_t message, std::uintptr_t wparam,
                        std::intptr_t lparam, PayloadDeleter dropPayload) {
  WakeHandler wake = nullptr;
  {
    std::lock_guard<std::mutex> lock(lock_);
    entries_.push_back(Entry{&window, message, wparam, lparam, dropPayload});
    if (!drainScheduled_) {
      drainScheduled_ = true;
      wake = wake_;
    }
  }
  if (wake) wake();
}

// A window destroyed by its own procedure is not waited for: that dispatch
// runs on the owner, below this call.
void MessageQueue::DropMessagesFor(const Window& window) {
  std::deque<Entry> dropped;
  {
    std::unique_lock<std::mutex> lock(lock_);
    const auto kept = std::stable_partition(entries_.begin(), entries_.end(),
                                            [&](const Entry& e) { return e.window != &window; });
    std::move(kept, entries_.end(), std::back_inserter(dropped));
    entries_.erase(kept, entries_.end());
    if (std::this_thread::get_id() != owner_) {
      dispatchEnded_.wait(lock, [&] { return !Dispatching(window); });
    }
  }
  Drop(dropped);  // outside the lock: a payload's destructor may post
}

bool MessageQueue::TakeNext(Entry& entry) {
  std::lock_guard<std::mutex> lock(lock_);
  if (entries_.empty()) {
    drainScheduled_ = false;
    return false;
  }
  entry = entries_.front();
  entries_.pop_front();
  dispatching_.push_back(entry.window);
  return true;
}

void MessageQueue::EndDispatch() {
  std::lock_guard<std::mutex> lock(lock_);
  dispatching_.pop_back();
  dispatchEnded_.notify_all();
}

bool MessageQueue::Dispatching(const Window& window) const {
  return std::find(dispatching_.begin(), dispatching_.end(), &window) != dispatching_.end();
}

// The procedure may destroy its window, or post again: nothing here touches the
// window after the call, and each message is taken under the lock on its own.
std::size_t MessageQueue::Drain() {
  std::size_t dispatched = 0;
  Entry entry;
  while (TakeNext(entry)) {
    DispatchOne(entry);
    EndDispatch();
    ++dispatched;
  }
  return dispatched;
}

// The drain runs inside the interpreter's pending calls, where an exception
// would end the process: a procedure that throws (memory running out) loses
// its own message, and the rest of the queue is still dispatched.
void MessageQueue::DispatchOne(const Entry& entry) noexcept {
  try {
    entry.window->Dispatch(entry.message, entry.wparam, entry.lparam);
  } catch (...) {
  }
}

void MessageQueue::Drop(std::deque<Entry>& entries) {
  for (const Entry& entry : entries) {
    if (entry.dropPayload) entry.dropPayload(entry.lparam);
  }
  entries.clear();
}

}  // namespace platform
