// The 45 module functions at their positions. Each function is one statement in the
// functions_<Class>.cc of its class, built on binding::Call (runtime/call.h), which
// runs the shared call sequence: unpack exactly N arguments, convert them left to
// right (raising the module's error texts), call the native operation, convert its
// result. To add one:
//
// 1. Define it in functions_<Class>.cc (using namespace binding), for example
//
//    // Unicode argument, optional text result (None for no text):
//    PyObject* OBLoginData_GetEffectByGUID(PyObject*, PyObject* args) {
//      return Call(args, "OBLoginData_GetEffectByGUID", ReturnsUnicodeOrNone{},
//                  [](OBLoginData* self, const wchar_t* guid) {
//                    return self->GetEffectByGUID(guid);
//                  },
//                  Pointer<OBLoginData>(Type(TypeId::OBLoginData), "OBLoginData *"), Unicode());
//    }
//
//    // Integer argument, a by-reference CString (null refused), int result:
//    PyObject* OBLoginData_GetCategroyName(PyObject*, PyObject* args) {
//      return Call(args, "OBLoginData_GetCategroyName", ReturnsInt{},
//                  [](OBLoginData* self, int id, CString& name) {
//                    return self->GetCategroyName(id, name);
//                  },
//                  Pointer<OBLoginData>(Type(TypeId::OBLoginData), "OBLoginData *"),
//                  Integer("int"), Reference<CString>(Type(TypeId::CString), "CString &"));
//    }
//
//    Argument kinds (runtime/argument_kinds.h), each naming the C type of its error text:
//      Pointer<T>(type, "T *")                  null object refused with ValueError
//      Pointer<T>(type, "T *", OnNull::kSkipCall) setters: None object returns None
//      Reference<T>(type, "CString" | "CString &" | "HINTERNET")  T&, null refused
//      Unicode()            const wchar_t*, the unicode object's own buffer
//      WideString()         const wchar_t*, a copy freed after the call (None: null)
//      Integer("int" | "BOOL")                  int
//      NarrowArray<260>("char [_MAX_PATH]")     const std::array<char, 260>&
//      Object()             PyObject*, borrowed
//    Result kinds (runtime/result_kinds.h): ReturnsNone{}, ReturnsInt{},
//      ReturnsUnsigned{}, ReturnsUnicode{} (a std::wstring), ReturnsUnicodeOrNone{}
//      (a std::optional<std::wstring>), ReturnsUnicodeDict{} (a map of wide texts),
//      PassedThrough{} (the operation returns a new PyObject*), ReturnsStr{} (the
//      operation returns a std::string_view of the whole array), NewPointer(type,
//      flags): POINTER_OWN | POINTER_NOSHADOW for constructors, POINTER_OWN for
//      getters of CString and HINTERNET members (the operation returns a new heap copy).
//    Delete<T>(args, name, type, "T *") and Register(args, type) are the whole body of
//    the delete_ and _swigregister functions.
// 2. Declare it in functions_<Class>.h.
// 3. Replace its numbered slot comment below with its entry.
#include "module/function_table.h"

#include "module/functions_OBLoginData.h"
#include "module/functions_PyPresetUploader.h"
#include "module/functions_infoEffectURL.h"

namespace module {

namespace {

constexpr PyMethodDef Entry(const char* name, PyCFunction function) {
  return PyMethodDef{name, function, METH_VARARGS, nullptr};
}

PyMethodDef g_functions[] = {
    Entry("new_infoEffectURL", new_infoEffectURL),                      // 1
    Entry("infoEffectURL_strEffect_set", infoEffectURL_strEffect_set),  // 2
    Entry("infoEffectURL_strEffect_get", infoEffectURL_strEffect_get),  // 3
    Entry("infoEffectURL_strTag_set", infoEffectURL_strTag_set),        // 4
    Entry("infoEffectURL_strTag_get", infoEffectURL_strTag_get),        // 5
    Entry("infoEffectURL_strURL_set", infoEffectURL_strURL_set),        // 6
    Entry("infoEffectURL_strURL_get", infoEffectURL_strURL_get),        // 7
    Entry("delete_infoEffectURL", delete_infoEffectURL),                // 8
    Entry("infoEffectURL_swigregister", infoEffectURL_swigregister),    // 9
    Entry("new_OBLoginData", new_OBLoginData),  // 10
    Entry("delete_OBLoginData", delete_OBLoginData),  // 11
    Entry("OBLoginData_LoginOrbishare", OBLoginData_LoginOrbishare),  // 12
    Entry("OBLoginData_LogoutOrbishare", OBLoginData_LogoutOrbishare),  // 13
    Entry("OBLoginData_InitOBServerURL", OBLoginData_InitOBServerURL),  // 14
    Entry("OBLoginData_SetOBURLAsReg", OBLoginData_SetOBURLAsReg),  // 15
    Entry("OBLoginData_GetUserName", OBLoginData_GetUserName),  // 16
    Entry("OBLoginData_GetServerUrl", OBLoginData_GetServerUrl),  // 17
    Entry("OBLoginData_GetLoginTokenID", OBLoginData_GetLoginTokenID),  // 18
    Entry("OBLoginData_GetSignUpURL", OBLoginData_GetSignUpURL),  // 19
    Entry("OBLoginData_GetForgetPasswordURL", OBLoginData_GetForgetPasswordURL),  // 20
    Entry("OBLoginData_GetLensCorrectionURL", OBLoginData_GetLensCorrectionURL),  // 21
    Entry("OBLoginData_GetPresetCategory", OBLoginData_GetPresetCategory),  // 22
    Entry("OBLoginData_GetCategroyName", OBLoginData_GetCategroyName),  // 23
    Entry("OBLoginData_GetCategoryCount", OBLoginData_GetCategoryCount),  // 24
    Entry("OBLoginData_SetRelateVideo", OBLoginData_SetRelateVideo),  // 25
    Entry("OBLoginData_GetPresetDownloadURL", OBLoginData_GetPresetDownloadURL),  // 26
    Entry("OBLoginData_GetEffectByGUID", OBLoginData_GetEffectByGUID),  // 27
    Entry("OBLoginData_m_hInternet_set", OBLoginData_m_hInternet_set),  // 28
    Entry("OBLoginData_m_hInternet_get", OBLoginData_m_hInternet_get),  // 29
    Entry("OBLoginData_m_hConnect_set", OBLoginData_m_hConnect_set),  // 30
    Entry("OBLoginData_m_hConnect_get", OBLoginData_m_hConnect_get),  // 31
    Entry("OBLoginData_m_hRequest_set", OBLoginData_m_hRequest_set),  // 32
    Entry("OBLoginData_m_hRequest_get", OBLoginData_m_hRequest_get),  // 33
    Entry("OBLoginData_m_bServerReachable_set", OBLoginData_m_bServerReachable_set),  // 34
    Entry("OBLoginData_m_bServerReachable_get", OBLoginData_m_bServerReachable_get),  // 35
    Entry("OBLoginData_m_szChkServerUrl_set", OBLoginData_m_szChkServerUrl_set),  // 36
    Entry("OBLoginData_m_szChkServerUrl_get", OBLoginData_m_szChkServerUrl_get),  // 37
    Entry("OBLoginData_swigregister", OBLoginData_swigregister),  // 38
    Entry("new_PyPresetUploader", new_PyPresetUploader),                                // 39
    Entry("delete_PyPresetUploader", delete_PyPresetUploader),                          // 40
    Entry("PyPresetUploader_SetCallback", PyPresetUploader_SetCallback),                // 41
    Entry("PyPresetUploader_StartUpload", PyPresetUploader_StartUpload),                // 42
    Entry("PyPresetUploader_CancelUpload", PyPresetUploader_CancelUpload),              // 43
    Entry("PyPresetUploader_GetUploadedFileUrl", PyPresetUploader_GetUploadedFileUrl),  // 44
    Entry("PyPresetUploader_swigregister", PyPresetUploader_swigregister),              // 45
    {nullptr, nullptr, 0, nullptr},
};

}  // namespace

PyMethodDef* FunctionTable() { return g_functions; }

}  // namespace module
