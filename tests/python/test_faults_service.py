"""Service replies that break the rules, for every service call and for the
upload's reply: none at all, cut short, not HTTP, announcing 100 MiB, nested
100,000 deep, a billion-laughs entity, invalid UTF-8, a NUL byte inside, 10 MB
of text in one element; and answers that come 30 s late. Each call ends with
its failure result or the exact text, within its bound, and keeps no
descriptor or thread."""
import base64
import os
import re
import time
import unittest

import _PyUploader as native
from refservice import DEFAULT_HOST, DETECTION_HOST, SERVER_HOST, STAGING_HOST, reply
from upload_support import UPLOAD_PATH, UploadTest, wait_for_completion, worker_threads

XML = ['Content-Type', 'text/xml; charset=UTF-8']
ANNOUNCED = 100 * 1024 * 1024
NESTING = 100000
TEN_MB = 10 * 1000 * 1000
LATE = 20  # seconds: late, but within the 30 s an exchange or a reply may take
PROBE_BOUND = 5.5  # seconds a reachability probe is waited for
SLACK = 10.0  # seconds of scheduling a bound may take beyond itself
GARBAGE = 'SSH-2.0-OpenSSH_9.2\r\n\x00\x01\xfe\xff<<binary>>\r\n\r\n'
LAUGHS = ('<!DOCTYPE lolz [<!ENTITY lol0 "lol">'
          + ''.join('<!ENTITY lol%d "%s">' % (i, ('&lol%d;' % (i - 1)) * 10) for i in range(1, 10))
          + ']>')
FAILED = object()  # the operation's failure result


def upload_reply_of(test):
    """Publishes the test's preset and gives the URL and error text reported."""
    test.reports.items = []
    test.assertEqual(test.start(), 1)
    return wait_for_completion(test.reports)[4:]


class Operation(object):
    """A service call: where its reply comes from, the reply document with one
    text slot, how to run it, its failure result and what a text in the slot
    gives."""

    def __init__(self, name, host, path, document, run, failure, carried=lambda text: text,
                 signed_in=False, replies_before=0):
        self.name, self.host, self.path, self.document = name, host, path, document
        self.run, self.failure, self.carried = run, failure, carried
        self.signed_in, self.replies_before = signed_in, replies_before


HOST_NAME = re.compile(r'[A-Za-z0-9.-]+\Z')  # only a bare host name is kept as the server


def call(name, *args):
    return lambda test: getattr(native, 'OBLoginData_' + name)(test.session, *args)


def discover(test):
    call('InitOBServerURL')(test)
    return call('GetServerUrl')(test)


def sign_in(test):
    return call('LoginOrbishare', u'member', u'secret')(test), call('GetLoginTokenID')(test)


OPERATIONS = [
    Operation('discovery', DETECTION_HOST, '/observer.jsp', '<INFO><APIUrl>%s</APIUrl></INFO>',
              discover, unicode(STAGING_HOST),
              lambda text: text if HOST_NAME.match(text) else unicode(STAGING_HOST)),
    Operation('sign-in', SERVER_HOST, '/servlet/memLogin', '<info><tokenid>%s</tokenid></info>',
              sign_in, (0, u''), lambda text: (1, text)),
    Operation('categories', SERVER_HOST, '/servlet/getPresetCategory',
              '<categories><category categoryid="3">%s</category></categories>',
              call('GetPresetCategory', u'ENU'), {}, lambda text: {u'3': text}),
    Operation('related video', SERVER_HOST, '/servlet/setRelateVideo',
              '<info><videoUrl>%s</videoUrl></info>',
              call('SetRelateVideo', u'http://videos.example/1', u'VidSite', u'a=1'), None,
              signed_in=True, replies_before=1),
    Operation('effect lookup', SERVER_HOST, '/servlet/GetEffectByGUIDForQZM',
              '<PIP><pipURL>%s</pipURL></PIP>', call('GetEffectByGUID', u'G-1'), u''),
    Operation('upload reply', SERVER_HOST, UPLOAD_PATH,
              '<uploadTemplate><templateUrl>%s</templateUrl></uploadTemplate>', upload_reply_of,
              (u'', u''), lambda text: (text, u'')),
]


def raw(data):
    return reply(raw_b64=base64.b64encode(data))


def head_announcing(length):
    return ('HTTP/1.1 200 OK\r\nContent-Type: text/xml; charset=UTF-8\r\n'
            'Content-Length: %d\r\nConnection: close\r\n\r\n' % length)


def cut_short(document):
    whole = document % 'kept'
    return raw(head_announcing(len(whole)) + whole[:len(whole) // 2])


def in_slot(text, prefix=''):
    return lambda document: reply(prefix + document % text, 200, [XML])


# (fault, reply made from the operation's document, the text it carries or FAILED)
FAULTS = [
    ('dropped unanswered', lambda document: reply(abort_after=0), FAILED),
    ('cut short', cut_short, FAILED),
    ('not HTTP', lambda document: raw(GARBAGE), FAILED),
    ('announcing 100 MiB', lambda document: raw(head_announcing(ANNOUNCED) + document % 'kept'),
     FAILED),
    ('nested 100,000 deep', in_slot('<a>' * NESTING + 'deep' + '</a>' * NESTING), u'deep'),
    ('billion laughs', in_slot('&lol9;', LAUGHS), u'&lol9;'),
    ('invalid UTF-8', in_slot('a\xffb\xc0\xafc\xed\xa0\x80d\xc3'), u'a\ufffdb\ufffdc\ufffdd\ufffd'),
    ('NUL byte', in_slot('ab\x00cd'), FAILED),
    ('10 MB of text', in_slot('x' * TEN_MB), u'x' * TEN_MB),
]


def open_descriptors():
    return len(os.listdir('/proc/self/fd'))


class FaultyReplies(UploadTest):

    def setUp(self):
        UploadTest.setUp(self)
        self.session = None

    def tearDown(self):
        native.delete_OBLoginData(self.session)
        UploadTest.tearDown(self)

    def new_session(self, server_named=True, signed_in=False):
        native.delete_OBLoginData(self.session)
        self.session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
        if server_named:
            call('SetOBURLAsReg', unicode(SERVER_HOST))(self)
        if signed_in:
            self.assertEqual(sign_in(self)[0], 1)

    def run_against(self, operation, replies):
        self.new_session(operation.host == SERVER_HOST, operation.signed_in)
        self.svc.script(operation.host, operation.path, [reply()] * operation.replies_before
                        + replies)
        return operation.run(self)

    def test_every_call_ends_with_its_failure_result_or_the_exact_text(self):
        mismatches = []
        for operation in OPERATIONS:
            self.assertNotEqual(self.run_against(operation, []), operation.failure, operation.name)
            held = (open_descriptors(), worker_threads())
            for fault, make_reply, carried in FAULTS:
                found = self.run_against(operation, [make_reply(operation.document)])
                wanted = operation.failure if carried is FAILED else operation.carried(carried)
                if found != wanted:
                    mismatches.append((operation.name, fault, repr(found)[:200]))
                if (open_descriptors(), worker_threads()) != held:
                    mismatches.append((operation.name, fault, 'descriptors or threads left'))
        self.assertEqual(mismatches, [])

    def test_late_answers_arrive_and_an_unanswered_probe_gives_up_at_its_bound(self):
        self.new_session()
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(delay=LATE)])
        self.svc.script(SERVER_HOST, '/servlet/getPresetCategory', [reply(delay=LATE)])
        self.svc.script(DEFAULT_HOST, '/', [reply(delay=LATE)])
        began = time.time()
        self.assertEqual(self.start(), 1)
        self.assertEqual(sign_in(self), (0, u''))
        self.assertLess(time.time() - began, PROBE_BOUND + SLACK)
        self.assertEqual(call('GetPresetCategory', u'ENU')(self),
                         {u'3': u'Portrait', u'7': u'Landscape'})
        self.assertGreaterEqual(time.time() - began, LATE)
        self.assertEqual(wait_for_completion(self.reports)[2:4], (100, 1))


if __name__ == '__main__':
    unittest.main()
