// Test support: hosts a Python 2.7 interpreter for the whole test program. The
// test thread is the interpreter's main thread and holds the interpreter lock
// while tests run. Include from exactly one file of a test program.
#pragma once

#include <Python.h>

#include <gtest/gtest.h>

namespace test_support {

class EmbeddedPython : public ::testing::Environment {
 public:
  void SetUp() override {
    if (Py_IsInitialized()) return;
    Py_NoSiteFlag = 1;
    Py_InitializeEx(0);
    PyEval_InitThreads();  // the main thread now holds the lock
  }
  // The interpreter stays up until the process ends: its memory is still
  // reachable then, so leak checkers do not report it.
};

// The interpreter keeps most objects in memory mapped outside the C heap, so
// the leak checker cannot follow references held there and would report
// everything reachable only through them.
extern "C" __attribute__((weak, used, visibility("default"))) const char* __lsan_default_suppressions() {
  return "leak:libpython2.7.so\n";
}

inline ::testing::Environment* const kEmbeddedPython =
    ::testing::AddGlobalTestEnvironment(new EmbeddedPython);

// Runs Python statements in __main__; fails the test when they raise.
inline void RunPython(const char* code) { ASSERT_EQ(PyRun_SimpleString(code), 0) << code; }

}  // namespace test_support
