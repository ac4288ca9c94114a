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

template <Member member>
PyObject* SetMember(PyObject* args, const char* function) {
  return Call(args, function, ReturnsNone{},
              [](infoEffectURL* record, const CString& value) { record->*member = value; },
              Record(OnNull::kSkipCall), Text());
}

// A new heap copy of the member, owned by the pointer object returned.
template <Member member>
PyObject* GetMember(PyObject* args, const char* function) {
  return Call(args, function, NewPointer(Type(TypeId::CString), POINTER_OWN),
              [](infoEffectURL* record) { return new CString(record->*member); }, Record());
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
    {"infoEffectURL_strEffect_set", SetMember<&infoEffectURL::strEffect>},  // 2
    {"infoEffectURL_strEffect_get", GetMember<&infoEffectURL::strEffect>},  // 3
    {"infoEffectURL_strTag_set", SetMember<&infoEffectURL::strTag>},  // 4
    {"infoEffectURL_strTag_get", GetMember<&infoEffectURL::strTag>},  // 5
    {"infoEffectURL_strURL_set", SetMember<&infoEffectURL::strURL>},  // 6
    {"infoEffectURL_strURL_get", GetMember<&infoEffectURL::strURL>},  // 7
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
