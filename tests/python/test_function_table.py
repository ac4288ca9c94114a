"""The module's function table: all 45 functions, in their order.

Python only sees the functions by name, but each function object points at its
entry of the table (PyCFunctionObject.m_ml), so the entries' addresses give the
order in which the table lists them."""
import ctypes
import types
import unittest

import _PyUploader as native

TABLE = '''
    new_infoEffectURL infoEffectURL_strEffect_set infoEffectURL_strEffect_get
    infoEffectURL_strTag_set infoEffectURL_strTag_get infoEffectURL_strURL_set
    infoEffectURL_strURL_get delete_infoEffectURL infoEffectURL_swigregister
    new_OBLoginData delete_OBLoginData OBLoginData_LoginOrbishare OBLoginData_LogoutOrbishare
    OBLoginData_InitOBServerURL OBLoginData_SetOBURLAsReg OBLoginData_GetUserName
    OBLoginData_GetServerUrl OBLoginData_GetLoginTokenID OBLoginData_GetSignUpURL
    OBLoginData_GetForgetPasswordURL OBLoginData_GetLensCorrectionURL
    OBLoginData_GetPresetCategory OBLoginData_GetCategroyName OBLoginData_GetCategoryCount
    OBLoginData_SetRelateVideo OBLoginData_GetPresetDownloadURL OBLoginData_GetEffectByGUID
    OBLoginData_m_hInternet_set OBLoginData_m_hInternet_get OBLoginData_m_hConnect_set
    OBLoginData_m_hConnect_get OBLoginData_m_hRequest_set OBLoginData_m_hRequest_get
    OBLoginData_m_bServerReachable_set OBLoginData_m_bServerReachable_get
    OBLoginData_m_szChkServerUrl_set OBLoginData_m_szChkServerUrl_get OBLoginData_swigregister
    new_PyPresetUploader delete_PyPresetUploader PyPresetUploader_SetCallback
    PyPresetUploader_StartUpload PyPresetUploader_CancelUpload
    PyPresetUploader_GetUploadedFileUrl PyPresetUploader_swigregister
'''.split()


METH_VARARGS = 0x0001


class PyMethodDef(ctypes.Structure):
    _fields_ = [('ml_name', ctypes.c_void_p), ('ml_meth', ctypes.c_void_p),
                ('ml_flags', ctypes.c_int), ('ml_doc', ctypes.c_void_p)]


def entry_address(function):
    """m_ml, right after the object header of the function object."""
    header = 2 * ctypes.sizeof(ctypes.c_void_p)
    return ctypes.c_void_p.from_address(id(function) + header).value


def table_entries():
    """The entries from the first one up to the terminating entry."""
    functions = [f for f in vars(native).values() if isinstance(f, types.BuiltinFunctionType)]
    entry = PyMethodDef.from_address(min(entry_address(f) for f in functions))
    entries = []
    while entry.ml_name and len(entries) <= len(TABLE):
        entries.append(entry)
        entry = PyMethodDef.from_address(ctypes.addressof(entry) + ctypes.sizeof(PyMethodDef))
    return entries


class FunctionTable(unittest.TestCase):

    def test_lists_the_45_functions_in_order_and_nothing_else(self):
        names = [ctypes.string_at(e.ml_name) for e in table_entries()]
        self.assertEqual(names, TABLE)

    def test_every_function_takes_a_tuple_of_arguments_and_has_no_documentation(self):
        for entry in table_entries():
            self.assertEqual((entry.ml_flags, entry.ml_doc), (METH_VARARGS, None))


if __name__ == '__main__':
    unittest.main()
