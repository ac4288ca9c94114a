// The call sequence of every module function, written once:
//   1. unpack exactly one Python argument per argument kind (a wrong count raises the
//      interpreter's own TypeError naming the function);
//   2. convert them left to right; the first failure raises and returns null, and the
//      copies made so far are freed;
//   3. return None without calling anything when a pointer argument that skips on null
//      (setters and delete_ functions) is null;
//   4. call the native operation with the converted values, in order;
//   5. convert its result by the result kind; the copies are freed on return.
// An exception from any step raises MemoryError or RuntimeError (exception_barrier.h)
// and returns null, with the copies freed as well.
// A module function is then one statement, for example:
//   PyObject* Thing_SetName(PyObject*, PyObject* args) {
//     return Call(args, "Thing_SetName", ReturnsNone{},
//                 [](Thing* self, const wchar_t* name) { self->SetName(name); },
//                 Pointer<Thing>(type, "Thing *", OnNull::kSkipCall), Unicode());
//   }
#pragma once

#include <Python.h>

#include <array>
#include <tuple>
#include <type_traits>
#include <utility>

#include "interpreter/PythonApi.h"
#include "module/runtime/ClassData.h"
#include "module/runtime/argument_kinds.h"
#include "module/runtime/exception_barrier.h"
#include "module/runtime/result_kinds.h"

namespace runtime {

namespace call_detail {

template <typename Result, typename Op, typename... Values>
PyObject* Deliver(const Result& result, Op& op, Values&&... values) {
  if constexpr (std::is_same_v<Result, ReturnsNone>) {
    op(std::forward<Values>(values)...);
    Py_RETURN_NONE;
  } else {
    return result.Make(op(std::forward<Values>(values)...));
  }
}

template <size_t... I, typename Result, typename Op, typename... Kinds>
PyObject* Run(std::index_sequence<I...>, PyObject* args, const char* function,
              const Result& result, Op& op, const Kinds&... kinds) {
  constexpr Py_ssize_t kCount = sizeof...(Kinds);
  std::array<PyObject*, kCount + 1> objects{};
  if (!interpreter::UnpackTuple(args, function, kCount, kCount, &objects[I]...)) return nullptr;
  std::tuple<typename Kinds::Slot...> slots;
  if (!(kinds.Convert(function, static_cast<int>(I) + 1, objects[I], std::get<I>(slots)) && ...)) {
    return nullptr;
  }
  if ((kinds.SkipsCall(std::get<I>(slots)) || ...)) Py_RETURN_NONE;
  return Deliver(result, op, kinds.Value(std::get<I>(slots))...);
}

}  // namespace call_detail

// Runs the call sequence for the module function `function` (its table name).
template <typename Result, typename Op, typename... Kinds>
PyObject* Call(PyObject* args, const char* function, const Result& result, Op op,
               const Kinds&... kinds) {
  return RaiseOnException<PyObject*>(nullptr, [&] {
    return call_detail::Run(std::index_sequence_for<Kinds...>{}, args, function, result, op,
                            kinds...);
  });
}

// A "delete_" function: converts its one argument with POINTER_DISOWN and deletes the
// native object; None does nothing.
template <typename T>
PyObject* Delete(PyObject* args, const char* function, TypeInfo* type, const char* cType) {
  return Call(args, function, ReturnsNone{}, [](T* object) { delete object; },
              Pointer<T>(type, cType, OnNull::kSkipCall, POINTER_DISOWN));
}

// A "_swigregister" function: registers its one argument as the class of `type`.
inline PyObject* Register(PyObject* args, TypeInfo* type) {
  PyObject* cls = nullptr;
  if (!interpreter::UnpackTuple(args, "swigregister", 1, 1, &cls)) return nullptr;
  return RaiseOnException<PyObject*>(nullptr, [&] {
    RegisterClass(*type, cls);
    Py_RETURN_NONE;
  });
}

}  // namespace runtime
