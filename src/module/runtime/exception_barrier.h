// Where a C++ exception stops on its way out to the interpreter: every entry point the
// interpreter calls (the call sequence, class registration, the pointer objects' slots,
// module init) runs its body through RaiseOnException, so that a failure inside the
// host's process becomes a Python exception instead of ending the process.
// std::bad_alloc becomes MemoryError, any other exception a RuntimeError with its
// what() text. Unwinding frees whatever the body had made so far.
#pragma once

#include <Python.h>

#include <exception>
#include <new>

namespace runtime {

inline constexpr char kUnknownExceptionText[] = "unknown C++ exception";

inline void RaiseCurrentException() noexcept {
  try {
    throw;
  } catch (const std::bad_alloc&) {
    PyErr_NoMemory();
  } catch (const std::exception& error) {
    PyErr_SetString(PyExc_RuntimeError, error.what());
  } catch (...) {
    PyErr_SetString(PyExc_RuntimeError, kUnknownExceptionText);
  }
}

// The body's result, or `failed` (null, -1) with the exception raised.
template <typename Result, typename Body>
Result RaiseOnException(Result failed, const Body& body) noexcept {
  try {
    return body();
  } catch (...) {
    RaiseCurrentException();
    return failed;
  }
}

}  // namespace runtime
