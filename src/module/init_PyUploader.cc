// The module's entry point, the only symbol the library exports: init_PyUploader on
// Python 2.7, PyInit__PyUploader on 3.
#include <Python.h>

#include "interpreter/AllowThreadsGuard.h"
#include "interpreter/MainThreadNudge.h"
#include "interpreter/PythonApi.h"
#include "module/function_table.h"
#include "module/runtime/TypeTable.h"
#include "module/runtime/exception_barrier.h"
#include "module/types.h"
#include "platform/blocking_scope.h"
#include "platform/http_global.h"

namespace {

constexpr char kModuleName[] = "_PyUploader";
constexpr int kApiVersion = 1013;

PyObject* MakeModule() {
  // What loading the library sets up: the HTTP library, the interpreter lock for
  // the worker and probe threads, its release during the lower layers' blocking
  // waits, and on Python 3.9 to 3.11 the helper thread of the reports' hand-over
  // (started here, so that the process's threads stay as many as at import).
  platform::http::GlobalInit();
  interpreter::PrepareThreads();
  interpreter::PrepareMainThreadNudge();
  platform::InstallBlockingRelease(
      {&interpreter::AllowThreadsGuard::ReleaseInterpreterLock, &interpreter::AllowThreadsGuard::RetakeInterpreterLock});

  PyObject* module = interpreter::CreateModule(kModuleName, module::FunctionTable(), kApiVersion);
  if (!module) return nullptr;  // the module defines no constants
  // A failure raised here makes the import fail.
  const int failed = runtime::RaiseOnException(1, [] {
    runtime::InitializeTypeTable(module::ModuleTypeTable());
    return 0;
  });
  return failed ? interpreter::AbandonModule(module) : module;
}

}  // namespace

PYUPLOADER_MODULE_INIT(_PyUploader, MakeModule)
