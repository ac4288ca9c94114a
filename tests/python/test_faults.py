"""Replies that break the rules, for every service call and the upload's reply: none,
cut short, not HTTP, announcing 100 MiB, nested 100,000 deep, a billion laughs, invalid
UTF-8, a NUL byte, 10 MB of text. Each call ends with its failure result or the exact
text, and keeps no descriptor or thread."""
# ctest timeout: 90
import re
import unittest

import _PyUploader as native
from fixtures import (DETECTION_HOST, SERVER_HOST, STAGING_HOST, UPLOAD_PATH, UploadTest, b64, counts, reply,
                      settled, text_type)

XML = ['Content-Type', 'text/xml; charset=UTF-8']
NESTING = 100000
TEN_MB = 10 * 1000 * 1000
GARBAGE = b'SSH-2.0-OpenSSH_9.2\r\n\x00\x01\xfe\xff<<binary>>\r\n\r\n'
LAUGHS = (b'<!DOCTYPE lolz [<!ENTITY lol0 "lol">'
          + b''.join(b'<!ENTITY lol%d "%s">' % (i, (b'&lol%d;' % (i - 1)) * 10) for i in range(1, 10))
          + b']>')
FAILED = object()  # the operation's failure result


def call(name, *args):
    return lambda test: getattr(native, 'OBLoginData_' + name)(test.session, *args)


def discover(test):
    return call('InitOBServerURL')(test) or call('GetServerUrl')(test)


def sign_in(test):
    return call('LoginOrbishare', u'member', u'secret')(test), call('GetLoginTokenID')(test)


def upload_reply(test):
    test.reports.items = []
    test.assertEqual(test.start(), 1)
    return test.completion()[4:]


# (name, host, path, reply document with one text slot, run, failure result,
#  what a text in the slot gives, signed in first, replies before the one read)
OPERATIONS = [
    ('discovery', DETECTION_HOST, '/observer.jsp', b'<INFO><APIUrl>%s</APIUrl></INFO>', discover,
     text_type(STAGING_HOST), lambda text: text if re.match(r'[A-Za-z0-9.-]+\Z', text) else text_type(STAGING_HOST),
     False, 0),
    ('sign-in', SERVER_HOST, '/servlet/memLogin', b'<info><tokenid>%s</tokenid></info>', sign_in,
     (0, u''), lambda text: (1, text), False, 0),
    ('categories', SERVER_HOST, '/servlet/getPresetCategory',
     b'<categories><category categoryid="3">%s</category></categories>',
     call('GetPresetCategory', u'ENU'), {}, lambda text: {u'3': text}, False, 0),
    ('related video', SERVER_HOST, '/servlet/setRelateVideo', b'<info><videoUrl>%s</videoUrl></info>',
     call('SetRelateVideo', u'http://videos.example/1', u'VidSite', u'a=1'), None,
     lambda text: text, True, 1),
    ('effect lookup', SERVER_HOST, '/servlet/GetEffectByGUIDForQZM',
     b'<PIP><pipURL>%s</pipURL></PIP>', call('GetEffectByGUID', u'G-1'), u'', lambda text: text,
     False, 0),
    ('upload reply', SERVER_HOST, UPLOAD_PATH,
     b'<uploadTemplate><templateUrl>%s</templateUrl></uploadTemplate>', upload_reply, (u'', u''),
     lambda text: (text, u''), False, 0),
]


def head_announcing(length):
    return (b'HTTP/1.1 200 OK\r\nContent-Type: text/xml; charset=UTF-8\r\n'
            b'Content-Length: %d\r\nConnection: close\r\n\r\n' % length)


def cut_short(document):
    whole = document % b'kept'
    return reply(raw_b64=b64(head_announcing(len(whole)) + whole[:len(whole) // 2]))


def in_slot(text, prefix=b''):
    return lambda document: reply(prefix + document % text, 200, [XML])


# (fault, reply made from the operation's document, the text it carries or FAILED)
FAULTS = [
    ('dropped unanswered', lambda document: reply(abort_after=0), FAILED),
    ('cut short', cut_short, FAILED),
    ('not HTTP', lambda document: reply(raw_b64=b64(GARBAGE)), FAILED),
    ('announcing 100 MiB', lambda document: reply(raw_b64=b64(head_announcing(100 << 20) + document % b'kept')),
     FAILED),
    ('nested 100,000 deep', in_slot(b'<a>' * NESTING + b'deep' + b'</a>' * NESTING), u'deep'),
    ('billion laughs', in_slot(b'&lol9;', LAUGHS), u'&lol9;'),
    ('invalid UTF-8', in_slot(b'a\xffb\xc0\xafc\xed\xa0\x80d\xc3'), u'a\ufffdb\ufffdc\ufffdd\ufffd'),
    ('NUL byte', in_slot(b'ab\x00cd'), FAILED),
    ('10 MB of text', in_slot(b'x' * TEN_MB), u'x' * TEN_MB),
]


class FaultyReplies(UploadTest):

    def setUp(self):
        UploadTest.setUp(self)
        self.session = None
        self.addCleanup(lambda: native.delete_OBLoginData(self.session))

    def new_session(self, server_named=True, signed_in=False):
        native.delete_OBLoginData(self.session)
        self.session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
        if server_named:
            call('SetOBURLAsReg', text_type(SERVER_HOST))(self)
        if signed_in:
            self.assertEqual(sign_in(self)[0], 1)

    def test_every_call_ends_with_its_failure_result_or_the_exact_text(self):
        mismatches = []
        for name, host, path, document, run, failure, carried, signed_in, before in OPERATIONS:
            self.new_session(host == SERVER_HOST, signed_in)
            self.assertNotEqual(run(self), failure, name)
            held = counts()
            for fault, make_reply, text in FAULTS:
                self.new_session(host == SERVER_HOST, signed_in)
                self.svc.script(host, path, [reply()] * before + [make_reply(document)])
                found = run(self)
                if found != (failure if text is FAILED else carried(text)):
                    mismatches.append((name, fault, repr(found)[:200]))
                if settled(counts, held) != held:
                    mismatches.append((name, fault, 'descriptors or threads left'))
        self.assertEqual(mismatches, [])


if __name__ == '__main__':
    unittest.main()
