// The kinds of module function arguments. Each kind converts one Python object into a
// Slot (what must live until the native call has returned) and hands the native
// operation its Value; on failure it raises the exception the module promises and
// returns false. See call.h for how they are used.
#pragma once

#include <Python.h>

#include <array>
#include <cstddef>
#include <memory>

#include "interpreter/PythonApi.h"
#include "module/runtime/TypeInfo.h"
#include "module/runtime/conversions.h"
#include "module/runtime/pointers.h"
#include "module/runtime/status.h"

namespace runtime {

// What a None (null) pointer argument does.
enum class OnNull {
  kRefuse,    // ValueError "invalid null reference ..."
  kSkipCall,  // the native operation is not called and the function returns None
};

struct NeverSkips {
  template <typename Slot>
  bool SkipsCall(const Slot&) const { return false; }
};

// A pointer object of `type` (or an object whose "this" leads to one) as T*.
template <typename T>
struct PointerKind {
  using Slot = void*;
  TypeInfo* type;
  const char* cType;
  OnNull onNull;
  int flags;  // POINTER_DISOWN for the delete_ functions

  bool Convert(const char* function, int position, PyObject* object, Slot& slot) const {
    if (ConvertPointer(object, &slot, type, flags) != STATUS_OK) {
      RaiseArgumentError(STATUS_ERROR, function, position, cType);
      return false;
    }
    if (!slot && onNull == OnNull::kRefuse) {
      RaiseNullReference(function, position, cType);
      return false;
    }
    return true;
  }
  bool SkipsCall(const Slot& slot) const { return !slot && onNull == OnNull::kSkipCall; }
  T* Value(Slot& slot) const { return static_cast<T*>(slot); }
};

// A class-type argument passed by value or by reference ('CString', 'CString &'): a
// pointer object of the pointer type, never null. By-value operations take const T&.
template <typename T>
struct ReferenceKind : PointerKind<T> {
  T& Value(void*& slot) const { return *static_cast<T*>(slot); }
};

template <typename T>
PointerKind<T> Pointer(TypeInfo* type, const char* cType, OnNull onNull = OnNull::kRefuse,
                       int flags = 0) {
  return PointerKind<T>{type, cType, onNull, flags};
}

template <typename T>
ReferenceKind<T> Reference(TypeInfo* type, const char* cType) {
  return ReferenceKind<T>{{type, cType, OnNull::kRefuse, 0}};
}

// A `unicode` (or subclass) only, on 3 a `str`; on 2.7 the operation reads the
// object's own buffer during the call, on 3 a copy.
struct UnicodeKind : NeverSkips {
  using Slot = interpreter::UnicodeChars;
  bool Convert(const char*, int, PyObject* object, Slot& slot) const {
    if (!PyUnicode_Check(object)) {
      PyErr_SetString(PyExc_TypeError, "Unicode string expected");
      return false;
    }
    return slot.Read(object);
  }
  const wchar_t* Value(Slot& slot) const { return slot.get(); }
};
inline UnicodeKind Unicode() { return {}; }

// 'wchar_t const *': `unicode`, `str`, a "wchar_t *" pointer object or None (null).
// Text is copied into a buffer that lives until the call has returned.
struct WideStringKind : NeverSkips {
  struct Slot {
    const wchar_t* text = nullptr;
    std::unique_ptr<wchar_t[]> copy;
  };
  const char* cType;

  bool Convert(const char* function, int position, PyObject* object, Slot& slot) const {
    wchar_t* text = nullptr;
    int mark = 0;
    int status = AsWideString(object, &text, nullptr, &mark);
    if (status != STATUS_OK) {
      // A `str` the default encoding cannot decode keeps the interpreter's own error.
      if (!PyErr_Occurred()) RaiseArgumentError(status, function, position, cType);
      return false;
    }
    if (mark == NEWOBJ) slot.copy.reset(text);
    slot.text = text;
    return true;
  }
  const wchar_t* Value(Slot& slot) const { return slot.text; }
};
inline WideStringKind WideString() { return WideStringKind{{}, "wchar_t const *"}; }

// 'int', 'BOOL': a signed 32-bit `int`, `bool` or `long`.
struct IntegerKind : NeverSkips {
  using Slot = int;
  const char* cType;

  bool Convert(const char* function, int position, PyObject* object, Slot& slot) const {
    int status = AsInt(object, &slot);
    if (status != STATUS_OK) RaiseArgumentError(status, function, position, cType);
    return status == STATUS_OK;
  }
  int Value(Slot& slot) const { return slot; }
};
inline IntegerKind Integer(const char* cType) { return IntegerKind{{}, cType}; }

// 'char [N]': a `str` of at most N bytes, a "char *" pointer object, or None (zeros).
template <size_t N>
struct NarrowArrayKind : NeverSkips {
  using Slot = std::array<char, N>;
  const char* cType;

  bool Convert(const char* function, int position, PyObject* object, Slot& slot) const {
    int status = AsNarrowArray(object, slot.data(), N);
    if (status != STATUS_OK) RaiseArgumentError(status, function, position, cType);
    return status == STATUS_OK;
  }
  const Slot& Value(Slot& slot) const { return slot; }
};
template <size_t N>
NarrowArrayKind<N> NarrowArray(const char* cType) {
  return NarrowArrayKind<N>{{}, cType};
}

// Any object, borrowed for the call.
struct ObjectKind : NeverSkips {
  using Slot = PyObject*;
  bool Convert(const char*, int, PyObject* object, Slot& slot) const {
    slot = object;
    return true;
  }
  PyObject* Value(Slot& slot) const { return slot; }
};
inline ObjectKind Object() { return {}; }

}  // namespace runtime
