#include <Python.h>

#include "service/UnicodeResult.h"

static_assert(sizeof(Py_UNICODE) == sizeof(wchar_t), "wide strings must cross into unicode objects unchanged");

PyObject* NewUnicodeResult(std::wstring_view text) {
  const wchar_t* characters = text.empty() ? L"" : text.data();
  return PyUnicode_FromWideChar(characters, static_cast<Py_ssize_t>(text.size()));
}
