// The module's function table, in the order Python's callers know it.
#pragma once

#include <Python.h>

namespace module {

// The null-terminated table the module is created with; static storage.
PyMethodDef* FunctionTable();

}  // namespace module
