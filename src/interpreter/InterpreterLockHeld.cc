#include <Python.h>

#include "interpreter/InterpreterLockHeld.h"

namespace interpreter {

bool InterpreterLockHeld() {
  PyThreadState* mine = PyGILState_GetThisThreadState();
  return mine != nullptr && mine == _PyThreadState_Current;
}

}  // namespace interpreter
