// The binding layer's conversions of arguments made from bytes: str and
// unicode of any characters into fixed arrays and wide strings, integers of
// any width into int, and type names.
#include <Python.h>

#include <array>
#include <climits>
#include <memory>

#include "fuzz_support.h"
#include "module/runtime/ModuleTypes.h"
#include "module/runtime/PyRef.h"
#include "module/runtime/TypeTable.h"
#include "module/runtime/conversions.h"
#include "module/runtime/status.h"

using binding::PyRef;

namespace {

// Array sizes of 'char [N]' arguments, the module's _MAX_PATH among them.
constexpr std::array<std::size_t, 4> kArraySizes = {1, 259, 260, 261};

void CheckNarrowArray(PyObject* str, std::string_view bytes, std::size_t size) {
  std::vector<char> buffer(size, '\x55');  // exactly N bytes, so an overrun is caught
  const int status = binding::AsNarrowArray(str, buffer.data(), size);
  fuzz::Require((status == binding::STATUS_OK) == (bytes.size() <= size), "a str is taken when it fits");
  std::string expected(bytes);
  expected.resize(size, '\0');
  fuzz::Require(status != binding::STATUS_OK || std::string_view(buffer.data(), size) == expected,
                "an array holds the bytes followed by zeros");
}

void CheckWideCopy(PyObject* unicode) {
  wchar_t* address = nullptr;
  int mark = 0;
  fuzz::Require(binding::AsWideString(unicode, &address, nullptr, &mark) == binding::STATUS_OK &&
                    mark == binding::NEWOBJ,
                "text converts to a wide copy");
  const std::unique_ptr<wchar_t[]> copy(address);
  const std::size_t count = PyUnicode_GET_SIZE(unicode);
  fuzz::Require(std::memcmp(copy.get(), PyUnicode_AS_UNICODE(unicode), count * sizeof(wchar_t)) == 0 &&
                    copy[count] == L'\0',
                "a wide string holds every character and a terminator");
}

void CheckInteger(PyObject* number) {
  int overflow = 0;
  const long value = PyLong_AsLongAndOverflow(number, &overflow);
  const bool fits = overflow == 0 && value >= INT_MIN && value <= INT_MAX;
  int converted = 0;
  fuzz::Require((binding::AsInt(number, &converted) == binding::STATUS_OK) == fits && (!fits || converted == value),
                "an integer converts, keeping its value, exactly when int holds it");
  fuzz::Require(!PyErr_Occurred(), "an integer conversion leaves no error set");
}

}  // namespace

// The interpreter keeps objects in memory the leak checker cannot follow.
extern "C" const char* __lsan_default_suppressions() { return "leak:libpython2.7.so\n"; }

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  Py_NoSiteFlag = 1;
  Py_InitializeEx(0);
  static binding::ModuleTypes types({{"_p_char", "char *|TCHAR *"}, {"_p_wchar_t", "wchar_t *|WCHAR *"}});
  binding::InitializeTypeTable(types.table());
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const std::string_view bytes = fuzz::Bytes(data + 1, size - 1);
  const PyRef str(PyString_FromStringAndSize(bytes.data(), bytes.size()));
  CheckNarrowArray(str.get(), bytes, kArraySizes[data[0] % kArraySizes.size()]);
  const std::wstring raw = fuzz::RawCharacters(bytes);
  const PyRef decoded(PyUnicode_DecodeUTF8(bytes.data(), bytes.size(), "replace"));
  const PyRef anyCharacters(PyUnicode_FromUnicode(reinterpret_cast<const Py_UNICODE*>(raw.data()), raw.size()));
  CheckWideCopy(decoded.get());
  CheckWideCopy(anyCharacters.get());
  const PyRef asLong(_PyLong_FromByteArray(data + 1, size - 1, 1, 1));
  CheckInteger(asLong.get());
  const PyRef asInt(PyNumber_Int(asLong.get()));
  if (asInt && PyInt_Check(asInt.get())) CheckInteger(asInt.get());
  binding::TypeQuery(std::string(bytes).c_str());
  return 0;
}
