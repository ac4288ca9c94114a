#include "module/runtime/status.h"

namespace runtime {

PyObject* ErrorTypeForCode(int code) {
  switch (code) {
    case -12: return PyExc_MemoryError;
    case -11: return PyExc_AttributeError;
    case -10: return PyExc_SystemError;
    case -9: return PyExc_ValueError;
    case -8: return PyExc_SyntaxError;
    case -7: return PyExc_OverflowError;
    case -6: return PyExc_ZeroDivisionError;
    case -5: return PyExc_TypeError;
    case -4: return PyExc_IndexError;
    case -2: return PyExc_IOError;
    default: return PyExc_RuntimeError;
  }
}

void RaiseArgumentError(int status, const char* function, int position, const char* cType) {
  if (status == STATUS_ERROR) status = STATUS_TYPE_ERROR;
  PyErr_Format(ErrorTypeForCode(status), "in method '%s', argument %d of type '%s'", function,
               position, cType);
}

void RaiseNullReference(const char* function, int position, const char* cType) {
  PyErr_Format(PyExc_ValueError, "invalid null reference in method '%s', argument %d of type '%s'",
               function, position, cType);
}

}  // namespace runtime
