// The runtime's Python types (pointer and packed-data objects): built once per module
// from a template, readied on first use and never freed; and the rule by which the
// same types of other modules of the ring are recognised.
#pragma once

#include <Python.h>

namespace runtime {

class StaticType {
 public:
  // Fills in what both runtime types share: name, size, documentation, the generic
  // attribute lookup, the default flags, one reference, and `type` as their type.
  static PyTypeObject Template(const char* name, Py_ssize_t basicSize);

  explicit StaticType(const PyTypeObject& filled);
  StaticType(const StaticType&) = delete;
  StaticType& operator=(const StaticType&) = delete;

  // The readied type, or null when readying failed.
  PyTypeObject* get() { return ready_ ? &type_ : nullptr; }

 private:
  PyTypeObject type_;
  bool ready_;
};

// True when `candidate` is `ours`, or a type of another module with the same name that
// is laid out like it: a static type (a Python class of that name could be anything)
// of the same basic size.
bool IsCompatibleType(PyTypeObject* candidate, PyTypeObject* ours);

}  // namespace runtime
