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

using HandleMember = HINTERNET service::OBLoginData::*;
using LinkGetter = std::wstring (service::OBLoginData::*)();
using UrlBuffer = std::array<char, kMaxPath>;

constexpr char kSessionType[] = "OBLoginData *";

PointerKind<service::OBLoginData> Session(OnNull onNull = OnNull::kRefuse) {
  return Pointer<service::OBLoginData>(Type(TypeId::OBLoginData), kSessionType, onNull);
}

PyObject* SetHandle(PyObject* args, const char* function, HandleMember member) {
  return Call(args, function, ReturnsNone{},
              [member](service::OBLoginData* self, HINTERNET handle) { self->*member = handle; },
              Session(OnNull::kSkipCall), Reference<HINTERNET>(Type(TypeId::HINTERNET), "HINTERNET"));
}

// A new heap cell holding the handle, owned by the pointer object returned.
PyObject* GetHandle(PyObject* args, const char* function, HandleMember member) {
  return Call(args, function, NewPointer(Type(TypeId::HINTERNET), POINTER_OWN),
              [member](service::OBLoginData* self) { return new HINTERNET(self->*member); }, Session());
}

// A link to a service page.
PyObject* GetLink(PyObject* args, const char* function, LinkGetter getter) {
  return Call(args, function, ReturnsUnicode{}, [getter](service::OBLoginData* self) { return (self->*getter)(); },
              Session());
}

}  // namespace

const ModuleFunction kOBLoginDataFunctions[] = {
    {"new_OBLoginData",  // 10
     [](PyObject* args, const char* name) {
       return Call(args, name, NewPointer(Type(TypeId::OBLoginData), POINTER_OWN | POINTER_NOSHADOW),
                   [](const wchar_t* version, const wchar_t* versionType, const wchar_t* uuid) {
                     return new service::OBLoginData(version, versionType, uuid);
                   },
                   Unicode(), Unicode(), Unicode());
     }},
    {"delete_OBLoginData",  // 11
     [](PyObject* args, const char* name) {
       return Delete<service::OBLoginData>(args, name, Type(TypeId::OBLoginData), kSessionType);
     }},
    {"OBLoginData_LoginOrbishare",  // 12
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnsigned{},
                   [](service::OBLoginData* self, const wchar_t* account, const wchar_t* password) {
                     return self->LoginOrbishare(account, password);
                   },
                   Session(), Unicode(), Unicode());
     }},
    {"OBLoginData_LogoutOrbishare",  // 13
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](service::OBLoginData* self) { self->LogoutOrbishare(); }, Session());
     }},
    {"OBLoginData_InitOBServerURL",  // 14
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](service::OBLoginData* self) { self->InitOBServerURL(); }, Session());
     }},
    {"OBLoginData_SetOBURLAsReg",  // 15
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](service::OBLoginData* self, const wchar_t* serverHost) { self->SetOBURLAsReg(serverHost); },
                   Session(), Unicode());
     }},
    {"OBLoginData_GetUserName",  // 16
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicode{},
                   [](service::OBLoginData* self) { return self->GetUserName(); }, Session());
     }},
    {"OBLoginData_GetServerUrl",  // 17
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicode{},
                   [](service::OBLoginData* self) { return self->GetServerUrl(); }, Session());
     }},
    {"OBLoginData_GetLoginTokenID",  // 18
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicode{},
                   [](service::OBLoginData* self) { return self->GetLoginTokenID(); }, Session());
     }},
    {"OBLoginData_GetSignUpURL",  // 19
     [](PyObject* args, const char* name) {
       return GetLink(args, name, &service::OBLoginData::GetSignUpURL);
     }},
    {"OBLoginData_GetForgetPasswordURL",  // 20
     [](PyObject* args, const char* name) {
       return GetLink(args, name, &service::OBLoginData::GetForgetPasswordURL);
     }},
    {"OBLoginData_GetLensCorrectionURL",  // 21
     [](PyObject* args, const char* name) {
       return GetLink(args, name, &service::OBLoginData::GetLensCorrectionURL);
     }},
    {"OBLoginData_GetPresetCategory",  // 22
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicodeDict{},
                   [](service::OBLoginData* self, const wchar_t* language) -> const service::OBLoginData::Categories& {
                     return self->GetPresetCategory(language);
                   },
                   Session(), Unicode());
     }},
    // The name is written into the string object passed in, which must exist.
    {"OBLoginData_GetCategroyName",  // 23
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsInt{},
                   [](service::OBLoginData* self, int id, CString& name) { return self->GetCategroyName(id, name); },
                   Session(), Integer("int"), Reference<CString>(Type(TypeId::CString), "CString &"));
     }},
    {"OBLoginData_GetCategoryCount",  // 24
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsInt{},
                   [](service::OBLoginData* self) { return self->GetCategoryCount(); }, Session());
     }},
    {"OBLoginData_SetRelateVideo",  // 25
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicodeOrNone{},
                   [](service::OBLoginData* self, const wchar_t* videoURL, const wchar_t* website, const wchar_t* videoInfo) {
                     return self->SetRelateVideo(videoURL, website, videoInfo);
                   },
                   Session(), Unicode(), Unicode(), Unicode());
     }},
    {"OBLoginData_GetPresetDownloadURL",  // 26
     [](PyObject* args, const char* name) {
       return GetLink(args, name, &service::OBLoginData::GetPresetDownloadURL);
     }},
    {"OBLoginData_GetEffectByGUID",  // 27
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsUnicodeOrNone{},
                   [](service::OBLoginData* self, const wchar_t* guid) { return self->GetEffectByGUID(guid); }, Session(),
                   Unicode());
     }},
    {"OBLoginData_m_hInternet_set",  // 28
     [](PyObject* args, const char* name) {
       return SetHandle(args, name, &service::OBLoginData::m_hInternet);
     }},
    {"OBLoginData_m_hInternet_get",  // 29
     [](PyObject* args, const char* name) {
       return GetHandle(args, name, &service::OBLoginData::m_hInternet);
     }},
    {"OBLoginData_m_hConnect_set",  // 30
     [](PyObject* args, const char* name) {
       return SetHandle(args, name, &service::OBLoginData::m_hConnect);
     }},
    {"OBLoginData_m_hConnect_get",  // 31
     [](PyObject* args, const char* name) {
       return GetHandle(args, name, &service::OBLoginData::m_hConnect);
     }},
    {"OBLoginData_m_hRequest_set",  // 32
     [](PyObject* args, const char* name) {
       return SetHandle(args, name, &service::OBLoginData::m_hRequest);
     }},
    {"OBLoginData_m_hRequest_get",  // 33
     [](PyObject* args, const char* name) {
       return GetHandle(args, name, &service::OBLoginData::m_hRequest);
     }},
    {"OBLoginData_m_bServerReachable_set",  // 34
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](service::OBLoginData* self, int reachable) { self->m_bServerReachable = reachable; },
                   Session(OnNull::kSkipCall), Integer("BOOL"));
     }},
    {"OBLoginData_m_bServerReachable_get",  // 35
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsInt{},
                   [](service::OBLoginData* self) { return self->m_bServerReachable; }, Session());
     }},
    {"OBLoginData_m_szChkServerUrl_set",  // 36
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](service::OBLoginData* self, const UrlBuffer& url) {
                     std::copy(url.begin(), url.end(), self->m_szChkServerUrl);
                   },
                   Session(), NarrowArray<kMaxPath>("char [_MAX_PATH]"));
     }},
    // All kMaxPath bytes: the array need not hold a terminator.
    {"OBLoginData_m_szChkServerUrl_get",  // 37
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsStr{},
                   [](service::OBLoginData* self) { return std::string_view(self->m_szChkServerUrl, kMaxPath); },
                   Session());
     }},
    {"OBLoginData_swigregister",  // 38
     [](PyObject* args, const char*) {
       return Register(args, Type(TypeId::OBLoginData));
     }},
};
static_assert(std::size(kOBLoginDataFunctions) == kOBLoginDataCount);

}  // namespace module
