"""The trace of a preset upload, in a fresh interpreter with the switch on: the
uploader names itself as the prefix and writes one line at the completion,
never the member's token; a refused pause setting gets a line of its own."""
import unittest

from trace_support import TraceRun
from upload_support import SESSION

UPLOAD = """
from upload_support import PresetFiles, Reports, TEXTS, new_uploader, wait_for_completion
files = PresetFiles()
reports = Reports()
uploader = new_uploader()
uploader.SetCallback(reports)
assert uploader.StartUpload(files.preset, files.images, *[TEXTS[k] for k in
    ('templateKey', 'title', 'category', 'tags', 'description')]) == 1
assert wait_for_completion(reports)[3] == 1
files.remove()
"""


class UploadTrace(unittest.TestCase):

    def test_the_completion_line_behind_the_uploaders_prefix(self):
        with TraceRun(1) as trace:
            code, out, err = trace.run(UPLOAD)
            self.assertEqual(code, 0, err)
            self.assertEqual(trace.lines(),
                             [u'[PyPresetUploader]PyPresetUploader::OnBackgroundUploadComplete\n'])
            trace.assert_secret_absent(self, SESSION['token'])

    def test_the_pause_setting_is_read_when_the_uploader_is_made(self):
        # Fourteen files of one chunk each: fourteen pauses of at least 0.2 s,
        # though the setting says 0 by the time the upload starts.
        code = """
        import os, time
        os.environ['PYUPLOADER_CHUNK_PAUSE_MS'] = 'fast'
        from upload_support import PresetFiles, Reports, TEXTS, new_uploader, wait_for_completion
        refused = new_uploader()
        os.environ['PYUPLOADER_CHUNK_PAUSE_MS'] = '200'
        uploader = new_uploader()
        os.environ['PYUPLOADER_CHUNK_PAUSE_MS'] = '0'
        files = PresetFiles()
        reports = Reports()
        uploader.SetCallback(reports)
        start = time.time()
        assert uploader.StartUpload(files.preset, files.images, *[TEXTS[k] for k in
            ('templateKey', 'title', 'category', 'tags', 'description')]) == 1
        assert wait_for_completion(reports)[3] == 1
        elapsed = time.time() - start
        assert elapsed >= 14 * 0.2, elapsed
        files.remove()
        """
        with TraceRun(1) as trace:
            status, out, err = trace.run(code)
            self.assertEqual(status, 0, err)
            self.assertEqual(trace.lines()[0],
                             u'[PyPresetUploader]PYUPLOADER_CHUNK_PAUSE_MS refused: "fast" is not a'
                             u' whole number of milliseconds from 0 to 1000; the pause stays 50 ms\n')
            self.assertEqual(len(trace.lines()), 2, trace.lines())


if __name__ == '__main__':
    unittest.main()
