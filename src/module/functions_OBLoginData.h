// Module functions of the OBLoginData session: construction, the plain accessors
// sign-in, discovery and the probe members (Nos. 10 to 18, 24, 28 to 38).
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
PyObject* OBLoginData_GetCategoryCount(PyObject* self, PyObject* args);
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
