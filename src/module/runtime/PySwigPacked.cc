#include "module/runtime/PySwigPacked.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <optional>
#include <string>

#include "interpreter/PythonApi.h"
#include "module/runtime/StaticType.h"
#include "module/runtime/exception_barrier.h"
#include "module/runtime/text_form.h"

namespace runtime {

namespace {

constexpr char kTypeName[] = "PySwigPacked";
// The packed form is shown only while it fits this many characters with its terminator.
constexpr size_t kPackedTextLimit = 1024;

PySwigPacked* AsPacked(PyObject* object) { return reinterpret_cast<PySwigPacked*>(object); }

// "_" and two hexadecimal digits per byte, when that fits the limit.
std::optional<std::string> PackedForm(const PySwigPacked& packed) {
  if (2 * packed.size + 2 > kPackedTextLimit) return std::nullopt;
  return "_" + PackBytes(packed.data, packed.size);
}

std::string Repr(const PySwigPacked& packed) {
  std::optional<std::string> form = PackedForm(packed);
  std::string name = packed.type->mangledName;
  return form ? "<Swig Packed at " + *form + name + ">" : "<Swig Packed " + name + ">";
}

PyObject* ReprSlot(PyObject* self) {
  return RaiseOnException<PyObject*>(nullptr, [self] {
    std::string text = Repr(*AsPacked(self));
    return interpreter::NewNarrowText(text.data(), text.size());
  });
}

PyObject* StrSlot(PyObject* self) {
  return RaiseOnException<PyObject*>(nullptr, [self] {
    const PySwigPacked& packed = *AsPacked(self);
    std::string text = PackedForm(packed).value_or("") + packed.type->mangledName;
    return interpreter::NewNarrowText(text.data(), text.size());
  });
}

int PrintSlot(PyObject* self, FILE* file, int) {
  return RaiseOnException(-1, [self, file] {
    std::fputs(Repr(*AsPacked(self)).c_str(), file);
    return 0;
  });
}

int CompareSlot(PyObject* left, PyObject* right) {
  const PySwigPacked& a = *AsPacked(left);
  const PySwigPacked& b = *AsPacked(right);
  if (a.size != b.size) return a.size < b.size ? -1 : 1;
  int order = std::memcmp(a.data, b.data, a.size);
  return order < 0 ? -1 : (order > 0 ? 1 : 0);
}

void Dealloc(PyObject* self) {
  std::free(AsPacked(self)->data);
  PyObject_Del(self);
}

PyTypeObject MakeType() {
  PyTypeObject type = StaticType::Template(kTypeName, sizeof(PySwigPacked));
  type.tp_dealloc = Dealloc;
  interpreter::SetPrintSlot(type, PrintSlot);
  interpreter::SetCompareSlot<CompareSlot>(type);
  type.tp_repr = ReprSlot;
  type.tp_str = StrSlot;
  return type;
}

}  // namespace

PyTypeObject* PySwigPackedType() {
  static StaticType type(MakeType());
  return type.get();
}

bool IsPySwigPacked(PyObject* object) {
  return IsCompatibleType(Py_TYPE(object), PySwigPackedType());
}

PyObject* NewPySwigPacked(const void* data, size_t size, TypeInfo* type) {
  PyTypeObject* pyType = PySwigPackedType();
  if (!pyType) return nullptr;
  void* copy = std::malloc(size ? size : 1);
  if (!copy) return PyErr_NoMemory();
  std::memcpy(copy, data, size);
  PySwigPacked* packed = PyObject_New(PySwigPacked, pyType);
  if (!packed) {
    std::free(copy);
    return nullptr;
  }
  packed->data = copy;
  packed->type = type;
  packed->size = size;
  return reinterpret_cast<PyObject*>(packed);
}

}  // namespace runtime
