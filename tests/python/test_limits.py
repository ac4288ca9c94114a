"""The edges of files and time: a hive that is a device, a FIFO or too large is not read;
a FIFO or device is not uploaded; a server that drips or never accepts is given up after
30 s, a late one waited for; a cancel or a delete ends an upload within a second in every
phase. (A memory failure raising MemoryError is the binding runtime's unit test.)"""
# ctest timeout: 120
import contextlib
import errno
import os
import socket
import threading
import time
import unittest

import _PyUploader as native
from fixtures import (HTTP_PORT, SERVER_HOST, SESSION, TLS_PORT, UPLOAD_PATH, Reports, Test, UploadTest,
                      reply, run_python, text_type, wait_until)

EXCHANGE_LIMIT, LIMIT_SLACK = 30.0, 3.0  # seconds from the start of an exchange to its last reply byte
LATE = EXCHANGE_LIMIT - 6  # seconds an answer may take: well within the limit
PROMPTLY = 1.0  # seconds a cancel or a delete may take in any phase
UNANSWERED_HOST = '127.0.0.9'


@contextlib.contextmanager
def never_accepting(port):
    """A listener whose accept queue is full, so that a connection to it never completes."""
    listener = socket.socket()
    listener.bind((UNANSWERED_HOST, port))
    listener.listen(0)
    filler = socket.create_connection((UNANSWERED_HOST, port))
    try:
        yield
    finally:
        filler.close()
        listener.close()


def session_on(host):
    session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
    native.OBLoginData_SetOBURLAsReg(session, text_type(host))
    return session


class Files(Test):

    def test_only_a_regular_hive_file_of_at_most_1_mib_is_read(self):
        fifo, outcomes = os.path.join(self.folder, 'fifo.reg'), []
        os.mkfifo(fifo)
        rows = [('under 1 MiB', (1 << 20) - 1000, True), ('2 MiB', 2 << 20, False), (fifo, 0, False),
                ('/dev/zero', 0, False)]
        for name, size, traced in rows:
            self.clear_trace()
            hive = name if not size else os.path.join(self.folder, '%d.reg' % size)
            if size:
                with open(hive, 'wb') as out:
                    out.write(self.HIVE + (b'; ' + b'x' * 78 + b'\r\n') * (size // 82))
            os.environ['PYUPLOADER_REGISTRY'], began = hive, time.time()
            code, _, err = run_python("""
                import _PyUploader as native
                native.delete_OBLoginData(native.new_OBLoginData(u'5.0', u'Retail', u'm'))""", timeout=10)
            outcomes.append((name, code, time.time() - began < 5, bool(self.trace())))
        self.assertEqual(outcomes, [(name, 0, True, traced) for name, _, traced in rows])


class Uploads(UploadTest):

    def test_a_fifo_device_or_folder_among_the_checked_files_refuses_the_start_and_as_image_7_fails_at_once(self):
        fifo, folder = self.missing + '.fifo', self.missing + '.folder'
        os.mkfifo(fifo.encode('utf-8'))
        os.mkdir(folder)
        self.addCleanup(self.release, fifo)
        for odd in (fifo, u'/dev/zero', folder):
            self.assertEqual([self.start(files=[odd] + self.images), self.start(files=[self.preset, odd] + self.images[1:])],
                             [0, 0], odd)
        self.assertEqual(self.uploads(), [])
        self.assertEqual(self.start(files=[self.preset] + self.images[:6] + [fifo] + self.images[7:]), 1)
        self.assertEqual(self.completion(timeout=PROMPTLY)[3], 0)
        [upload] = self.uploads()
        last = upload.upload.files[-1]  # only its head went out
        self.assertEqual((len(upload.upload.files), last.name, last.size, upload.complete), (9, 'PIPimg_7', 0, False))

    @staticmethod
    def release(fifo):
        """Ends an open() blocked on the FIFO, so that a blocked worker cannot hang the suite."""
        try:
            os.close(os.open(fifo.encode('utf-8'), os.O_WRONLY | os.O_NONBLOCK))
        except OSError as error:
            if error.errno != errno.ENXIO:  # nobody waits
                raise

    def test_a_cancel_or_a_delete_ends_the_upload_within_a_second_in_every_phase(self):
        spent = []
        with never_accepting(HTTP_PORT):
            for host in (UNANSWERED_HOST, SERVER_HOST):  # connecting, awaiting the reply
                for action in ('cancel', 'delete'):
                    self.svc.reset()
                    self.reports.items = []
                    self.uploader = self.new_uploader(text_type(host), *SESSION[1:])
                    self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(drip=2)])
                    self.assertEqual(self.start(), 1)
                    if host == SERVER_HOST:
                        wait_until(lambda: [u for u in self.uploads() if u.complete], 10, 'the whole body')
                    else:
                        time.sleep(0.5)
                    began = time.time()
                    if action == 'delete':
                        self.uploader = None
                    else:
                        self.uploader.CancelUpload()
                        self.assertEqual(self.completion(timeout=5)[2:4], (100, 0))
                    spent.append((host, action, time.time() - began < PROMPTLY))
        self.assertEqual(spent, [(host, action, True) for host, action, _ in spent])

    def test_dripped_and_unaccepted_exchanges_are_given_up_after_30_seconds_and_a_late_answer_waited_for(self):
        # All at once, so that the limit is waited out once; a silent wait shorter than the
        # limit is no failure.
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(drip=2), reply(delay=LATE)])
        self.svc.script(SERVER_HOST, '/servlet/getPresetCategory', [reply(drip=2)])
        sessions = dict((name, session_on(host)) for name, host in (
            ('sign-in', UNANSWERED_HOST), ('categories', SERVER_HOST)))
        for session in sessions.values():
            self.addCleanup(native.delete_OBLoginData, session)
        results, took = {}, {}

        def timed(name, operation, *args):
            began = time.time()
            results[name] = operation(sessions[name], *args)
            took[name] = time.time() - began
        signing_in = threading.Thread(target=timed, args=('sign-in', native.OBLoginData_LoginOrbishare,
                                                          u'member', u'secret'))
        late, late_reports = self.new_uploader(), Reports()
        late.SetCallback(late_reports)
        with never_accepting(TLS_PORT):
            signing_in.start()
            self.assertEqual(self.start(), 1)
            wait_until(lambda: [u for u in self.uploads() if u.complete], 10, 'the whole body')
            self.assertEqual(self.start(late), 1)
            began = time.time()  # of the categories and the upload's reply
            timed('categories', native.OBLoginData_GetPresetCategory, u'ENU')
            results['upload'] = self.completion(timeout=EXCHANGE_LIMIT + LIMIT_SLACK)[2:4]
            took['upload'] = time.time() - began
            signing_in.join(EXCHANGE_LIMIT + LIMIT_SLACK)
        self.assertEqual(self.completion(late_reports, timeout=LIMIT_SLACK)[2:4], (100, 1))
        self.assertEqual(results, {'categories': {}, 'upload': (100, 0), 'sign-in': 0})
        self.assertEqual([name for name, seconds in took.items()
                          if not EXCHANGE_LIMIT - 1 < seconds < EXCHANGE_LIMIT + LIMIT_SLACK], [], took)


if __name__ == '__main__':
    unittest.main()
