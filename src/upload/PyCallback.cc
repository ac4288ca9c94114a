#include <Python.h>

#include "upload/PyCallback.h"

#include <cstring>
#include <string>

#include "interpreter/GilStateGuard.h"

namespace upload {

PyCallback::~PyCallback() { SetCallback(nullptr); }

void PyCallback::SetCallback(PyObject* callable) {
  PyObject* replaced = callback;
  callback = (callable == nullptr || callable == Py_None) ? nullptr : callable;
  Py_XINCREF(callback);
  // Released last: letting go of the old callable may run arbitrary Python code.
  Py_XDECREF(replaced);
}

void PyCallback::Call(const char* format, ...) {
  if (callback == nullptr) return;
  interpreter::GilStateGuard lock;
  std::va_list args;
  va_start(args, format);
  PyObject* result = CallV(format, args);
  va_end(args);
  Py_XDECREF(result);
}

PyObject* PyCallback::CallV(const char* format, std::va_list args) {
  if (callback == nullptr) return nullptr;
  PyObject* arguments = nullptr;
  if (format != nullptr && *format != '\0') {
    // A single item would build a bare value; the callable always gets a tuple.
    const std::string tupleFormat = std::strlen(format) == 1 ? std::string("(") + format + ")" : format;
    arguments = Py_VaBuildValue(const_cast<char*>(tupleFormat.c_str()), args);
    if (arguments == nullptr) {
      // Arguments that cannot be built are reported; the callable is not
      // called with arguments it was never meant to receive.
      PyErr_Print();
      return nullptr;
    }
  }
  // Held for the call: the callable may unregister or replace itself, or drop
  // the object that holds it, while it runs.
  PyObject* const callable = callback;
  Py_INCREF(callable);
  PyObject* result = PyObject_CallObject(callable, arguments);
  Py_XDECREF(arguments);
  if (PyErr_Occurred()) PyErr_Print();
  Py_DECREF(callable);
  return result;
}

}  // namespace upload
