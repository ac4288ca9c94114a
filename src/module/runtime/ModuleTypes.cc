#include "module/runtime/ModuleTypes.h"

namespace runtime {

ModuleTypes::ModuleTypes(std::initializer_list<TypeName> names)
    : casts_(kCastsPerType * names.size()), types_(names.size() + 1, nullptr) {
  initial_.reserve(names.size());
  for (const TypeName& name : names) {
    initial_.push_back(TypeInfo{name.mangledName, name.prettyNames, nullptr, nullptr, nullptr, 0});
  }
  for (size_t i = 0; i < initial_.size(); ++i) {
    initialTypes_.push_back(&initial_[i]);
    casts_[kCastsPerType * i].type = &initial_[i];
    initialCasts_.push_back(&casts_[kCastsPerType * i]);
  }
  table_.types = types_.data();
  table_.size = initial_.size();
  table_.initialTypes = initialTypes_.data();
  table_.initialCasts = initialCasts_.data();
}

}  // namespace runtime
