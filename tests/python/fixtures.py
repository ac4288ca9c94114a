"""Fixtures of the Python suites, run inside tests/sandbox/run: the reference service's
control interface, the trace, a session or an upload per test.
Replies (reply()) may also set: delay (seconds), pieces and pause, chunked, no_length,
close_after, hang, read_rate (request bytes per second), drip (reply bytes per second),
abort_after (body bytes, then drop) and raw_b64 (instead of a reply).
Host states: 'up', 'down', 'hang'. Certificates: 'good', 'expired', 'wrong-name'.
"""
import base64
import ctypes
import json
import os
import shutil
import subprocess
import sys
import tempfile
import textwrap
import threading
import time
import unittest
try:
    from urllib.request import Request, urlopen, quote
    from urllib.error import HTTPError
except ImportError:
    from urllib2 import Request, urlopen, quote, HTTPError

import _PyUploader as native
from PyUploader import PyPresetUploader

text_type = type(u'')  # what the module returns for a text
PY2 = sys.version_info[0] == 2
_HOSTS = {'__name__': 'hosts'}
exec(compile(open(os.path.join(os.path.dirname(__file__), '..', 'service', 'hosts.py')).read(),
             'hosts.py', 'exec'), _HOSTS)
DEFAULT_HOST, STAGING_HOST = _HOSTS['DEFAULT_HOST'], _HOSTS['STAGING_HOST']
DETECTION_HOST, SERVER_HOST = _HOSTS['DETECTION_HOST'], _HOSTS['SERVER_HOST']
HTTP_PORT, TLS_PORT = _HOSTS['HTTP_PORT'], _HOSTS['TLS_PORT']
MAIN_THREAD = threading.current_thread().ident
UUID = u'machine-1'
UPLOAD_PATH = '/servlet/uploadTemplate'


def b64(data):
    return base64.b64encode(data).decode('ascii')


def reply(body=None, status=None, headers=None, **options):
    """A scripted reply; body is sent byte for byte (text as UTF-8)."""
    if body is not None:
        body = body.encode('utf-8') if isinstance(body, text_type) else body
        options.update(body_b64=b64(body), status=200)
    options.update((k, v) for k, v in (('status', status), ('headers', headers)) if v is not None)
    return options


def xml_reply(xml, status=200, **options):
    return reply(xml, status, [['Content-Type', 'text/xml; charset=UTF-8']], **options)


def _decode(value):
    if isinstance(value, dict):
        if list(value) == ['base64']:
            return base64.b64decode(value['base64'])
        return dict((k, _decode(v)) for k, v in value.items())
    return [_decode(v) for v in value] if isinstance(value, list) else value


class Recorded(object):
    """A recorded request (method, target, path, head, headers, body, body_size, complete, host,
    port, tls, upload) or multipart part (kind, name, filename, size, sha256, content)."""

    def __init__(self, document):
        for key, value in document.items():
            setattr(self, str(key), _decode(value))
        if isinstance(getattr(self, 'upload', None), dict):
            self.upload = Recorded(self.upload)
            self.upload.parts = [Recorded(p) for p in self.upload.parts]
            for part in self.upload.parts:  # ASCII: the interpreter's own str
                for key in ('name', 'content_type'):
                    if not PY2 and isinstance(getattr(part, key, None), bytes):
                        setattr(part, key, getattr(part, key).decode('latin-1'))
            self.upload.fields = [(p.name, p.content) for p in self.upload.parts if p.kind == 'field']
            self.upload.files = [p for p in self.upload.parts if p.kind == 'file']

    def header(self, name):
        return dict((k.lower(), v) for k, v in self.headers).get(name.lower())


class RefService(object):
    url = os.environ.get('REFSERVICE_CONTROL', _HOSTS['CONTROL_URL'])

    def reset(self):
        self._call('/reset', {})

    def script(self, host, path, replies, repeat=False):
        self._call('/script', dict(host=host, path=path, replies=list(replies), repeat=repeat))

    def host_state(self, host, state):
        self._call('/host', dict(host=host, state=state))

    def tls(self, cert):
        self._call('/tls', dict(cert=cert))

    def requests(self, host=None, path=None, bodies=True):
        query = [(k, v) for k, v in (('bodies', None if bodies else '0'), ('host', host), ('path', path)) if v]
        query = '&'.join('%s=%s' % (k, quote(v, safe='')) for k, v in query)
        return [Recorded(r) for r in self._call('/requests?' + query)['requests']]

    def _call(self, path, body=None):
        data = json.dumps(body).encode('utf-8') if body is not None else None
        request = Request(self.url + path, data, {'Content-Type': 'application/json'})
        try:
            return json.loads(urlopen(request, timeout=30).read().decode('utf-8'))
        except HTTPError as error:
            raise AssertionError('control %s: %s' % (path, error.read()))


def wait_until(condition, timeout=10.0, what='the condition'):
    """Polls condition() until it is true and returns its value; fails after timeout."""
    deadline = time.time() + timeout
    while not condition():
        if time.time() > deadline:
            raise AssertionError('no %s after %.1f s' % (what, timeout))
        time.sleep(0.02)
    return condition()


def pump(seconds):
    """Lets the main thread take the reports that arrive for a while."""
    settled(lambda: None, True, seconds)


def run_python(code, *args, **timeout):
    """Runs code in a fresh interpreter; returns (exit code, stdout, stderr) as text. One
    still running after timeout seconds (60) is killed."""
    proc = subprocess.Popen([sys.executable, '-c', textwrap.dedent(code)] + list(args),
                            stdout=subprocess.PIPE, stderr=subprocess.PIPE)
    killer = threading.Timer(timeout.get('timeout', 60), proc.kill)
    killer.start()
    out, err = proc.communicate()
    killer.cancel()
    return proc.returncode, out.decode('utf-8'), err.decode('utf-8', 'replace')


def counts():
    """(threads, descriptors) of this process."""
    return len(os.listdir('/proc/self/task')), len(os.listdir('/proc/self/fd'))


def settled(measure, expected, timeout=1.0):
    """measure() once it equals expected, or after timeout: a thread just joined
    can still be listed for a moment while the kernel releases it."""
    deadline = time.time() + timeout
    while measure() != expected and time.time() < deadline:
        time.sleep(0.005)
    return measure()


class Ticker(threading.Thread):
    """Counts in a Python thread, which only advances while the interpreter lock is free."""

    def __enter__(self):
        self.ticks, self.stop = 0, threading.Event()
        self.start()
        return self

    def __exit__(self, *exc):
        self.stop.set()
        self.join()

    def run(self):
        while not self.stop.wait(0.01):
            self.ticks += 1


# A pointer object holds, after the object header, the address, the type and the ownership flag.
_PTR = 2 * ctypes.sizeof(ctypes.c_void_p)


class Relocated(object):
    """A pointer object shown at another address for a with block."""

    def __init__(self, pointer_object, address):
        self.cell, self.address = ctypes.c_void_p.from_address(id(pointer_object) + _PTR), address

    def __enter__(self):
        self.saved, self.cell.value = self.cell.value, self.address

    def __exit__(self, *exc):
        self.cell.value = self.saved


def cell(pointer_object):
    """The pointer-sized cell that a pointer object points at (a handle)."""
    return ctypes.c_void_p.from_address(ctypes.c_void_p.from_address(id(pointer_object) + _PTR).value)


class Test(unittest.TestCase):
    """A reset service, and the trace on in a temporary hive and output file."""
    HIVE = (b'Windows Registry Editor Version 5.00\r\n\r\n[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\'
            b'Lumivanta]\r\n"DumpMsg"=dword:00000001\r\n')

    def setUp(self):
        self.svc = RefService()
        self.svc.reset()
        self.folder = tempfile.mkdtemp(prefix='trace-')
        self.addCleanup(shutil.rmtree, self.folder, True)
        self.trace_file = os.path.join(self.folder, 'debug.log')
        with open(os.path.join(self.folder, 'hive.reg'), 'wb') as hive:
            hive.write(self.HIVE)
        saved = dict(os.environ)
        self.addCleanup(lambda: (os.environ.clear(), os.environ.update(saved)))
        os.environ.update(PYUPLOADER_REGISTRY=os.path.join(self.folder, 'hive.reg'),
                          PYUPLOADER_DEBUG_OUTPUT=self.trace_file)

    def clear_trace(self):
        if os.path.exists(self.trace_file):
            os.remove(self.trace_file)

    def trace(self, prefix=u'[OBLoginData]'):
        """The lines written, each checked for the prefix and shown without it."""
        if not os.path.exists(self.trace_file):
            return []
        with open(self.trace_file, 'rb') as written:
            lines = written.read().decode('utf-8').splitlines()
        self.assertEqual([l[:len(prefix)] for l in lines], [prefix] * len(lines))
        return [line[len(prefix):] for line in lines]


class SessionTest(Test):
    """A new session; links handed to a browser are written down."""

    def setUp(self):
        Test.setUp(self)
        self.browser = os.path.join(self.folder, 'browser')
        with open(self.browser, 'w') as out:
            out.write('#!/bin/sh\nprintf "%s\\n" "$1" >> "$0.links"\n')
        os.chmod(self.browser, 0o700)
        os.environ['BROWSER'] = self.browser
        self.session = None
        self.new_session()
        self.addCleanup(lambda: native.delete_OBLoginData(self.session))

    def new_session(self, version=u'5.0', version_type=u'Retail'):
        native.delete_OBLoginData(self.session)
        self.session = native.new_OBLoginData(version, version_type, UUID)
        self.clear_trace()  # the constructor's version lines are not the subject

    def call(self, operation, *args):
        return getattr(native, 'OBLoginData_' + operation)(self.session, *args)

    def sent(self, path, host=SERVER_HOST):
        return self.svc.requests(host=host, path=path)


SESSION = (u'api.orbishare.com', u'0123456789abcdef01234567', u'5.0', u'Retail', u'uuid-1')
TEXTS = (u'golden-hour', u'Golden h\xf6ur', u'7', u'warm,sunset', u'Soft "warm"\r\nlight')


class Reports(object):
    """A callable that keeps every report with the thread that delivered it."""

    def __init__(self, then=None):
        self.items, self.threads, self.then = [], set(), then

    def __call__(self, *report):
        self.items.append(report)
        self.threads.add(threading.current_thread().ident)
        if self.then:
            self.then(self, report)

    def progress(self):
        return [r for r in self.items if r[1] == u'ProgressChanged']

    def completions(self):
        return [r for r in self.items if r[1] == u'UploadComplete']


class UploadTest(Test):
    """A preset file, twelve images of random bytes, and an uploader with a recording callable."""

    def setUp(self):
        Test.setUp(self)
        self.replace_files()
        self.reports = Reports()
        self.uploader = self.new_uploader()
        self.addCleanup(lambda: setattr(self, 'uploader', None))

    def replace_files(self, preset_size=3000, image_sizes=None):
        folder = tempfile.mkdtemp(prefix=u'preset-\xe9-', dir=self.folder)
        self.images = []
        for i, size in enumerate([preset_size] + (image_sizes or [1000 + 77 * i for i in range(12)])):
            path = os.path.join(folder, u'Golden hour.preset' if i == 0 else u'preview_%02d.png' % i)
            with open(path, 'wb') as out:
                out.write(os.urandom(size))
            self.images.append(path)
        self.preset = self.images.pop(0)
        self.missing = os.path.join(folder, u'missing.png')

    def new_uploader(self, *session):
        uploader = PyPresetUploader(*(session or SESSION))
        uploader.SetCallback(self.reports)
        return uploader

    def start(self, uploader=None, files=None, texts=TEXTS):
        files = files or [self.preset] + self.images
        return (uploader or self.uploader).StartUpload(files[0], files[1:], *texts)

    # Past the 30 s reply limit: an upload the service cannot finish reading fails by then.
    def completion(self, reports=None, timeout=40.0):
        """Runs Python on the main thread until the completion report arrives."""
        return wait_until((reports or self.reports).completions, timeout, 'completion report')[0]

    def wait_for_progress(self, reports=None):
        wait_until(lambda: [r for r in (reports or self.reports).progress() if r[2] > 0], 30.0, 'progress')

    def uploads(self, bodies=True):
        return self.svc.requests(host=SERVER_HOST, path=UPLOAD_PATH, bodies=bodies)
