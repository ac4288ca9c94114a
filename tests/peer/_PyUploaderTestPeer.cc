// _PyUploaderTestPeer: a second module of the type ring, built only for tests. It makes
// and reads the "CString *" objects that _PyUploader's functions take, and shows that
// two modules share one TypeInfo per native type and one registered class.
#include <Python.h>

#include <string>

#include "interpreter/PythonApi.h"
#include "module/runtime/ModuleTypes.h"
#include "module/runtime/call.h"

namespace {

using namespace runtime;
using CString = std::wstring;

constexpr int kApiVersion = 1013;
constexpr char kCStringType[] = "CString *";

ModuleTypes& Types() {
  static auto* types = new ModuleTypes({{"_p_CString", "CString *"}});
  return *types;
}

TypeInfo* CStringType() { return Types()[0]; }

PyObject* new_CString(PyObject*, PyObject* args) {
  return Call(args, "new_CString", NewPointer(CStringType(), POINTER_OWN | POINTER_NOSHADOW),
              [](const wchar_t* text) { return new CString(text ? text : L""); }, WideString());
}

PyObject* CString_value(PyObject*, PyObject* args) {
  return Call(args, "CString_value", PassedThrough{},
              [](const CString& text) { return PyUnicode_FromWideChar(text.data(), text.size()); },
              Reference<CString>(CStringType(), kCStringType));
}

PyObject* delete_CString(PyObject*, PyObject* args) {
  return Delete<CString>(args, "delete_CString", CStringType(), kCStringType);
}

PyObject* CString_swigregister(PyObject*, PyObject* args) { return Register(args, CStringType()); }

PyMethodDef g_functions[] = {
    {"new_CString", new_CString, METH_VARARGS, nullptr},
    {"CString_value", CString_value, METH_VARARGS, nullptr},
    {"delete_CString", delete_CString, METH_VARARGS, nullptr},
    {"CString_swigregister", CString_swigregister, METH_VARARGS, nullptr},
    {nullptr, nullptr, 0, nullptr},
};

PyObject* MakeModule() {
  PyObject* module = interpreter::CreateModule("_PyUploaderTestPeer", g_functions, kApiVersion);
  if (module) InitializeTypeTable(Types().table());
  return module;
}

}  // namespace

PYUPLOADER_MODULE_INIT(_PyUploaderTestPeer, MakeModule)
