#include "module/runtime/TypeInfo.h"

#include <cstring>

namespace runtime {

const char* DisplayName(const TypeInfo& type) {
  if (!type.prettyNames) return type.mangledName;
  const char* last = std::strrchr(type.prettyNames, '|');
  return last ? last + 1 : type.prettyNames;
}

namespace {

CastInfo* Search(const TypeInfo& type, const char* mangledName) {
  for (CastInfo* cast = type.casts; cast; cast = cast->next) {
    if (std::strcmp(cast->type->mangledName, mangledName) == 0) return cast;
  }
  return nullptr;
}

void Unlink(TypeInfo& type, CastInfo& cast) {
  if (cast.prev) cast.prev->next = cast.next;
  if (cast.next) cast.next->prev = cast.prev;
  if (type.casts == &cast) type.casts = cast.next;
  cast.next = cast.prev = nullptr;
}

}  // namespace

CastInfo* FindCast(TypeInfo& type, const char* mangledName) {
  CastInfo* cast = Search(type, mangledName);
  if (cast && cast != type.casts) {
    Unlink(type, *cast);
    PushCastFront(type, *cast);
  }
  return cast;
}

bool AcceptsName(const TypeInfo& type, const char* mangledName) {
  return Search(type, mangledName) != nullptr;
}

void PushCastFront(TypeInfo& type, CastInfo& cast) {
  cast.prev = nullptr;
  cast.next = type.casts;
  if (type.casts) type.casts->prev = &cast;
  type.casts = &cast;
}

}  // namespace runtime
