// A small module of the ring for the runtime's tests: the types the conversions look
// up, plus a native class, initialized once for the whole test program.
#pragma once

#include <Python.h>

#include <string>

#include "module/runtime/TypeInfo.h"

namespace binding_test {

struct Thing {
  std::wstring name;
};

enum class TestType { CString, Thing, Char, WChar };

// Initializes the table on first use (the interpreter must be up).
binding::TypeInfo* Type(TestType type);

// A new pointer object for `address` of `type`, not owning it.
PyObject* PointerTo(void* address, TestType type);

// The text of the pending exception, "<type name>: <message>", cleared; "" if none.
std::string TakeError();

}  // namespace binding_test
