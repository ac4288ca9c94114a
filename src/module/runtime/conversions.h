// Conversions of module function arguments and results. The argument conversions
// return STATUS_OK or STATUS_TYPE_ERROR and leave no Python error set, except that a
// 2.7 `str` the default encoding cannot decode keeps the interpreter's decoding error.
// Every out-parameter may be null. Where 2.7 has `unicode` and `str`, Python 3 has
// its `str` (interpreter/PythonApi.h).
#pragma once

#include <Python.h>

#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <string_view>

namespace runtime {

// 'wchar_t const *': a `unicode` or `str` is copied into a new zero-terminated array
// (free it with delete[]) and the mark becomes NEWOBJ; a "wchar_t *" pointer object or
// None gives the pointed-to string itself (mark 0). The length is not computed.
int AsWideString(PyObject* object, wchar_t** address, size_t* length, int* mark);

// A `str` gives its own buffer, or a new[] copy when *mark is NEWOBJ on entry (on 3,
// always a copy of its UTF-8 form, and the mark says NEWOBJ); a
// "char *" pointer object or None gives the pointed-to string. The length counts the
// terminating zero (0 for null).
int AsNarrowString(PyObject* object, char** address, size_t* length, int* mark);

// 'char [N]': at most `size` bytes of a `str` (on 3 of its UTF-8 form), or of a
// "char *" pointer object (a terminating zero beyond them is dropped), the
// rest of `buffer` filled with zeros; None gives an all-zero buffer.
int AsNarrowArray(PyObject* object, char* buffer, size_t size);

// 'int', 'BOOL': an `int`, `bool` or `long` (on 3 an `int`) within the signed 32-bit
// range.
int AsInt(PyObject* object, int* value);

// A `str` of exactly `size` bytes (on 3 of their UTF-8 decoding, see
// interpreter::NewNarrowText).
PyObject* FromNarrowArray(const char* bytes, size_t size);

// The length of `bytes` without its trailing zero bytes.
size_t TrimTrailingZeros(const char* bytes, size_t size);

// A `unicode` (on 3 a `str`) of every character of `text`.
PyObject* FromWide(std::wstring_view text);

// A `dict` of `unicode` keys and values; see ReturnsUnicodeDict.
PyObject* FromWideMap(const std::map<std::wstring, std::wstring>& items);

// An `int` below 0x80000000, a `long` from there on (on 3 an `int` either way).
PyObject* FromUnsigned(uint32_t value);

}  // namespace runtime
