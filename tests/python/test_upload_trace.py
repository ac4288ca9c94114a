"""The trace of a preset upload, in a fresh interpreter with the switch on: the
uploader names itself as the prefix and writes one line at the completion,
never the member's token."""
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


if __name__ == '__main__':
    unittest.main()
