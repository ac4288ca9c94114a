#pragma once

#include <string_view>

struct _object;
typedef struct _object PyObject;

// A new Python unicode object holding `text` (all of it, zero characters
// included); null with the interpreter's error set when it cannot be made.
// Needs the interpreter lock.
PyObject* NewUnicodeResult(std::wstring_view text);
