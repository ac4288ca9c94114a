#include "module/runtime/StaticType.h"

#include <cstring>

namespace binding {

namespace {

constexpr char kDoc[] = "Swig object carries a C/C++ instance pointer";

}  // namespace

PyTypeObject StaticType::Template(const char* name, Py_ssize_t basicSize) {
  PyTypeObject type{};
  PyObject* head = reinterpret_cast<PyObject*>(&type);
  head->ob_refcnt = 1;
  head->ob_type = &PyType_Type;
  type.tp_name = name;
  type.tp_basicsize = basicSize;
  type.tp_getattro = PyObject_GenericGetAttr;
  type.tp_flags = Py_TPFLAGS_DEFAULT;
  type.tp_doc = kDoc;
  return type;
}

StaticType::StaticType(const PyTypeObject& filled)
    : type_(filled), ready_(PyType_Ready(&type_) == 0) {}

bool IsCompatibleType(PyTypeObject* candidate, PyTypeObject* ours) {
  if (!ours) return false;
  if (candidate == ours) return true;
  return std::strcmp(candidate->tp_name, ours->tp_name) == 0 &&
         !(candidate->tp_flags & Py_TPFLAGS_HEAPTYPE) &&
         candidate->tp_basicsize == ours->tp_basicsize;
}

}  // namespace binding
