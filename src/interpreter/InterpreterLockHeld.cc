#include "interpreter/InterpreterLockHeld.h"

#include "interpreter/PythonApi.h"

namespace interpreter {

bool InterpreterLockHeld() { return interpreter::ThisThreadHoldsLock(); }

}  // namespace interpreter
