// The module's entry point, the only symbol the library exports.
#include <Python.h>

#include "interpreter/AllowThreadsGuard.h"
#include "module/function_table.h"
#include "module/runtime/TypeTable.h"
#include "module/runtime/exception_barrier.h"
#include "module/types.h"
#include "platform/blocking_scope.h"
#include "platform/http_global.h"

namespace {

constexpr char kModuleName[] = "_PyUploader";
constexpr int kApiVersion = 1013;

}  // namespace

extern "C" __attribute__((visibility("default"))) void init_PyUploader() {
  // What loading the library sets up: the HTTP library, the interpreter lock for
  // the worker and probe threads, and its release during the lower layers'
  // blocking waits.
  platform::http::GlobalInit();
  PyEval_InitThreads();
  platform::InstallBlockingRelease(
      {&interpreter::AllowThreadsGuard::ReleaseInterpreterLock, &interpreter::AllowThreadsGuard::RetakeInterpreterLock});

  PyObject* module =
      Py_InitModule4(kModuleName, module::FunctionTable(), nullptr, nullptr, kApiVersion);
  if (!module) return;  // the module defines no constants
  // A failure raised here makes the import fail.
  runtime::RaiseOnException(0, [] {
    runtime::InitializeTypeTable(module::ModuleTypeTable());
    return 0;
  });
}
