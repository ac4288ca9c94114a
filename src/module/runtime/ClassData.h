// The Python class registered for a native type. The field order is a binary layout
// that other modules of the ring read.
#pragma once

#include <Python.h>

#include "module/runtime/TypeInfo.h"

namespace runtime {

struct ClassData {
  PyObject* klass;        // the class object
  PyObject* newRaw;       // its "__new__" (new-style classes), else null
  PyObject* newArgs;      // (klass,) when newRaw is set, else klass
  PyObject* destroy;      // its "__swig_destroy__", or null
  int destroyTakesTuple;  // destroy is called with an argument tuple
  int implicitConvBusy;   // recursion guard of implicit conversion; unused here
};

// Builds the class's ClassData and attaches it to `type` and, recursively, to every
// type in its cast list that has no converter and no class yet. Registering again
// replaces the previous ClassData wherever it was attached; one that this module
// made is freed once no type holds it (another module's is left to that module).
void RegisterClass(TypeInfo& type, PyObject* cls);

// A new instance of the registered class holding `pointerObject` as "this"; null
// (with no error left set) when none can be made.
PyObject* NewShadowInstance(const ClassData& data, PyObject* pointerObject);

// Drops the references a ClassData holds.
void ReleaseClassData(ClassData& data);

}  // namespace runtime
