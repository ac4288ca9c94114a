#include "module/runtime/pointers.h"

#include "interpreter/PythonApi.h"
#include "module/runtime/ClassData.h"
#include "module/runtime/PySwigObject.h"
#include "module/runtime/status.h"

namespace runtime {

namespace {

PyObject* g_thisName = nullptr;

// "this" values leading to further "this" values are followed this far at most, so
// an object whose "this" is itself cannot hang the caller.
constexpr int kMaxThisDepth = 64;

// One step of the search: the value that `object` names as "this", or empty.
PyRef LookUpThis(PyObject* object) {
  if (interpreter::IsClassicInstance(object)) {
    return PyRef::Borrow(interpreter::ClassicInstanceLookup(object, ThisName()));
  }
  if (PyObject** dictSlot = _PyObject_GetDictPtr(object)) {
    return PyRef::Borrow(*dictSlot ? PyDict_GetItem(*dictSlot, ThisName()) : nullptr);
  }
  if (PyWeakref_CheckProxy(object)) {
    PyObject* referent = PyWeakref_GET_OBJECT(object);
    return PyRef::Borrow(referent == Py_None ? nullptr : referent);
  }
  PyRef value(PyObject_GetAttr(object, ThisName()));
  if (!value) PyErr_Clear();
  return value;
}

// The pointer object in a chain whose type `expected` accepts, and its address.
PySwigObject* MatchInChain(PySwigObject* object, TypeInfo* expected, void** address) {
  for (; object; object = reinterpret_cast<PySwigObject*>(object->next)) {
    if (!expected || object->type == expected) {
      *address = object->ptr;
      return object;
    }
    if (CastInfo* cast = FindCast(*expected, object->type->mangledName)) {
      *address = cast->converter ? cast->converter(object->ptr) : object->ptr;
      return object;
    }
  }
  return nullptr;
}

}  // namespace

PyObject* ThisName() {
  if (!g_thisName) g_thisName = interpreter::NewInternedText("this");
  return g_thisName;
}

void ReleaseThisName() { Py_CLEAR(g_thisName); }

PyRef GetThisObject(PyObject* object) {
  PyRef current = PyRef::Borrow(object);
  for (int depth = 0; current && depth < kMaxThisDepth; ++depth) {
    if (IsPySwigObject(current.get())) return current;
    current = LookUpThis(current.get());
  }
  return PyRef();
}

int ConvertPointer(PyObject* object, void** address, TypeInfo* expected, int flags) {
  if (!object) return STATUS_ERROR;
  void* found = nullptr;
  if (object != Py_None) {
    PyRef pointerObject = GetThisObject(object);
    if (!pointerObject) return STATUS_ERROR;
    auto* chain = reinterpret_cast<PySwigObject*>(pointerObject.get());
    PySwigObject* match = MatchInChain(chain, expected, &found);
    if (!match) return STATUS_ERROR;
    if (flags & POINTER_DISOWN) match->own = 0;
  }
  if (address) *address = found;
  return STATUS_OK;
}

PyObject* NewPointerObject(void* address, TypeInfo* type, int flags) {
  if (!address) Py_RETURN_NONE;
  PyRef pointerObject(NewPySwigObject(address, type, flags & POINTER_OWN));
  if (!pointerObject) return nullptr;
  if (type->classData && !(flags & POINTER_NOSHADOW)) {
    if (PyObject* instance = NewShadowInstance(*type->classData, pointerObject.get())) {
      return instance;
    }
  }
  return pointerObject.release();
}

}  // namespace runtime
