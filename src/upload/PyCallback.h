#pragma once

#include <cstdarg>

struct _object;
typedef struct _object PyObject;

namespace upload {

// One registered Python callable, called with arguments built from a
// Py_BuildValue format. The callable's exceptions are printed and cleared.
class PyCallback {
 public:
  PyCallback() = default;
  virtual ~PyCallback();
  PyCallback(const PyCallback&) = delete;
  PyCallback& operator=(const PyCallback&) = delete;

  // Registers `callable`; null or None unregisters. Needs the interpreter lock.
  void SetCallback(PyObject* callable);

  // Calls the callable under the interpreter lock (taken if need be) and drops
  // its result; without a callable it does nothing. A one-character format
  // still passes a 1-tuple; an empty one passes no arguments.
  void Call(const char* format, ...);

  // The same with the lock held; returns the callable's result (a new
  // reference) or null.
  PyObject* CallV(const char* format, std::va_list args);

 protected:
  PyObject* callback = nullptr;  // owned reference; never None
};

}  // namespace upload
