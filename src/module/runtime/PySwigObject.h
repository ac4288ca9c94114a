// The pointer object: a Python object carrying a native address, the type of what it
// points to and whether Python owns it. Its layout is shared with every module of the
// ring, which reads these fields of each other's objects.
#pragma once

#include <Python.h>

#include "module/runtime/TypeInfo.h"

namespace runtime {

struct PySwigObject {
  PyObject_HEAD
  void* ptr;
  TypeInfo* type;
  int own;         // 1: destroying this object destroys the native object
  PyObject* next;  // next link of a chain of "this" objects (built only by append)
};

// This module's type "PySwigObject", made on first use and never freed.
PyTypeObject* PySwigObjectType();

// True for this module's pointer objects and for those of other modules of the ring:
// a type of the same name counts only when it is a static type of the same size,
// since its memory is read as a PySwigObject.
bool IsPySwigObject(PyObject* object);

// A bare pointer object (never a class instance).
PyObject* NewPySwigObject(void* ptr, TypeInfo* type, bool own);

// The text of repr(): "<Swig Object of type 'T' at 0x1234>", then the chain's.
PyObject* PySwigObjectRepr(PyObject* object);

}  // namespace runtime
