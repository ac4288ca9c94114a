"""The module as Python sees it: every wrong argument of every function, the session's
members, pointer objects, registered classes, the type ring shared with a second module,
and the one exported symbol."""
# ctest timeout: 20
import os
import subprocess
import sys
import unittest
import weakref

import _PyUploaderTestPeer as peer
import _PyUploader as native
from fixtures import PY2, Relocated, run_python, text_type

SKIP, REFUSE = 'skip', 'refuse'  # what a None object does: nothing, or ValueError
MAX_PATH = 260


def ptr(type_name, on_null=REFUSE):
    return ('ptr', type_name + ' *', type_name, on_null)


def ref(c_type, type_name):
    return ('ref', c_type, type_name, REFUSE)


RECORD, SESSION, UPLOADER = ptr('infoEffectURL'), ptr('OBLoginData'), ptr('PyPresetUploader')
RECORD_SETTER, SESSION_SETTER = ptr('infoEffectURL', SKIP), ptr('OBLoginData', SKIP)
CSTRING, HANDLE = ref('CString', 'CString'), ref('HINTERNET', 'HINTERNET')
UNICODE, WIDE, OBJECT, ARRAY = ('unicode',), ('wide',), ('object',), ('array',)
SIGNATURES = dict(
    [('new_infoEffectURL', [CSTRING] * 3), ('delete_infoEffectURL', [RECORD_SETTER]),
     ('infoEffectURL_swigregister', [OBJECT]), ('new_OBLoginData', [UNICODE] * 3),
     ('delete_OBLoginData', [SESSION_SETTER]), ('OBLoginData_swigregister', [OBJECT]),
     ('OBLoginData_LoginOrbishare', [SESSION, UNICODE, UNICODE]),
     ('OBLoginData_SetOBURLAsReg', [SESSION, UNICODE]),
     ('OBLoginData_GetPresetCategory', [SESSION, UNICODE]),
     ('OBLoginData_GetCategroyName', [SESSION, ('int', 'int'), ref('CString &', 'CString')]),
     ('OBLoginData_SetRelateVideo', [SESSION] + [UNICODE] * 3),
     ('OBLoginData_GetEffectByGUID', [SESSION, UNICODE]),
     ('OBLoginData_m_bServerReachable_set', [SESSION_SETTER, ('int', 'BOOL')]),
     ('OBLoginData_m_szChkServerUrl_set', [SESSION, ARRAY]),
     ('new_PyPresetUploader', [WIDE] * 5), ('delete_PyPresetUploader', [ptr('PyPresetUploader', SKIP)]),
     ('PyPresetUploader_SetCallback', [UPLOADER, OBJECT]),
     ('PyPresetUploader_StartUpload', [UPLOADER] + [WIDE] * 18),
     ('PyPresetUploader_swigregister', [OBJECT])]
    + [('infoEffectURL_str%s_%s' % (member, verb), signature) for member in ('Effect', 'Tag', 'URL')
       for verb, signature in (('set', [RECORD_SETTER, CSTRING]), ('get', [RECORD]))]
    + [('OBLoginData_%s_%s' % (member, verb), signature)
       for member in ('m_hInternet', 'm_hConnect', 'm_hRequest')
       for verb, signature in (('set', [SESSION_SETTER, HANDLE]), ('get', [SESSION]))]
    + [('OBLoginData_' + name, [SESSION]) for name in (
        'LogoutOrbishare InitOBServerURL GetUserName GetServerUrl GetLoginTokenID GetSignUpURL '
        'GetForgetPasswordURL GetLensCorrectionURL GetCategoryCount GetPresetDownloadURL '
        'm_bServerReachable_get m_szChkServerUrl_get').split()]
    + [('PyPresetUploader_' + name, [UPLOADER]) for name in ('CancelUpload', 'GetUploadedFileUrl')])


class PySwigObject(object):
    """A Python class that only borrows the pointer type's name."""


class ThisLoop(object):
    def __init__(self):
        self.this = self


# Wrong values by name, each made anew for every call, so that a reference kept
# by a refused call shows; a pointer value is named by its type.
PLAIN_VALUES = {
    'int': lambda: 7, 'bool': lambda: True, 'long': lambda: 1 << 40, 'float': lambda: 1.5,
    'str': lambda: 'te' + 'xt', 'unicode': lambda: u'te' + u'xt', 'None': lambda: None,
    'list': lambda: [u'text'], 'long str': lambda: 'x' * (MAX_PATH + 1),
    'undecodable str': lambda: b'\xff\xfe', 'impostor': PySwigObject, 'this loop': ThisLoop,
    'dead proxy': lambda: weakref.proxy(PySwigObject()),
}
SINGLETONS = ('None', 'bool', 'int')  # their reference counts move on their own
# On Python 3 'str' is the text type and the undecodable one is bytes.
TEXTS = ('unicode',) if PY2 else ('unicode', 'str', 'long str')
ARRAY_VALUES = ('str', 'None', 'undecodable str') if PY2 else ('str', 'unicode', 'None')
NOT_NARROW = u'unicode' if PY2 else b'bytes'


def outcome(kind, value):
    """None (accepted, not called), ('returns', 'None'), ('unicode error', None) or
    (exception, C type; None for the Unicode text)."""
    name = kind[0]
    if name == 'object':
        return None
    if name in ('ptr', 'ref'):
        if value == kind[2]:
            return None
        if value == 'None':
            return ('returns', 'None') if kind[3] == SKIP else (ValueError, kind[1])
        return (TypeError, kind[1])
    if name == 'unicode':
        return None if value in TEXTS else (TypeError, None)
    if name == 'wide':
        if value == 'undecodable str' and PY2:
            return ('unicode error', None)
        return None if value in ('str', 'unicode', 'None', 'long str') else (TypeError, 'wchar_t const *')
    if name == 'int':
        return None if value in ('int', 'bool') else (TypeError, kind[1])
    return None if value in ARRAY_VALUES else (TypeError, 'char [_MAX_PATH]')


def expected_result(function, position, expected):
    error, c_type = expected
    if error in ('returns', 'unicode error'):
        return expected
    if c_type is None:
        return (error, 'Unicode string expected')
    text = "in method '%s', argument %d of type '%s'" % (function, position, c_type)
    return (error, ('invalid null reference ' if error is ValueError else '') + text)


class Objects(unittest.TestCase):
    """One object of each kind, deleted afterwards."""

    def setUp(self):
        self.text = peer.new_CString(u'text')
        self.session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
        self.record = native.new_infoEffectURL(self.text, self.text, self.text)
        self.uploader = native.new_PyPresetUploader(*[u'x'] * 5)

    def tearDown(self):
        native.delete_PyPresetUploader(self.uploader)
        native.delete_infoEffectURL(self.record)
        native.delete_OBLoginData(self.session)
        peer.delete_CString(self.text)

    def assertRefused(self, error, text, function, *args):
        with self.assertRaises(error) as caught:
            function(*args)
        self.assertEqual(str(caught.exception), text)


class Arguments(Objects):

    def test_every_wrong_value_in_every_position_is_refused_with_its_exact_text(self):
        self.assertEqual(sorted(SIGNATURES), sorted(n for n, f in vars(native).items() if callable(f)))
        handle = native.OBLoginData_m_hInternet_get(self.session)
        pointers = {'CString': self.text, 'OBLoginData': self.session, 'HINTERNET': handle,
                    'infoEffectURL': self.record, 'PyPresetUploader': self.uploader}
        values = dict(PLAIN_VALUES, **dict((n, lambda p=p: p) for n, p in pointers.items()))
        valid = dict(pointers, unicode=u'x', wide=u'x', int=1, array='x', object=None)
        mismatches = []
        for function, kinds in sorted(SIGNATURES.items()):
            for position, kind in enumerate(kinds, 1):
                for name in sorted(values):
                    expected = outcome(kind, name)
                    if expected is None:
                        continue
                    found = self.call_with(function, [valid[k[2] if k[0] in ('ptr', 'ref') else k[0]]
                                                      for k in kinds], position, name, values[name]())
                    if found != expected_result(function, position, expected):
                        mismatches.append((function, position, name, found))
        self.assertEqual(mismatches, [])
        for function, kinds in SIGNATURES.items():  # a wrong number of arguments names the function
            name = 'swigregister' if function.endswith('_swigregister') else function
            for count in (len(kinds) - 1, len(kinds) + 1):
                self.assertRefused(TypeError, '%s expected %d arguments, got %d' % (
                    name, len(kinds), count), getattr(native, function), *[None] * count)

    @staticmethod
    def call_with(function, args, position, name, value):
        references = sys.getrefcount(value)
        args[position - 1] = value
        try:
            found = ('returns', repr(getattr(native, function)(*args)))
        except UnicodeDecodeError:
            found = ('unicode error', None)
        except (TypeError, ValueError) as error:
            found = (type(error), str(error))
        args[position - 1] = None
        if name not in SINGLETONS and sys.getrefcount(value) != references:
            found += ('reference kept',)
        return found

    def test_the_first_refusal_wins_a_refused_call_changes_nothing_and_texts_convert(self):
        self.assertRefused(ValueError, "invalid null reference in method 'new_infoEffectURL', "
                           "argument 1 of type 'CString'", native.new_infoEffectURL, None, 1, 2)
        self.assertRefused(ValueError, "invalid null reference in method 'infoEffectURL_strURL_set', "
                           "argument 2 of type 'CString'", native.infoEffectURL_strURL_set, None, None)
        kept = peer.new_CString(u'kept')
        native.infoEffectURL_strTag_set(self.record, kept)
        self.assertRaises(ValueError, native.infoEffectURL_strTag_set, self.record, None)
        value = native.infoEffectURL_strTag_get(self.record)
        self.assertEqual(peer.CString_value(value), u'kept')
        peer.delete_CString(kept)
        peer.delete_CString(value)

        class Text(text_type):
            pass
        for given, expected in [(u'caf\xe9 \U0001f600', u'caf\xe9 \U0001f600'), ('plain', u'plain'),
                                (None, u''), (u'before\0after', u'before'), (Text(u'sub'), u'sub')]:
            made = peer.new_CString(given)
            self.assertEqual(peer.CString_value(made), expected)
            peer.delete_CString(made)
        native.delete_OBLoginData(native.new_OBLoginData(Text(u'5.0'), Text(u''), Text(u'id')))

    def test_the_session_members_url_array_of_260_bytes_and_32_bit_flag(self):
        def member(name, *value):
            return getattr(native, 'OBLoginData_%s_%s' % (name, 'set' if value else 'get'))(self.session, *value)
        for value, read in [('a' * 100, 'a' * 100), ('b' * MAX_PATH, 'b' * MAX_PATH), ('a\0\0b\0\0', 'a\0\0b'),
                            (None, '')]:
            member('m_szChkServerUrl', 'x' * MAX_PATH)  # a shorter value clears it all
            member('m_szChkServerUrl', value)
            self.assertEqual(member('m_szChkServerUrl'), read, value)
        for value, stored in ((True, 1), (-2 ** 31, -2 ** 31), (2 ** 31 - 1, 2 ** 31 - 1), (2 ** 64 // 2 ** 61, 8)):
            member('m_bServerReachable', value)
            self.assertEqual(member('m_bServerReachable'), stored)
        refusals = [('m_szChkServerUrl', 'char [_MAX_PATH]', v) for v in ('c' * (MAX_PATH + 1), NOT_NARROW, 5)]
        refusals += [('m_bServerReachable', 'BOOL', v) for v in (2 ** 31, -2 ** 31 - 1, 2 ** 80, 1.0, '1', None)]
        for name, c_type, value in refusals:
            self.assertRefused(TypeError, "in method 'OBLoginData_%s_set', argument 2 of type '%s'" % (name, c_type),
                               member, name, value)
        self.assertEqual(member('m_szChkServerUrl'), '')

    def test_pointer_objects_text_forms_numbers_order_and_ownership(self):
        with Relocated(self.record, 0x1234):
            self.assertEqual((str(self.record), repr(self.record), int(self.record)), (
                '_3412000000000000_p_infoEffectURL', "<Swig Object of type 'infoEffectURL *' at 0x1234>", 4660))
            if PY2:  # the number forms of Python 2 only
                self.assertEqual((hex(self.record), oct(self.record), long(self.record)), ('1234', '11064', 4660))
        same = peer.new_CString(u'other')  # of the same module: one type compares
        with Relocated(self.text, 0x1000), Relocated(same, 0x2000):
            self.assertEqual((self.text < same, same > self.text, self.text == same), (True, True, False))
        with Relocated(self.text, 0x2000), Relocated(same, 0x2000):
            self.assertEqual(self.text == same, True)
        peer.delete_CString(same)
        self.assertEqual((self.record.own(), self.record.disown(), self.record.own()), (True, None, False))
        self.assertEqual((self.record.own(True), self.record.own(0), self.record.own()), (False, True, False))
        self.assertEqual((self.record.acquire(), self.record.own()), (None, True))
        self.assertRaises(TypeError, self.record.own, 1, 2)


# Run in a fresh interpreter per import order: registered classes and the ring
# belong to the process. The output is the evidence.
SCENARIO = '''from __future__ import print_function
import sys
%s
print(sorted(n for n in dir(sys.modules['swig_runtime_data3']) if not n.startswith('__')))
text = peer.new_CString(u'peer made')
text.disown()
record = native.new_infoEffectURL(text, text, text)
value = native.infoEffectURL_strURL_get(record)
print(type(value) is not type(text), peer.CString_value(value))
class NewStyle(object):
    __swig_destroy__ = peer.delete_CString
class Classic:
    __swig_destroy__ = peer.delete_CString
for cls in (NewStyle, Classic):
    peer.CString_swigregister(cls)
    value = native.infoEffectURL_strTag_get(record)
    this = getattr(value, 'this', value)
    print(type(value).__name__, type(this).__name__, this.own(), peer.CString_value(value))
    del value, this
made = native.new_infoEffectURL(text, text, text)
print(type(made).__name__, native.delete_infoEffectURL(made))
calls = []
destroyers = [('Recorded', lambda obj: calls.append(obj.own()) or native.delete_infoEffectURL(obj)),
              ('Failing', lambda obj: 1 / 0), ('NoDestroy', None)]
for name, destroy in destroyers:
    cls = type(name, (object,), dict(__swig_destroy__=staticmethod(destroy)) if destroy else {})
    native.infoEffectURL_swigregister(cls)
    made = cls()
    made.this = native.new_infoEffectURL(text, text, text)
    try:
        raise KeyError('pending')
    except KeyError:
        del made
        print(cls.__name__, calls, sys.exc_info()[0].__name__)
native.delete_infoEffectURL(record)
'''
EXPECTED = ("%s\nTrue peer made\n"
            "NewStyle PySwigObject True peer made\n%s PySwigObject True peer made\n"
            "PySwigObject None\n"
            "Recorded [False] KeyError\nFailing [False] KeyError\n"
            "swig/python detected a memory leak of type 'infoEffectURL *', no destructor found.\n"
            "NoDestroy [False] KeyError\n") % ((['type_pointer'], 'instance') if PY2 else
                                                (['type_pointer_capsule'], 'Classic'))


class Process(unittest.TestCase):

    def test_two_modules_share_one_ring_and_registered_classes_in_either_import_order(self):
        for imports in ('import _PyUploaderTestPeer as peer\nimport _PyUploader as native',
                        'import _PyUploader as native\nimport _PyUploaderTestPeer as peer'):
            code, out, err = run_python(SCENARIO % imports)
            self.assertEqual((code, out), (0, EXPECTED), err)

    def test_only_the_initialiser_is_exported(self):
        library = os.path.join(os.environ['UPLOADER_BUILD_DIR'], 'python', native.__file__.split('/')[-1])
        listing = subprocess.check_output(['nm', '-D', '--defined-only', library]).decode('ascii')
        self.assertEqual([line.split()[-1] for line in listing.splitlines() if line.strip()],
                         ['init_PyUploader' if PY2 else 'PyInit__PyUploader'])


if __name__ == '__main__':
    unittest.main()
