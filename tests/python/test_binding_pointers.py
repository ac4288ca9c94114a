"""Pointer objects as Python sees them: text forms, numbers, order, ownership, chains."""
import sys
import tempfile
import unittest

import _PyUploaderTestPeer as peer
import _PyUploader as native
from binding_support import Relocated, Scenarios, WithRecord, address_of, own_field


class PointerObjects(WithRecord):

    def test_text_forms_and_numbers_at_a_known_address(self):
        with Relocated(self.record, 0x1234) as moved:
            self.assertEqual(str(moved), '_3412000000000000_p_infoEffectURL')
            self.assertEqual(repr(moved), "<Swig Object of type 'infoEffectURL *' at 0x1234>")
            self.assertEqual(hex(moved), '1234')
            self.assertEqual(oct(moved), '11064')
            self.assertEqual(long(moved), 4660L)
            self.assertEqual(int(moved), 4660)

    def test_display_name_is_the_last_spelling(self):
        cases = [('_p_wchar_t', 'WCHAR *'), ('_p_char', 'TCHAR *'),
                 ('_p_unsigned_long_long', 'uint64 *'), ('_p_HINTERNET', 'HINTERNET *')]
        for mangled, shown in cases:
            with Relocated(self.record, 0xabc0, mangled) as moved:
                self.assertEqual(repr(moved), "<Swig Object of type '%s' at 0xabc0>" % shown)
                self.assertEqual(str(moved), '_c0ab000000000000' + mangled)

    def test_repr_of_a_chain_follows_each_link(self):
        other = peer.new_CString(u'other')
        self.record.append(other)
        self.assertIs(self.record.next(), other)
        self.assertEqual(repr(self.record),
                         "<Swig Object of type 'infoEffectURL *' at 0x%x>" % address_of(self.record)
                         + repr(other))
        self.assertEqual(self.record.__repr__(), repr(self.record))
        self.assertIsNone(other.next())
        peer.delete_CString(other)

    def test_print_to_a_real_file_writes_the_representation(self):
        with tempfile.TemporaryFile() as out:
            print >> out, self.record,
            out.seek(0)
            self.assertEqual(out.read(), repr(self.record))

    def test_compares_by_address_whatever_the_type(self):
        low, high = peer.new_CString(u'a'), peer.new_CString(u'b')
        with Relocated(low, 0x1000), Relocated(high, 0x2000, '_p_OBLoginData'):
            self.assertTrue(low < high)
            self.assertTrue(high > low)
            self.assertEqual(cmp(high, low), 1)
        same = native.infoEffectURL_strTag_get(self.record)
        with Relocated(self.record, 0x2000), Relocated(same, 0x2000):
            self.assertTrue(self.record == same)
            self.assertEqual(cmp(self.record, same), 0)
        for made in (low, high, same):
            peer.delete_CString(made)

    def test_ownership_methods(self):
        self.assertTrue(self.record.own())
        self.assertIsNone(self.record.disown())
        self.assertIs(self.record.own(), False)
        self.assertIs(self.record.own(True), False)
        self.assertEqual(own_field(self.record), 1)
        self.assertIs(self.record.own(0), True)
        self.assertEqual(own_field(self.record), 0)
        self.assertIsNone(self.record.acquire())
        self.assertIs(self.record.own(), True)
        with self.assertRaises(TypeError):
            self.record.own(1, 2)

    def test_append_refuses_non_pointers_and_cycles(self):
        with self.assertRaises(SystemError):
            self.record.append(5)
        self.assertIsNone(self.record.next())
        with self.assertRaises(ValueError):
            self.record.append(self.record)
        other = peer.new_CString(u'other')
        other.append(self.record)
        with self.assertRaises(ValueError):
            self.record.append(other)
        peer.delete_CString(other)

    def test_append_again_releases_the_previous_link(self):
        first, second = peer.new_CString(u'1'), peer.new_CString(u'2')
        before = sys.getrefcount(first)
        self.record.append(first)
        self.assertEqual(sys.getrefcount(first), before + 1)
        self.record.append(second)
        self.assertEqual(sys.getrefcount(first), before)
        self.assertIs(self.record.next(), second)
        for made in (first, second):
            peer.delete_CString(made)

    def test_a_chain_link_of_the_expected_type_is_found(self):
        other = peer.new_CString(u'linked')
        other.disown()
        other.append(self.record)
        value = native.infoEffectURL_strURL_get(other)
        self.assertEqual(peer.CString_value(value), u'text')
        peer.delete_CString(value)


class DestroyingOwners(Scenarios):
    """Collection of owning pointer objects, watched from a fresh interpreter."""

    PRELUDE = '''
        import gc, _PyUploader as native, _PyUploaderTestPeer as peer
        text = peer.new_CString(u'x')
        text.disown()
    '''

    def test_collection_destroys_only_owned_objects_and_reports_each_leak_once(self):
        out = self.run_scenario('''
        record = native.new_infoEffectURL(text, text, text)
        values = [native.infoEffectURL_strTag_get(record) for _ in range(3)]
        disowned = native.infoEffectURL_strTag_get(record)
        disowned.disown()
        native.delete_infoEffectURL(record)
        print record.own()
        del record, values, disowned
        value = peer.new_CString(u'v')
        peer.delete_CString(value)
        del value
        gc.collect()
        print 'end'
        ''')
        leak = "swig/python detected a memory leak of type 'CString *', no destructor found.\n"
        self.assertEqual(out, 'False\n' + leak * 3 + 'end\n')


if __name__ == '__main__':
    unittest.main()
