#pragma once

namespace interpreter {

// True when the calling thread holds the Python interpreter lock.
bool InterpreterLockHeld();

}  // namespace interpreter
