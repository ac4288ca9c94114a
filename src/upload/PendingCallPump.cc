#include <Python.h>

#include "upload/PendingCallPump.h"

#include <chrono>
#include <thread>

#include "platform/message_queue.h"

namespace upload {

namespace {

// The interpreter's pending-call queue is small and only tried, never waited
// for; a refused registration is repeated until it is taken.
constexpr auto kRefusedRetryDelay = std::chrono::milliseconds(1);

// Pending calls run on the interpreter's main thread, so this drains its queue.
int DrainMainThreadQueue(void*) {
  platform::MessageQueue::DispatchPending();
  return 0;
}

void ScheduleDrain() {
  while (Py_AddPendingCall(&DrainMainThreadQueue, nullptr) != 0) {
    std::this_thread::sleep_for(kRefusedRetryDelay);
  }
}

}  // namespace

void InstallPendingCallPump() { platform::MessageQueue::ForCurrentThread()->SetWakeHandler(&ScheduleDrain); }

}  // namespace upload
