#pragma once

// True when the calling thread holds the Python interpreter lock.
bool InterpreterLockHeld();
