// Test support: Python objects made by test code, held for the test's scope.
#pragma once

#include <Python.h>

#include <gtest/gtest.h>

#include <string>

namespace test_support {

// A new reference, released when the holder goes away.
class PyRef {
 public:
  explicit PyRef(PyObject* object = nullptr) : object_(object) {}
  ~PyRef() { Py_XDECREF(object_); }
  PyRef(const PyRef&) = delete;
  PyRef& operator=(const PyRef&) = delete;
  PyObject* get() const { return object_; }

 private:
  PyObject* object_;
};

// The value of a Python expression evaluated in __main__, as its repr.
inline std::string EvalRepr(const char* expression) {
  PyObject* globals = PyModule_GetDict(PyImport_AddModule("__main__"));
  PyRef value(PyRun_String(expression, Py_eval_input, globals, globals));
  if (value.get() == nullptr) {
    PyErr_Print();
    return "<error>";
  }
  PyRef repr(PyObject_Repr(value.get()));
  return PyString_AsString(repr.get());
}

}  // namespace test_support
