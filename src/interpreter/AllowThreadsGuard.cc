#include <Python.h>

#include "interpreter/AllowThreadsGuard.h"

#include "interpreter/InterpreterLockHeld.h"
#include "interpreter/ParkIfStopped.h"

void* AllowThreadsGuard::ReleaseInterpreterLock() {
  return InterpreterLockHeld() ? PyEval_SaveThread() : nullptr;
}

void AllowThreadsGuard::RetakeInterpreterLock(void* released) {
  if (released == nullptr) return;
  ParkIfStopped([released] { PyEval_RestoreThread(static_cast<PyThreadState*>(released)); });
}
