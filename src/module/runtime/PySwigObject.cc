#include "module/runtime/PySwigObject.h"

#include <cinttypes>
#include <cstdio>
#include <string>

#include "interpreter/PythonApi.h"
#include "module/runtime/ClassData.h"
#include "module/runtime/PyRef.h"
#include "module/runtime/StaticType.h"
#include "module/runtime/exception_barrier.h"
#include "module/runtime/text_form.h"

namespace runtime {

namespace {

constexpr char kTypeName[] = "PySwigObject";
constexpr char kLeakLine[] = "swig/python detected a memory leak of type '%s', no destructor found.\n";

PySwigObject* AsObject(PyObject* object) { return reinterpret_cast<PySwigObject*>(object); }

std::string Repr(const PySwigObject& object) {
  return "<Swig Object of type '" + std::string(DisplayName(*object.type)) + "' at 0x" +
         FormatAddress("%" PRIxPTR, object.ptr) + ">";
}

// Calls the class's destroy function on a non-owning stand-in: the dying object itself
// has no references left and must not be handed to code that may take one.
void CallDestroy(const PySwigObject& object, const ClassData& data) {
  PyObject *type, *value, *traceback;
  PyErr_Fetch(&type, &value, &traceback);
  PyRef standIn(NewPySwigObject(object.ptr, object.type, false));
  // Held for the call: it may register another class, which frees `data`.
  const PyRef destroy = PyRef::Borrow(data.destroy);
  if (standIn) {
    PyRef result(data.destroyTakesTuple
                     ? PyObject_CallFunctionObjArgs(destroy.get(), standIn.get(), nullptr)
                     : PyCFunction_GET_FUNCTION(destroy.get())(PyCFunction_GET_SELF(destroy.get()),
                                                               standIn.get()));
  }
  PyErr_Clear();  // a failing destroy is ignored
  PyErr_Restore(type, value, traceback);
}

void ReportLeak(const TypeInfo& type) {
  std::printf(kLeakLine, DisplayName(type));
  std::fflush(stdout);
}

void Dealloc(PyObject* self) {
  PySwigObject& object = *AsObject(self);
  PyObject* next = object.next;
  if (object.own) {
    const ClassData* data = object.type->classData;
    if (data && data->destroy) {
      CallDestroy(object, *data);
    } else {
      ReportLeak(*object.type);
    }
  }
  Py_XDECREF(next);
  PyObject_Del(self);
}

PyObject* ReprSlot(PyObject* self) {
  return RaiseOnException<PyObject*>(nullptr, [self]() -> PyObject* {
    PySwigObject& object = *AsObject(self);
    std::string text = Repr(object);
    if (object.next) {
      PyRef nextText(PyObject_Repr(object.next));  // its recursion limit guards long chains
      if (!nextText) return nullptr;
      const char* nextChars = interpreter::NarrowTextChars(nextText.get());
      if (!nextChars) return nullptr;
      text += nextChars;
    }
    return interpreter::NewNarrowText(text.data(), text.size());
  });
}

int PrintSlot(PyObject* self, FILE* file, int) {
  PyRef text(ReprSlot(self));
  if (!text) return -1;
  const char* chars = interpreter::NarrowTextChars(text.get());
  if (!chars) return -1;
  std::fputs(chars, file);
  return 0;
}

PyObject* StrSlot(PyObject* self) {
  return RaiseOnException<PyObject*>(nullptr, [self] {
    PySwigObject& object = *AsObject(self);
    std::string text = "_" + PackBytes(&object.ptr, sizeof object.ptr) + object.type->mangledName;
    return interpreter::NewNarrowText(text.data(), text.size());
  });
}

int CompareSlot(PyObject* left, PyObject* right) {
  auto a = reinterpret_cast<uintptr_t>(AsObject(left)->ptr);
  auto b = reinterpret_cast<uintptr_t>(AsObject(right)->ptr);
  return a < b ? -1 : (a > b ? 1 : 0);
}

PyObject* LongSlot(PyObject* self) { return PyLong_FromVoidPtr(AsObject(self)->ptr); }

PyObject* FormattedAddress(PyObject* self, const char* format) {
  return RaiseOnException<PyObject*>(nullptr, [self, format] {
    return interpreter::NewNarrowText(FormatAddress(format, AsObject(self)->ptr).c_str());
  });
}
PyObject* OctSlot(PyObject* self) { return FormattedAddress(self, "%" PRIoPTR); }
PyObject* HexSlot(PyObject* self) { return FormattedAddress(self, "%" PRIxPTR); }

PyObject* Disown(PyObject* self, PyObject*) {
  AsObject(self)->own = 0;
  Py_RETURN_NONE;
}

PyObject* Acquire(PyObject* self, PyObject*) {
  AsObject(self)->own = 1;
  Py_RETURN_NONE;
}

PyObject* Own(PyObject* self, PyObject* args) {
  PyObject* value = nullptr;
  if (!interpreter::UnpackTuple(args, "own", 0, 1, &value)) return nullptr;
  PyObject* previous = PyBool_FromLong(AsObject(self)->own);
  if (value) {
    int truth = PyObject_IsTrue(value);
    if (truth < 0) {
      Py_DECREF(previous);
      return nullptr;
    }
    AsObject(self)->own = truth;
  }
  return previous;
}

bool ChainContains(PyObject* chain, PyObject* member) {
  for (; chain; chain = AsObject(chain)->next) {
    if (chain == member) return true;
  }
  return false;
}

// Fails without an exception of its own for a non-pointer argument, which the
// interpreter reports as SystemError. A link back into this chain would make every
// walk along it endless, so that is refused too.
PyObject* Append(PyObject* self, PyObject* other) {
  if (!IsPySwigObject(other)) return nullptr;
  if (ChainContains(other, self)) {
    PyErr_SetString(PyExc_ValueError, "appending this object would make the chain a cycle");
    return nullptr;
  }
  Py_INCREF(other);
  PyObject* previous = AsObject(self)->next;
  AsObject(self)->next = other;
  Py_XDECREF(previous);
  Py_RETURN_NONE;
}

PyObject* Next(PyObject* self, PyObject*) {
  PyObject* next = AsObject(self)->next;
  if (!next) Py_RETURN_NONE;
  Py_INCREF(next);
  return next;
}

PyObject* ReprMethod(PyObject* self, PyObject*) { return ReprSlot(self); }

PyMethodDef kMethods[] = {
    {"disown", Disown, METH_NOARGS, "releases ownership of the pointer"},
    {"acquire", Acquire, METH_NOARGS, "aquires ownership of the pointer"},
    {"own", Own, METH_VARARGS, "returns/sets ownership of the pointer"},
    {"append", Append, METH_O, "appends another 'this' object"},
    {"next", Next, METH_NOARGS, "returns the next 'this' object"},
    {"__repr__", ReprMethod, METH_NOARGS, "returns object representation"},
    {nullptr, nullptr, 0, nullptr},
};

PyNumberMethods MakeNumberMethods() {
  PyNumberMethods number{};
  interpreter::SetIntegerSlots(number, LongSlot, OctSlot, HexSlot);
  return number;
}

PyTypeObject MakeType() {
  static PyNumberMethods number = MakeNumberMethods();
  PyTypeObject type = StaticType::Template(kTypeName, sizeof(PySwigObject));
  type.tp_dealloc = Dealloc;
  interpreter::SetPrintSlot(type, PrintSlot);
  interpreter::SetCompareSlot<CompareSlot>(type);
  type.tp_repr = ReprSlot;
  type.tp_as_number = &number;
  type.tp_str = StrSlot;
  type.tp_methods = kMethods;
  return type;
}

}  // namespace

PyTypeObject* PySwigObjectType() {
  static StaticType type(MakeType());
  return type.get();
}

bool IsPySwigObject(PyObject* object) {
  return IsCompatibleType(Py_TYPE(object), PySwigObjectType());
}

PyObject* NewPySwigObject(void* ptr, TypeInfo* type, bool own) {
  PyTypeObject* pyType = PySwigObjectType();
  if (!pyType) return nullptr;
  PySwigObject* object = PyObject_New(PySwigObject, pyType);
  if (!object) return nullptr;
  object->ptr = ptr;
  object->type = type;
  object->own = own ? 1 : 0;
  object->next = nullptr;
  return reinterpret_cast<PyObject*>(object);
}

PyObject* PySwigObjectRepr(PyObject* object) { return ReprSlot(object); }

}  // namespace runtime
