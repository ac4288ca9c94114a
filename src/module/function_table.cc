// The 45 module functions at their positions. Each function is one entry of its
// class's table in functions_<Class>.cc: its name, then its body, one statement
// built on runtime::Call (runtime/call.h), which
// runs the shared call sequence: unpack exactly N arguments, convert them left to
// right (raising the module's error texts), call the native operation, convert its
// result. To add one:
//
// 1. Write its entry at its position in its class's table in functions_<Class>.cc
//    (using namespace runtime); the body is given the name for its error texts:
//
//    // Unicode argument, optional text result (None for no text):
//    {"OBLoginData_GetEffectByGUID",
//     [](PyObject* args, const char* name) {
//       return Call(args, name, ReturnsUnicodeOrNone{},
//                   [](OBLoginData* self, const wchar_t* guid) {
//                     return self->GetEffectByGUID(guid);
//                   },
//                   Pointer<OBLoginData>(Type(TypeId::OBLoginData), "OBLoginData *"), Unicode());
//     }},
//
//    // Integer argument, a by-reference CString (null refused), int result:
//    {"OBLoginData_GetCategroyName",
//     [](PyObject* args, const char* name) {
//       return Call(args, name, ReturnsInt{},
//                   [](OBLoginData* self, int id, CString& text) {
//                     return self->GetCategroyName(id, text);
//                   },
//                   Pointer<OBLoginData>(Type(TypeId::OBLoginData), "OBLoginData *"),
//                   Integer("int"), Reference<CString>(Type(TypeId::CString), "CString &"));
//     }},
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
//    Where a helper template makes the whole body, the entry names it:
//    {"OBLoginData_m_hConnect_get", GetHandle<&OBLoginData::m_hConnect>}.
// 2. Raise the class's count in function_table.h.
#include "module/function_table.h"

#include <cstddef>
#include <utility>
#include <vector>

namespace module {

namespace {

// The interpreter calls a function with its arguments only; each position gets
// its own entry point, which hands the entry's body its name.
template <const ModuleFunction* functions, std::size_t I>
PyObject* EntryPoint(PyObject*, PyObject* args) {
  return functions[I].body(args, functions[I].name);
}

template <const ModuleFunction* functions, std::size_t... I>
void Append(std::vector<PyMethodDef>& table, std::index_sequence<I...>) {
  (table.push_back({functions[I].name, &EntryPoint<functions, I>, METH_VARARGS, nullptr}), ...);
}

std::vector<PyMethodDef> MakeTable() {
  std::vector<PyMethodDef> table;
  Append<kInfoEffectURLFunctions>(table, std::make_index_sequence<kInfoEffectURLCount>{});
  Append<kOBLoginDataFunctions>(table, std::make_index_sequence<kOBLoginDataCount>{});
  Append<kPyPresetUploaderFunctions>(table, std::make_index_sequence<kPyPresetUploaderCount>{});
  table.push_back({nullptr, nullptr, 0, nullptr});
  return table;
}

}  // namespace

PyMethodDef* FunctionTable() {
  static std::vector<PyMethodDef> table = MakeTable();
  return table.data();
}

}  // namespace module
