#include "module/runtime/ClassData.h"

#include "module/runtime/PyRef.h"
#include "module/runtime/pointers.h"

namespace binding {

namespace {

// The attribute, or null with the lookup's error cleared.
PyObject* OptionalAttribute(PyObject* object, const char* name) {
  PyObject* value = PyObject_GetAttrString(object, name);
  if (!value) PyErr_Clear();
  return value;
}

bool TakesSingleObject(PyObject* function) {
  return PyCFunction_Check(function) && (PyCFunction_GET_FLAGS(function) & METH_O);
}

void SetConstructor(ClassData& data, PyObject* cls) {
  data.newRaw = PyClass_Check(cls) ? nullptr : OptionalAttribute(cls, "__new__");
  if (data.newRaw) {
    data.newArgs = PyTuple_Pack(1, cls);
  } else {
    Py_INCREF(cls);
    data.newArgs = cls;
  }
}

void ShareWithCasts(TypeInfo& type, ClassData* data) {
  type.classData = data;
  for (CastInfo* cast = type.casts; cast; cast = cast->next) {
    if (!cast->converter && !cast->type->classData) ShareWithCasts(*cast->type, data);
  }
}

// Stores "this" in the instance's dictionary, creating it when still empty.
bool StoreThis(PyObject* instance, PyObject* pointerObject) {
  PyObject** dictSlot = _PyObject_GetDictPtr(instance);
  if (!dictSlot) return false;
  if (!*dictSlot) *dictSlot = PyDict_New();
  return *dictSlot && PyDict_SetItem(*dictSlot, ThisName(), pointerObject) == 0;
}

PyObject* NewClassicInstance(const ClassData& data, PyObject* pointerObject) {
  PyRef dict(PyDict_New());
  if (!dict || PyDict_SetItem(dict.get(), ThisName(), pointerObject) != 0) return nullptr;
  return PyInstance_NewRaw(data.newArgs, dict.get());
}

}  // namespace

void RegisterClass(TypeInfo& type, PyObject* cls) {
  auto* data = new ClassData{};
  Py_INCREF(cls);
  data->klass = cls;
  SetConstructor(*data, cls);
  data->destroy = OptionalAttribute(cls, "__swig_destroy__");
  data->destroyTakesTuple = !(data->destroy && TakesSingleObject(data->destroy));
  data->implicitConvBusy = 0;
  ShareWithCasts(type, data);
  type.ownsClassData = 1;
}

PyObject* NewShadowInstance(const ClassData& data, PyObject* pointerObject) {
  PyRef instance;
  if (data.newRaw) {
    instance = PyRef(PyObject_Call(data.newRaw, data.newArgs, nullptr));
    // An instance that cannot hold "this" would lose the native object with it.
    if (instance && !StoreThis(instance.get(), pointerObject)) instance = PyRef();
  } else {
    instance = PyRef(NewClassicInstance(data, pointerObject));
  }
  if (!instance) PyErr_Clear();
  return instance.release();
}

void ReleaseClassData(ClassData& data) {
  Py_CLEAR(data.newRaw);
  Py_CLEAR(data.newArgs);
  Py_CLEAR(data.destroy);
  Py_CLEAR(data.klass);
}

}  // namespace binding
