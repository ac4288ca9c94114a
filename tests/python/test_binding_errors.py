"""Refusals in order, text conversions and a refused call changing nothing. Every
wrong argument of every function is in test_argument_matrix."""
import unittest

import _PyUploaderTestPeer as peer
import _PyUploader as native
from binding_support import WithRecord


class RefusedArguments(WithRecord):

    def test_first_failure_wins_left_to_right(self):
        self.assertRaisesText(TypeError, "in method 'new_infoEffectURL', argument 1 of type 'CString'",
                              native.new_infoEffectURL, 1, None, 2)
        self.assertRaisesText(ValueError,
                              "invalid null reference in method 'new_infoEffectURL', "
                              "argument 1 of type 'CString'",
                              native.new_infoEffectURL, None, 1, 2)
        # A null object would skip the setter, but the null reference is refused first.
        self.assertRaisesText(ValueError,
                              "invalid null reference in method 'infoEffectURL_strURL_set', "
                              "argument 2 of type 'CString'",
                              native.infoEffectURL_strURL_set, None, None)

    def test_wide_string_accepts_unicode_str_and_none(self):
        for given, expected in [(u'caf\xe9 \U0001f600', u'caf\xe9 \U0001f600'),
                                ('plain', u'plain'), (None, u''),
                                (u'before\0after', u'before'), (u'', u'')]:
            made = peer.new_CString(given)
            self.assertEqual(peer.CString_value(made), expected)
            peer.delete_CString(made)

    def test_refused_call_changes_nothing(self):
        kept = peer.new_CString(u'kept')
        native.infoEffectURL_strTag_set(self.record, kept)
        with self.assertRaises(ValueError):
            native.infoEffectURL_strTag_set(self.record, None)
        value = native.infoEffectURL_strTag_get(self.record)
        self.assertEqual(peer.CString_value(value), u'kept')
        for made in (kept, value):
            peer.delete_CString(made)


if __name__ == '__main__':
    unittest.main()
