// The native types of _PyUploader as the interpreter-wide type ring knows them.
#pragma once

#include <string>

#include "module/runtime/TypeInfo.h"
#include "module/runtime/TypeTable.h"

namespace module {

// The system's wide string object ("CString *" in Python).
using CString = std::wstring;

// Positions in the module's type table, which is sorted by mangled name.
enum class TypeId {
  CString,           // "_p_CString"
  HINTERNET,         // "_p_HINTERNET"
  OBLoginData,       // "_p_OBLoginData"
  PyPresetUploader,  // "_p_PyPresetUploader"
  Char,              // "_p_char"
  Double,            // "_p_double"
  Float,             // "_p_float"
  infoEffectURL,     // "_p_infoEffectURL"
  Int,               // "_p_int"
  Long,              // "_p_long"
  LongLong,          // "_p_long_long"
  UnsignedChar,      // "_p_unsigned_char"
  UnsignedInt,       // "_p_unsigned_int"
  UnsignedLong,      // "_p_unsigned_long"
  UnsignedLongLong,  // "_p_unsigned_long_long"
  UnsignedShort,     // "_p_unsigned_short"
  WChar,             // "_p_wchar_t"
};

// The module's table, handed to InitializeTypeTable by the module's init.
runtime::TypeTable& ModuleTypeTable();

// The ring's TypeInfo for `id` (valid once the module is initialized).
runtime::TypeInfo* Type(TypeId id);

}  // namespace module
