"""Every module function called with every wrong kind of argument in every
position, generated from the functions' signatures: the exact exception and
text, no reference kept to the refused value, and no crash (CI runs this suite
against the AddressSanitizer build of the module too)."""
import sys
import unittest
import weakref

import _PyUploaderTestPeer as peer
import _PyUploader as native

SKIP, REFUSE = 'skip', 'refuse'  # what a None object does: nothing, or ValueError


def ptr(type_name, on_null=REFUSE):
    return ('ptr', type_name + ' *', type_name, on_null)


def ref(c_type, type_name):
    return ('ref', c_type, type_name, REFUSE)


RECORD, SESSION, UPLOADER = ptr('infoEffectURL'), ptr('OBLoginData'), ptr('PyPresetUploader')
RECORD_SETTER, SESSION_SETTER = ptr('infoEffectURL', SKIP), ptr('OBLoginData', SKIP)
CSTRING, HANDLE = ref('CString', 'CString'), ref('HINTERNET', 'HINTERNET')
UNICODE, WIDE, OBJECT, ARRAY = ('unicode',), ('wide',), ('object',), ('array',)


def integer(c_type):
    return ('int', c_type)


SIGNATURES = dict(
    [('new_infoEffectURL', [CSTRING] * 3), ('delete_infoEffectURL', [RECORD_SETTER]),
     ('infoEffectURL_swigregister', [OBJECT]), ('new_OBLoginData', [UNICODE] * 3),
     ('delete_OBLoginData', [SESSION_SETTER]), ('OBLoginData_swigregister', [OBJECT]),
     ('OBLoginData_LoginOrbishare', [SESSION, UNICODE, UNICODE]),
     ('OBLoginData_SetOBURLAsReg', [SESSION, UNICODE]),
     ('OBLoginData_GetPresetCategory', [SESSION, UNICODE]),
     ('OBLoginData_GetCategroyName', [SESSION, integer('int'), ref('CString &', 'CString')]),
     ('OBLoginData_SetRelateVideo', [SESSION] + [UNICODE] * 3),
     ('OBLoginData_GetEffectByGUID', [SESSION, UNICODE]),
     ('OBLoginData_m_bServerReachable_set', [SESSION_SETTER, integer('BOOL')]),
     ('OBLoginData_m_szChkServerUrl_set', [SESSION, ARRAY]),
     ('new_PyPresetUploader', [WIDE] * 5),
     ('delete_PyPresetUploader', [ptr('PyPresetUploader', SKIP)]),
     ('PyPresetUploader_SetCallback', [UPLOADER, OBJECT]),
     ('PyPresetUploader_StartUpload', [UPLOADER] + [WIDE] * 18),
     ('PyPresetUploader_swigregister', [OBJECT])]
    + [('infoEffectURL_str%s_%s' % (member, verb), signature)
       for member in ('Effect', 'Tag', 'URL')
       for verb, signature in (('set', [RECORD_SETTER, CSTRING]), ('get', [RECORD]))]
    + [('OBLoginData_%s_%s' % (member, verb), signature)
       for member in ('m_hInternet', 'm_hConnect', 'm_hRequest')
       for verb, signature in (('set', [SESSION_SETTER, HANDLE]), ('get', [SESSION]))]
    + [('OBLoginData_' + name, [SESSION]) for name in (
        'LogoutOrbishare InitOBServerURL GetUserName GetServerUrl GetLoginTokenID GetSignUpURL '
        'GetForgetPasswordURL GetLensCorrectionURL GetCategoryCount GetPresetDownloadURL '
        'm_bServerReachable_get m_szChkServerUrl_get').split()]
    + [('PyPresetUploader_' + name, [UPLOADER])
       for name in ('CancelUpload', 'GetUploadedFileUrl')])

MAX_PATH = 260


class PySwigObject(object):
    """A Python class that only borrows the pointer type's name."""


class ThisLoop(object):
    """An object whose "this" is itself."""

    def __init__(self):
        self.this = self


class Gone(object):
    pass


def dead_proxy():
    return weakref.proxy(Gone())


# Wrong values by name; a pointer value is named by its type. Each is made anew
# for every call, so that a reference kept by a refused call shows.
PLAIN_VALUES = {
    'int': lambda: 7, 'bool': lambda: True, 'long': lambda: 1 << 40, 'float': lambda: 1.5,
    'str': lambda: 'te' + 'xt', 'unicode': lambda: u'te' + u'xt', 'None': lambda: None,
    'list': lambda: [u'text'], 'long str': lambda: 'x' * (MAX_PATH + 1),
    'undecodable str': lambda: '\xff\xfe', 'impostor': PySwigObject, 'this loop': ThisLoop,
    'dead proxy': dead_proxy,
}
# Shared by the interpreter itself, so their reference counts move on their own.
SINGLETONS = ('None', 'bool', 'int')


def outcome(kind, value_name):
    """What the conversion of kind does with the value: None (accepted, not
    called), ('returns', 'None'), ('unicode error', None) or (exception, C type)."""
    name = kind[0]
    if name == 'object':
        return None
    if name in ('ptr', 'ref'):
        if value_name == kind[2]:
            return None
        if value_name == 'None':
            return ('returns', 'None') if kind[3] == SKIP else (ValueError, kind[1])
        return (TypeError, kind[1])
    if name == 'unicode':
        return None if value_name == 'unicode' else (TypeError, None)
    if name == 'wide':
        if value_name == 'undecodable str':
            return ('unicode error', None)
        accepted = ('str', 'unicode', 'None', 'long str')
        return None if value_name in accepted else (TypeError, 'wchar_t const *')
    if name == 'int':
        return None if value_name in ('int', 'bool') else (TypeError, kind[1])
    accepted = ('str', 'None', 'undecodable str')  # a narrow array: at most 260 bytes
    return None if value_name in accepted else (TypeError, 'char [_MAX_PATH]')


def expected_result(function, position, expected):
    error, c_type = expected
    if error in ('returns', 'unicode error'):
        return expected
    if c_type is None:
        return (error, 'Unicode string expected')
    text = "in method '%s', argument %d of type '%s'" % (function, position, c_type)
    return (error, ('invalid null reference ' if error is ValueError else '') + text)


class ArgumentMatrix(unittest.TestCase):

    def setUp(self):
        self.text = peer.new_CString(u'text')
        self.session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
        self.handle = native.OBLoginData_m_hInternet_get(self.session)
        self.record = native.new_infoEffectURL(self.text, self.text, self.text)
        self.uploader = native.new_PyPresetUploader(*[u'x'] * 5)
        pointers = {'CString': self.text, 'OBLoginData': self.session, 'HINTERNET': self.handle,
                    'infoEffectURL': self.record, 'PyPresetUploader': self.uploader}
        self.values = dict(PLAIN_VALUES)
        self.values.update((name, lambda p=p: p) for name, p in pointers.items())
        self.valid = dict(pointers, unicode=u'x', wide=u'x', int=1, array='x', object=None)

    def tearDown(self):
        native.delete_PyPresetUploader(self.uploader)
        native.delete_infoEffectURL(self.record)
        native.delete_OBLoginData(self.session)
        peer.delete_CString(self.text)

    def valid_value(self, kind):
        return self.valid[kind[2] if kind[0] in ('ptr', 'ref') else kind[0]]

    def test_every_wrong_value_in_every_position_is_refused_with_its_exact_text(self):
        functions = [name for name, value in vars(native).items() if callable(value)]
        self.assertEqual(sorted(SIGNATURES), sorted(functions))
        mismatches = []
        for function, kinds in sorted(SIGNATURES.items()):
            for position, kind in enumerate(kinds, 1):
                for value_name in sorted(self.values):
                    expected = outcome(kind, value_name)
                    if expected is not None:
                        found = self.call_with(function, kinds, position, value_name)
                        wanted = expected_result(function, position, expected)
                        if found != wanted:
                            mismatches.append((function, position, value_name, found, wanted))
        self.assertEqual(mismatches, [])

    def call_with(self, function, kinds, position, value_name):
        value = self.values[value_name]()
        references = sys.getrefcount(value)
        args = [self.valid_value(kind) for kind in kinds]
        args[position - 1] = value
        try:
            found = ('returns', repr(getattr(native, function)(*args)))
        except UnicodeDecodeError:
            found = ('unicode error', None)
        except (TypeError, ValueError) as error:
            found = (type(error), str(error))
        del args
        if value_name not in SINGLETONS and sys.getrefcount(value) != references:
            found += ('reference kept',)
        return found

    def test_a_wrong_number_of_arguments_is_refused_naming_the_function(self):
        for function, kinds in SIGNATURES.items():
            name = 'swigregister' if function.endswith('_swigregister') else function
            for count in (len(kinds) - 1, len(kinds) + 1):
                with self.assertRaises(TypeError) as caught:
                    getattr(native, function)(*[None] * count)
                self.assertEqual(str(caught.exception), '%s expected %d arguments, got %d'
                                 % (name, len(kinds), count))


if __name__ == '__main__':
    unittest.main()
