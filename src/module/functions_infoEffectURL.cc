#include "module/function_table.h"

#include <iterator>

#include "module/infoEffectURL.h"
#include "module/runtime/call.h"
#include "module/types.h"

namespace module {

namespace {

using namespace runtime;

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

const ModuleFunction kInfoEffectURLFunctions[] = {
    {"new_infoEffectURL",  // 1
     [](PyObject* args, const char* name) {
       return Call(args, name,
                   NewPointer(Type(TypeId::infoEffectURL), POINTER_OWN | POINTER_NOSHADOW),
                   [](const CString& effect, const CString& tag, const CString& url) {
                     return new infoEffectURL(effect, tag, url);
                   },
                   Text(), Text(), Text());
     }},
    {"infoEffectURL_strEffect_set",  // 2
     [](PyObject* args, const char* name) {
       return SetMember(args, name, &infoEffectURL::strEffect);
     }},
    {"infoEffectURL_strEffect_get",  // 3
     [](PyObject* args, const char* name) {
       return GetMember(args, name, &infoEffectURL::strEffect);
     }},
    {"infoEffectURL_strTag_set",  // 4
     [](PyObject* args, const char* name) {
       return SetMember(args, name, &infoEffectURL::strTag);
     }},
    {"infoEffectURL_strTag_get",  // 5
     [](PyObject* args, const char* name) {
       return GetMember(args, name, &infoEffectURL::strTag);
     }},
    {"infoEffectURL_strURL_set",  // 6
     [](PyObject* args, const char* name) {
       return SetMember(args, name, &infoEffectURL::strURL);
     }},
    {"infoEffectURL_strURL_get",  // 7
     [](PyObject* args, const char* name) {
       return GetMember(args, name, &infoEffectURL::strURL);
     }},
    {"delete_infoEffectURL",  // 8
     [](PyObject* args, const char* name) {
       return Delete<infoEffectURL>(args, name, Type(TypeId::infoEffectURL),
                                    kRecordType);
     }},
    {"infoEffectURL_swigregister",  // 9
     [](PyObject* args, const char*) {
       return Register(args, Type(TypeId::infoEffectURL));
     }},
};
static_assert(std::size(kInfoEffectURLFunctions) == kInfoEffectURLCount);

}  // namespace module
