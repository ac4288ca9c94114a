"""What the module does at the edges of memory, files and time: a memory failure
raises MemoryError and the host lives on; a registry hive that is a device, a
FIFO or too large is not read; a FIFO or device is not uploaded; a server that
drips its reply is given up after 30 s; a cancel or a delete ends an upload
within a second in every phase."""
import errno
import os
import socket
import time
import unittest

import _PyUploader as native

from refservice import SERVER_HOST, reply, wait_until
from trace_support import TraceRun, hive_text
from upload_support import UPLOAD_PATH, UploadTest, new_uploader, wait_for_completion

EXCHANGE_LIMIT = 30.0  # seconds from the start of an exchange to its last reply byte
LIMIT_SLACK = 3.0
PROMPTLY = 1.0  # seconds a cancel or a delete may take in any phase
DRIP = 2  # bytes a second
FILES_BEFORE_IMAGE7 = 8  # preset, cover and images 1 to 6
MIB = 1024 * 1024


def release(fifo):
    """Ends an open() blocked on the FIFO by opening its other end (a fault's
    blocked worker must not hang the suite)."""
    try:
        os.close(os.open(fifo.encode('utf-8'), os.O_WRONLY | os.O_NONBLOCK))
    except OSError as error:
        if error.errno != errno.ENXIO:  # nobody waits: nothing to release
            raise


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

    UNANSWERED_HOST = '127.0.0.9'  # a listener whose accept queue is full

    def test_a_cancel_or_a_delete_ends_the_upload_within_a_second_in_every_phase(self):
        listener = socket.socket()
        listener.bind((self.UNANSWERED_HOST, 80))
        listener.listen(0)
        filler = socket.create_connection((self.UNANSWERED_HOST, 80))  # fills the queue
        try:
            rows = [(phase, action, self.stop_time(phase, action))
                    for phase in ('connecting', 'awaiting the reply')
                    for action in ('cancel', 'delete')]
        finally:
            filler.close()
            listener.close()
        self.assertEqual([(phase, action, spent < PROMPTLY) for phase, action, spent in rows],
                         [(phase, action, True) for phase, action, _ in rows])

    def stop_time(self, phase, action):
        self.svc.reset()
        self.reports.items = []
        host = self.UNANSWERED_HOST if phase == 'connecting' else SERVER_HOST
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


class DrippingServer(UploadTest):
    """Both the categories and the upload's reply drip at 2 bytes a second; both
    are given up after 30 s, together, in one wait."""

    def setUp(self):
        UploadTest.setUp(self)
        self.session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
        native.OBLoginData_SetOBURLAsReg(self.session, unicode(SERVER_HOST))

    def tearDown(self):
        native.delete_OBLoginData(self.session)
        UploadTest.tearDown(self)

    def test_a_dripped_reply_fails_after_30_seconds(self):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(drip=DRIP)])
        self.svc.script(SERVER_HOST, '/servlet/getPresetCategory', [reply(drip=DRIP)])
        self.assertEqual(self.start(), 1)
        wait_until(lambda: [u for u in self.uploads() if u.complete], 10, 'the whole body')
        body_sent = began = time.time()
        self.assertEqual(native.OBLoginData_GetPresetCategory(self.session, u'ENU'), {})
        categories_took = time.time() - began
        completion = wait_for_completion(self.reports, timeout=EXCHANGE_LIMIT + LIMIT_SLACK)
        reply_took = time.time() - body_sent
        for took in (categories_took, reply_took):
            self.assertTrue(EXCHANGE_LIMIT - 1 < took < EXCHANGE_LIMIT + LIMIT_SLACK, took)
        self.assertEqual(completion[2:4], (100, 0))


if __name__ == '__main__':
    unittest.main()
