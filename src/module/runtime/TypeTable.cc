#include "module/runtime/TypeTable.h"

#include <Python.h>

#include <cstring>

#include "interpreter/PythonApi.h"
#include "module/runtime/ClassData.h"
#include "module/runtime/pointers.h"

namespace runtime {

namespace {

// The module that holds the ring: no functions, one attribute holding the head table
// (on 3 a capsule, under the name the generator's runtime gives it there).
constexpr char kRingModule[] = "swig_runtime_data3";
constexpr const char* kRingAttribute = PY_MAJOR_VERSION >= 3 ? "type_pointer_capsule" : "type_pointer";
constexpr char kRingCapsule[] = "swig_runtime_data3.type_pointer_capsule";
constexpr int kRingApiVersion = 1013;

TypeTable* g_moduleTable = nullptr;  // this module's own table
TypeTable* g_ringHead = nullptr;     // the remembered answer of the ring lookup

// Run when the interpreter destroys the ring module: the head table's classes go.
// Not while the interpreter exits, which frees this module before the objects that
// other modules' globals hold, and those need their classes' destructors; the
// classes are then held until the process ends.
void ReleaseRing(void* pointer) {
  if (interpreter::TearingDownModules()) return;
  auto* head = static_cast<TypeTable*>(pointer);
  for (size_t i = 0; i < head->size; ++i) {
    TypeInfo* type = head->types[i];
    if (type && type->ownsClassData && type->classData) ReleaseClassData(*type->classData);
  }
  ReleaseThisName();
}

TypeTable* LookUpRing() {
  if (!g_ringHead) {
    g_ringHead = static_cast<TypeTable*>(
        interpreter::ImportPublishedPointer(kRingModule, kRingAttribute, kRingCapsule));
    if (!g_ringHead) PyErr_Clear();
  }
  return g_ringHead;
}

void CreateRing(TypeTable& head) {
  PyObject* module = interpreter::AddEmptyModule(kRingModule, kRingApiVersion);
  if (!module) return;
  PyObject* pointer = interpreter::NewPublishedPointer(&head, kRingCapsule, ReleaseRing);
  if (pointer && PyModule_AddObject(module, kRingAttribute, pointer) == 0) g_ringHead = &head;
}

bool RingContains(TypeTable& head, const TypeTable& table) {
  TypeTable* member = &head;
  do {
    if (member == &table) return true;
    member = member->next;
  } while (member != &head);
  return false;
}

// Links `table` into the ring; false when it is a member already.
bool JoinRing(TypeTable& table) {
  TypeTable* head = LookUpRing();
  if (!head) {
    CreateRing(table);
    return true;
  }
  if (RingContains(*head, table)) return false;
  table.next = head->next;
  head->next = &table;
  return true;
}

TypeInfo* FindMangled(const TypeTable& table, const char* name) {
  size_t low = 0;
  size_t high = table.size;
  while (low < high) {
    size_t middle = low + (high - low) / 2;
    const TypeInfo* type = table.types[middle];
    if (!type || !type->mangledName) break;
    int order = std::strcmp(name, type->mangledName);
    if (order == 0) return table.types[middle];
    if (order < 0) {
      high = middle;
    } else {
      low = middle + 1;
    }
  }
  return nullptr;
}

// The type of `name` in a table of the ring other than `own`.
TypeInfo* FindInOtherTables(const TypeTable& own, const char* name) {
  for (const TypeTable* table = own.next; table != &own; table = table->next) {
    if (TypeInfo* type = FindMangled(*table, name)) return type;
  }
  return nullptr;
}

// Two spellings of a C type compare equal when they differ only in blanks.
bool SameSpelling(const char* a, const char* aEnd, const char* b, const char* bEnd) {
  for (;;) {
    while (a != aEnd && *a == ' ') ++a;
    while (b != bEnd && *b == ' ') ++b;
    if (a == aEnd || b == bEnd) return a == aEnd && b == bEnd;
    if (*a++ != *b++) return false;
  }
}

bool HasSpelling(const TypeInfo& type, const char* name) {
  if (!type.prettyNames) return false;
  const char* nameEnd = name + std::strlen(name);
  for (const char* alternative = type.prettyNames;;) {
    const char* end = std::strchr(alternative, '|');
    if (!end) end = alternative + std::strlen(alternative);
    if (SameSpelling(alternative, end, name, nameEnd)) return true;
    if (*end == '\0') return false;
    alternative = end + 1;
  }
}

TypeInfo* FindSpelling(const TypeTable& table, const char* name) {
  for (size_t i = 0; i < table.size && table.types[i]; ++i) {
    if (HasSpelling(*table.types[i], name)) return table.types[i];
  }
  return nullptr;
}

// Puts the initial cast entries of type `index` on the cast list of `type`, the
// TypeInfo chosen for it, pointing them at the ring's types.
void MergeCasts(TypeTable& table, size_t index, TypeInfo& type) {
  bool ownType = &type == table.initialTypes[index];
  for (CastInfo* cast = table.initialCasts[index]; cast->type; ++cast) {
    if (TypeInfo* known = FindInOtherTables(table, cast->type->mangledName)) {
      if (!ownType) {
        if (AcceptsName(type, known->mangledName)) continue;
      } else {
        cast->type = known;
      }
    }
    PushCastFront(type, *cast);
  }
}

TypeInfo* ChooseType(TypeTable& table, size_t index) {
  TypeInfo* own = table.initialTypes[index];
  TypeInfo* type = FindInOtherTables(table, own->mangledName);
  if (type) {
    if (own->classData) type->classData = own->classData;
  } else {
    type = own;
  }
  MergeCasts(table, index, *type);
  return type;
}

}  // namespace

void InitializeTypeTable(TypeTable& table) {
  if (!table.next) table.next = &table;
  g_moduleTable = &table;
  if (!JoinRing(table)) return;
  for (size_t i = 0; i < table.size; ++i) table.types[i] = ChooseType(table, i);
  table.types[table.size] = nullptr;
}

TypeInfo* TypeQuery(const char* name) {
  TypeTable* start = g_moduleTable;
  if (!start) return nullptr;
  const TypeTable* table = start;
  do {
    if (TypeInfo* type = FindMangled(*table, name)) return type;
    table = table->next;
  } while (table != start);
  do {
    if (TypeInfo* type = FindSpelling(*table, name)) return type;
    table = table->next;
  } while (table != start);
  return nullptr;
}

}  // namespace runtime
