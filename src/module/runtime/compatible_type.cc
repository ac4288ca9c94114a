#include "module/runtime/compatible_type.h"

#include <cstring>

namespace binding {

bool IsCompatibleType(PyTypeObject* candidate, PyTypeObject* ours) {
  if (!ours) return false;
  if (candidate == ours) return true;
  return std::strcmp(candidate->tp_name, ours->tp_name) == 0 &&
         !(candidate->tp_flags & Py_TPFLAGS_HEAPTYPE) &&
         candidate->tp_basicsize == ours->tp_basicsize;
}

}  // namespace binding
