"""What the module does at the edges of memory, files and time: a memory failure
raises MemoryError and the host lives on; a registry hive that is a device, a
FIFO or too large is not read; a FIFO or device is not uploaded; a server that
drips its reply or never accepts is given up after 30 s; a cancel or a delete
ends an upload within a second in every phase."""
import contextlib
import errno
import os
import socket
import threading
import time
import unittest

import _PyUploader as native

from refservice import HTTP_PORT, SERVER_HOST, TLS_PORT, reply, wait_until
from trace_support import TraceRun, hive_text
from upload_support import UPLOAD_PATH, UploadTest, new_uploader, wait_for_completion

EXCHANGE_LIMIT = 30.0  # seconds from the start of an exchange to its last reply byte
LIMIT_SLACK = 3.0
PROMPTLY = 1.0  # seconds a cancel or a delete may take in any phase
DRIP = 2  # bytes a second
FILES_BEFORE_IMAGE7 = 8  # preset, cover and images 1 to 6
MIB = 1024 * 1024
UNANSWERED_HOST = '127.0.0.9'


def release(fifo):
    """Ends an open() blocked on the FIFO by opening its other end (a fault's
    blocked worker must not hang the suite)."""
    try:
        os.close(os.open(fifo.encode('utf-8'), os.O_WRONLY | os.O_NONBLOCK))
    except OSError as error:
        if error.errno != errno.ENXIO:  # nobody waits: nothing to release
            raise


@contextlib.contextmanager
def never_accepting(port):
    """A listener on UNANSWERED_HOST whose accept queue is full, so that a
    connection to it never completes."""
    listener = socket.socket()
    listener.bind((UNANSWERED_HOST, port))
    listener.listen(0)
    filler = socket.create_connection((UNANSWERED_HOST, port))
    try:
        yield
    finally:
        filler.close()
        listener.close()


def new_session(server_host):
    session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
    native.OBLoginData_SetOBURLAsReg(session, unicode(server_host))
    return session


# AddressSanitizer's allocator ends the process on a failed allocation by design.
UNDER_ASAN = 'libasan' in os.environ.get('LD_PRELOAD', '')


@unittest.skipIf(UNDER_ASAN, 'no allocation failure reaches the code under AddressSanitizer')
class MemoryFailure(unittest.TestCase):

    # Two copies of one 128 MiB unicode are made; only one fits under the cap.
    CHILD = """
        import resource
        import _PyUploader as native
        def mapped():
            for line in open('/proc/self/status'):
                if line.startswith('VmSize:'):
                    return int(line.split()[1]) * 1024
        big = u'x' * (32 << 20)
        before = mapped()
        resource.setrlimit(resource.RLIMIT_AS, (before + (192 << 20), resource.RLIM_INFINITY))
        try:
            native.new_PyPresetUploader(big, big, u'', u'', u'')
            print 'no error'
        except MemoryError:
            print 'MemoryError, copies %s' % ('kept' if mapped() - before > (64 << 20) else 'freed')
        native.delete_PyPresetUploader(native.new_PyPresetUploader(u'h', u't', u'v', u'r', u'u'))
        print 'alive'
        """

    def test_a_conversion_that_runs_out_raises_memory_error_and_frees_its_copies(self):
        with TraceRun(dump_msg=0) as run:
            code, out, err = run.run(self.CHILD)
        self.assertEqual((code, out.splitlines()), (0, ['MemoryError, copies freed', 'alive']), err)


class RegistryFile(unittest.TestCase):

    def test_only_a_regular_file_of_at_most_1_mib_is_read(self):
        valid = hive_text(dump_msg=1)
        padding = lambda size: (u'; ' + u'x' * 78 + u'\r\n') * (size // 82)
        rows = [('just under 1 MiB', valid + padding(MIB - 1000), True),
                ('2 MiB', valid + padding(2 * MIB), False),
                ('FIFO', None, False),
                ('/dev/zero', '/dev/zero', False)]
        outcomes = []
        for name, content, traced in rows:
            with TraceRun() as run:
                os.remove(run.hive)
                if content == '/dev/zero':
                    run.hive = content
                elif content is None:
                    os.mkfifo(run.hive)
                else:
                    with open(run.hive, 'wb') as hive:
                        hive.write(content.encode('ascii'))
                began = time.time()
                code, _, err = run.run("""
                    import _PyUploader as native
                    native.delete_OBLoginData(native.new_OBLoginData(u'5.0', u'Retail', u'm'))
                    """, timeout=10)
                outcomes.append((name, code, time.time() - began < 5, bool(run.lines())))
        self.assertEqual(outcomes, [(name, 0, True, traced) for name, _, traced in rows])


class NotARegularFile(UploadTest):

    def setUp(self):
        UploadTest.setUp(self)
        self.fifo = self.files.missing(u'fifo.png')
        os.mkfifo(self.fifo.encode('utf-8'))

    def tearDown(self):
        release(self.fifo)
        UploadTest.tearDown(self)

    def test_a_fifo_device_or_folder_among_the_checked_files_refuses_the_start(self):
        folder = self.files.missing(u'folder.png')
        os.mkdir(folder)
        images = lambda first: [first] + self.files.images[1:]
        rows = [('FIFO preset', self.fifo, self.files.images),
                ('FIFO image 1', self.files.preset, images(self.fifo)),
                ('device image 1', self.files.preset, images(u'/dev/zero')),
                ('folder image 1', self.files.preset, images(folder))]
        self.assertEqual([(name, self.start(preset=preset, images=imgs)) for name, preset, imgs in rows],
                         [(name, 0) for name, _, _ in rows])
        self.assertEqual(self.uploads(), [])

    def test_a_fifo_as_image_7_fails_the_upload_at_once(self):
        images = list(self.files.images)
        images[6] = self.fifo
        self.assertEqual(self.start(images=images), 1)
        self.assertEqual(wait_for_completion(self.reports, timeout=PROMPTLY)[3], 0)
        [upload] = self.uploads()
        last = upload.upload.files[-1]  # only its head went out
        self.assertEqual((len(upload.upload.files), last.name, last.size, upload.complete),
                         (FILES_BEFORE_IMAGE7 + 1, 'PIPimg_7', 0, False))


class PromptStop(UploadTest):
    """A cancel or a delete, while the upload connects or awaits the reply."""

    def test_a_cancel_or_a_delete_ends_the_upload_within_a_second_in_every_phase(self):
        with never_accepting(HTTP_PORT):
            rows = [(phase, action, self.stop_time(phase, action))
                    for phase in ('connecting', 'awaiting the reply')
                    for action in ('cancel', 'delete')]
        self.assertEqual([(phase, action, spent < PROMPTLY) for phase, action, spent in rows],
                         [(phase, action, True) for phase, action, _ in rows])

    def stop_time(self, phase, action):
        self.svc.reset()
        self.reports.items = []
        host = UNANSWERED_HOST if phase == 'connecting' else SERVER_HOST
        self.uploader = new_uploader(serverHost=unicode(host))
        self.uploader.SetCallback(self.reports)
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(drip=DRIP)])
        self.assertEqual(self.start(), 1)
        if phase == 'connecting':
            time.sleep(0.5)
        else:
            wait_until(lambda: [u for u in self.uploads() if u.complete], 10, 'the whole body')
        began = time.time()
        if action == 'delete':
            self.uploader = None
        else:
            self.uploader.CancelUpload()
            self.assertEqual(wait_for_completion(self.reports, timeout=5)[2:4], (100, 0))
        return time.time() - began


class GivenUpServer(UploadTest):
    """A dripped category reply, a sign-in whose server never accepts and an
    upload's dripped reply, all at once: each is given up after 30 s, in one wait."""

    def setUp(self):
        UploadTest.setUp(self)
        self.session = new_session(SERVER_HOST)

    def tearDown(self):
        native.delete_OBLoginData(self.session)
        UploadTest.tearDown(self)

    def test_every_exchange_ends_30_seconds_after_it_began(self):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(drip=DRIP)])
        self.svc.script(SERVER_HOST, '/servlet/getPresetCategory', [reply(drip=DRIP)])
        results, took = {}, {}
        with never_accepting(TLS_PORT):
            signing_in = threading.Thread(target=self.sign_in_unanswered, args=(results, took))
            signing_in.start()
            self.assertEqual(self.start(), 1)
            wait_until(lambda: [u for u in self.uploads() if u.complete], 10, 'the whole body')
            began = time.time()
            results['categories'] = native.OBLoginData_GetPresetCategory(self.session, u'ENU')
            took['categories'] = time.time() - began
            results['upload'] = wait_for_completion(
                self.reports, timeout=EXCHANGE_LIMIT + LIMIT_SLACK)[2:4]
            took['upload'] = time.time() - began
            signing_in.join(EXCHANGE_LIMIT + LIMIT_SLACK)
        self.assertEqual(results, {'categories': {}, 'upload': (100, 0), 'sign-in': 0})
        for name, seconds in took.items():
            self.assertTrue(EXCHANGE_LIMIT - 1 < seconds < EXCHANGE_LIMIT + LIMIT_SLACK,
                            '%s took %.1f s' % (name, seconds))

    @staticmethod
    def sign_in_unanswered(results, took):
        session = new_session(UNANSWERED_HOST)
        began = time.time()
        results['sign-in'] = native.OBLoginData_LoginOrbishare(session, u'member', u'secret')
        took['sign-in'] = time.time() - began
        native.delete_OBLoginData(session)


if __name__ == '__main__':
    unittest.main()
