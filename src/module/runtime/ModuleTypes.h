// The storage of one module's TypeTable, built from its types' names. Every type's
// initial cast list holds the type itself, with no converter.
#pragma once

#include <cstddef>
#include <initializer_list>
#include <vector>

#include "module/runtime/TypeTable.h"

namespace runtime {

struct TypeName {
  const char* mangledName;
  const char* prettyNames;
};

class ModuleTypes {
 public:
  // `names` must be sorted by mangled name in byte order.
  explicit ModuleTypes(std::initializer_list<TypeName> names);
  ModuleTypes(const ModuleTypes&) = delete;
  ModuleTypes& operator=(const ModuleTypes&) = delete;

  TypeTable& table() { return table_; }
  // The type at `index` as the ring knows it, once the table is initialized.
  TypeInfo* operator[](size_t index) const { return table_.types[index]; }

 private:
  static constexpr size_t kCastsPerType = 2;  // the type itself, then the terminator

  std::vector<TypeInfo> initial_;
  std::vector<CastInfo> casts_;
  std::vector<TypeInfo*> initialTypes_;
  std::vector<CastInfo*> initialCasts_;
  std::vector<TypeInfo*> types_;
  TypeTable table_{};
};

}  // namespace runtime
