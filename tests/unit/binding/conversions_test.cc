// Argument and result conversions at their edges.
#include <Python.h>

#include <gtest/gtest.h>

#include <array>
#include <string>

#include "module/runtime/PyRef.h"
#include "module/runtime/conversions.h"
#include "module/runtime/result_kinds.h"
#include "module/runtime/status.h"
#include "test_module.h"

namespace {

using binding::PyRef;
using namespace binding_test;

constexpr size_t kMaxPath = 260;

PyRef Eval(const char* expression) {
  PyRef globals(PyDict_New());
  PyDict_SetItemString(globals.get(), "__builtins__", PyEval_GetBuiltins());
  return PyRef(PyRun_String(expression, Py_eval_input, globals.get(), globals.get()));
}

struct ArrayCase {
  const char* expression;
  int status;
  size_t copied;  // bytes of the str expected at the start of the buffer
};

class AsNarrowArrayCases : public ::testing::TestWithParam<ArrayCase> {};

TEST_P(AsNarrowArrayCases, CopiesAtMostTheArrayAndZeroFillsTheRest) {
  PyRef object = Eval(GetParam().expression);
  ASSERT_TRUE(object) << TakeError();
  std::array<char, kMaxPath + 8> buffer;
  buffer.fill('#');
  ASSERT_EQ(binding::AsNarrowArray(object.get(), buffer.data(), kMaxPath), GetParam().status);
  EXPECT_EQ(TakeError(), "");
  if (GetParam().status != binding::STATUS_OK) return;
  for (size_t i = 0; i < GetParam().copied; ++i) ASSERT_EQ(buffer[i], 'a') << i;
  for (size_t i = GetParam().copied; i < kMaxPath; ++i) ASSERT_EQ(buffer[i], '\0') << i;
  for (size_t i = kMaxPath; i < buffer.size(); ++i) ASSERT_EQ(buffer[i], '#') << "overrun at " << i;
}

INSTANTIATE_TEST_SUITE_P(
    Lengths, AsNarrowArrayCases,
    ::testing::Values(ArrayCase{"'a' * 100", binding::STATUS_OK, 100},
                      ArrayCase{"'a' * 259", binding::STATUS_OK, 259},
                      ArrayCase{"'a' * 260", binding::STATUS_OK, 260},
                      ArrayCase{"''", binding::STATUS_OK, 0},
                      ArrayCase{"None", binding::STATUS_OK, 0},
                      ArrayCase{"5", binding::STATUS_TYPE_ERROR, 0}));

TEST(AsNarrowArray, TakesTheStringBehindACharPointer) {
  char text[] = "pointed";
  PyRef pointer(PointerTo(text, TestType::Char));
  std::array<char, kMaxPath> buffer;
  ASSERT_EQ(binding::AsNarrowArray(pointer.get(), buffer.data(), buffer.size()), binding::STATUS_OK);
  EXPECT_STREQ(buffer.data(), "pointed");
}

TEST(AsWideString, TakesTheStringBehindAWideCharPointerWithoutCopying) {
  wchar_t text[] = L"pointed";
  PyRef pointer(PointerTo(text, TestType::WChar));
  wchar_t* address = nullptr;
  int mark = 0;
  ASSERT_EQ(binding::AsWideString(pointer.get(), &address, nullptr, &mark), binding::STATUS_OK);
  EXPECT_EQ(address, text);
  EXPECT_EQ(mark, 0);
}

TEST(AsWideString, RefusesOtherObjectsAndKeepsDecodingErrors) {
  char text[] = "narrow";
  PyRef narrowPointer(PointerTo(text, TestType::Char));
  for (const char* expression : {"5", "[]"}) {
    PyRef object = Eval(expression);
    EXPECT_EQ(binding::AsWideString(object.get(), nullptr, nullptr, nullptr),
              binding::STATUS_TYPE_ERROR);
    EXPECT_EQ(TakeError(), "");
  }
  EXPECT_EQ(binding::AsWideString(narrowPointer.get(), nullptr, nullptr, nullptr),
            binding::STATUS_TYPE_ERROR);
  PyRef undecodable = Eval("'\\xff'");
  EXPECT_EQ(binding::AsWideString(undecodable.get(), nullptr, nullptr, nullptr),
            binding::STATUS_TYPE_ERROR);
  EXPECT_EQ(TakeError().rfind("UnicodeDecodeError: ", 0), 0u);
}

TEST(ResultConversions, UnsignedBecomesIntOrLong) {
  struct Case {
    uint32_t value;
    const char* type;
    const char* text;
  };
  for (const Case& c : {Case{0, "int", "0"}, Case{0x7FFFFFFF, "int", "2147483647"},
                        Case{0x80000000, "long", "2147483648"},
                        Case{0xFFFFFFFF, "long", "4294967295"}}) {
    PyRef result(binding::FromUnsigned(c.value));
    PyRef text(PyObject_Str(result.get()));
    EXPECT_STREQ(Py_TYPE(result.get())->tp_name, c.type);
    EXPECT_STREQ(PyString_AsString(text.get()), c.text);
  }
}

TEST(ResultConversions, NarrowArrayKeepsInnerZerosAndDropsTrailingOnes) {
  const char bytes[8] = {'a', '\0', 'b', '\0', '\0'};
  size_t size = binding::TrimTrailingZeros(bytes, sizeof bytes);
  EXPECT_EQ(size, 3u);
  PyRef result(binding::FromNarrowArray(bytes, size));
  EXPECT_EQ(std::string(PyString_AS_STRING(result.get()), PyString_GET_SIZE(result.get())),
            std::string("a\0b", 3));
  EXPECT_EQ(binding::TrimTrailingZeros(bytes + 3, 5), 0u);
}

// Wide texts reach Python whole: inner zeros and characters beyond the BMP included.
TEST(ResultConversions, WideTextsBecomeUnicodeWithEveryCharacter) {
  const std::wstring text(L"m\u00E4\0t\U0001F600", 5);
  const auto same = [&](PyObject* object) {
    return object && PyUnicode_CheckExact(object) &&
           std::wstring(reinterpret_cast<const wchar_t*>(PyUnicode_AS_UNICODE(object)),
                        PyUnicode_GET_SIZE(object)) == text;
  };
  EXPECT_TRUE(same(PyRef(binding::ReturnsUnicode{}.Make(text)).get()));
  EXPECT_TRUE(same(PyRef(binding::ReturnsUnicodeOrNone{}.Make(text)).get()));
  EXPECT_EQ(PyRef(binding::ReturnsUnicodeOrNone{}.Make(std::nullopt)).get(), Py_None);
  PyRef dictionary(binding::ReturnsUnicodeDict{}.Make({{L"7", text}, {text, L""}}));
  ASSERT_TRUE(dictionary && PyDict_CheckExact(dictionary.get()));
  EXPECT_EQ(PyDict_Size(dictionary.get()), 2);
  PyRef key(binding::FromWide(L"7"));
  EXPECT_TRUE(same(PyDict_GetItem(dictionary.get(), key.get())));
}

}  // namespace
