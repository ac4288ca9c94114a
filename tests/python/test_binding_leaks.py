"""Many create/get/set/delete rounds leave the process size flat."""
import os
import unittest

import _PyUploaderTestPeer as peer
import _PyUploader as native

ROUNDS = 10000
WARM_UP = 1000
# What the allocator may still grow by without anything leaking; one leaked copy per
# round would take far more than this.
SLACK_BYTES = 512 * 1024
PAGE_BYTES = os.sysconf('SC_PAGE_SIZE')


def resident_bytes():
    with open('/proc/self/statm') as statm:
        return int(statm.read().split()[1]) * PAGE_BYTES


class Text(object):
    __swig_destroy__ = peer.delete_CString


class Record(object):
    __swig_destroy__ = native.delete_infoEffectURL

    def __init__(self, text):
        self.this = native.new_infoEffectURL(text, text, text)


peer.CString_swigregister(Text)
native.infoEffectURL_swigregister(Record)


def explicit_round(payload):
    text = peer.new_CString(payload)
    record = native.new_infoEffectURL(text, text, text)
    native.infoEffectURL_strTag_set(record, text)
    value = native.infoEffectURL_strTag_get(record)
    peer.CString_value(value)
    native.delete_infoEffectURL(record)
    peer.delete_CString(text)


def collected_round(payload):
    text = peer.new_CString(payload)
    record = Record(text)
    native.infoEffectURL_strURL_set(record, text)
    native.infoEffectURL_strURL_get(record)
    peer.CString_value(native.infoEffectURL_strEffect_get(record))
    try:
        peer.new_CString(1)
    except TypeError:
        pass


class NoLeaks(unittest.TestCase):

    def assertFlat(self, round_function):
        payload = u'x' * 200
        for _ in range(WARM_UP):
            round_function(payload)
        before = resident_bytes()
        for _ in range(ROUNDS):
            round_function(payload)
        self.assertLess(resident_bytes() - before, SLACK_BYTES)

    def test_explicit_deletes(self):
        self.assertFlat(explicit_round)

    def test_destruction_by_collection(self):
        self.assertFlat(collected_round)


if __name__ == '__main__':
    unittest.main()
