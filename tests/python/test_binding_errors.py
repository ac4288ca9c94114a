"""Arguments the module functions refuse: exception types and exact texts."""
import unittest

import _PyUploaderTestPeer as peer
import _PyUploader as native
from binding_support import WithRecord


class RefusedArguments(WithRecord):

    def assertRaisesText(self, error, text, function, *args):
        with self.assertRaises(error) as caught:
            function(*args)
        self.assertEqual(str(caught.exception), text)

    def test_pointer_of_wrong_type_or_kind(self):
        class PySwigObject(object):
            """A Python class merely named like the pointer type."""
        cases = [
            (native.infoEffectURL_strTag_get, (self.text,), 1, 'infoEffectURL *'),
            (native.infoEffectURL_strTag_get, (u'text',), 1, 'infoEffectURL *'),
            (native.infoEffectURL_strTag_get, (PySwigObject(),), 1, 'infoEffectURL *'),
            (native.infoEffectURL_strEffect_set, (self.record, self.record), 2, 'CString'),
            (native.new_infoEffectURL, (self.text, 5, self.text), 2, 'CString'),
            (native.new_infoEffectURL, (self.text, self.text, 'str'), 3, 'CString'),
            (native.delete_infoEffectURL, (self.text,), 1, 'infoEffectURL *'),
            (peer.CString_value, (self.record,), 1, 'CString *'),
            (peer.new_CString, (5,), 1, 'wchar_t const *'),
            (peer.new_CString, (self.record,), 1, 'wchar_t const *'),
        ]
        for function, args, position, c_type in cases:
            self.assertRaisesText(
                TypeError, "in method '%s', argument %d of type '%s'"
                % (function.__name__, position, c_type), function, *args)

    def test_null_where_a_reference_or_an_object_is_needed(self):
        cases = [
            (native.new_infoEffectURL, (None, self.text, self.text), 1, 'CString'),
            (native.new_infoEffectURL, (self.text, self.text, None), 3, 'CString'),
            (native.infoEffectURL_strURL_set, (self.record, None), 2, 'CString'),
            (native.infoEffectURL_strURL_set, (None, None), 2, 'CString'),
            (native.infoEffectURL_strURL_get, (None,), 1, 'infoEffectURL *'),
            (peer.CString_value, (None,), 1, 'CString *'),
        ]
        for function, args, position, c_type in cases:
            self.assertRaisesText(
                ValueError, "invalid null reference in method '%s', argument %d of type '%s'"
                % (function.__name__, position, c_type), function, *args)

    def test_null_object_of_setters_and_deletes_does_nothing(self):
        for function in (native.infoEffectURL_strEffect_set, native.infoEffectURL_strTag_set,
                         native.infoEffectURL_strURL_set):
            self.assertIsNone(function(None, self.text))
        self.assertIsNone(native.delete_infoEffectURL(None))
        self.assertIsNone(peer.delete_CString(None))

    def test_first_failure_wins_left_to_right(self):
        self.assertRaisesText(TypeError, "in method 'new_infoEffectURL', argument 1 of type 'CString'",
                              native.new_infoEffectURL, 1, None, 2)
        self.assertRaisesText(ValueError,
                              "invalid null reference in method 'new_infoEffectURL', "
                              "argument 1 of type 'CString'",
                              native.new_infoEffectURL, None, 1, 2)

    def test_wrong_argument_counts_name_the_function(self):
        cases = [
            (native.new_infoEffectURL, (self.text,), 'new_infoEffectURL expected 3 arguments, got 1'),
            (native.infoEffectURL_strTag_get, (), 'infoEffectURL_strTag_get expected 1 arguments, got 0'),
            (native.infoEffectURL_strTag_set, (self.record, self.text, self.text),
             'infoEffectURL_strTag_set expected 2 arguments, got 3'),
            (native.infoEffectURL_swigregister, (), 'swigregister expected 1 arguments, got 0'),
            (native.infoEffectURL_swigregister, (1, 2), 'swigregister expected 1 arguments, got 2'),
            (peer.CString_swigregister, (), 'swigregister expected 1 arguments, got 0'),
        ]
        for function, args, text in cases:
            self.assertRaisesText(TypeError, text, function, *args)

    def test_wide_string_accepts_unicode_str_and_none(self):
        for given, expected in [(u'caf\xe9 \U0001f600', u'caf\xe9 \U0001f600'),
                                ('plain', u'plain'), (None, u''),
                                (u'before\0after', u'before'), (u'', u'')]:
            made = peer.new_CString(given)
            self.assertEqual(peer.CString_value(made), expected)
            peer.delete_CString(made)

    def test_wide_string_from_undecodable_str_keeps_the_decoding_error(self):
        with self.assertRaises(UnicodeDecodeError):
            peer.new_CString('\xff\xfe')

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
