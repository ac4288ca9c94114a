#include "upload/PyCallback.h"

#include <gtest/gtest.h>

#include <thread>

#include "interpreter/AllowThreadsGuard.h"
#include "support/embedded_python.h"
#include "support/python_objects.h"

namespace {

using test_support::EvalRepr;
using test_support::RunPython;

class PyCallbackTest : public ::testing::Test {
 protected:
  void SetUp() override {
    RunPython(
        "calls = []\n"
        "def record(*args):\n"
        "    calls.append(args)\n"
        "def flaky(*args):\n"
        "    calls.append(args)\n"
        "    raise ValueError('reported and cleared')\n");
  }

  // Borrowed: __main__ keeps its globals alive.
  static PyObject* Global(const char* name) {
    return PyDict_GetItemString(PyModule_GetDict(PyImport_AddModule("__main__")), name);
  }

  PyCallback callback_;
};

TEST_F(PyCallbackTest, FormatsBuildTheArgumentTuple) {
  callback_.SetCallback(Global("record"));
  callback_.Call("i", 5);
  callback_.Call("");
  callback_.Call(nullptr);
  callback_.Call("uuii", L"PROGRESS", L"ProgressChanged", 33, 7);
  callback_.Call("uuiiuu", L"PROGRESS", L"UploadComplete", 100, 1, L"http://x/\u00E4", L"");
  EXPECT_EQ(EvalRepr("calls"),
            "[(5,), (), (), (u'PROGRESS', u'ProgressChanged', 33, 7), "
            "(u'PROGRESS', u'UploadComplete', 100, 1, u'http://x/\\xe4', u'')]");
}

TEST_F(PyCallbackTest, NoneOrNullUnregisters) {
  callback_.SetCallback(Global("record"));
  callback_.SetCallback(Py_None);
  callback_.Call("i", 1);
  callback_.SetCallback(Global("record"));
  callback_.SetCallback(nullptr);
  callback_.Call("i", 2);
  EXPECT_EQ(EvalRepr("calls"), "[]");
}

TEST_F(PyCallbackTest, HoldsOneReferenceHoweverOftenTheSameCallableIsRegistered) {
  PyObject* record = Global("record");
  const Py_ssize_t unregistered = Py_REFCNT(record);
  {
    PyCallback callback;
    callback.SetCallback(record);
    callback.SetCallback(record);
    EXPECT_EQ(Py_REFCNT(record), unregistered + 1);
  }
  EXPECT_EQ(Py_REFCNT(record), unregistered);
}

TEST_F(PyCallbackTest, ARaisingCallableDoesNotStopLaterCalls) {
  callback_.SetCallback(Global("flaky"));
  callback_.Call("i", 1);
  EXPECT_EQ(PyErr_Occurred(), nullptr);
  callback_.Call("i", 2);
  EXPECT_EQ(EvalRepr("calls"), "[(1,), (2,)]");
}

TEST_F(PyCallbackTest, ArgumentsThatCannotBeBuiltSkipTheCall) {
  callback_.SetCallback(Global("record"));
  callback_.Call("q", 1);  // not a format unit
  EXPECT_EQ(PyErr_Occurred(), nullptr);
  EXPECT_EQ(EvalRepr("calls"), "[]");
}

TEST_F(PyCallbackTest, ACallFromAThreadWithoutTheLockTakesIt) {
  callback_.SetCallback(Global("record"));
  {
    AllowThreadsGuard letOthersRun;
    std::thread([&] { callback_.Call("i", 42); }).join();
  }
  EXPECT_EQ(EvalRepr("calls"), "[(42,)]");
}

}  // namespace
