#include "interpreter/InterpreterLockHeld.h"

#include "interpreter/PythonApi.h"

namespace interpreter {

bool InterpreterLockHeld() { return python_api::ThisThreadHoldsLock(); }

}  // namespace interpreter
