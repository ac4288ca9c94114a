#include <Python.h>

#include "interpreter/InterpreterLockHeld.h"

bool InterpreterLockHeld() {
  PyThreadState* mine = PyGILState_GetThisThreadState();
  return mine != nullptr && mine == _PyThreadState_Current;
}
