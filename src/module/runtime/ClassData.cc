#include "module/runtime/ClassData.h"

#include <map>
#include <utility>
#include <vector>

#include "interpreter/PythonApi.h"
#include "module/runtime/PyRef.h"
#include "module/runtime/pointers.h"

namespace runtime {

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
  data.newRaw = interpreter::IsClassicClass(cls) ? nullptr : OptionalAttribute(cls, "__new__");
  if (data.newRaw) {
    data.newArgs = PyTuple_Pack(1, cls);
  } else {
    Py_INCREF(cls);
    data.newArgs = cls;
  }
}

// How many types hold each class data that this module made.
std::map<ClassData*, int>& Holders() {
  static auto* holders = new std::map<ClassData*, int>;
  return *holders;
}

// Points `type` at `data`; class data of this module that no type holds any
// more is added to `unheld`.
void Attach(TypeInfo& type, ClassData* data, std::vector<ClassData*>& unheld) {
  ClassData* previous = std::exchange(type.classData, data);
  ++Holders()[data];
  const auto held = Holders().find(previous);
  if (held != Holders().end() && --held->second == 0) {
    Holders().erase(held);
    unheld.push_back(previous);
  }
}

// Cast types take the class when they have none, or the one `type` had until now.
void ShareWithCasts(TypeInfo& type, ClassData* data, const ClassData* replaced,
                    std::vector<ClassData*>& unheld) {
  Attach(type, data, unheld);
  for (CastInfo* cast = type.casts; cast; cast = cast->next) {
    TypeInfo& other = *cast->type;
    if (cast->converter || other.classData == data) continue;
    if (!other.classData || other.classData == replaced) {
      ShareWithCasts(other, data, replaced, unheld);
    }
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
  return interpreter::NewClassicInstance(data.newArgs, dict.get());
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
  std::vector<ClassData*> unheld;
  ShareWithCasts(type, data, type.classData, unheld);
  type.ownsClassData = 1;
  // Last: letting go of an old class may run Python code.
  for (ClassData* old : unheld) {
    ReleaseClassData(*old);
    delete old;
  }
}

PyObject* NewShadowInstance(const ClassData& data, PyObject* pointerObject) {
  PyRef instance;
  if (data.newRaw) {
    // Held for the call: "__new__" may register another class, which frees `data`.
    const PyRef newRaw = PyRef::Borrow(data.newRaw);
    const PyRef newArgs = PyRef::Borrow(data.newArgs);
    instance = PyRef(PyObject_Call(newRaw.get(), newArgs.get(), nullptr));
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

}  // namespace runtime
