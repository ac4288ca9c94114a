// Finding the native address behind a Python object and wrapping addresses in
// pointer objects or instances of registered classes.
#pragma once

#include <Python.h>

#include "module/runtime/PyRef.h"
#include "module/runtime/TypeInfo.h"
#include "module/runtime/status.h"

namespace runtime {

// The string "this", made once and kept (borrowed reference).
PyObject* ThisName();
// Drops the kept "this" string; the next use makes a new one.
void ReleaseThisName();

// The pointer object behind `object`: itself, its "this", or the "this" of what a
// weak proxy refers to, followed until a pointer object is found. Empty when none.
PyRef GetThisObject(PyObject* object);

// Stores the native address of `object` (None gives null) when it is, or leads to, a
// pointer object whose type `expected` accepts (any type when `expected` is null).
// With POINTER_DISOWN the matching pointer object gives up ownership. Returns
// STATUS_OK or STATUS_ERROR and leaves no Python error set.
int ConvertPointer(PyObject* object, void** address, TypeInfo* expected, int flags);

// A new pointer object for `address` (None for null), owning it with POINTER_OWN, or
// an instance of the class registered for `type` unless POINTER_NOSHADOW is given.
PyObject* NewPointerObject(void* address, TypeInfo* type, int flags);

}  // namespace runtime
