// The places where the C APIs of CPython 2.7 and of CPython 3.8 to 3.13 differ,
// each behind one name, so that the rest of the code is written once for both.
// Python 3 has no Py_UNICODE, no classic classes, no CObject and one integer type;
// its `str` is text, and `bytes` is refused like any other wrong type.
#pragma once

#include <Python.h>

#include <cstddef>
#include <cstdio>
#include <cstring>
#include <memory>

static_assert(sizeof(wchar_t) == 4, "wide strings hold one character per wchar_t");

namespace interpreter {

// ---- The module's entry point and module objects.

// Defines the exported init function of module `name` (init<name> on 2.7,
// PyInit_<name> on 3), which returns what `make()` returns: the module, or null
// with the exception that makes the import fail.
#if PY_MAJOR_VERSION >= 3
#define PYUPLOADER_MODULE_INIT(name, make) \
  extern "C" __attribute__((visibility("default"))) PyObject* PyInit_##name() { return make(); }
#else
#define PYUPLOADER_MODULE_INIT(name, make) \
  extern "C" __attribute__((visibility("default"))) void init##name() { make(); }
#endif

// A new module of these functions, or null. On 2.7 it is a borrowed reference that
// the interpreter's module table holds; on 3 the caller's new reference.
inline PyObject* CreateModule(const char* name, PyMethodDef* functions, int apiVersion) {
#if PY_MAJOR_VERSION >= 3
  // The interpreter keeps pointing at the definition while the module lives.
  auto* definition = new PyModuleDef{PyModuleDef_HEAD_INIT, name, nullptr, -1, functions,
                                     nullptr, nullptr, nullptr, nullptr};
  return PyModule_Create2(definition, apiVersion);
#else
  return Py_InitModule4(name, functions, nullptr, nullptr, apiVersion);
#endif
}

// What an init function returns when it fails after CreateModule succeeded.
inline PyObject* AbandonModule(PyObject* module) {
#if PY_MAJOR_VERSION >= 3
  Py_DECREF(module);
#else
  (void)module;
#endif
  return nullptr;
}

// A module without functions, entered in sys.modules so that other modules find it
// by importing its name; borrowed.
inline PyObject* AddEmptyModule(const char* name, int apiVersion) {
#if PY_MAJOR_VERSION >= 3
  (void)apiVersion;
  return PyImport_AddModule(name);
#else
  static PyMethodDef noFunctions[] = {{nullptr, nullptr, 0, nullptr}};
  return Py_InitModule4(name, noFunctions, nullptr, nullptr, apiVersion);
#endif
}

// A C pointer that one extension module publishes to others as a module attribute:
// a CObject on 2.7; on 3 a capsule named "<module>.<attribute>" (`capsuleName`, which
// must live as long as the capsule). `release` runs with the pointer when the
// object is freed.
inline PyObject* NewPublishedPointer(void* pointer, const char* capsuleName,
                                     void (*release)(void*)) {
#if PY_MAJOR_VERSION >= 3
  PyObject* capsule = PyCapsule_New(pointer, capsuleName, [](PyObject* self) {
    auto* releaseFunction = reinterpret_cast<void (*)(void*)>(PyCapsule_GetContext(self));
    releaseFunction(PyCapsule_GetPointer(self, PyCapsule_GetName(self)));
  });
  if (capsule && PyCapsule_SetContext(capsule, reinterpret_cast<void*>(release)) != 0) {
    Py_CLEAR(capsule);
  }
  return capsule;
#else
  (void)capsuleName;
  return PyCObject_FromVoidPtr(pointer, release);
#endif
}

// The pointer published under `attribute` of module `moduleName`, or null with an
// exception set.
inline void* ImportPublishedPointer(const char* moduleName, const char* attribute,
                                    const char* capsuleName) {
#if PY_MAJOR_VERSION >= 3
  (void)moduleName;
  (void)attribute;
  return PyCapsule_Import(capsuleName, 0);
#else
  (void)capsuleName;
  return PyCObject_Import(const_cast<char*>(moduleName), const_cast<char*>(attribute));
#endif
}

// ---- Text.

// 2.7's `str`, which text arguments decode with the default encoding; on 3 nothing
// counts: `bytes` is refused like any other wrong type.
inline bool IsUndecodedText(PyObject* object) {
#if PY_MAJOR_VERSION >= 3
  (void)object;
  return false;
#else
  return PyString_Check(object);
#endif
}

// The number of characters of a `unicode` (on 3 a `str`), which is also its number
// of wide characters.
inline Py_ssize_t UnicodeLength(PyObject* text) {
#if PY_MAJOR_VERSION >= 3
  return PyUnicode_GetLength(text);
#else
  return PyUnicode_GET_SIZE(text);
#endif
}

// Copies the `count` characters of `text` (UnicodeLength) to `out`, unterminated.
inline void CopyUnicode(PyObject* text, wchar_t* out, Py_ssize_t count) {
#if PY_MAJOR_VERSION >= 3
  PyUnicode_AsWideChar(text, out, count);
#else
  static_assert(sizeof(Py_UNICODE) == sizeof(wchar_t),
                "unicode characters cross into wide strings unconverted");
  std::memcpy(out, PyUnicode_AS_UNICODE(text), count * sizeof(wchar_t));
#endif
}

// The characters of a `unicode` (on 3 a `str`) as a zero-terminated wide string for
// as long as this object and the text live: on 2.7 the object's own buffer, which
// holds the same UCS-4 values; on 3 a copy.
class UnicodeChars {
 public:
  // False, with the interpreter's MemoryError set, when the copy cannot be made.
  bool Read(PyObject* text) {
#if PY_MAJOR_VERSION >= 3
    Py_ssize_t length = 0;  // asked for, so that inner zeros are no error
    copy_.reset(PyUnicode_AsWideCharString(text, &length));
    chars_ = copy_.get();
#else
    chars_ = reinterpret_cast<const wchar_t*>(PyUnicode_AS_UNICODE(text));
#endif
    return chars_ != nullptr;
  }
  const wchar_t* get() const { return chars_; }

 private:
  struct MemFree {
    void operator()(wchar_t* chars) const { PyMem_Free(chars); }
  };
  const wchar_t* chars_ = nullptr;
  std::unique_ptr<wchar_t, MemFree> copy_;
};

// The type that narrow strings (char arrays) cross as: `str` on both, which on 3 is
// text whose UTF-8 form is the bytes.
inline bool IsNarrowText(PyObject* object) {
#if PY_MAJOR_VERSION >= 3
  return PyUnicode_Check(object);
#else
  return PyString_Check(object);
#endif
}

// The bytes of a narrow-text object (IsNarrowText): on 2.7 the `str`'s own buffer;
// on 3 the text's UTF-8 form held by this object, in which lone surrogates
// U+DC80..U+DCFF stand for the bytes NewNarrowText could not decode, so that a
// value read can be written back unchanged.
class NarrowBytes {
 public:
  explicit NarrowBytes(PyObject* text) {
#if PY_MAJOR_VERSION >= 3
    encoded_ = PyUnicode_AsEncodedString(text, "utf-8", "surrogateescape");
    if (!encoded_) {
      PyErr_Clear();  // a text without a narrow form is refused like a wrong type
      return;
    }
    data_ = PyBytes_AS_STRING(encoded_);
    size_ = PyBytes_GET_SIZE(encoded_);
#else
    data_ = PyString_AS_STRING(text);
    size_ = PyString_GET_SIZE(text);
#endif
  }
  ~NarrowBytes() { Py_XDECREF(encoded_); }
  NarrowBytes(const NarrowBytes&) = delete;
  NarrowBytes& operator=(const NarrowBytes&) = delete;

  explicit operator bool() const { return data_ != nullptr; }
  char* data() const { return data_; }
  size_t size() const { return static_cast<size_t>(size_); }
  // True when data() belongs to the text object and lives as long as it does.
  bool inText() const { return encoded_ == nullptr; }

 private:
  PyObject* encoded_ = nullptr;
  char* data_ = nullptr;
  Py_ssize_t size_ = 0;
};

// A narrow-text object of exactly these bytes: a `str` on 2.7; on 3 a `str` of their
// UTF-8 decoding, each undecodable byte a lone surrogate (see NarrowBytes).
inline PyObject* NewNarrowText(const char* bytes, size_t size) {
#if PY_MAJOR_VERSION >= 3
  return PyUnicode_DecodeUTF8(bytes, static_cast<Py_ssize_t>(size), "surrogateescape");
#else
  return PyString_FromStringAndSize(bytes, static_cast<Py_ssize_t>(size));
#endif
}

inline PyObject* NewNarrowText(const char* text) { return NewNarrowText(text, std::strlen(text)); }

// The zero-terminated UTF-8 characters of a narrow-text object (as long as it lives),
// or null with an exception set.
inline const char* NarrowTextChars(PyObject* text) {
#if PY_MAJOR_VERSION >= 3
  return PyUnicode_AsUTF8(text);
#else
  return PyString_AsString(text);
#endif
}

// An interned `str`.
inline PyObject* NewInternedText(const char* text) {
#if PY_MAJOR_VERSION >= 3
  return PyUnicode_InternFromString(text);
#else
  return PyString_InternFromString(text);
#endif
}

// ---- Integers.

// 2.7's `int` (and `bool`), beside its `long`; on 3 every integer is a `long`.
inline bool IsShortInt(PyObject* object) {
#if PY_MAJOR_VERSION >= 3
  (void)object;
  return false;
#else
  return PyInt_Check(object);
#endif
}

inline long ShortIntValue(PyObject* object) {
#if PY_MAJOR_VERSION >= 3
  (void)object;
  return 0;
#else
  return PyInt_AS_LONG(object);
#endif
}

// An `int` (2.7's short integer; on 3 the one integer type).
inline PyObject* NewInt(long value) {
#if PY_MAJOR_VERSION >= 3
  return PyLong_FromLong(value);
#else
  return PyInt_FromLong(value);
#endif
}

// ---- Type slots.

// Compares two objects of the same type (two types with the same comparison), giving
// -1, 0 or 1; objects of other types fall back to the interpreter's default.
using ThreeWayCompare = int (*)(PyObject*, PyObject*);

#if PY_MAJOR_VERSION >= 3
template <ThreeWayCompare compare>
PyObject* RichCompareSlot(PyObject* left, PyObject* right, int op) {
  if (Py_TYPE(left)->tp_richcompare != Py_TYPE(right)->tp_richcompare) Py_RETURN_NOTIMPLEMENTED;
  const int order = compare(left, right);
  Py_RETURN_RICHCOMPARE(order, 0, op);
}
#endif

// tp_compare on 2.7; on 3, where only rich comparisons exist, all six built on it.
// Either way the objects are unhashable, as a type that compares but does not hash is.
template <ThreeWayCompare compare>
void SetCompareSlot(PyTypeObject& type) {
#if PY_MAJOR_VERSION >= 3
  type.tp_richcompare = RichCompareSlot<compare>;
#else
  type.tp_compare = compare;
#endif
}

// Writing to a real file: 2.7's tp_print; 3 has no such slot and prints str().
inline void SetPrintSlot(PyTypeObject& type, int (*print)(PyObject*, FILE*, int)) {
#if PY_MAJOR_VERSION >= 3
  (void)type;
  (void)print;
#else
  type.tp_print = print;
#endif
}

// The number slots of an object that stands for an integer: int() and long() give
// `toLong`; on 2.7 oct() and hex() give the texts of `toOct` and `toHex`; on 3, where
// oct() and hex() format the integer that __index__ gives, `toLong` is __index__.
inline void SetIntegerSlots(PyNumberMethods& number, unaryfunc toLong, unaryfunc toOct,
                            unaryfunc toHex) {
  number.nb_int = toLong;
#if PY_MAJOR_VERSION >= 3
  (void)toOct;
  (void)toHex;
  number.nb_index = toLong;
#else
  number.nb_long = toLong;
  number.nb_oct = toOct;
  number.nb_hex = toHex;
#endif
}

// ---- Classic classes and their instances, which only 2.7 has.

inline bool IsClassicClass(PyObject* object) {
#if PY_MAJOR_VERSION >= 3
  (void)object;
  return false;
#else
  return PyClass_Check(object);
#endif
}

inline bool IsClassicInstance(PyObject* object) {
#if PY_MAJOR_VERSION >= 3
  (void)object;
  return false;
#else
  return PyInstance_Check(object);
#endif
}

// The attribute of a classic instance (IsClassicInstance), borrowed, or null.
inline PyObject* ClassicInstanceLookup(PyObject* instance, PyObject* name) {
#if PY_MAJOR_VERSION >= 3
  (void)instance;
  (void)name;
  return nullptr;
#else
  return _PyInstance_Lookup(instance, name);
#endif
}

// A raw instance of a classic class (IsClassicClass) with this dictionary, or null.
inline PyObject* NewClassicInstance(PyObject* cls, PyObject* dict) {
#if PY_MAJOR_VERSION >= 3
  (void)cls;
  (void)dict;
  return nullptr;
#else
  return PyInstance_NewRaw(cls, dict);
#endif
}

// ---- Threads and hosting.

// Starts an interpreter hosted by this program (tests, benchmarks), without site
// and signal handlers, the calling thread its main thread holding its lock.
inline void StartHostedInterpreter() {
#if PY_MAJOR_VERSION >= 3
  PyConfig config;
  PyConfig_InitPythonConfig(&config);
  config.site_import = 0;
  config.install_signal_handlers = 0;
  const PyStatus status = Py_InitializeFromConfig(&config);
  PyConfig_Clear(&config);
  if (PyStatus_Exception(status)) Py_ExitStatusException(status);
#else
  Py_NoSiteFlag = 1;
  Py_InitializeEx(0);
  PyEval_InitThreads();
#endif
}

// Readies the interpreter lock for threads other than the main one; 3 has it ready.
inline void PrepareThreads() {
#if PY_MAJOR_VERSION < 3
  PyEval_InitThreads();
#endif
}

// True when the calling thread holds the interpreter lock.
inline bool ThisThreadHoldsLock() {
  PyThreadState* mine = PyGILState_GetThisThreadState();
#if PY_MAJOR_VERSION >= 3
  // Asked only of a thread with a state: PyGILState_Check says yes to every thread
  // once a subinterpreter exists.
  return mine != nullptr && PyGILState_Check();
#else
  return mine != nullptr && mine == _PyThreadState_Current;
#endif
}

// Python 3.9 to 3.11, where a pending call added by a thread other than the main
// one is noticed only when the main thread next takes the lock (MainThreadNudge.h).
#define PYUPLOADER_PENDING_CALLS_NEED_NUDGE \
  (PY_VERSION_HEX >= 0x03090000 && PY_VERSION_HEX < 0x030C0000)

// False once the interpreter has begun to finalize on 3, where a pending call added
// from then on may reach a freed interpreter; 2.7 takes them to the end (they are
// run, if ever, by the main thread).
inline bool TakesPendingCalls() {
#if PY_MAJOR_VERSION >= 3
  return Py_IsInitialized();
#else
  return true;
#endif
}

// PyArg_UnpackTuple, with 2.7's words for a wrong number of arguments on both:
// 3 says "1 argument" where 2.7 said "1 arguments", and callers know the latter.
template <typename... Out>
bool UnpackTuple(PyObject* args, const char* name, Py_ssize_t min, Py_ssize_t max, Out... out) {
#if PY_MAJOR_VERSION >= 3
  const Py_ssize_t count = PyTuple_Check(args) ? PyTuple_GET_SIZE(args) : min;
  if (count < min || count > max) {
    const char* bound = min == max ? "" : count < min ? "at least " : "at most ";
    PyErr_Format(PyExc_TypeError, "%s expected %s%zd arguments, got %zd", name, bound,
                 count < min ? min : max, count);
    return false;
  }
#endif
  return PyArg_UnpackTuple(args, name, min, max, out...) != 0;
}

// True while Python 3 exits and tears its modules down: it frees the modules that
// only sys.modules holds before it clears the globals of the others, so what those
// globals hold dies after them. 2.7 clears __main__ first and is never asked.
inline bool TearingDownModules() {
#if PY_MAJOR_VERSION >= 3
  return !Py_IsInitialized();
#else
  return false;
#endif
}

}  // namespace interpreter
