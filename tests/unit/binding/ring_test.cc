// Two more modules joining the ring: one TypeInfo per name, merged cast lists, lookups.
#include <Python.h>

#include <gtest/gtest.h>

#include "module/runtime/ModuleTypes.h"
#include "module/runtime/PyRef.h"
#include "module/runtime/TypeTable.h"
#include "module/runtime/pointers.h"
#include "test_module.h"

namespace {

using namespace binding;
using binding_test::TestType;

int CastCount(const TypeInfo& type) {
  int count = 0;
  for (const CastInfo* cast = type.casts; cast; cast = cast->next) ++count;
  return count;
}

class Ring : public ::testing::Test {
 protected:
  static void SetUpTestSuite() {
    binding_test::Type(TestType::Thing);  // the test module is the ring's head
    first_ = new ModuleTypes({{"_p_Gadget", "Gadget *"}, {"_p_Thing", "Thing *"}});
    second_ = new ModuleTypes({{"_p_Gadget", "Gadget *"}, {"_p_unsigned_long", "unsigned long *"}});
    InitializeTypeTable(first_->table());
    InitializeTypeTable(second_->table());
  }
  static ModuleTypes* first_;
  static ModuleTypes* second_;
};

ModuleTypes* Ring::first_ = nullptr;
ModuleTypes* Ring::second_ = nullptr;

TEST_F(Ring, ANameHasOneTypeInfoAcrossModules) {
  EXPECT_EQ((*first_)[1], binding_test::Type(TestType::Thing));
  EXPECT_EQ((*second_)[0], (*first_)[0]);
  EXPECT_EQ(second_->table().types[2], nullptr);
  // The shared types accept their own name once: the later module's entry is dropped.
  EXPECT_EQ(CastCount(*(*first_)[0]), 1);
  EXPECT_EQ(CastCount(*(*first_)[1]), 1);
}

TEST_F(Ring, JoiningAgainChangesNothing) {
  InitializeTypeTable(second_->table());
  InitializeTypeTable(first_->table());
  EXPECT_EQ(CastCount(*(*first_)[0]), 1);
  EXPECT_EQ((*second_)[0], (*first_)[0]);
}

TEST_F(Ring, PointerObjectsOfEitherModuleAreAccepted) {
  int gadget = 0;
  PyRef made(NewPointerObject(&gadget, (*second_)[0], POINTER_OWN | POINTER_NOSHADOW));
  void* address = nullptr;
  EXPECT_EQ(ConvertPointer(made.get(), &address, (*first_)[0], POINTER_DISOWN), STATUS_OK);
  EXPECT_EQ(address, &gadget);
  EXPECT_EQ(reinterpret_cast<PyObject*>(made.get())->ob_refcnt, 1);
  EXPECT_EQ(ConvertPointer(made.get(), &address, (*first_)[1], 0), STATUS_ERROR);
  EXPECT_EQ(ConvertPointer(Py_None, &address, (*first_)[1], POINTER_DISOWN), STATUS_OK);
  EXPECT_EQ(address, nullptr);
  EXPECT_EQ(ConvertPointer(nullptr, &address, (*first_)[1], 0), STATUS_ERROR);
}

TEST_F(Ring, TypeQueryByMangledNameThenBySpelling) {
  struct Case {
    const char* name;
    TypeInfo* expected;
  };
  for (const Case& c : {Case{"_p_Gadget", (*first_)[0]}, Case{"_p_unsigned_long", (*second_)[1]},
                        Case{"_p_wchar_t", binding_test::Type(TestType::WChar)},
                        Case{"unsigned long*", (*second_)[1]},
                        Case{" unsigned  long * ", (*second_)[1]},
                        Case{"TCHAR *", binding_test::Type(TestType::Char)},
                        Case{"WCHAR*", binding_test::Type(TestType::WChar)},
                        Case{"_p_nothing", nullptr}, Case{"char", nullptr}, Case{"", nullptr}}) {
    EXPECT_EQ(TypeQuery(c.name), c.expected) << c.name;
  }
}

TEST(CastList, AMatchMovesToTheFront) {
  TypeInfo a{"_p_a", nullptr, nullptr, nullptr, nullptr, 0};
  TypeInfo b{"_p_b", nullptr, nullptr, nullptr, nullptr, 0};
  TypeInfo c{"_p_c", nullptr, nullptr, nullptr, nullptr, 0};
  CastInfo toA{&a, nullptr, nullptr, nullptr}, toB{&b, nullptr, nullptr, nullptr},
      toC{&c, nullptr, nullptr, nullptr};
  for (CastInfo* cast : {&toC, &toB, &toA}) PushCastFront(a, *cast);
  EXPECT_EQ(FindCast(a, "_p_c"), &toC);
  EXPECT_EQ(a.casts, &toC);
  EXPECT_EQ(toC.next, &toA);
  EXPECT_EQ(toA.next, &toB);
  EXPECT_EQ(toB.next, nullptr);
  EXPECT_EQ(toB.prev, &toA);
  EXPECT_EQ(FindCast(a, "_p_d"), nullptr);
  EXPECT_EQ(DisplayName(a), std::string("_p_a"));
}

}  // namespace
