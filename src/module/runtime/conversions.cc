#include "module/runtime/conversions.h"

#include <climits>
#include <cstring>
#include <memory>

#include "interpreter/PythonApi.h"
#include "module/runtime/PyRef.h"
#include "module/runtime/TypeTable.h"
#include "module/runtime/pointers.h"
#include "module/runtime/status.h"

namespace runtime {

namespace {

constexpr uint32_t kLargestInt = 0x7FFFFFFF;

TypeInfo* WideCharType() {
  static TypeInfo* type = TypeQuery("_p_wchar_t");
  return type;
}

TypeInfo* CharType() {
  static TypeInfo* type = TypeQuery("_p_char");
  return type;
}

wchar_t* CopyUnicode(PyObject* text) {
  Py_ssize_t count = interpreter::UnicodeLength(text);
  auto* copy = new wchar_t[count + 1];
  interpreter::CopyUnicode(text, copy, count);
  copy[count] = L'\0';
  return copy;
}

template <typename T>
void Store(T* out, T value) {
  if (out) *out = value;
}

bool InIntRange(long value) { return value >= INT_MIN && value <= INT_MAX; }

}  // namespace

int AsWideString(PyObject* object, wchar_t** address, size_t*, int* mark) {
  PyRef decoded;
  if (interpreter::IsUndecodedText(object)) {
    decoded = PyRef(PyUnicode_FromObject(object));
    if (!decoded) return STATUS_TYPE_ERROR;
    object = decoded.get();
  }
  if (PyUnicode_Check(object)) {
    wchar_t* copy = CopyUnicode(object);
    if (address) {
      *address = copy;
    } else {
      delete[] copy;
    }
    Store(mark, NEWOBJ);
    return STATUS_OK;
  }
  void* pointer = nullptr;
  if (ConvertPointer(object, &pointer, WideCharType(), 0) != STATUS_OK) return STATUS_TYPE_ERROR;
  Store(address, static_cast<wchar_t*>(pointer));
  return STATUS_OK;
}

int AsNarrowString(PyObject* object, char** address, size_t* length, int* mark) {
  if (interpreter::IsNarrowText(object)) {
    const interpreter::NarrowBytes bytes(object);
    if (!bytes) return STATUS_TYPE_ERROR;
    size_t count = bytes.size() + 1;
    // Bytes that die with `bytes` are copied whatever the caller asked for.
    if (address && (!bytes.inText() || (mark && *mark == NEWOBJ))) {
      *address = new char[count];
      std::memcpy(*address, bytes.data(), count);
      Store(mark, NEWOBJ);
    } else {
      Store(address, bytes.data());
      Store(mark, 0);
    }
    Store(length, count);
    return STATUS_OK;
  }
  void* pointer = nullptr;
  if (ConvertPointer(object, &pointer, CharType(), 0) != STATUS_OK) return STATUS_TYPE_ERROR;
  auto* text = static_cast<char*>(pointer);
  Store(address, text);
  Store(length, text ? std::strlen(text) + 1 : size_t{0});
  Store(mark, 0);
  return STATUS_OK;
}

int AsNarrowArray(PyObject* object, char* buffer, size_t size) {
  char* text = nullptr;
  size_t count = 0;
  int mark = 0;
  if (AsNarrowString(object, &text, &count, &mark) != STATUS_OK) return STATUS_TYPE_ERROR;
  const std::unique_ptr<char[]> copy(mark == NEWOBJ ? text : nullptr);
  if (count == size + 1 && text[size] == '\0') count = size;
  if (count > size) return STATUS_TYPE_ERROR;
  if (count) std::memcpy(buffer, text, count);
  std::memset(buffer + count, 0, size - count);
  return STATUS_OK;
}

int AsInt(PyObject* object, int* value) {
  long number = 0;
  if (interpreter::IsShortInt(object)) {
    number = interpreter::ShortIntValue(object);
  } else if (PyLong_Check(object)) {
    number = PyLong_AsLong(object);
    if (number == -1 && PyErr_Occurred()) {
      PyErr_Clear();
      return STATUS_TYPE_ERROR;
    }
  } else {
    return STATUS_TYPE_ERROR;
  }
  // The platform's C long is wider than the 32-bit value the native side takes.
  if (!InIntRange(number)) return STATUS_TYPE_ERROR;
  Store(value, static_cast<int>(number));
  return STATUS_OK;
}

PyObject* FromNarrowArray(const char* bytes, size_t size) {
  return interpreter::NewNarrowText(bytes, size);
}

size_t TrimTrailingZeros(const char* bytes, size_t size) {
  while (size > 0 && bytes[size - 1] == '\0') --size;
  return size;
}

PyObject* FromWide(std::wstring_view text) {
  const wchar_t* characters = text.empty() ? L"" : text.data();
  return PyUnicode_FromWideChar(characters, static_cast<Py_ssize_t>(text.size()));
}

PyObject* FromWideMap(const std::map<std::wstring, std::wstring>& items) {
  PyObject* dictionary = PyDict_New();
  if (!dictionary) {
    PyErr_Clear();
    Py_RETURN_NONE;
  }
  for (const auto& [key, value] : items) {
    const PyRef keyObject(FromWide(key));
    const PyRef valueObject(FromWide(value));
    if (!keyObject || !valueObject ||
        PyDict_SetItem(dictionary, keyObject.get(), valueObject.get()) != 0) {
      PyErr_Clear();
      break;
    }
  }
  return dictionary;
}

PyObject* FromUnsigned(uint32_t value) {
  if (value <= kLargestInt) return interpreter::NewInt(static_cast<long>(value));
  return PyLong_FromUnsignedLong(value);
}

}  // namespace runtime
