// Module functions 1 to 9: the infoEffectURL record.
#pragma once

#include <Python.h>

namespace module {

PyObject* new_infoEffectURL(PyObject* self, PyObject* args);
PyObject* infoEffectURL_strEffect_set(PyObject* self, PyObject* args);
PyObject* infoEffectURL_strEffect_get(PyObject* self, PyObject* args);
PyObject* infoEffectURL_strTag_set(PyObject* self, PyObject* args);
PyObject* infoEffectURL_strTag_get(PyObject* self, PyObject* args);
PyObject* infoEffectURL_strURL_set(PyObject* self, PyObject* args);
PyObject* infoEffectURL_strURL_get(PyObject* self, PyObject* args);
PyObject* delete_infoEffectURL(PyObject* self, PyObject* args);
PyObject* infoEffectURL_swigregister(PyObject* self, PyObject* args);

}  // namespace module
