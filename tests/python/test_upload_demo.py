"""The demo program end to end against the reference service: a preset
published with its progress bar, and Ctrl-C (SIGINT) cancelling the upload."""
import os
import select
import signal
import subprocess
import sys
import time
import unittest

from refservice import RefService, SERVER_HOST, reply
from upload_support import UPLOAD_PATH

DEMO = os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', '..', 'examples',
                    'publish_preset.py')
NO_HANG = 120.0  # seconds


class Demo(object):
    """The demo in a child process, its output read as it comes."""

    def __init__(self, preset_mb):
        self.process = subprocess.Popen([sys.executable, '-u', DEMO, '--preset-mb', str(preset_mb)],
                                        stdout=subprocess.PIPE, stderr=subprocess.STDOUT)
        self.output = ''

    def read_until(self, text):
        deadline = time.time() + NO_HANG
        while text not in self.output:
            remaining = deadline - time.time()
            if remaining <= 0 or not select.select([self.process.stdout], [], [], remaining)[0]:
                raise AssertionError('no %r in %r' % (text, self.output))
            piece = os.read(self.process.stdout.fileno(), 65536)
            if not piece:
                raise AssertionError('ended without %r: %r' % (text, self.output))
            self.output += piece

    def finish(self):
        self.output += self.process.stdout.read()
        return self.process.wait()


class PublishPresetDemo(unittest.TestCase):

    def setUp(self):
        self.svc = RefService()
        self.svc.reset()

    def test_signs_in_lists_the_categories_and_publishes_with_a_progress_bar(self):
        demo = Demo(preset_mb=1)
        self.assertEqual(demo.finish(), 0, demo.output)
        self.assertIn('Signed in as demo@example.org on api.orbishare.com\n', demo.output)
        self.assertIn('  category 3: Portrait\n  category 7: Landscape\n', demo.output)
        self.assertIn('[########################################] 100%', demo.output)
        self.assertTrue(demo.output.endswith(
            '\nPublished: http://api.orbishare.com/template/view.jsp?id=5001\n'), demo.output)

    def test_ctrl_c_cancels_the_upload_and_shows_the_outcome(self):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=1024 * 1024)])
        demo = Demo(preset_mb=32)
        demo.read_until('% ')
        demo.process.send_signal(signal.SIGINT)
        self.assertEqual(demo.finish(), 1, demo.output)
        self.assertIn('\nCancelling...\n', demo.output)
        self.assertTrue(demo.output.endswith('\nNot published (cancelled or failed)\n'),
                        demo.output)
        [upload] = self.svc.requests(host=SERVER_HOST, path=UPLOAD_PATH, bodies=False)
        self.assertFalse(upload.complete)


if __name__ == '__main__':
    unittest.main()
