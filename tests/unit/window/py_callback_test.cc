#include "upload/PyCallback.h"

#include <gtest/gtest.h>

#include <thread>

#include "support/embedded_python.h"
#include "support/python_objects.h"
#include "upload/AllowThreadsGuard.h"

namespace {

using test_support::EvalRepr;
using test_support::MainGlobal;
using test_support::PyRef;
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
};

TEST_F(PyCallbackTest, FormatsBuildTheArgumentTuple) {
  PyRef record(MainGlobal("record"));
  PyCallback callback;
  callback.SetCallback(record.get());
  callback.Call("i", 5);
  callback.Call("");
  callback.Call(nullptr);
  callback.Call("uuii", L"PROGRESS", L"ProgressChanged", 33, 7);
  callback.Call("uuiiuu", L"PROGRESS", L"UploadComplete", 100, 1, L"http://x/\u00E4", L"");
  EXPECT_EQ(EvalRepr("calls"),
            "[(5,), (), (), (u'PROGRESS', u'ProgressChanged', 33, 7), "
            "(u'PROGRESS', u'UploadComplete', 100, 1, u'http://x/\\xe4', u'')]");
}

TEST_F(PyCallbackTest, NoneOrNullUnregisters) {
  PyRef record(MainGlobal("record"));
  PyCallback callback;
  callback.SetCallback(record.get());
  callback.SetCallback(Py_None);
  callback.Call("i", 1);
  callback.SetCallback(record.get());
  callback.SetCallback(nullptr);
  callback.Call("i", 2);
  EXPECT_EQ(EvalRepr("calls"), "[]");
}

TEST_F(PyCallbackTest, HoldsOneReferenceHoweverOftenTheSameCallableIsRegistered) {
  PyRef record(MainGlobal("record"));
  const Py_ssize_t unregistered = Py_REFCNT(record.get());
  {
    PyCallback callback;
    callback.SetCallback(record.get());
    callback.SetCallback(record.get());
    EXPECT_EQ(Py_REFCNT(record.get()), unregistered + 1);
  }
  EXPECT_EQ(Py_REFCNT(record.get()), unregistered);
}

TEST_F(PyCallbackTest, ARaisingCallableDoesNotStopLaterCalls) {
  PyRef flaky(MainGlobal("flaky"));
  PyCallback callback;
  callback.SetCallback(flaky.get());
  callback.Call("i", 1);
  EXPECT_EQ(PyErr_Occurred(), nullptr);
  callback.Call("i", 2);
  EXPECT_EQ(EvalRepr("calls"), "[(1,), (2,)]");
}

TEST_F(PyCallbackTest, ArgumentsThatCannotBeBuiltSkipTheCall) {
  PyRef record(MainGlobal("record"));
  PyCallback callback;
  callback.SetCallback(record.get());
  callback.Call("q", 1);  // not a format unit
  EXPECT_EQ(PyErr_Occurred(), nullptr);
  EXPECT_EQ(EvalRepr("calls"), "[]");
}

TEST_F(PyCallbackTest, ACallFromAThreadWithoutTheLockTakesIt) {
  PyRef record(MainGlobal("record"));
  PyCallback callback;
  callback.SetCallback(record.get());
  {
    AllowThreadsGuard letOthersRun;
    std::thread([&] { callback.Call("i", 42); }).join();
  }
  EXPECT_EQ(EvalRepr("calls"), "[(42,)]");
}

}  // namespace
