// The module's function table, in the order Python's callers know it: the
// infoEffectURL record's functions (1 to 9), the session's (10 to 38) and the
// preset uploader's (39 to 45).
#pragma once

#include <Python.h>

#include <cstddef>

namespace module {

// A module function: its table name and its body, which gets that name for the
// call sequence's error texts.
struct ModuleFunction {
  const char* name;
  PyObject* (*body)(PyObject* args, const char* name);
};

// Each class's functions in table order; its file checks the count.
inline constexpr std::size_t kInfoEffectURLCount = 9;
inline constexpr std::size_t kOBLoginDataCount = 29;
inline constexpr std::size_t kPyPresetUploaderCount = 7;
extern const ModuleFunction kInfoEffectURLFunctions[];
extern const ModuleFunction kOBLoginDataFunctions[];
extern const ModuleFunction kPyPresetUploaderFunctions[];

// The null-terminated table the module is created with; static storage.
PyMethodDef* FunctionTable();

}  // namespace module
