// The binding layer's conversions of arguments made from bytes: `str` and
// `unicode` (any characters, valid Unicode or not) into narrow strings, fixed
// arrays and wide strings, integers of any width into int, and type names.
#include <Python.h>

#include <algorithm>
#include <array>
#include <climits>
#include <memory>
#include <vector>

#include "fuzz_support.h"
#include "module/runtime/ModuleTypes.h"
#include "module/runtime/PyRef.h"
#include "module/runtime/TypeTable.h"
#include "module/runtime/conversions.h"
#include "module/runtime/status.h"

using binding::PyRef;

namespace {

// Array sizes of 'char [N]' arguments, the module's _MAX_PATH among them.
constexpr std::array<std::size_t, 6> kArraySizes = {1, 2, 16, 259, 260, 261};

void InitializeTypes() {
  static binding::ModuleTypes types({{"_p_char", "char *|TCHAR *"},
                                     {"_p_wchar_t", "wchar_t *|WCHAR *"}});
  binding::InitializeTypeTable(types.table());
}

void CheckNarrowString(PyObject* str, std::string_view bytes) {
  char* address = nullptr;
  std::size_t length = 0;
  int mark = 0;
  fuzz::Require(binding::AsNarrowString(str, &address, &length, &mark) == binding::STATUS_OK,
                "a str is a narrow string");
  fuzz::Require(address == PyString_AS_STRING(str) && length == bytes.size() + 1,
                "a narrow string is the str's own buffer, its terminator counted");
  mark = binding::NEWOBJ;
  fuzz::Require(binding::AsNarrowString(str, &address, &length, &mark) == binding::STATUS_OK,
                "a str is copied on request");
  const std::unique_ptr<char[]> copy(address);
  fuzz::Require(std::string_view(copy.get(), length) == std::string(bytes) + '\0',
                "a copied narrow string holds the bytes and a terminator");
}

void CheckNarrowArray(PyObject* str, std::string_view bytes, std::size_t size) {
  std::vector<char> buffer(size, '\x55');  // exactly N bytes, so an overrun is caught
  const int status = binding::AsNarrowArray(str, buffer.data(), size);
  if (bytes.size() > size) {
    fuzz::Require(status == binding::STATUS_TYPE_ERROR, "a str longer than the array is refused");
    return;
  }
  fuzz::Require(status == binding::STATUS_OK, "a str that fits the array is taken");
  std::string expected(bytes);
  expected.resize(size, '\0');
  fuzz::Require(std::string_view(buffer.data(), size) == expected,
                "an array holds the bytes followed by zeros");
}

// A wide string conversion of a unicode object copies all of its characters.
void CheckWideCopy(PyObject* unicode, PyObject* argument) {
  wchar_t* address = nullptr;
  int mark = 0;
  fuzz::Require(binding::AsWideString(argument, &address, nullptr, &mark) == binding::STATUS_OK,
                "text converts to a wide string");
  fuzz::Require(mark == binding::NEWOBJ, "a wide string from text is a copy");
  const std::unique_ptr<wchar_t[]> copy(address);
  const std::size_t count = PyUnicode_GET_SIZE(unicode);
  fuzz::Require(std::memcmp(copy.get(), PyUnicode_AS_UNICODE(unicode), count * sizeof(wchar_t)) == 0 &&
                    copy[count] == L'\0',
                "a wide string holds every character and a terminator");
}

void CheckWideFromStr(PyObject* str, std::string_view bytes) {
  const bool ascii = std::all_of(bytes.begin(), bytes.end(),
                                 [](char c) { return static_cast<unsigned char>(c) < 0x80; });
  if (!ascii) {
    wchar_t* address = nullptr;
    int mark = 0;
    fuzz::Require(binding::AsWideString(str, &address, nullptr, &mark) != binding::STATUS_OK &&
                      PyErr_ExceptionMatches(PyExc_UnicodeDecodeError),
                  "a str the default encoding cannot decode keeps the decoding error");
    PyErr_Clear();
    return;
  }
  const PyRef unicode(PyUnicode_FromObject(str));
  CheckWideCopy(unicode.get(), str);
}

void CheckWideStrings(std::string_view bytes) {
  const PyRef decoded(PyUnicode_DecodeUTF8(bytes.data(), bytes.size(), "replace"));
  CheckWideCopy(decoded.get(), decoded.get());
  const std::wstring raw = fuzz::RawCharacters(bytes);
  const PyRef anyCharacters(PyUnicode_FromUnicode(reinterpret_cast<const Py_UNICODE*>(raw.data()), raw.size()));
  CheckWideCopy(anyCharacters.get(), anyCharacters.get());
}

void CheckInteger(PyObject* number) {
  int overflow = 0;
  const long value = PyLong_AsLongAndOverflow(number, &overflow);
  const bool fits = overflow == 0 && value >= INT_MIN && value <= INT_MAX;
  int converted = 0;
  const int status = binding::AsInt(number, &converted);
  fuzz::Require(status == (fits ? binding::STATUS_OK : binding::STATUS_TYPE_ERROR),
                "an integer converts exactly when int holds it");
  fuzz::Require(!fits || converted == value, "an integer keeps its value");
  fuzz::Require(!PyErr_Occurred(), "an integer conversion leaves no error set");
}

// The bytes as a little-endian signed number, as a long and, where a C long
// holds it, as an int.
void CheckIntegers(std::string_view bytes) {
  const PyRef asLong(_PyLong_FromByteArray(reinterpret_cast<const unsigned char*>(bytes.data()),
                                           bytes.size(), 1, 1));
  CheckInteger(asLong.get());
  const PyRef asInt(PyNumber_Int(asLong.get()));
  if (asInt && PyInt_Check(asInt.get())) CheckInteger(asInt.get());
}

}  // namespace

// The interpreter keeps objects in memory the leak checker cannot follow, so
// what is reachable only through them would be reported.
extern "C" const char* __lsan_default_suppressions() { return "leak:libpython2.7.so\n"; }

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  Py_NoSiteFlag = 1;
  Py_InitializeEx(0);
  InitializeTypes();
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const std::size_t arraySize = kArraySizes[data[0] % kArraySizes.size()];
  const std::string_view bytes = fuzz::Bytes(data + 1, size - 1);

  const PyRef str(PyString_FromStringAndSize(bytes.data(), bytes.size()));
  CheckNarrowString(str.get(), bytes);
  CheckNarrowArray(str.get(), bytes, arraySize);
  CheckWideFromStr(str.get(), bytes);
  CheckWideStrings(bytes);
  CheckIntegers(bytes);
  binding::TypeQuery(std::string(bytes).c_str());
  return 0;
}
