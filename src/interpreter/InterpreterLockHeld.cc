#include "interpreter/InterpreterLockHeld.h"

#include "interpreter/PythonApi.h"

bool InterpreterLockHeld() { return python_api::ThisThreadHoldsLock(); }
