#include <Python.h>

#include "upload/AllowThreadsGuard.h"

#include "upload/InterpreterLockHeld.h"

AllowThreadsGuard::AllowThreadsGuard()
    : savedThreadState_(InterpreterLockHeld() ? PyEval_SaveThread() : nullptr) {}

AllowThreadsGuard::~AllowThreadsGuard() {
  if (savedThreadState_ != nullptr) PyEval_RestoreThread(savedThreadState_);
}
