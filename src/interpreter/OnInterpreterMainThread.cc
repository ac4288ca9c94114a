#include <Python.h>
#include <pythread.h>

#include "interpreter/OnInterpreterMainThread.h"

namespace interpreter {

// Thread states are listed newest first, so the last one belongs to the thread
// that initialised the interpreter: its main thread.
bool OnInterpreterMainThread() {
  PyThreadState* oldest = PyInterpreterState_ThreadHead(PyThreadState_Get()->interp);
  if (oldest == nullptr) return false;
  while (PyThreadState* next = PyThreadState_Next(oldest)) oldest = next;
  return oldest->thread_id == PyThread_get_thread_ident();
}

}  // namespace interpreter
