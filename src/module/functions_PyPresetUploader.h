// Module functions of the preset uploader (Nos. 39 to 45).
#pragma once

#include <Python.h>

namespace module {

PyObject* new_PyPresetUploader(PyObject* self, PyObject* args);
PyObject* delete_PyPresetUploader(PyObject* self, PyObject* args);
PyObject* PyPresetUploader_SetCallback(PyObject* self, PyObject* args);
PyObject* PyPresetUploader_StartUpload(PyObject* self, PyObject* args);
PyObject* PyPresetUploader_CancelUpload(PyObject* self, PyObject* args);
PyObject* PyPresetUploader_GetUploadedFileUrl(PyObject* self, PyObject* args);
PyObject* PyPresetUploader_swigregister(PyObject* self, PyObject* args);

}  // namespace module
