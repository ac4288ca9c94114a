// The kinds of module function results: each turns what the native operation returned
// into the Python object the function returns. See call.h.
#pragma once

#include <Python.h>

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "interpreter/PythonApi.h"
#include "module/runtime/TypeInfo.h"
#include "module/runtime/conversions.h"
#include "module/runtime/pointers.h"

namespace runtime {

// None, whatever the operation returns.
struct ReturnsNone {};

// An `int` of the operation's 32-bit result.
struct ReturnsInt {
  PyObject* Make(int value) const { return interpreter::NewInt(value); }
};

// An `int` below 0x80000000, else a `long`.
struct ReturnsUnsigned {
  PyObject* Make(uint32_t value) const { return FromUnsigned(value); }
};

// A `unicode` of every character of the text, zero characters included.
struct ReturnsUnicode {
  PyObject* Make(std::wstring_view text) const { return FromWide(text); }
};

// None for no text, else as ReturnsUnicode.
struct ReturnsUnicodeOrNone {
  PyObject* Make(const std::optional<std::wstring>& text) const {
    if (!text) Py_RETURN_NONE;
    return FromWide(*text);
  }
};

// A `dict` of `unicode` keys and values. The caller asked for what is known, not for
// an exception: None when the dictionary cannot be made, and the items made so far
// when one of them cannot be.
struct ReturnsUnicodeDict {
  PyObject* Make(const std::map<std::wstring, std::wstring>& items) const {
    return FromWideMap(items);
  }
};

// The operation built the Python object itself (a new reference, or null with an
// exception set).
struct PassedThrough {
  PyObject* Make(PyObject* value) const { return value; }
};

// A `str` of a character array's bytes up to its last non-zero byte.
struct ReturnsStr {
  PyObject* Make(std::string_view bytes) const {
    return FromNarrowArray(bytes.data(), TrimTrailingZeros(bytes.data(), bytes.size()));
  }
};

// A new pointer object for the native object the operation returned (None for null).
struct NewPointerKind {
  TypeInfo* type;
  int flags;
  PyObject* Make(void* address) const { return NewPointerObject(address, type, flags); }
};
inline NewPointerKind NewPointer(TypeInfo* type, int flags) { return NewPointerKind{type, flags}; }

}  // namespace runtime
