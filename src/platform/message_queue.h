// The message queue of one thread: messages posted to the windows that the thread
// owns wait here, in the order of posting, until the thread dispatches them.
//
// Dispatch is driven from outside: when a post finds no dispatch scheduled, it
// marks one scheduled and calls the queue's wake handler (on the posting thread),
// which must make the owning thread call DispatchPending soon. The mark is
// cleared when a dispatch finds the queue empty, so one wake-up covers every
// message posted until then. Without a wake handler the owner dispatches when it
// chooses to (tests call DispatchPending directly).
#pragma once

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "platform/window.h"

namespace platform {

class MessageQueue {
 public:
  // Arranges a later DispatchPending on the queue's owning thread. Runs on the
  // posting thread, without the queue's lock; it must not wait for the dispatch.
  using WakeHandler = void (*)();

  // The calling thread's queue, made on first use.
  static std::shared_ptr<MessageQueue> ForCurrentThread();

  // Dispatches the messages queued for the calling thread's windows, one at a
  // time and without holding the queue's lock, until the queue is empty.
  // Returns how many were dispatched.
  static std::size_t DispatchPending();

  MessageQueue() = default;
  ~MessageQueue();
  MessageQueue(const MessageQueue&) = delete;
  MessageQueue& operator=(const MessageQueue&) = delete;

  void SetWakeHandler(WakeHandler wake);

 private:
  friend class Window;

  struct Entry {
    Window* window;
    std::uint32_t message;
    std::uintptr_t wparam;
    std::intptr_t lparam;
    PayloadDeleter dropPayload;
  };

  void Post(Window& window, std::uint32_t message, std::uintptr_t wparam, std::intptr_t lparam,
            PayloadDeleter dropPayload);
  // Drops the window's queued messages. On another thread than the owner it
  // also waits for a dispatch to the window that is under way.
  void DropMessagesFor(const Window& window);
  bool TakeNext(Entry& entry);
  void EndDispatch();
  bool Dispatching(const Window& window) const;
  std::size_t Drain();
  static void DispatchOne(const Entry& entry) noexcept;
  static void Drop(std::deque<Entry>& entries);

  const std::thread::id owner_ = std::this_thread::get_id();
  std::mutex lock_;
  std::deque<Entry> entries_;     // guarded by lock_
  bool drainScheduled_ = false;   // guarded by lock_
  WakeHandler wake_ = nullptr;    // guarded by lock_
  // The windows whose procedures run now, innermost last; guarded by lock_.
  std::vector<const Window*> dispatching_;
  std::condition_variable dispatchEnded_;
};

}  // namespace platform
