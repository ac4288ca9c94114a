// Which Python types count as pointer or packed objects, and the packed object's forms.
#include <Python.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "module/runtime/PyRef.h"
#include "module/runtime/PySwigObject.h"
#include "module/runtime/PySwigPacked.h"
#include "module/runtime/StaticType.h"
#include "test_module.h"

namespace {

using namespace binding;
using binding_test::TestType;

// A static type standing in for another module's type of the given name and size.
PyTypeObject ForeignType(const char* name, Py_ssize_t size, long extraFlags = 0) {
  PyTypeObject type = StaticType::Template(name, size);
  type.tp_flags |= extraFlags;
  return type;
}

bool RecognisedAs(PyTypeObject& type, bool (*check)(PyObject*)) {
  PyObject object{};
  Py_REFCNT(&object) = 1;
  Py_TYPE(&object) = &type;
  return check(&object);
}

TEST(ForeignTypes, OnlyStaticTypesOfTheSameLayoutAreTrusted) {
  struct Case {
    PyTypeObject type;
    bool (*check)(PyObject*);
    bool trusted;
  };
  std::vector<Case> cases = {
      {ForeignType("PySwigObject", sizeof(PySwigObject)), IsPySwigObject, true},
      {ForeignType("PySwigObject", sizeof(PyObject)), IsPySwigObject, false},
      {ForeignType("PySwigObject", sizeof(PySwigObject), Py_TPFLAGS_HEAPTYPE), IsPySwigObject, false},
      {ForeignType("PySwigObjects", sizeof(PySwigObject)), IsPySwigObject, false},
      {ForeignType("PySwigPacked", sizeof(PySwigPacked)), IsPySwigPacked, true},
      {ForeignType("PySwigPacked", sizeof(PySwigPacked) + 8), IsPySwigPacked, false},
      {ForeignType("PySwigPacked", sizeof(PySwigPacked), Py_TPFLAGS_HEAPTYPE), IsPySwigPacked, false},
  };
  for (Case& c : cases) {
    EXPECT_EQ(RecognisedAs(c.type, c.check), c.trusted)
        << c.type.tp_name << " size " << c.type.tp_basicsize << " flags " << c.type.tp_flags;
  }
}

std::string Text(PyObject* (*form)(PyObject*), PyObject* object) {
  PyRef text(form(object));
  return PyString_AsString(text.get());
}

TEST(PackedObjects, ShowTheirBytesWhileTheyFit) {
  TypeInfo* type = binding_test::Type(TestType::Thing);
  const unsigned char small[] = {0x01, 0xab};
  PyRef shown(NewPySwigPacked(small, sizeof small, type));
  ASSERT_TRUE(IsPySwigPacked(shown.get()));
  EXPECT_EQ(Text(PyObject_Repr, shown.get()), "<Swig Packed at _01ab_p_Thing>");
  EXPECT_EQ(Text(PyObject_Str, shown.get()), "_01ab_p_Thing");

  std::vector<unsigned char> fits(511, 0x5a), large(512, 0x5a);
  std::string packed;
  for (size_t i = 0; i < fits.size(); ++i) packed += "5a";
  PyRef fitting(NewPySwigPacked(fits.data(), fits.size(), type));
  EXPECT_EQ(Text(PyObject_Str, fitting.get()), "_" + packed + "_p_Thing");
  PyRef hidden(NewPySwigPacked(large.data(), large.size(), type));
  EXPECT_EQ(Text(PyObject_Repr, hidden.get()), "<Swig Packed _p_Thing>");
  EXPECT_EQ(Text(PyObject_Str, hidden.get()), "_p_Thing");
}

TEST(PackedObjects, CompareBySizeThenContent) {
  TypeInfo* type = binding_test::Type(TestType::Thing);
  const unsigned char a[] = {1, 2}, b[] = {1, 3}, c[] = {0, 0, 0};
  PyRef pa(NewPySwigPacked(a, 2, type)), pb(NewPySwigPacked(b, 2, type)),
      pc(NewPySwigPacked(c, 3, type)), pa2(NewPySwigPacked(a, 2, type));
  EXPECT_EQ(PyObject_Compare(pa.get(), pb.get()), -1);
  EXPECT_EQ(PyObject_Compare(pb.get(), pa.get()), 1);
  EXPECT_EQ(PyObject_Compare(pb.get(), pc.get()), -1);
  EXPECT_EQ(PyObject_Compare(pa.get(), pa2.get()), 0);
}

}  // namespace
