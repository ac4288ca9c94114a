#include "module/functions_OBLoginData.h"

#include <algorithm>
#include <array>
#include <string_view>

#include "module/runtime/call.h"
#include "module/types.h"
#include "service/OBLoginData.h"

namespace module {

namespace {

using namespace binding;

using HandleMember = HINTERNET OBLoginData::*;
using LinkGetter = std::wstring (OBLoginData::*)();
using UrlBuffer = std::array<char, kMaxPath>;

constexpr char kSessionType[] = "OBLoginData *";

PointerKind<OBLoginData> Session(OnNull onNull = OnNull::kRefuse) {
  return Pointer<OBLoginData>(Type(TypeId::OBLoginData), kSessionType, onNull);
}

PyObject* SetHandle(PyObject* args, const char* function, HandleMember member) {
  return Call(args, function, ReturnsNone{},
              [member](OBLoginData* self, HINTERNET handle) { self->*member = handle; },
              Session(OnNull::kSkipCall), Reference<HINTERNET>(Type(TypeId::HINTERNET), "HINTERNET"));
}

// A new heap cell holding the handle, owned by the pointer object returned.
PyObject* GetHandle(PyObject* args, const char* function, HandleMember member) {
  return Call(args, function, NewPointer(Type(TypeId::HINTERNET), POINTER_OWN),
              [member](OBLoginData* self) { return new HINTERNET(self->*member); }, Session());
}

// A link to a service page.
PyObject* GetLink(PyObject* args, const char* function, LinkGetter getter) {
  return Call(args, function, ReturnsUnicode{}, [getter](OBLoginData* self) { return (self->*getter)(); },
              Session());
}

}  // namespace

PyObject* new_OBLoginData(PyObject*, PyObject* args) {
  return Call(args, "new_OBLoginData", NewPointer(Type(TypeId::OBLoginData), POINTER_OWN | POINTER_NOSHADOW),
              [](const wchar_t* version, const wchar_t* versionType, const wchar_t* uuid) {
                return new OBLoginData(version, versionType, uuid);
              },
              Unicode(), Unicode(), Unicode());
}

PyObject* delete_OBLoginData(PyObject*, PyObject* args) {
  return Delete<OBLoginData>(args, "delete_OBLoginData", Type(TypeId::OBLoginData), kSessionType);
}

PyObject* OBLoginData_LoginOrbishare(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_LoginOrbishare", ReturnsUnsigned{},
              [](OBLoginData* self, const wchar_t* account, const wchar_t* password) {
                return self->LoginOrbishare(account, password);
              },
              Session(), Unicode(), Unicode());
}

PyObject* OBLoginData_LogoutOrbishare(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_LogoutOrbishare", ReturnsNone{},
              [](OBLoginData* self) { self->LogoutOrbishare(); }, Session());
}

PyObject* OBLoginData_InitOBServerURL(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_InitOBServerURL", ReturnsNone{},
              [](OBLoginData* self) { self->InitOBServerURL(); }, Session());
}

PyObject* OBLoginData_SetOBURLAsReg(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_SetOBURLAsReg", ReturnsNone{},
              [](OBLoginData* self, const wchar_t* serverHost) { self->SetOBURLAsReg(serverHost); },
              Session(), Unicode());
}

PyObject* OBLoginData_GetUserName(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_GetUserName", ReturnsUnicode{},
              [](OBLoginData* self) { return self->GetUserName(); }, Session());
}

PyObject* OBLoginData_GetServerUrl(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_GetServerUrl", ReturnsUnicode{},
              [](OBLoginData* self) { return self->GetServerUrl(); }, Session());
}

PyObject* OBLoginData_GetLoginTokenID(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_GetLoginTokenID", ReturnsUnicode{},
              [](OBLoginData* self) { return self->GetLoginTokenID(); }, Session());
}

PyObject* OBLoginData_GetSignUpURL(PyObject*, PyObject* args) {
  return GetLink(args, "OBLoginData_GetSignUpURL", &OBLoginData::GetSignUpURL);
}

PyObject* OBLoginData_GetForgetPasswordURL(PyObject*, PyObject* args) {
  return GetLink(args, "OBLoginData_GetForgetPasswordURL", &OBLoginData::GetForgetPasswordURL);
}

PyObject* OBLoginData_GetLensCorrectionURL(PyObject*, PyObject* args) {
  return GetLink(args, "OBLoginData_GetLensCorrectionURL", &OBLoginData::GetLensCorrectionURL);
}

PyObject* OBLoginData_GetPresetCategory(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_GetPresetCategory", ReturnsUnicodeDict{},
              [](OBLoginData* self, const wchar_t* language) -> const OBLoginData::Categories& {
                return self->GetPresetCategory(language);
              },
              Session(), Unicode());
}

// The name is written into the string object passed in, which must exist.
PyObject* OBLoginData_GetCategroyName(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_GetCategroyName", ReturnsInt{},
              [](OBLoginData* self, int id, CString& name) { return self->GetCategroyName(id, name); },
              Session(), Integer("int"), Reference<CString>(Type(TypeId::CString), "CString &"));
}

PyObject* OBLoginData_GetCategoryCount(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_GetCategoryCount", ReturnsInt{},
              [](OBLoginData* self) { return self->GetCategoryCount(); }, Session());
}

PyObject* OBLoginData_SetRelateVideo(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_SetRelateVideo", ReturnsUnicodeOrNone{},
              [](OBLoginData* self, const wchar_t* videoURL, const wchar_t* website, const wchar_t* videoInfo) {
                return self->SetRelateVideo(videoURL, website, videoInfo);
              },
              Session(), Unicode(), Unicode(), Unicode());
}

PyObject* OBLoginData_GetPresetDownloadURL(PyObject*, PyObject* args) {
  return GetLink(args, "OBLoginData_GetPresetDownloadURL", &OBLoginData::GetPresetDownloadURL);
}

PyObject* OBLoginData_GetEffectByGUID(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_GetEffectByGUID", ReturnsUnicodeOrNone{},
              [](OBLoginData* self, const wchar_t* guid) { return self->GetEffectByGUID(guid); }, Session(),
              Unicode());
}

PyObject* OBLoginData_m_hInternet_set(PyObject*, PyObject* args) {
  return SetHandle(args, "OBLoginData_m_hInternet_set", &OBLoginData::m_hInternet);
}

PyObject* OBLoginData_m_hInternet_get(PyObject*, PyObject* args) {
  return GetHandle(args, "OBLoginData_m_hInternet_get", &OBLoginData::m_hInternet);
}

PyObject* OBLoginData_m_hConnect_set(PyObject*, PyObject* args) {
  return SetHandle(args, "OBLoginData_m_hConnect_set", &OBLoginData::m_hConnect);
}

PyObject* OBLoginData_m_hConnect_get(PyObject*, PyObject* args) {
  return GetHandle(args, "OBLoginData_m_hConnect_get", &OBLoginData::m_hConnect);
}

PyObject* OBLoginData_m_hRequest_set(PyObject*, PyObject* args) {
  return SetHandle(args, "OBLoginData_m_hRequest_set", &OBLoginData::m_hRequest);
}

PyObject* OBLoginData_m_hRequest_get(PyObject*, PyObject* args) {
  return GetHandle(args, "OBLoginData_m_hRequest_get", &OBLoginData::m_hRequest);
}

PyObject* OBLoginData_m_bServerReachable_set(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_m_bServerReachable_set", ReturnsNone{},
              [](OBLoginData* self, int reachable) { self->m_bServerReachable = reachable; },
              Session(OnNull::kSkipCall), Integer("BOOL"));
}

PyObject* OBLoginData_m_bServerReachable_get(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_m_bServerReachable_get", ReturnsInt{},
              [](OBLoginData* self) { return self->m_bServerReachable; }, Session());
}

PyObject* OBLoginData_m_szChkServerUrl_set(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_m_szChkServerUrl_set", ReturnsNone{},
              [](OBLoginData* self, const UrlBuffer& url) {
                std::copy(url.begin(), url.end(), self->m_szChkServerUrl);
              },
              Session(), NarrowArray<kMaxPath>("char [_MAX_PATH]"));
}

// All kMaxPath bytes: the array need not hold a terminator.
PyObject* OBLoginData_m_szChkServerUrl_get(PyObject*, PyObject* args) {
  return Call(args, "OBLoginData_m_szChkServerUrl_get", ReturnsStr{},
              [](OBLoginData* self) { return std::string_view(self->m_szChkServerUrl, kMaxPath); },
              Session());
}

PyObject* OBLoginData_swigregister(PyObject*, PyObject* args) {
  return Register(args, Type(TypeId::OBLoginData));
}

}  // namespace module
