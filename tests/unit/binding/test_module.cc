#include "test_module.h"

#include "module/runtime/ModuleTypes.h"
#include "module/runtime/PyRef.h"
#include "module/runtime/pointers.h"
#include "support/fixtures.h"

namespace binding_test {

namespace {

binding::ModuleTypes& Types() {
  static auto* types = [] {
    test_support::StartPython();
    auto* made = new binding::ModuleTypes({
        {"_p_CString", "CString *"},
        {"_p_Thing", "Thing *"},
        {"_p_char", "char *|TCHAR *"},
        {"_p_wchar_t", "wchar_t *|WCHAR *"},
    });
    binding::InitializeTypeTable(made->table());
    return made;
  }();
  return *types;
}

}  // namespace

binding::TypeInfo* Type(TestType type) { return Types()[static_cast<size_t>(type)]; }

PyObject* PointerTo(void* address, TestType type) {
  return binding::NewPointerObject(address, Type(type), binding::POINTER_NOSHADOW);
}

std::string TakeError() {
  if (!PyErr_Occurred()) return "";
  PyObject *type, *value, *traceback;
  PyErr_Fetch(&type, &value, &traceback);
  PyErr_NormalizeException(&type, &value, &traceback);
  binding::PyRef typeRef(type), valueRef(value), tracebackRef(traceback);
  binding::PyRef text(PyObject_Str(value));
  std::string name = reinterpret_cast<PyTypeObject*>(type)->tp_name;  // "exceptions.TypeError"
  return name.substr(name.rfind('.') + 1) + ": " + (text ? PyString_AsString(text.get()) : "?");
}

}  // namespace binding_test
