// The shared call sequence through a module of test functions covering every argument
// kind: what reaches the native operation, and what a refusal leaves behind. The
// refusal texts are checked through the real module (test_argument_matrix).
#include <Python.h>

#include <gtest/gtest.h>

#include <array>
#include <new>
#include <stdexcept>
#include <string>

#include "module/runtime/call.h"
#include "support/embedded_python.h"
#include "test_module.h"

namespace {

using namespace binding;
using binding_test::TakeError;
using binding_test::Type;
using binding_test::TestType;
using binding_test::Thing;

// What the last native call received.
struct Received {
  int calls = 0;
  std::wstring unicode, wide;
  bool wideIsNull = false;
  int number = 0, flag = 0;
  std::string bytes;
  PyObject* object = nullptr;
} g_received;

Thing g_thing;

PointerKind<Thing> ThingArg(OnNull onNull = OnNull::kRefuse) {
  return Pointer<Thing>(Type(TestType::Thing), "Thing *", onNull);
}

// kinds(thing, unicode, wide, int, BOOL, char[260], object)
PyObject* Kinds(PyObject*, PyObject* args) {
  return Call(args, "kinds", ReturnsInt{},
              [](Thing* thing, const wchar_t* unicode, const wchar_t* wide, int number, int flag,
                 const std::array<char, 260>& bytes, PyObject* object) {
                ++g_received.calls;
                g_received.unicode = unicode;
                g_received.wideIsNull = !wide;
                g_received.wide = wide ? wide : L"";
                g_received.number = number;
                g_received.flag = flag;
                g_received.bytes.assign(bytes.data(), bytes.size());
                g_received.object = object;
                return static_cast<int>(thing->name.size());
              },
              ThingArg(), Unicode(), WideString(), Integer("int"), Integer("BOOL"),
              NarrowArray<260>("char [_MAX_PATH]"), Object());
}

// set_name(thing or None, CString &): a setter, skipped for a null thing.
PyObject* SetName(PyObject*, PyObject* args) {
  return Call(args, "set_name", ReturnsNone{},
              [](Thing* thing, std::wstring& name) {
                ++g_received.calls;
                thing->name = name;
              },
              ThingArg(OnNull::kSkipCall), Reference<std::wstring>(Type(TestType::CString), "CString &"));
}

// throws(which, wide): the operation throws, after a copy of `wide` was made.
PyObject* Throws(PyObject*, PyObject* args) {
  return Call(args, "throws", ReturnsNone{},
              [](int which, const wchar_t*) {
                if (which == 0) throw std::bad_alloc();
                if (which == 1) throw std::length_error("text too long");
                throw which;
              },
              Integer("int"), WideString());
}

PyMethodDef g_functions[] = {
    {"kinds", Kinds, METH_VARARGS, nullptr},
    {"throws", Throws, METH_VARARGS, nullptr},
    {"set_name", SetName, METH_VARARGS, nullptr},
    {nullptr, nullptr, 0, nullptr},
};

class CallSequence : public ::testing::Test {
 protected:
  static void SetUpTestSuite() {
    Py_InitModule4("calltest", g_functions, nullptr, nullptr, 1013);
    PyRef thing(binding_test::PointerTo(&g_thing, TestType::Thing));
    PyDict_SetItemString(PyModule_GetDict(PyImport_AddModule("__main__")), "thing", thing.get());
    test_support::RunPython(
        "import calltest\n"
        "good = (thing, u'uni', u'wide', 3, True, 'bytes', None)\n");
  }
  void SetUp() override {
    g_received = Received();
    g_thing.name = L"four";
  }

  // Runs `call` (an expression) and returns the error it raised as "Type: message".
  std::string ErrorOf(const std::string& call) {
    PyObject* main = PyImport_AddModule("__main__");
    PyObject* globals = PyModule_GetDict(main);
    PyRef result(PyRun_String(call.c_str(), Py_eval_input, globals, globals));
    return TakeError();
  }
};

TEST_F(CallSequence, ConvertedValuesReachTheOperation) {
  ASSERT_EQ(ErrorOf("calltest.kinds(*good)"), "");
  EXPECT_EQ(g_received.calls, 1);
  EXPECT_EQ(g_received.unicode, L"uni");
  EXPECT_EQ(g_received.wide, L"wide");
  EXPECT_EQ(g_received.number, 3);
  EXPECT_EQ(g_received.flag, 1);
  EXPECT_EQ(g_received.bytes, std::string("bytes") + std::string(255, '\0'));
  EXPECT_EQ(g_received.object, Py_None);
  test_support::RunPython("assert calltest.kinds(*good) == 4");
}

TEST_F(CallSequence, NoneGivesANullWideString) {
  ASSERT_EQ(ErrorOf("calltest.kinds(thing, u'', None, 0, 0, None, 1)"), "");
  EXPECT_TRUE(g_received.wideIsNull);
  EXPECT_EQ(g_received.bytes, std::string(260, '\0'));
}

TEST_F(CallSequence, CopiesMadeBeforeARefusalAreFreed) {
  // Called directly, so that the leak checker, which leaves the interpreter's own
  // allocations alone, would report a wide-string copy left behind.
  PyObject* globals = PyModule_GetDict(PyImport_AddModule("__main__"));
  PyRef args(PyRun_String("(thing, u'', u'copied' * 100, 'not an int', 0, None, 1)", Py_eval_input,
                          globals, globals));
  ASSERT_TRUE(args);
  for (int i = 0; i < 100; ++i) {
    EXPECT_EQ(Kinds(nullptr, args.get()), nullptr);
    EXPECT_EQ(TakeError(), "TypeError: in method 'kinds', argument 4 of type 'int'");
  }
  EXPECT_EQ(g_received.calls, 0);
}

// The leak checker would report a copy left behind by the unwinding.
TEST_F(CallSequence, AnExceptionBecomesAPythonErrorAndFreesTheCopies) {
  EXPECT_EQ(ErrorOf("calltest.throws(0, u'copied' * 100)"), "MemoryError: ");
  EXPECT_EQ(ErrorOf("calltest.throws(1, u'copied' * 100)"), "RuntimeError: text too long");
  EXPECT_EQ(ErrorOf("calltest.throws(2, u'copied' * 100)"), "RuntimeError: unknown C++ exception");
}

TEST_F(CallSequence, ASetterWithANullObjectDoesNothing) {
  std::wstring name = L"unused";
  PyRef pointer(binding_test::PointerTo(&name, TestType::CString));
  PyObject* globals = PyModule_GetDict(PyImport_AddModule("__main__"));
  PyDict_SetItemString(globals, "name", pointer.get());
  EXPECT_EQ(ErrorOf("calltest.set_name(None, name)"), "");
  EXPECT_EQ(g_received.calls, 0);
  EXPECT_EQ(ErrorOf("calltest.set_name(thing, name)"), "");
  EXPECT_EQ(g_received.calls, 1);
  test_support::RunPython("assert calltest.kinds(*good) == 6");
  PyDict_DelItemString(globals, "name");
}

}  // namespace
