#include <Python.h>

#include "upload/PendingCallPump.h"

#include <chrono>
#include <thread>

#include "interpreter/PythonApi.h"
#include "platform/message_queue.h"

namespace {

// The interpreter's pending-call queue is small and only tried, never waited
// for; a refused registration is repeated until it is taken.
constexpr auto kRefusedRetryDelay = std::chrono::milliseconds(1);

// Pending calls run on the interpreter's main thread, so this drains its queue.
int DrainMainThreadQueue(void*) {
  ui::MessageQueue::DispatchPending();
  return 0;
}

// An interpreter that has gone away runs nothing more: the queue stays undrained.
void ScheduleDrain() {
  while (python_api::TakesPendingCalls() &&
         Py_AddPendingCall(&DrainMainThreadQueue, nullptr) != 0) {
    std::this_thread::sleep_for(kRefusedRetryDelay);
  }
}

}  // namespace

void InstallPendingCallPump() { ui::MessageQueue::ForCurrentThread()->SetWakeHandler(&ScheduleDrain); }
