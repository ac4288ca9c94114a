"""Helpers for the binding suites: subprocess runs and a look inside pointer objects.

Pointer objects and the type ring have a fixed binary layout (other modules read
it too), so the tests can place a pointer object at a known address or give it
another type through ctypes, without any test-only entry point in the module.
"""
import ctypes
import os
import subprocess
import sys
import textwrap
import unittest

# Offsets in a pointer object after the object header (reference count, type).
_HEADER = 2 * ctypes.sizeof(ctypes.c_void_p)
_PTR = _HEADER
_TYPE = _HEADER + 8
_OWN = _HEADER + 16

_as_void_ptr = ctypes.pythonapi.PyCObject_AsVoidPtr
_as_void_ptr.restype = ctypes.c_void_p
_as_void_ptr.argtypes = [ctypes.py_object]


def run_python(code):
    """Runs `code` in a fresh interpreter; returns (exit code, stdout, stderr)."""
    proc = subprocess.Popen([sys.executable, '-c', textwrap.dedent(code)],
                            stdout=subprocess.PIPE, stderr=subprocess.PIPE,
                            env=dict(os.environ))
    out, err = proc.communicate()
    return proc.returncode, out, err


def address_of(pointer_object):
    return ctypes.c_void_p.from_address(id(pointer_object) + _PTR).value or 0


def set_address(pointer_object, address):
    ctypes.c_void_p.from_address(id(pointer_object) + _PTR).value = address


def set_type(pointer_object, type_info):
    ctypes.c_void_p.from_address(id(pointer_object) + _TYPE).value = type_info


def own_field(pointer_object):
    return ctypes.c_int.from_address(id(pointer_object) + _OWN).value


def ring_type(mangled_name):
    """The address of the ring's TypeInfo for `mangled_name` (head table first)."""
    head = _as_void_ptr(sys.modules['swig_runtime_data3'].type_pointer)
    table = head
    while True:
        types, size, following = (ctypes.c_void_p.from_address(table + 8 * i).value
                                  for i in range(3))
        for i in range(size):
            info = ctypes.c_void_p.from_address(types + 8 * i).value
            name = ctypes.c_char_p.from_address(info).value
            if name == mangled_name:
                return info
        table = following
        if table == head:
            raise KeyError(mangled_name)


class Relocated(object):
    """A disowned pointer object moved to `address` (and `mangled_name`'s type) for
    the duration of a with block, then put back and given its ownership again."""

    def __init__(self, pointer_object, address, mangled_name=None):
        self.pointer_object = pointer_object
        self.address = address
        self.mangled_name = mangled_name

    def __enter__(self):
        self.saved = (address_of(self.pointer_object),
                      ctypes.c_void_p.from_address(id(self.pointer_object) + _TYPE).value,
                      self.pointer_object.own())
        self.pointer_object.disown()
        set_address(self.pointer_object, self.address)
        if self.mangled_name:
            set_type(self.pointer_object, ring_type(self.mangled_name))
        return self.pointer_object

    def __exit__(self, *exc):
        address, type_info, owned = self.saved
        set_address(self.pointer_object, address)
        set_type(self.pointer_object, type_info)
        self.pointer_object.own(owned)
        return False


class ErrorTextTest(unittest.TestCase):

    def assertRaisesText(self, error, text, function, *args):
        with self.assertRaises(error) as caught:
            function(*args)
        self.assertEqual(str(caught.exception), text)


class Scenarios(unittest.TestCase):
    """Runs scenarios in fresh interpreters: `PRELUDE`, then the scenario's body."""

    PRELUDE = ''

    def run_scenario(self, body):
        code, out, err = run_python(textwrap.dedent(self.PRELUDE) + textwrap.dedent(body))
        self.assertEqual(code, 0, err)
        return out


class WithRecord(ErrorTextTest):
    """Each test has `self.text`, a "CString *" made by the peer module, and
    `self.record`, an infoEffectURL made from it; both are deleted afterwards."""

    def setUp(self):
        import _PyUploaderTestPeer as peer
        import _PyUploader as native
        self.text = peer.new_CString(u'text')
        self.record = native.new_infoEffectURL(self.text, self.text, self.text)

    def tearDown(self):
        import _PyUploaderTestPeer as peer
        import _PyUploader as native
        native.delete_infoEffectURL(self.record)
        peer.delete_CString(self.text)
