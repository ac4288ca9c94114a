// The module's entry point, the only symbol the library exports: init_PyUploader on
// Python 2.7, PyInit__PyUploader on 3.
#include <Python.h>

#include "interpreter/AllowThreadsGuard.h"
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
  // the worker and probe threads, and its release during the lower layers'
  // blocking waits.
  http::GlobalInit();
  python_api::PrepareThreads();
  InstallBlockingRelease(
      {&AllowThreadsGuard::ReleaseInterpreterLock, &AllowThreadsGuard::RetakeInterpreterLock});

  PyObject* module = python_api::CreateModule(kModuleName, module::FunctionTable(), kApiVersion);
  if (!module) return nullptr;  // the module defines no constants
  // A failure raised here makes the import fail.
  const int failed = binding::RaiseOnException(1, [] {
    binding::InitializeTypeTable(module::ModuleTypeTable());
    return 0;
  });
  return failed ? python_api::AbandonModule(module) : module;
}

}  // namespace

PYUPLOADER_MODULE_INIT(_PyUploader, MakeModule)
