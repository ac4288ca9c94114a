// Recognising the pointer and packed-data types of other modules of the ring.
#pragma once

#include <Python.h>

namespace binding {

// True when `candidate` is `ours`, or a type of another module with the same name that
// is laid out like it: a static type (a Python class of that name could be anything)
// of the same basic size.
bool IsCompatibleType(PyTypeObject* candidate, PyTypeObject* ours);

}  // namespace binding
