"""A fresh session against the reference service with the debug trace on, for
the suites of server discovery and sign-in.

The trace switch is read when a session is made and the output file is named
by the environment, so each test gets its own hive and output file before it
makes its session. Links handed to a browser are recorded through BROWSER."""
import ctypes
import os
import stat
import threading
import time

import _PyUploader as native
from binding_support import ErrorTextTest, address_of
from refservice import RefService, wait_until
from trace_support import TraceRun

VERSION = u'5.0'
VERSION_TYPE = u'Retail'
UUID = u'machine-1'
PREFIX = u'[OBLoginData]'
PROBE_LIMIT = 5.5  # seconds a probe is waited for before it is cancelled

BROWSER_SCRIPT = '#!/bin/sh\nprintf "%s\\n" "$1" >> "$0.links"\n'


def info_xml(root='INFO', **fields):
    """A reply document whose root holds one element per field, in the
    order of the service information."""
    order = ['APIUrl', 'AdjustmentPreset', 'SignUp', 'ForgetPassword', 'LensCorrection',
             'VideoGallery', 'firstloginUrl', 'tokenid', 'username', 'profileURL', 'search',
             'errMsg']
    elements = ''.join('<%s>%s</%s>' % (name, fields[name], name)
                       for name in order if name in fields)
    return '<%s>%s</%s>' % (root, elements, root)


class SessionTest(ErrorTextTest):
    """Each test starts with the plausible service, the trace on and a new session."""

    def setUp(self):
        self.svc = RefService()
        self.svc.reset()
        self.trace = TraceRun(dump_msg=1)
        self.browser = os.path.join(self.trace.folder, 'browser')
        with open(self.browser, 'wb') as out:
            out.write(BROWSER_SCRIPT)
        os.chmod(self.browser, stat.S_IRWXU)
        self.saved_environment = dict(os.environ)
        os.environ.update(self.trace.environment(), BROWSER=self.browser)
        self.session = self.new_session()

    def tearDown(self):
        native.delete_OBLoginData(self.session)
        os.environ.clear()
        os.environ.update(self.saved_environment)
        self.trace.__exit__(None, None, None)

    def new_session(self, version=VERSION, version_type=VERSION_TYPE):
        session = native.new_OBLoginData(version, version_type, UUID)
        self.clear_trace()  # the constructor's version lines are not the subject
        return session

    def call(self, operation, *args):
        """OBLoginData_<operation> on the session."""
        return getattr(native, 'OBLoginData_' + operation)(self.session, *args)

    def clear_trace(self):
        if os.path.exists(self.trace.output):
            os.remove(self.trace.output)

    def trace_text(self):
        return self.trace.text()

    def trace_lines(self):
        """The lines written, without the prefix and the line feed."""
        lines = self.trace_text().splitlines()
        for line in lines:
            self.assertTrue(line.startswith(PREFIX), line)
        return [line[len(PREFIX):] for line in lines]

    def opened_links(self, count):
        """The first count links handed to the browser, waiting for them."""
        record = self.browser + '.links'

        def links():
            if not os.path.exists(record):
                return None
            with open(record) as opened:
                found = opened.read().splitlines()
            return found if len(found) >= count else None
        return wait_until(links, 10.0, '%d opened links' % count)

    def handle_values(self):
        """The probe's two handles as integers (0 for null)."""
        cells = [native.OBLoginData_m_hInternet_get(self.session),
                 native.OBLoginData_m_hConnect_get(self.session)]
        return [ctypes.c_void_p.from_address(address_of(cell)).value or 0 for cell in cells]


class Ticker(object):
    """A Python thread that counts while the test's own thread is busy; it
    only advances while the interpreter lock is free."""

    def __init__(self):
        self.ticks = 0
        self._stop = threading.Event()
        self._thread = threading.Thread(target=self._run)

    def __enter__(self):
        self._thread.start()
        return self

    def __exit__(self, *exc):
        self._stop.set()
        self._thread.join()
        return False

    def _run(self):
        while not self._stop.is_set():
            self.ticks += 1
            time.sleep(0.01)
