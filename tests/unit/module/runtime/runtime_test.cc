// What only C++ sees of the binding runtime: which foreign types are trusted
// as pointer objects, the ring's type look-up, and copies made
// before a refusal. What Python sees is in the Python binding suite.
#include <Python.h>
#include <gtest/gtest.h>

#include <stdexcept>

#include "fixtures.h"
#include "module/runtime/ModuleTypes.h"
#include "module/runtime/PySwigObject.h"
#include "module/runtime/PySwigPacked.h"
#include "module/runtime/StaticType.h"
#include "module/runtime/TypeTable.h"
#include "module/runtime/call.h"
#include "module/runtime/pointers.h"

namespace {

using namespace runtime;

// The ring's head for these tests: the types the conversions look up, and one more.
TypeInfo* Type(const char* mangled) {
  static ModuleTypes* types = [] {
    test_support::StartPython();
    auto* made = new ModuleTypes({{"_p_Thing", "Thing *"}, {"_p_char", "char *|TCHAR *"},
                                  {"_p_wchar_t", "wchar_t *|WCHAR *"}});
    InitializeTypeTable(made->table());
    return made;
  }();
  return types ? TypeQuery(mangled) : nullptr;
}

// Another module's static type of that name, size and flags stands behind the object.
bool Trusted(const char* name, Py_ssize_t size, long flags, bool (*check)(PyObject*)) {
  test_support::StartPython();  // our own types are readied on first use
  PyTypeObject type = StaticType::Template(name, size);
  type.tp_flags |= flags;
  PyObject object{};
  object.ob_refcnt = 1;
  object.ob_type = &type;
  return check(&object);
}

TEST(ForeignTypes, OnlyStaticTypesOfTheSameNameAndLayoutAreTrusted) {
  EXPECT_TRUE(Trusted("PySwigObject", sizeof(PySwigObject), 0, IsPySwigObject));
  EXPECT_FALSE(Trusted("PySwigObject", sizeof(PyObject), 0, IsPySwigObject));
  EXPECT_FALSE(Trusted("PySwigObject", sizeof(PySwigObject), Py_TPFLAGS_HEAPTYPE, IsPySwigObject));
  EXPECT_FALSE(Trusted("PySwigObjects", sizeof(PySwigObject), 0, IsPySwigObject));
  EXPECT_TRUE(Trusted("PySwigPacked", sizeof(PySwigPacked), 0, IsPySwigPacked));
  EXPECT_FALSE(Trusted("PySwigPacked", sizeof(PySwigPacked) + 8, Py_TPFLAGS_HEAPTYPE, IsPySwigPacked));
}

// Two more modules join the ring: one TypeInfo per name, found by mangled name
// or by any of its spellings, shown by its last spelling.
TEST(Ring, ANameHasOneTypeInfoFoundByNameOrSpelling) {
  Type("_p_Thing");  // the test module is the ring's head
  static ModuleTypes first({{"_p_Gadget", "Gadget *"}, {"_p_Thing", "Thing *"}});
  static ModuleTypes second({{"_p_Gadget", "Gadget *"}, {"_p_unsigned_long", "unsigned long *"}});
  InitializeTypeTable(first.table());
  InitializeTypeTable(second.table());
  InitializeTypeTable(first.table());  // joining again changes nothing
  EXPECT_EQ(first[1], Type("_p_Thing"));
  EXPECT_EQ(second[0], first[0]);
  for (const auto& [name, expected] : std::vector<std::pair<const char*, TypeInfo*>>{
           {"_p_Gadget", first[0]}, {"unsigned long*", second[1]}, {" unsigned  long * ", second[1]},
           {"TCHAR *", Type("_p_char")}, {"WCHAR*", Type("_p_wchar_t")},
           {"_p_nothing", nullptr}, {"char", nullptr}, {"", nullptr}}) {
    EXPECT_EQ(TypeQuery(name), expected) << name;
  }
  EXPECT_STREQ(DisplayName(*Type("_p_wchar_t")), "WCHAR *");
}

// Only meaningful under the leak checker (CI's sanitizer run), which would
// report a wide-string copy left behind by a refused call.
PyObject* Kinds(PyObject*, PyObject* args) {
  return Call(args, "kinds", ReturnsInt{}, [](const wchar_t*, int) { return 0; }, WideString(),
              Integer("int"));
}

// The operation throws after a copy was made: the exception becomes a Python error.
PyObject* Throws(PyObject*, PyObject* args) {
  return Call(args, "throws", ReturnsNone{}, [](int which, const wchar_t*) {
    if (which == 0) throw std::bad_alloc();
    if (which == 1) throw std::length_error("text too long");
    throw which;
  }, Integer("int"), WideString());
}

TEST(CallSequence, CopiesMadeBeforeARefusalOrAnExceptionAreFreed) {
  for (const auto& [which, text] : std::vector<std::pair<int, std::string>>{
           {0, ""}, {1, "text too long"}, {2, "unknown C++ exception"}}) {
    PyRef args(Py_BuildValue("(iu)", which, L"copied copied copied copied"));
    EXPECT_EQ(Throws(nullptr, args.get()), nullptr);
    PyObject *type, *value, *traceback;
    PyErr_Fetch(&type, &value, &traceback);
    PyRef held(type), message(value ? PyObject_Str(value) : nullptr), rest(value), trace(traceback);
    EXPECT_EQ(type, which == 0 ? PyExc_MemoryError : PyExc_RuntimeError);
    EXPECT_EQ(message ? interpreter::NarrowTextChars(message.get()) : "", text);
  }
  Type("_p_Thing");
  PyRef args(Py_BuildValue("(us)", L"copied copied copied copied copied", "not an int"));
  for (int i = 0; i < 100; ++i) {
    EXPECT_EQ(Kinds(nullptr, args.get()), nullptr);
    EXPECT_TRUE(PyErr_ExceptionMatches(PyExc_TypeError));
    PyErr_Clear();
  }
}

// Wide texts reach Python whole, inner zeros and characters beyond the BMP included;
// dictionaries and every text result are made of these.
TEST(ResultKinds, WideTextsBecomeUnicodeWithEveryCharacter) {
  const std::wstring text(L"m\u00E4\0t\U0001F600", 5);
  PyRef made(FromWide(text));
  ASSERT_TRUE(made && PyUnicode_CheckExact(made.get()));
  std::wstring chars(interpreter::UnicodeLength(made.get()), L'\0');
  interpreter::CopyUnicode(made.get(), chars.data(), chars.size());
  EXPECT_EQ(chars, text);
}

}  // namespace
