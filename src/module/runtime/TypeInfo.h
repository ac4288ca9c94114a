// One native type as the pointer objects of every module in the interpreter see it.
// The field order is a binary layout: other modules of the ring read these records.
#pragma once

namespace runtime {

struct CastInfo;
struct ClassData;
struct TypeInfo;

using DynamicCast = TypeInfo* (*)(void**);
using AddressConverter = void* (*)(void*);

struct TypeInfo {
  const char* mangledName;  // "_p_OBLoginData"
  const char* prettyNames;  // "char *|TCHAR *": the last alternative is the display name
  DynamicCast dynamicCast;  // always null here
  CastInfo* casts;          // the types whose pointer objects this type accepts
  ClassData* classData;     // the registered Python class, or null
  int ownsClassData;        // classData was made here and is released with the table
};

// One entry of a cast list: pointer objects of `type` are accepted, their address
// passed through `converter` when there is one.
struct CastInfo {
  TypeInfo* type;
  AddressConverter converter;
  CastInfo* next;
  CastInfo* prev;
};

// The last "|" alternative of the pretty names, or the mangled name when there are none.
const char* DisplayName(const TypeInfo& type);

// The entry of `type`'s cast list for `mangledName`, moved to the front so that the
// next conversion of the same pair matches at once; null when there is none.
CastInfo* FindCast(TypeInfo& type, const char* mangledName);

// The same search without reordering.
bool AcceptsName(const TypeInfo& type, const char* mangledName);

void PushCastFront(TypeInfo& type, CastInfo& cast);

}  // namespace runtime
