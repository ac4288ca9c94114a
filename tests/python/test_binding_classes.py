"""Registered classes: what stands for a native object, and what collection does."""
import unittest
import weakref

import _PyUploaderTestPeer as peer
import _PyUploader as native
from binding_support import Scenarios

LEAK = "swig/python detected a memory leak of type '%s', no destructor found.\n"


class NewStyleRecord(object):
    __swig_destroy__ = native.delete_infoEffectURL


class ClassicRecord:
    __swig_destroy__ = native.delete_infoEffectURL


class Holder(object):
    """Anything whose "this" leads on to a pointer object."""

    def __init__(self, this):
        self.this = this


class AcceptedObjects(unittest.TestCase):

    def setUp(self):
        self.text = peer.new_CString(u'text')

    def tearDown(self):
        peer.delete_CString(self.text)

    def make_record(self, cls):
        native.infoEffectURL_swigregister(cls)
        record = cls()
        record.this = native.new_infoEffectURL(self.text, self.text, self.text)
        return record

    def read_tag(self, obj):
        value = native.infoEffectURL_strTag_get(obj)
        try:
            return peer.CString_value(value)
        finally:
            peer.delete_CString(value)

    def test_instance_proxy_bare_pointer_and_chains_of_this(self):
        for cls in (NewStyleRecord, ClassicRecord):
            record = self.make_record(cls)
            for obj in (record, weakref.proxy(record), record.this, Holder(record),
                        Holder(Holder(record.this))):
                self.assertEqual(self.read_tag(obj), u'text', (cls, obj))
            native.delete_infoEffectURL(record)

    def test_objects_without_a_pointer_behind_them_are_refused(self):
        class Empty(object):
            pass
        refused = [Empty(), ClassicRecord(), Holder(5)]
        for obj in refused:
            with self.assertRaises(TypeError) as caught:
                native.infoEffectURL_strTag_get(obj)
            self.assertEqual(str(caught.exception),
                             "in method 'infoEffectURL_strTag_get', argument 1 of type "
                             "'infoEffectURL *'")

    def test_constructors_return_bare_pointer_objects_even_with_a_class(self):
        native.infoEffectURL_swigregister(NewStyleRecord)
        made = native.new_infoEffectURL(self.text, self.text, self.text)
        self.assertEqual(type(made).__name__, 'PySwigObject')
        native.delete_infoEffectURL(made)


class Collection(Scenarios):
    """Each scenario runs in a fresh interpreter, whose output is the evidence."""

    PRELUDE = '''
        import gc, _PyUploader as native, _PyUploaderTestPeer as peer
        text = peer.new_CString(u'text')
        text.disown()
        def record_of(cls):
            native.infoEffectURL_swigregister(cls)
            record = cls()
            record.this = native.new_infoEffectURL(text, text, text)
            return record
    '''

    def test_destroy_gets_a_non_owning_stand_in_and_a_class_without_it_leaks(self):
        out = self.run_scenario('''
        calls = []
        def destroy(obj):
            calls.append((long(obj), obj.own()))
            native.delete_infoEffectURL(obj)
        class Recorded(object):
            __swig_destroy__ = staticmethod(destroy)
        record = record_of(Recorded)
        address = long(record.this)
        del record
        print calls == [(address, False)]
        class NewStyle(object):
            __swig_destroy__ = native.delete_infoEffectURL
        class Classic:
            __swig_destroy__ = native.delete_infoEffectURL
        class SingleArgument(object):
            __swig_destroy__ = id
        class NoDestroy(object):
            pass
        for cls in (NewStyle, Classic, SingleArgument, NoDestroy):
            record = record_of(cls)
            del record
            print cls.__name__
        ''')
        self.assertEqual(out, 'True\nNewStyle\nClassic\nSingleArgument\n'
                              + LEAK % 'infoEffectURL *' + 'NoDestroy\n')

    def test_a_failing_destroy_is_ignored(self):
        out = self.run_scenario('''
        def destroy(obj):
            raise RuntimeError('not now')
        class Record(object):
            __swig_destroy__ = staticmethod(destroy)
        record = record_of(Record)
        try:
            raise KeyError('pending')
        except KeyError:
            del record
            import sys
            print sys.exc_info()[0].__name__
        ''')
        self.assertEqual(out, 'KeyError\n')


class ShadowInstances(Scenarios):
    """Getters return an instance once a class is registered for their pointer type."""

    PRELUDE = '''
        import _PyUploader as native, _PyUploaderTestPeer as peer
        text = peer.new_CString(u'text')
        text.disown()
        record = native.new_infoEffectURL(text, text, text)
        record.disown()
    '''

    def test_new_style_classic_and_unusual_classes(self):
        out = self.run_scenario('''
        class NewStyle(object):
            __swig_destroy__ = peer.delete_CString
        class Classic:
            __swig_destroy__ = peer.delete_CString
        class Slotted(object):
            __slots__ = ()
            __swig_destroy__ = peer.delete_CString
        class Prefilled(object):
            __swig_destroy__ = peer.delete_CString
            def __new__(cls):
                obj = object.__new__(cls)
                obj.extra = 1
                return obj
        for cls in (NewStyle, Classic, Slotted, Prefilled):
            peer.CString_swigregister(cls)
            value = native.infoEffectURL_strTag_get(record)
            this = getattr(value, 'this', value)
            print type(value).__name__, type(this).__name__, this.own(), peer.CString_value(value)
            del value, this
        print 'end'
        ''')
        self.assertEqual(out, 'NewStyle PySwigObject True text\n'
                              'instance PySwigObject True text\n'
                              'PySwigObject PySwigObject True text\n'
                              'Prefilled PySwigObject True text\n'
                              'end\n')


if __name__ == '__main__':
    unittest.main()
