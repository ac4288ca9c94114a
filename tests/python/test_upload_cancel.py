"""Stopping a preset upload: a cancel while a file streams, and the uploader
destroyed while its worker runs. The service reads slowly so that the upload
is still streaming when the test acts."""
import gc
import subprocess
import sys
import time
import unittest

from refservice import wait_until
from upload_support import (TEXTS, Reports, UploadTest, pump, wait_for_completion,
                            wait_for_progress, worker_threads)

LARGE_PRESET = 24 * 1024 * 1024
SLOW_READ = 1024 * 1024  # bytes per second
QUIET_AFTER = 1.0  # seconds in which no further report may arrive
EXIT_BOUND = 10  # seconds for an interpreter to exit mid-upload
# A fresh interpreter that starts the upload and exits while the preset streams,
# the uploader in a global (destroyed as the module's globals are cleared) or in
# a reference cycle (never collected: its worker still runs when the process ends).
EXIT_MID_UPLOAD = '''
from upload_support import Reports, new_uploader, wait_for_progress
reports = Reports()
uploader = new_uploader()
uploader.SetCallback(reports)
uploader.StartUpload(%r, %r, *%r)
wait_for_progress(reports)
if %r:
    cycle = [uploader, None]
    cycle[1] = cycle
    del uploader
'''


class SlowUpload(UploadTest):
    """A large preset that the service reads slowly."""

    def setUp(self):
        UploadTest.setUp(self)
        self.replace_files(preset_size=LARGE_PRESET)
        self.slow_reader(SLOW_READ)


class CancelledUpload(SlowUpload):

    def test_a_cancel_while_streaming_completes_with_failure_and_nothing_after(self):
        self.assertEqual(self.start(), 1)
        wait_for_progress(self.reports)
        self.uploader.CancelUpload()
        self.assertEqual(wait_for_completion(self.reports),
                         (u'PROGRESS', u'UploadComplete', 100, 0, u'', u''))
        count = len(self.reports.items)
        pump(QUIET_AFTER)
        self.assertEqual(len(self.reports.items), count)
        self.assertEqual(self.reports.items[-1][1], u'UploadComplete')
        [upload] = self.uploads()
        self.assertFalse(upload.complete)
        self.assertLess(upload.body_size, LARGE_PRESET)

    def test_a_cancelled_second_upload_does_not_report_the_first_ones_success(self):
        self.svc.reset()  # a quick first upload
        self.start()
        self.assertEqual(wait_for_completion(self.reports)[3], 1)
        self.slow_reader(SLOW_READ)
        second = Reports()
        self.uploader.SetCallback(second)
        self.start()
        wait_for_progress(second)
        self.uploader.CancelUpload()
        self.assertEqual(wait_for_completion(second)[2:], (100, 0, u'', u''))
        self.assertEqual(self.uploader.GetUploadedFileUrl(), u'')


class InterpreterExit(SlowUpload):

    def test_the_interpreter_exits_mid_upload_at_once_and_the_upload_is_cut_off(self):
        texts = [TEXTS[name] for name in ('templateKey', 'title', 'category', 'tags', 'description')]
        for in_cycle in (False, True):
            self.svc.reset()
            self.slow_reader(SLOW_READ)
            code = EXIT_MID_UPLOAD % (self.files.preset, self.files.images, texts, in_cycle)
            started = time.time()
            child = subprocess.Popen(['timeout', str(EXIT_BOUND), sys.executable, '-c', code],
                                     stdout=subprocess.PIPE, stderr=subprocess.STDOUT)
            output = child.communicate()[0]
            self.assertEqual(child.returncode, 0, (in_cycle, output))
            self.assertLess(time.time() - started, EXIT_BOUND / 2.0, in_cycle)
            [upload] = wait_until(lambda: [u for u in self.uploads() if u.error or u.complete],
                                  10.0, 'the upload connection ended')
            self.assertFalse(upload.complete, in_cycle)


class DestroyedUploader(SlowUpload):

    def test_deleting_waits_for_the_worker_and_the_callable_hears_nothing_more(self):
        threads_before = worker_threads()
        references_before = sys.getrefcount(self.reports)
        self.start()
        wait_for_progress(self.reports)
        self.assertEqual(worker_threads(), threads_before + 1)
        count = len(self.reports.items)
        self.uploader = None  # the last reference: the native object goes now
        self.assertEqual(worker_threads(), threads_before)
        pump(QUIET_AFTER)
        self.assertEqual(len(self.reports.items), count)
        self.assertEqual(self.reports.completions(), [])
        gc.collect()
        self.assertEqual(sys.getrefcount(self.reports), references_before - 1)
        [upload] = self.uploads()
        self.assertFalse(upload.complete)

    def test_the_callable_may_delete_the_uploader_it_is_called_by(self):
        threads_before = worker_threads()

        def delete_on_first(reports, report):
            self.uploader = None
        self.reports.then = delete_on_first
        self.start()
        wait_for_progress(self.reports, percent_above=-1)
        self.assertEqual(worker_threads(), threads_before)
        pump(QUIET_AFTER)
        self.assertEqual(len(self.reports.items), 1)


if __name__ == '__main__':
    unittest.main()
