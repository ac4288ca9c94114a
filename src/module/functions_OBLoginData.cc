#include "module/function_table.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <string_view>

#include "module/runtime/call.h"
#include "module/types.h"
#include "service/OBLoginData.h"

namespace module {

namespace {

using namespace runtime;
using service::OBLoginData;

using HandleMember = HINTERNET OBLoginData::*;
using LinkGetter = std::wstring (OBLoginData::*)();
using UrlBuffer = std::array<char, kMaxPath>;

constexpr char kSessionType[] = "OBLoginData *";

PointerKind<OBLoginData> Session(OnNull onNull = OnNull::kRefuse) {
  return Pointer<OBLoginData>(Type(TypeId::OBLoginData), kSessionType, onNull);
}

template <HandleMember member>
PyObject* SetHandle(PyObject* args, const char* function) {
  return Call(args, function, ReturnsNone{},
              [](OBLoginData* self, HINTERNET handle) { self->*member = handle; },
              Session(OnNull::kSkipCall), Reference<HINTERNET>(Type(TypeId::HINTERNET), "HINTERNET"));
}

// A new heap cell holding the handle, owned by the pointer object returned.
template <HandleMember member>
PyObject* GetHandle(PyObject* args, const char* function) {
  return Call(args, function, NewPointer(Type(TypeId::HINTERNET), POINTER_OWN),
              [](OBLoginData* self) { return new HINTERNET(self->*member); }, Session());
}

// A link to a service page.
template <LinkGetter getter>
PyObject* GetLink(PyObject* args, const char* function) {
  return Call(args, function, ReturnsUnicode{}, [](OBLoginData* self) { return (self->*getter)(); },
              Session());
}

}  // namespace

const ModuleFunction kOBLoginDataFunctions[] = {
    {"new_OBLoginData",  // 10
     [](PyObject* args, const char* name) {
       return Call(args, name, NewPointer(Type(TypeId::OBLoginData), POINTER_OWN | POINTER_NOSHADOW),
                   [](const wchar_t* version, const wchar_t* versionType, const wchar_t* uuid) {
                     return new OBLoginData(version, versionType, uuid);
                   },
                   Unicode(), Unicode(), Unicode());
     }},
    {"delete_OBLoginData",  // 11
     [](PyObject* args, const char* name) {
       return Delete<OBLoginData>(args, name, Type(TypeId::OBLoginData), kSessionType);
     }},
    {"OBLoginData_LoginOrbishare",  // 12
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnsigned{},
                   [](OBLoginData* self, const wchar_t* account, const wchar_t* password) {
                     return self->LoginOrbishare(account, password);
                   },
                   Session(), Unicode(), Unicode());
     }},
    {"OBLoginData_LogoutOrbishare",  // 13
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](OBLoginData* self) { self->LogoutOrbishare(); }, Session());
     }},
    {"OBLoginData_InitOBServerURL",  // 14
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](OBLoginData* self) { self->InitOBServerURL(); }, Session());
     }},
    {"OBLoginData_SetOBURLAsReg",  // 15
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](OBLoginData* self, const wchar_t* serverHost) { self->SetOBURLAsReg(serverHost); },
                   Session(), Unicode());
     }},
    {"OBLoginData_GetUserName",  // 16
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicode{},
                   [](OBLoginData* self) { return self->GetUserName(); }, Session());
     }},
    {"OBLoginData_GetServerUrl",  // 17
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicode{},
                   [](OBLoginData* self) { return self->GetServerUrl(); }, Session());
     }},
    {"OBLoginData_GetLoginTokenID",  // 18
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicode{},
                   [](OBLoginData* self) { return self->GetLoginTokenID(); }, Session());
     }},
    {"OBLoginData_GetSignUpURL", GetLink<&OBLoginData::GetSignUpURL>},  // 19
    {"OBLoginData_GetForgetPasswordURL", GetLink<&OBLoginData::GetForgetPasswordURL>},  // 20
    {"OBLoginData_GetLensCorrectionURL", GetLink<&OBLoginData::GetLensCorrectionURL>},  // 21
    {"OBLoginData_GetPresetCategory",  // 22
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicodeDict{},
                   [](OBLoginData* self, const wchar_t* language) -> const OBLoginData::Categories& {
                     return self->GetPresetCategory(language);
                   },
                   Session(), Unicode());
     }},
    // The name is written into the string object passed in, which must exist.
    {"OBLoginData_GetCategroyName",  // 23
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsInt{},
                   [](OBLoginData* self, int id, CString& name) { return self->GetCategroyName(id, name); },
                   Session(), Integer("int"), Reference<CString>(Type(TypeId::CString), "CString &"));
     }},
    {"OBLoginData_GetCategoryCount",  // 24
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsInt{},
                   [](OBLoginData* self) { return self->GetCategoryCount(); }, Session());
     }},
    {"OBLoginData_SetRelateVideo",  // 25
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicodeOrNone{},
                   [](OBLoginData* self, const wchar_t* videoURL, const wchar_t* website, const wchar_t* videoInfo) {
                     return self->SetRelateVideo(videoURL, website, videoInfo);
                   },
                   Session(), Unicode(), Unicode(), Unicode());
     }},
    {"OBLoginData_GetPresetDownloadURL", GetLink<&OBLoginData::GetPresetDownloadURL>},  // 26
    {"OBLoginData_GetEffectByGUID",  // 27
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicodeOrNone{},
                   [](OBLoginData* self, const wchar_t* guid) { return self->GetEffectByGUID(guid); }, Session(),
                   Unicode());
     }},
    {"OBLoginData_m_hInternet_set", SetHandle<&OBLoginData::m_hInternet>},  // 28
    {"OBLoginData_m_hInternet_get", GetHandle<&OBLoginData::m_hInternet>},  // 29
    {"OBLoginData_m_hConnect_set", SetHandle<&OBLoginData::m_hConnect>},  // 30
    {"OBLoginData_m_hConnect_get", GetHandle<&OBLoginData::m_hConnect>},  // 31
    {"OBLoginData_m_hRequest_set", SetHandle<&OBLoginData::m_hRequest>},  // 32
    {"OBLoginData_m_hRequest_get", GetHandle<&OBLoginData::m_hRequest>},  // 33
    {"OBLoginData_m_bServerReachable_set",  // 34
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](OBLoginData* self, int reachable) { self->m_bServerReachable = reachable; },
                   Session(OnNull::kSkipCall), Integer("BOOL"));
     }},
    {"OBLoginData_m_bServerReachable_get",  // 35
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsInt{},
                   [](OBLoginData* self) { return self->m_bServerReachable; }, Session());
     }},
    {"OBLoginData_m_szChkServerUrl_set",  // 36
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](OBLoginData* self, const UrlBuffer& url) {
                     std::copy(url.begin(), url.end(), self->m_szChkServerUrl);
                   },
                   Session(), NarrowArray<kMaxPath>("char [_MAX_PATH]"));
     }},
    // All kMaxPath bytes: the array need not hold a terminator.
    {"OBLoginData_m_szChkServerUrl_get",  // 37
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsStr{},
                   [](OBLoginData* self) { return std::string_view(self->m_szChkServerUrl, kMaxPath); },
                   Session());
     }},
    {"OBLoginData_swigregister",  // 38
     [](PyObject* args, const char*) {
       return Register(args, Type(TypeId::OBLoginData));
     }},
};
static_assert(std::size(kOBLoginDataFunctions) == kOBLoginDataCount);

}  // namespace module
