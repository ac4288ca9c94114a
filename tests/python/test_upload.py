"""Publishing a preset against the reference service: what goes on the wire,
the reports the callable receives, the service's answers, and the starts that
are refused."""
import hashlib
import math
import sys
import threading
import time
import unittest
import urllib
from StringIO import StringIO

import _PyUploader as native

from refservice import SERVER_HOST, reply, xml_reply
from upload_support import (INITIAL_RATE_ESTIMATE, MAIN_THREAD, OCTET_STREAM, SESSION, TEXTS,
                            UPLOAD_PATH, Reports, UploadTest, expected_body,
                            expected_fields, new_uploader, pump, wait_for_completion,
                            wait_for_progress)

FIRST_URL = u'http://api.orbishare.com/template/view.jsp?id=5001'
SECOND_URL = u'http://api.orbishare.com/template/view.jsp?id=5002'
FILE_PARTS = 14
# Besides its first and last report, a file reports at most once a half-second.
REPORTS_PER_SECOND = 2


def upload_template(url=u'', error=u''):
    body = u'<uploadTemplate><templateUrl>%s</templateUrl><errMsg>%s</errMsg></uploadTemplate>'
    return (body % (url, error)).encode('utf-8')


class SuccessfulUpload(UploadTest):

    def test_the_service_receives_every_field_and_file_byte_for_byte_in_order(self):
        # Files of 100 MiB, 0 bytes (sent twice) and 1 byte among them.
        self.replace_files(preset_size=100 * 1024 * 1024, image_sizes=[0, 1] + [1000] * 10)
        self.assertEqual(self.start(), 1)
        self.assertEqual(wait_for_completion(self.reports),
                         (u'PROGRESS', u'UploadComplete', 100, 1, FIRST_URL, u''))
        [upload] = self.uploads()
        self.assertEqual((upload.method, upload.path, upload.complete), ('POST', UPLOAD_PATH, True))
        self.assertEqual(upload.header('User-Agent'), 'WinInetPost/0.0.4')
        self.assertEqual(upload.upload.fields, expected_fields())
        self.assertEqual(
            [(f.name, f.filename, f.content_type, f.size, f.sha256) for f in upload.upload.files],
            [(name, path.encode('utf-8'), OCTET_STREAM, len(open(path, 'rb').read()),
              hashlib.sha256(open(path, 'rb').read()).hexdigest())
             for name, path in self.files.parts()])
        body = expected_body(upload.upload.boundary, expected_fields(), self.files.parts())
        self.assertEqual(upload.header('Content-Length'), str(len(body)))
        self.assertEqual((upload.body_size, upload.body_sha256),
                         (len(body), hashlib.sha256(body).hexdigest()))

    def test_progress_reaches_the_main_thread_rising_and_at_most_twice_a_second_per_file(self):
        self.replace_files(preset_size=3 * 1024 * 1024)
        self.slow_reader(2 * 1024 * 1024)
        began = time.time()
        self.start()
        wait_for_completion(self.reports)
        elapsed = time.time() - began
        self.assertEqual(self.reports.threads, set([MAIN_THREAD]))
        percents = [r[2] for r in self.reports.progress()]
        self.assertEqual(percents, sorted(percents))
        self.assertEqual((percents[0], percents[-1]), (0, 100))
        self.assertGreater(len(set(percents)), 2)
        bound = REPORTS_PER_SECOND * (FILE_PARTS + int(math.ceil(elapsed)) + 1)
        self.assertLessEqual(len(percents), bound)
        for report in self.reports.progress():
            self.assertEqual(report[:2], (u'PROGRESS', u'ProgressChanged'))
            self.assertIsInstance(report[3], int)

    def test_the_url_is_empty_during_the_upload_and_known_afterwards(self):
        self.assertEqual(self.uploader.GetUploadedFileUrl(), u'')
        self.replace_files(preset_size=2 * 1024 * 1024)
        self.slow_reader(1024 * 1024)
        self.start()
        wait_for_progress(self.reports)
        self.assertEqual(self.uploader.GetUploadedFileUrl(), u'')
        wait_for_completion(self.reports)
        self.assertEqual(self.uploader.GetUploadedFileUrl(), FIRST_URL)

    def test_two_uploads_in_a_row_the_second_starting_from_the_first_ones_speed(self):
        # The slow reader makes the first upload's files span half-seconds, so
        # a speed is measured and kept in the form.
        preset_size = 3 * 1024 * 1024
        self.replace_files(preset_size=preset_size)
        self.slow_reader(2 * 1024 * 1024)
        self.start()
        self.assertEqual(wait_for_completion(self.reports)[3:5], (1, FIRST_URL))
        first_estimate = self.reports.progress()[0][3]
        self.assertEqual(first_estimate, preset_size // INITIAL_RATE_ESTIMATE)

        second = Reports()
        self.uploader.SetCallback(second)
        self.assertEqual(self.start(title=u'Second'), 1)
        self.assertEqual(self.uploader.GetUploadedFileUrl(), u'')
        self.assertEqual(wait_for_completion(second)[3:5], (1, SECOND_URL))
        self.assertNotEqual(second.progress()[0][3], first_estimate)
        self.assertEqual(self.uploads()[1].upload.field('title'), 'Second')


class ServerAnswers(UploadTest):

    def complete_with(self, answer):
        self.reports.items = []
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [answer])
        self.start()
        return wait_for_completion(self.reports)[2:]

    def test_an_error_answer_reports_failure_with_the_servers_whole_error_text(self):
        for status, error in ((500, u'Title already used'), (403, u'\u00e9chec ' * 100)):
            answer = xml_reply(upload_template(error=error), status)
            self.assertEqual(self.complete_with(answer), (100, 0, u'', error))

    def test_the_url_is_percent_decoded(self):
        encoded = urllib.quote('http://api.orbishare.com/t?id=9&x=a b', safe='')
        answer = xml_reply(upload_template(url=encoded.decode('ascii')))
        url = u'http://api.orbishare.com/t?id=9&x=a b'
        self.assertEqual(self.complete_with(answer), (100, 1, url, u''))
        self.assertEqual(self.uploader.GetUploadedFileUrl(), url)

    def test_replies_without_the_nodes_give_empty_texts(self):
        for answer in (reply('', 200), reply('<html>no xml</html>', 200),
                       xml_reply('<other><templateUrl>x</templateUrl></other>', 201)):
            self.assertEqual(self.complete_with(answer), (100, 1, u'', u''), answer)

    def test_a_server_that_cannot_be_reached_reports_failure(self):
        self.svc.host_state(SERVER_HOST, 'down')
        self.start()
        self.assertEqual(wait_for_completion(self.reports)[2:], (100, 0, u'', u''))
        self.assertEqual(self.reports.progress(), [])


class FailedUploads(UploadTest):

    def test_a_missing_image7_starts_and_ends_with_the_open_error(self):
        for image7 in (self.files.missing(), None):
            self.reports.items = []
            images = list(self.files.images)
            images[6] = image7
            self.assertEqual(self.start(images=images), 1)
            self.assertEqual(wait_for_completion(self.reports)[2:], (100, 0, u'', u''))
            upload = self.uploads()[-1]
            self.assertFalse(upload.complete)
            self.assertEqual([f.name for f in upload.upload.files][-1], 'PIPimg_7')

    def test_absent_texts_are_sent_as_empty_fields(self):
        session = dict(SESSION, token=None, version=None, versionType=None, uuid=None)
        uploader = new_uploader(**session)
        uploader.SetCallback(self.reports)
        texts = dict((name, None) for name in TEXTS)
        self.assertEqual(self.start(uploader, **texts), 1)
        self.assertEqual(wait_for_completion(self.reports)[2:], (100, 0, u'', u'Invalid token'))
        self.assertEqual(self.uploads()[0].upload.fields, expected_fields(session, texts))


class RefusedStarts(UploadTest):

    def assert_nothing_started(self):
        pump(0.3)
        self.assertEqual(self.reports.items, [])
        self.assertEqual(self.uploads(), [])

    def test_a_missing_preset_or_one_of_the_first_four_images_changes_nothing(self):
        self.start()
        wait_for_completion(self.reports)
        self.svc.reset()
        self.reports.items = []
        for index in range(5):
            for absent in (self.files.missing(), None):
                files = [self.files.preset] + list(self.files.images)
                files[index] = absent
                self.assertEqual(self.start(preset=files[0], images=files[1:]), 0,
                                 (index, absent))
        self.assert_nothing_started()
        self.assertEqual(self.uploader.GetUploadedFileUrl(), FIRST_URL)

    def test_a_server_host_that_gives_no_acceptable_url_changes_nothing(self):
        longest = u'h' * (259 - len(u'http://') - len(UPLOAD_PATH))
        for host in (u'', u'api.orbishare.com:8080', u'me@api.orbishare.com',
                     u'api.orbishare.com?x=1', longest + u'h'):
            uploader = new_uploader(serverHost=host)
            uploader.SetCallback(self.reports)
            self.assertEqual(self.start(uploader), 0, host)
        self.assert_nothing_started()
        # The longest host that fits the URL starts, and fails to resolve.
        uploader = new_uploader(serverHost=longest)
        uploader.SetCallback(self.reports)
        self.assertEqual(self.start(uploader), 1)
        self.assertEqual(wait_for_completion(self.reports)[2:], (100, 0, u'', u''))

    def test_a_start_during_a_running_upload_changes_nothing(self):
        self.replace_files(preset_size=2 * 1024 * 1024)
        self.slow_reader(1024 * 1024)
        self.assertEqual(self.start(title=u'First'), 1)
        wait_for_progress(self.reports)
        self.assertEqual(self.start(title=u'Second'), 0)
        self.assertEqual(wait_for_completion(self.reports)[3:5], (1, FIRST_URL))
        pump(0.3)
        self.assertEqual(len(self.reports.completions()), 1)
        [upload] = self.uploads()
        self.assertEqual(upload.upload.field('title'), 'First')

    def test_an_uploader_off_the_main_thread_cannot_start(self):
        results = []

        def elsewhere():
            uploader = new_uploader()
            uploader.SetCallback(self.reports)
            results.append(self.start(uploader))
        worker = threading.Thread(target=elsewhere)
        worker.start()
        worker.join()
        self.assertEqual(results, [0])
        self.assert_nothing_started()


class Callables(UploadTest):

    def test_a_callable_registered_between_two_reports_receives_the_later_ones(self):
        later = Reports()
        self.reports.then = lambda reports, report: self.uploader.SetCallback(later)
        self.start()
        wait_for_completion(later)
        self.assertEqual(len(self.reports.items), 1)
        self.assertEqual(self.reports.items[0][1], u'ProgressChanged')
        self.assertEqual(later.completions()[0][3:], (1, FIRST_URL, u''))

    def test_a_callable_that_raises_does_not_stop_the_upload(self):
        def fail(reports, report):
            raise ZeroDivisionError('report %d' % len(reports.items))
        self.reports.then = fail
        stderr, sys.stderr = sys.stderr, StringIO()
        try:
            self.start()
            wait_for_completion(self.reports)
        finally:
            printed, sys.stderr = sys.stderr.getvalue(), stderr
        self.assertEqual(self.reports.completions()[0][3:], (1, FIRST_URL, u''))
        self.assertEqual(printed.count('ZeroDivisionError: report'), len(self.reports.items))
        self.assertIn('ZeroDivisionError: report %d' % len(self.reports.items), printed)


class ModuleFunctions(UploadTest):

    def test_str_texts_are_accepted_as_well(self):
        self.replace_files(prefix='preset-')
        uploader = new_uploader(serverHost='api.orbishare.com', token='0123')
        uploader.SetCallback(self.reports)
        paths = [str(p) for p in [self.files.preset] + self.files.images]
        texts = dict((name, str(value.encode('unicode_escape'))) for name, value in TEXTS.items())
        self.assertEqual(self.start(uploader, preset=paths[0], images=paths[1:], **texts), 1)
        self.assertEqual(wait_for_completion(self.reports)[3], 1)
        upload = self.uploads()[0].upload
        self.assertEqual((upload.field('title'), upload.field('token')), (texts['title'], '0123'))

    def test_results_of_the_plain_functions(self):
        self.assertEqual(native.PyPresetUploader_SetCallback(self.uploader, None), 1)
        self.assertIsNone(native.PyPresetUploader_CancelUpload(self.uploader))
        self.assertIsNone(native.delete_PyPresetUploader(None))
        bare = native.new_PyPresetUploader(None, None, None, None, None)
        self.assertIn("<Swig Object of type 'PyPresetUploader *' at 0x", repr(bare))
        self.assertIsNone(native.delete_PyPresetUploader(bare))


if __name__ == '__main__':
    unittest.main()
