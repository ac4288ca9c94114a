// A module's table of native types and the interpreter-wide ring that joins the
// tables of every module built the same way, so that one native type has one
// TypeInfo in the whole interpreter. The field order is a binary layout that other
// modules of the ring read.
#pragma once

#include <cstddef>

#include "module/runtime/TypeInfo.h"

namespace runtime {

struct TypeTable {
  TypeInfo** types;          // sorted by mangled name, null after the last
  size_t size;
  TypeTable* next;           // the next module's table; the last links to the first
  TypeInfo** initialTypes;   // this module's own types, in the order of `types`
  CastInfo** initialCasts;   // per initial type, its entries ending with a null type
};

// Joins the ring (creating it when this is the first module) and fills `table.types`
// with the TypeInfo each name has in the ring. Called once by the module's init.
void InitializeTypeTable(TypeTable& table);

// The type of a mangled name ("_p_char") in any table of the ring, starting with this
// module's, else one whose C spelling ("char *") matches, blanks ignored; null if none.
TypeInfo* TypeQuery(const char* name);

}  // namespace runtime
