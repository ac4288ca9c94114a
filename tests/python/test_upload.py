"""Publishing a preset: the form on the wire, the reports the callable receives, the
service's answers, refused starts, cancel and an uploader destroyed while it works."""
# ctest timeout: 90
import hashlib
import io
import os
import sys
import threading
import time
import unittest

from fixtures import (MAIN_THREAD, PY2, SERVER_HOST, SESSION, UPLOAD_PATH, Reports, UploadTest, pump, reply,
                      run_python, wait_until, xml_reply)

FIRST_URL = u'http://api.orbishare.com/template/view.jsp?id=5001'
SECOND_URL = u'http://api.orbishare.com/template/view.jsp?id=5002'
FAILED = (100, 0, u'', u'')
# The fifteen text fields in ascending byte order of their names.
FIELDS = [('AP', b'KRV'), ('AspectRatio', b'1:1'), ('PIPtype', b'0'), ('Version', b'5.0'),
          ('category', b'7'), ('description', b'Soft "warm"\r\nlight'),
          ('productName', b'Quillmark Lumivanta'), ('tags', b'warm,sunset'),
          ('templateKey', b'golden-hour'), ('templatetype', b'PRESET'),
          ('title', b'Golden h\xc3\xb6ur'), ('token', b'0123456789abcdef01234567'),
          ('uuid', b'uuid-1'), ('versionInfo', b'5.0'), ('versionType', b'Retail')]
CANCEL_BOUND = 5.0  # seconds from CancelUpload to the completion report
QUIET = 0.5  # seconds in which no further report may arrive
SECOND_TEXTS = (u'k', u'Second', u'', u'', u'')


def upload_template(url=u'', error=u''):
    return u'<uploadTemplate><templateUrl>%s</templateUrl><errMsg>%s</errMsg></uploadTemplate>' % (url, error)


def digest(path):
    with open(path, 'rb') as data:
        content = data.read()
    return len(content), hashlib.sha256(content).hexdigest()


class Publishing(UploadTest):

    def test_every_field_and_file_arrives_whole_in_order_and_the_trace_keeps_no_token(self):
        # Files of 8 MiB, 0 bytes (sent twice) and 1 byte among them; the pause
        # setting is read when the uploader is made.
        os.environ['PYUPLOADER_CHUNK_PAUSE_MS'] = 'fast'
        self.new_uploader()
        os.environ['PYUPLOADER_CHUNK_PAUSE_MS'] = '200'
        self.uploader = self.new_uploader()
        os.environ['PYUPLOADER_CHUNK_PAUSE_MS'] = '0'
        self.replace_files(preset_size=8 * 1024 * 1024, image_sizes=[0, 1] + [1000] * 10)
        started = time.time()
        self.assertEqual(self.start(), 1)
        self.assertEqual(self.completion(), (u'PROGRESS', u'UploadComplete', 100, 1, FIRST_URL, u''))
        self.assertGreaterEqual(time.time() - started, 14 * 0.2, 'fourteen files, a pause after each')
        [upload] = self.uploads()
        self.assertEqual((upload.method, upload.path, upload.header('User-Agent'), upload.complete,
                          upload.upload.error, upload.header('Content-Length')),
                         ('POST', UPLOAD_PATH, 'WinInetPost/0.0.4', True, None, str(upload.body_size)))
        self.assertEqual(upload.upload.fields, FIELDS)
        names = ['PIPfile', 'PIPimg'] + ['PIPimg_%d' % (i + 1) for i in range(12)]
        self.assertEqual([(f.name, f.filename, f.content_type, (f.size, f.sha256)) for f in upload.upload.files],
                         [(name, path.encode('utf-8'), 'application/octet-stream', digest(path))
                          for name, path in zip(names, [self.preset, self.images[0]] + self.images)])
        self.assertEqual(self.trace(u'[PyPresetUploader]'), [
            u'PYUPLOADER_CHUNK_PAUSE_MS refused: "fast" is not a whole number of milliseconds from 0 to 1000;'
            u' the pause stays 50 ms', u'PyPresetUploader::OnBackgroundUploadComplete'])

    def test_progress_rises_on_the_main_thread_a_start_meanwhile_is_refused_and_the_speed_kept(self):
        # Read slowly, the files span half-seconds: a speed is measured and kept.
        preset_size = 2 * 1024 * 1024
        self.replace_files(preset_size=preset_size)
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=2 * 1024 * 1024)])
        self.assertEqual(self.uploader.GetUploadedFileUrl(), u'')
        self.start()
        self.wait_for_progress()
        self.assertEqual((self.start(texts=SECOND_TEXTS), self.uploader.GetUploadedFileUrl()), (0, u''))
        self.assertEqual(self.completion()[3:5], (1, FIRST_URL))
        pump(QUIET)
        progress = self.reports.progress()
        percents = [r[2] for r in progress]
        self.assertEqual((self.reports.threads, len(self.reports.completions()), percents[0], percents[-1]),
                         (set([MAIN_THREAD]), 1, 0, 100))
        self.assertEqual(percents, sorted(percents))
        self.assertGreater(len(set(percents)), 2)
        self.assertEqual(set(r[:2] + (type(r[3]),) for r in progress), set([(u'PROGRESS', u'ProgressChanged', int)]))
        self.assertEqual(progress[0][3], preset_size // 5600)  # the initial estimate
        self.assertEqual(self.uploader.GetUploadedFileUrl(), FIRST_URL)
        second = Reports()
        self.uploader.SetCallback(second)
        self.assertEqual(self.start(texts=SECOND_TEXTS), 1)
        self.assertEqual(self.uploader.GetUploadedFileUrl(), u'')
        self.assertEqual(self.completion(second)[3:5], (1, SECOND_URL))
        self.assertNotEqual(second.progress()[0][3], progress[0][3])
        self.assertEqual([dict(u.upload.fields)['title'] for u in self.uploads()], [b'Golden h\xc3\xb6ur', b'Second'])


class Answers(UploadTest):

    def test_each_answer_gives_its_completion_report(self):
        long_error = u'\u00e9chec ' * 100
        cases = [
            (xml_reply(upload_template(FIRST_URL, long_error), 500), (100, 0, FIRST_URL, long_error)),
            (xml_reply(upload_template(u'http%3A%2F%2Fapi.orbishare.com%2Ft%3Fid%3D9%26x%3Da%20b')),
             (100, 1, u'http://api.orbishare.com/t?id=9&x=a b', u'')),
            (reply('', 200), (100, 1, u'', u'')),
            (xml_reply('<other><templateUrl>x</templateUrl></other>', 201), (100, 1, u'', u'')),
        ]
        for answer, expected in cases:
            self.reports.items = []
            self.svc.script(SERVER_HOST, UPLOAD_PATH, [answer])
            self.start()
            self.assertEqual(self.completion()[2:], expected, answer)
            self.assertEqual(self.uploader.GetUploadedFileUrl(), expected[2])
        self.svc.host_state(SERVER_HOST, 'down')
        self.reports.items = []
        self.start()
        self.assertEqual((self.completion()[2:], self.reports.progress()), (FAILED, []))

    def test_refused_starts_change_nothing_and_a_seventh_image_missing_late_fails(self):
        self.start()
        self.completion()
        self.svc.reset()
        self.reports.items = []
        files = [self.preset] + self.images
        starts = [self.start(files=files[:index] + [absent] + files[index + 1:])
                  for index in range(5) for absent in (self.missing, None)]
        # A host the upload URL cannot carry (the URL rules themselves are the transport's units)
        starts += [self.start(self.new_uploader(host, *SESSION[1:])) for host in (u'', u'h:8080')]
        worker = threading.Thread(target=lambda: starts.append(self.start(self.new_uploader())))
        worker.start()
        worker.join()
        pump(0.3)
        self.assertEqual((starts, self.reports.items, self.uploads(), self.uploader.GetUploadedFileUrl()),
                         ([0] * 13, [], [], FIRST_URL))
        for image7 in (self.missing, None):
            self.reports.items = []
            self.assertEqual(self.start(files=files[:7] + [image7] + files[8:]), 1)
            self.assertEqual(self.completion()[2:], FAILED)
            upload = self.uploads()[-1]
            self.assertEqual((upload.complete, upload.upload.files[-1].name), (False, 'PIPimg_7'))

    def test_a_callable_that_raises_has_each_error_printed_and_still_gets_every_report(self):
        def fail(reports, report):
            raise ZeroDivisionError('report %d' % len(reports.items))
        self.reports.then = fail
        stderr, sys.stderr = sys.stderr, io.BytesIO() if PY2 else io.StringIO()
        try:
            self.start()
            self.completion()
        finally:
            printed, sys.stderr = sys.stderr.getvalue(), stderr
        self.assertEqual(self.reports.completions()[0][3:], (1, FIRST_URL, u''))
        self.assertEqual(printed.count('ZeroDivisionError: report'), len(self.reports.items))


class Stopping(UploadTest):
    """A large preset that the service reads slowly, so that it still streams."""

    def setUp(self):
        UploadTest.setUp(self)
        self.replace_files(preset_size=24 * 1024 * 1024)
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=1024 * 1024)])

    def test_a_cancel_while_streaming_completes_at_once_and_reports_no_earlier_success(self):
        self.svc.reset()  # a quick first upload
        self.start()
        self.assertEqual(self.completion()[3], 1)
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=1024 * 1024)])
        second = Reports()
        self.uploader.SetCallback(second)
        self.assertEqual(self.start(), 1)
        self.wait_for_progress(second)
        cancelled = time.time()
        self.uploader.CancelUpload()
        self.assertEqual(self.completion(second, timeout=30.0)[2:], FAILED)
        self.assertLess(time.time() - cancelled, CANCEL_BOUND, 'the cancel was not seen while streaming')
        count = len(second.items)
        pump(QUIET)
        upload = self.uploads(bodies=False)[-1]
        self.assertEqual((len(second.items), self.uploader.GetUploadedFileUrl(), upload.complete), (count, u'', False))
        self.assertLess(upload.body_size, 24 * 1024 * 1024)

    def test_an_interpreter_exiting_mid_upload_ends_at_once_and_cuts_the_upload_off(self):
        # The uploader in a global (destroyed as the globals are cleared) or in a
        # reference cycle (never collected: its worker still runs when the process ends).
        for in_cycle in (False, True):
            self.svc.reset()
            # read fast, as what the socket buffers hold drains soon
            self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=8 * 1024 * 1024)])
            started = time.time()
            code, out, err = run_python('''
                from fixtures import Reports, SESSION, TEXTS, wait_until
                from PyUploader import PyPresetUploader
                reports = Reports()
                uploader = PyPresetUploader(*SESSION)
                uploader.SetCallback(reports)
                uploader.StartUpload(%r, %r, *TEXTS)
                wait_until(lambda: [r for r in reports.progress() if r[2] > 0], 30.0)
                if %r:
                    cycle = [uploader, None]
                    cycle[1] = cycle
                    del uploader
                ''' % (self.preset, self.images, in_cycle), timeout=10)
            self.assertEqual(code, 0, (in_cycle, err))
            self.assertLess(time.time() - started, 5.0, in_cycle)
            [upload] = wait_until(lambda: [u for u in self.uploads(False) if u.error or u.complete], 10.0)
            self.assertFalse(upload.complete, in_cycle)


if __name__ == '__main__':
    unittest.main()
