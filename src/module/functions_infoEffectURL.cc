#include "module/functions_infoEffectURL.h"

#include "module/infoEffectURL.h"
#include "module/runtime/call.h"
#include "module/types.h"

namespace module {

namespace {

using namespace binding;

using Member = CString infoEffectURL::*;

constexpr char kRecordType[] = "infoEffectURL *";

PointerKind<infoEffectURL> Record(OnNull onNull = OnNull::kRefuse) {
  return Pointer<infoEffectURL>(Type(TypeId::infoEffectURL), kRecordType, onNull);
}

ReferenceKind<CString> Text() { return Reference<CString>(Type(TypeId::CString), "CString"); }

PyObject* SetMember(PyObject* args, const char* function, Member member) {
  return Call(args, function, ReturnsNone{},
              [member](infoEffectURL* record, const CString& value) { record->*member = value; },
              Record(OnNull::kSkipCall), Text());
}

// A new heap copy of the member, owned by the pointer object returned.
PyObject* GetMember(PyObject* args, const char* function, Member member) {
  return Call(args, function, NewPointer(Type(TypeId::CString), POINTER_OWN),
              [member](infoEffectURL* record) { return new CString(record->*member); }, Record());
}

}  // namespace

PyObject* new_infoEffectURL(PyObject*, PyObject* args) {
  return Call(args, "new_infoEffectURL",
              NewPointer(Type(TypeId::infoEffectURL), POINTER_OWN | POINTER_NOSHADOW),
              [](const CString& effect, const CString& tag, const CString& url) {
                return new infoEffectURL(effect, tag, url);
              },
              Text(), Text(), Text());
}

PyObject* infoEffectURL_strEffect_set(PyObject*, PyObject* args) {
  return SetMember(args, "infoEffectURL_strEffect_set", &infoEffectURL::strEffect);
}

PyObject* infoEffectURL_strEffect_get(PyObject*, PyObject* args) {
  return GetMember(args, "infoEffectURL_strEffect_get", &infoEffectURL::strEffect);
}

PyObject* infoEffectURL_strTag_set(PyObject*, PyObject* args) {
  return SetMember(args, "infoEffectURL_strTag_set", &infoEffectURL::strTag);
}

PyObject* infoEffectURL_strTag_get(PyObject*, PyObject* args) {
  return GetMember(args, "infoEffectURL_strTag_get", &infoEffectURL::strTag);
}

PyObject* infoEffectURL_strURL_set(PyObject*, PyObject* args) {
  return SetMember(args, "infoEffectURL_strURL_set", &infoEffectURL::strURL);
}

PyObject* infoEffectURL_strURL_get(PyObject*, PyObject* args) {
  return GetMember(args, "infoEffectURL_strURL_get", &infoEffectURL::strURL);
}

PyObject* delete_infoEffectURL(PyObject*, PyObject* args) {
  return Delete<infoEffectURL>(args, "delete_infoEffectURL", Type(TypeId::infoEffectURL),
                               kRecordType);
}

PyObject* infoEffectURL_swigregister(PyObject*, PyObject* args) {
  return Register(args, Type(TypeId::infoEffectURL));
}

}  // namespace module
