"""The OBLoginData session from Python: a new session, its accessors, its probe
members and the arguments the module refuses."""
import ctypes
import unittest

import _PyUploader as native
from binding_support import address_of, run_python

MAX_PATH = 260


def handle_value(pointer_object):
    """The HINTERNET held in the heap cell a getter returned."""
    return ctypes.c_void_p.from_address(address_of(pointer_object)).value or 0


def set_handle_value(pointer_object, value):
    ctypes.c_void_p.from_address(address_of(pointer_object)).value = value


class SessionTest(unittest.TestCase):

    def setUp(self):
        self.session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')

    def tearDown(self):
        native.delete_OBLoginData(self.session)


class NewSession(SessionTest):

    def test_texts_are_empty_unicode_and_there_are_no_categories(self):
        for getter in (native.OBLoginData_GetUserName, native.OBLoginData_GetServerUrl,
                       native.OBLoginData_GetLoginTokenID):
            value = getter(self.session)
            self.assertIs(type(value), unicode, getter.__name__)
            self.assertEqual(value, u'', getter.__name__)
        self.assertEqual(native.OBLoginData_GetCategoryCount(self.session), 0)

    def test_probe_members_start_cleared(self):
        self.assertEqual(native.OBLoginData_m_bServerReachable_get(self.session), 0)
        self.assertEqual(native.OBLoginData_m_szChkServerUrl_get(self.session), '')
        for getter in (native.OBLoginData_m_hInternet_get, native.OBLoginData_m_hConnect_get,
                       native.OBLoginData_m_hRequest_get):
            handle = getter(self.session)
            self.assertIn("'HINTERNET *'", repr(handle))
            self.assertEqual(handle_value(handle), 0, getter.__name__)

    def test_a_collected_handle_cell_is_reported_as_a_leak(self):
        code, out, err = run_python("""
            import _PyUploader as native
            session = native.new_OBLoginData(u'5.0', u'', u'')
            native.OBLoginData_m_hConnect_get(session)
            native.delete_OBLoginData(session)
            """)
        self.assertEqual(code, 0, err)
        self.assertEqual(out, "swig/python detected a memory leak of type 'HINTERNET *', "
                              "no destructor found.\n")


class ProbeMembers(SessionTest):

    def url(self):
        return native.OBLoginData_m_szChkServerUrl_get(self.session)

    def set_url(self, value):
        native.OBLoginData_m_szChkServerUrl_set(self.session, value)

    def test_the_url_reads_back_without_its_trailing_zeros(self):
        cases = [('a' * 100, 'a' * 100), ('b' * MAX_PATH, 'b' * MAX_PATH),
                 ('a\0\0b\0\0', 'a\0\0b'), (None, '')]
        for value, read in cases:
            self.set_url('x' * MAX_PATH)  # a shorter value clears what the longer one left
            self.set_url(value)
            self.assertEqual(self.url(), read, value)

    def test_too_long_or_unicode_urls_are_refused_and_change_nothing(self):
        self.set_url('keep')
        for value in ('c' * (MAX_PATH + 1), u'unicode', 5):
            with self.assertRaises(TypeError) as caught:
                self.set_url(value)
            self.assertEqual(str(caught.exception), "in method 'OBLoginData_m_szChkServerUrl_set', "
                                                    "argument 2 of type 'char [_MAX_PATH]'")
        self.assertEqual(self.url(), 'keep')

    def test_reachable_flag_takes_32_bit_integers(self):
        for value, stored in ((True, 1), (0, 0), (-2 ** 31, -2 ** 31), (2 ** 31 - 1, 2 ** 31 - 1),
                              (7L, 7)):
            native.OBLoginData_m_bServerReachable_set(self.session, value)
            self.assertEqual(native.OBLoginData_m_bServerReachable_get(self.session), stored)
        for value in (2 ** 31, -2 ** 31 - 1, 2L ** 31, 2L ** 80, 1.0, '1', None):
            with self.assertRaises(TypeError) as caught:
                native.OBLoginData_m_bServerReachable_set(self.session, value)
            self.assertEqual(str(caught.exception), "in method 'OBLoginData_m_bServerReachable_set', "
                                                    "argument 2 of type 'BOOL'")

    def test_handles_are_copied_in_and_out_through_heap_cells(self):
        members = ('m_hInternet', 'm_hConnect', 'm_hRequest')
        for number, member in enumerate(members, 1):
            cell = getattr(native, 'OBLoginData_%s_get' % member)(self.session)
            set_handle_value(cell, 0x1000 * number)
            getattr(native, 'OBLoginData_%s_set' % member)(self.session, cell)
            set_handle_value(cell, 0)  # the member holds a copy
        for number, member in enumerate(members, 1):
            cell = getattr(native, 'OBLoginData_%s_get' % member)(self.session)
            self.assertEqual(handle_value(cell), 0x1000 * number, member)


class RefusedArguments(SessionTest):

    def test_constructor_accepts_unicode_subclasses(self):
        class Text(unicode):
            pass
        session = native.new_OBLoginData(Text(u'5.0'), Text(u''), Text(u'id'))
        native.delete_OBLoginData(session)


if __name__ == '__main__':
    unittest.main()
