"""Helpers for the preset upload suites: preset files on disk, a recording
callable, the exact multipart body the service should receive, and waiting
while the main thread takes the reports.

Reports reach the callable only while the main thread runs Python code, so
every wait here is a loop of short sleeps.
"""
import os
import shutil
import tempfile
import thread
import time
import unittest

from PyUploader import PyPresetUploader
from refservice import RefService, SERVER_HOST, reply, wait_until

MAIN_THREAD = thread.get_ident()
DEFAULT = object()
UPLOAD_PATH = '/servlet/uploadTemplate'
IMAGE_COUNT = 12
INITIAL_RATE_ESTIMATE = 5600  # bytes per half-second before anything is measured
OCTET_STREAM = 'application/octet-stream'
CRLF = '\r\n'

SESSION = dict(serverHost=u'api.orbishare.com', token=u'0123456789abcdef01234567',
               version=u'5.0', versionType=u'Retail', uuid=u'7f3c2a10-0000-4000-8000-000000000001')
TEXTS = dict(templateKey=u'golden-hour', title=u'Golden h\xf6ur', category=u'7',
             tags=u'warm,sunset', description=u'Soft "warm" light\r\nfor evenings')


def new_uploader(**changes):
    values = dict(SESSION, **changes)
    return PyPresetUploader(values['serverHost'], values['token'], values['version'],
                            values['versionType'], values['uuid'])


def expected_fields(session=SESSION, texts=TEXTS):
    """The fifteen text fields in wire order (ascending byte order of the name)."""
    utf8 = lambda text: (text or u'').encode('utf-8')
    fields = {
        'token': utf8(session['token']), 'title': utf8(texts['title']),
        'tags': utf8(texts['tags']), 'description': utf8(texts['description']),
        'category': utf8(texts['category']), 'templatetype': 'PRESET', 'PIPtype': '0',
        'templateKey': utf8(texts['templateKey']), 'AspectRatio': '1:1',
        'productName': 'Quillmark Lumivanta', 'AP': 'KRV',
        'versionInfo': utf8(session['version']), 'Version': utf8(session['version']),
        'versionType': utf8(session['versionType']), 'uuid': utf8(session['uuid']),
    }
    return sorted(fields.items())


class PresetFiles(object):
    """A preset file and twelve images of random bytes in a temporary folder."""

    def __init__(self, preset_size=3000, image_sizes=None, prefix=u'preset-\xe9-'):
        self.folder = tempfile.mkdtemp(prefix=prefix)
        sizes = image_sizes or [1000 + 77 * i for i in range(IMAGE_COUNT)]
        self.preset = self._write(u'Golden hour.preset', preset_size)
        self.images = [self._write(u'preview_%02d.png' % (i + 1), size)
                       for i, size in enumerate(sizes)]

    def _write(self, name, size):
        path = os.path.join(self.folder, name)
        with open(path, 'wb') as f:
            f.write(os.urandom(size))
        return path

    def missing(self, name=u'missing.png'):
        return os.path.join(self.folder, name)

    def parts(self):
        """(field name, path) of the fourteen file parts, in wire order."""
        names = ['PIPfile', 'PIPimg'] + ['PIPimg_%d' % (i + 1) for i in range(IMAGE_COUNT)]
        return zip(names, [self.preset, self.images[0]] + self.images)

    def total_size(self):
        return sum(os.path.getsize(path) for _, path in self.parts())

    def remove(self):
        shutil.rmtree(self.folder, ignore_errors=True)


def expected_body(boundary, fields, files):
    """The multipart/form-data body, byte for byte."""
    out = []
    for name, value in fields:
        out += ['--', boundary, CRLF, 'Content-Disposition: form-data; name="', name, '"', CRLF,
                CRLF, value, CRLF]
    for name, path in files:
        with open(path, 'rb') as f:
            data = f.read()
        out += ['--', boundary, CRLF, 'Content-Disposition: form-data; name="', name,
                '"; filename="', path.encode('utf-8'), '"', CRLF, 'Content-Type: ', OCTET_STREAM,
                CRLF, CRLF, data, CRLF]
    out += ['--', boundary, '--', CRLF]
    return ''.join(out)


class Reports(object):
    """A callable that keeps every report with the thread that delivered it."""

    def __init__(self, then=None):
        self.items = []
        self.threads = set()
        self.then = then

    def __call__(self, *report):
        self.items.append(report)
        self.threads.add(thread.get_ident())
        if self.then:
            self.then(self, report)

    def progress(self):
        return [r for r in self.items if r[1] == u'ProgressChanged']

    def completions(self):
        return [r for r in self.items if r[1] == u'UploadComplete']


def wait_for_completion(reports, timeout=60.0):
    """Runs Python on the main thread until the completion report has arrived."""
    wait_until(reports.completions, timeout, 'completion report')
    return reports.completions()[0]


def wait_for_progress(reports, percent_above=0, timeout=30.0):
    wait_until(lambda: [r for r in reports.progress() if r[2] > percent_above], timeout,
               'progress report above %d%%' % percent_above)


def pump(seconds):
    """Lets the main thread take whatever reports arrive for a while."""
    deadline = time.time() + seconds
    while time.time() < deadline:
        time.sleep(0.02)


def worker_threads():
    """Threads of this process besides the main one."""
    return len(os.listdir('/proc/self/task')) - 1


class UploadTest(unittest.TestCase):
    """A reset service, fresh preset files and one uploader with a recording callable."""

    def setUp(self):
        self.svc = RefService()
        self.svc.reset()
        self.files = PresetFiles()
        self.reports = Reports()
        self.uploader = new_uploader()
        self.uploader.SetCallback(self.reports)

    def tearDown(self):
        self.uploader = None
        self.files.remove()

    def replace_files(self, **options):
        self.files.remove()
        self.files = PresetFiles(**options)

    def start(self, uploader=None, preset=DEFAULT, images=DEFAULT, **texts):
        uploader = uploader or self.uploader
        texts = dict(TEXTS, **texts)
        return uploader.StartUpload(
            self.files.preset if preset is DEFAULT else preset,
            self.files.images if images is DEFAULT else images,
            texts['templateKey'], texts['title'], texts['category'], texts['tags'],
            texts['description'])

    def slow_reader(self, bytes_per_second):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=bytes_per_second)])

    def uploads(self):
        return self.svc.requests(host=SERVER_HOST, path=UPLOAD_PATH)
