// Status codes, marks and flags shared by the conversions and the module functions.
#pragma once

#include <Python.h>

namespace runtime {

// Results of a conversion.
constexpr int STATUS_OK = 0;
constexpr int STATUS_ERROR = -1;  // generic failure; module functions report it as a type error
constexpr int STATUS_TYPE_ERROR = -5;
constexpr int STATUS_VALUE_ERROR = -9;

// Mark of a string conversion whose copy the caller must free.
constexpr int NEWOBJ = 512;

// Flags of NewPointerObject.
constexpr int POINTER_OWN = 1;
constexpr int POINTER_NOSHADOW = 2;
// Flag of ConvertPointer: the pointer object found gives up ownership.
constexpr int POINTER_DISOWN = 1;

// The Python exception type that reports a status code (a borrowed reference).
PyObject* ErrorTypeForCode(int code);

// TypeError (or the type of `status`): "in method 'NAME', argument N of type 'TYPE'".
void RaiseArgumentError(int status, const char* function, int position, const char* cType);
// ValueError: "invalid null reference in method 'NAME', argument N of type 'TYPE'".
void RaiseNullReference(const char* function, int position, const char* cType);

}  // namespace runtime
