#include <Python.h>

#include "upload/PendingCallPump.h"

#include <chrono>
#include <thread>

#include "interpreter/MainThreadNudge.h"
#include "interpreter/PythonApi.h"
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

// An interpreter that has gone away runs nothing more: the queue stays undrained.
// Every attempt, taken or refused, may leave the main thread not looking at its
// pending calls, so each is followed by a nudge.
void ScheduleDrain() {
  while (interpreter::TakesPendingCalls()) {
    const bool taken = Py_AddPendingCall(&DrainMainThreadQueue, nullptr) == 0;
    interpreter::NudgeMainThread();
    if (taken) return;
    std::this_thread::sleep_for(kRefusedRetryDelay);
  }
}

}  // namespace

void InstallPendingCallPump() {
  interpreter::PrepareMainThreadNudge();
  platform::MessageQueue::ForCurrentThread()->SetWakeHandler(&ScheduleDrain);
}

}  // namespace upload
