// Module functions of the OBLoginData session: construction, the plain accessors,
// sign-in, discovery, categories, related video, effect lookup, service links and
// the probe members (Nos. 10 to 38).
#pragma once

#include <Python.h>

namespace module {

PyObject* new_OBLoginData(PyObject* self, PyObject* args);
PyObject* delete_OBLoginData(PyObject* self, PyObject* args);
PyObject* OBLoginData_LoginOrbishare(PyObject* self, PyObject* args);
PyObject* OBLoginData_LogoutOrbishare(PyObject* self, PyObject* args);
PyObject* OBLoginData_InitOBServerURL(PyObject* self, PyObject* args);
PyObject* OBLoginData_SetOBURLAsReg(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetUserName(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetServerUrl(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetLoginTokenID(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetSignUpURL(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetForgetPasswordURL(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetLensCorrectionURL(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetPresetCategory(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetCategroyName(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetCategoryCount(PyObject* self, PyObject* args);
PyObject* OBLoginData_SetRelateVideo(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetPresetDownloadURL(PyObject* self, PyObject* args);
PyObject* OBLoginData_GetEffectByGUID(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_hInternet_set(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_hInternet_get(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_hConnect_set(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_hConnect_get(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_hRequest_set(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_hRequest_get(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_bServerReachable_set(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_bServerReachable_get(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_szChkServerUrl_set(PyObject* self, PyObject* args);
PyObject* OBLoginData_m_szChkServerUrl_get(PyObject* self, PyObject* args);
PyObject* OBLoginData_swigregister(PyObject* self, PyObject* args);

}  // namespace module
