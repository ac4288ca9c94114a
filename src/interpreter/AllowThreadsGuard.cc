#include <Python.h>

#include "interpreter/AllowThreadsGuard.h"

#include "interpreter/InterpreterLockHeld.h"

namespace interpreter {

void* AllowThreadsGuard::ReleaseInterpreterLock() {
  return InterpreterLockHeld() ? PyEval_SaveThread() : nullptr;
}

void AllowThreadsGuard::RetakeInterpreterLock(void* released) {
  if (released != nullptr) PyEval_RestoreThread(static_cast<PyThreadState*>(released));
}

}  // namespace interpreter
