"""Two modules of one type ring, imported in either order, each in a fresh interpreter."""
import unittest

from binding_support import Scenarios

SCENARIO = '''
import sys
%(imports)s
ring = sys.modules['swig_runtime_data3']
print sorted(name for name in dir(ring) if not name.startswith('__'))

# Pointer objects of one module are accepted by the other's functions.
text = peer.new_CString(u'peer made')
record = native.new_infoEffectURL(text, text, text)
value = native.infoEffectURL_strURL_get(record)
print type(value) is not type(text), peer.CString_value(value)
peer.delete_CString(value)

# A class registered by one module is what the other's getters return.
class Text(object):
    __swig_destroy__ = peer.delete_CString
peer.CString_swigregister(Text)
value = native.infoEffectURL_strEffect_get(record)
print type(value).__name__, peer.CString_value(value), repr(value.this).split(' at ')[0]
del value

native.delete_infoEffectURL(record)
peer.delete_CString(text)
print 'end'
'''

EXPECTED = ("['type_pointer']\n"
            "True peer made\n"
            "Text peer made <Swig Object of type 'CString *'\n"
            "end\n")


class SharedRing(Scenarios):

    def run_with(self, imports):
        return self.run_scenario(SCENARIO % {'imports': imports})

    def test_peer_imported_first(self):
        out = self.run_with('import _PyUploaderTestPeer as peer\nimport _PyUploader as native')
        self.assertEqual(out, EXPECTED)

    def test_peer_imported_second(self):
        out = self.run_with('import _PyUploader as native\nimport _PyUploaderTestPeer as peer')
        self.assertEqual(out, EXPECTED)


if __name__ == '__main__':
    unittest.main()
