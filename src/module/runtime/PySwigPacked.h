// The packed-data object: a heap copy of a native value with its type. This module
// makes none itself; the type lets other modules' packed objects compare, print and
// free themselves in the shared scheme.
#pragma once

#include <Python.h>

#include <cstddef>

#include "module/runtime/TypeInfo.h"

namespace runtime {

struct PySwigPacked {
  PyObject_HEAD
  void* data;  // owned copy
  TypeInfo* type;
  size_t size;
};

PyTypeObject* PySwigPackedType();
bool IsPySwigPacked(PyObject* object);

// A packed object holding a copy of `size` bytes at `data`.
PyObject* NewPySwigPacked(const void* data, size_t size, TypeInfo* type);

}  // namespace runtime
