"""The demo program end to end against the reference service: through a pipe a
line per tenth of the upload, on a terminal one bar redrawn in place, and a
last line that says what became of the upload."""
import errno
import os
import pty
import re
import select
import subprocess
import sys
import termios
import time
import unittest

from fixtures import SERVER_HOST, UPLOAD_PATH, RefService, reply

DEMO = os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', '..', 'examples',
                    'publish_preset.py')
NO_HANG = 120.0  # seconds
CLEAR_TO_END = '\x1b[K'
BAR = re.compile(r'\[[#.]{40}\] +(\d+)%  ')


def start_on_terminal(args):
    """The child runs with a terminal of its own that does not echo what is typed."""
    pid, fd = pty.fork()
    if pid == 0:
        try:
            attributes = termios.tcgetattr(0)
            attributes[3] &= ~termios.ECHO
            termios.tcsetattr(0, termios.TCSANOW, attributes)
            os.execv(args[0], args)
        finally:
            os._exit(127)
    return pid, fd


class Demo(object):
    """The demo in a child process, its output read as it comes."""

    def __init__(self, preset_mb, terminal=False):
        args = [sys.executable, '-u', DEMO, '--preset-mb', str(preset_mb)]
        if terminal:
            self.pid, self.fd = start_on_terminal(args)
        else:
            self.process = subprocess.Popen(args, stdout=subprocess.PIPE, stderr=subprocess.STDOUT)
            self.pid, self.fd = self.process.pid, self.process.stdout.fileno()
        self.output = ''
        self.deadline = time.time() + NO_HANG

    def read_until(self, done):
        while not done(self.output):
            remaining = self.deadline - time.time()
            if remaining <= 0 or not select.select([self.fd], [], [], remaining)[0]:
                raise AssertionError('stuck at %r' % self.output)
            try:
                piece = os.read(self.fd, 65536)
            except OSError as error:  # a terminal whose other side has gone
                if error.errno != errno.EIO:
                    raise
                piece = ''
            if not piece:
                return
            self.output += piece

    def finish(self):
        """The exit status, once the output has ended; a terminal's line ends as written."""
        self.read_until(lambda output: False)
        self.output = self.output.replace('\r\n', '\n')
        return os.waitpid(self.pid, 0)[1] >> 8


class PublishPresetDemo(unittest.TestCase):

    def setUp(self):
        self.svc = RefService()
        self.svc.reset()

    def test_through_a_pipe_a_line_per_tenth_and_the_published_url(self):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=2 * 1024 * 1024)])
        demo = Demo(preset_mb=2)
        self.assertEqual(demo.finish(), 0, demo.output)
        self.assertIn('Signed in as demo@example.org on api.orbishare.com\n', demo.output)
        self.assertIn('  category 3: Portrait\n  category 7: Landscape\n', demo.output)
        tenths = [int(BAR.match(line).group(1)) // 10 for line in demo.output.splitlines()
                  if BAR.match(line)]
        self.assertGreaterEqual(len(tenths), 3, demo.output)
        self.assertEqual(tenths, sorted(set(tenths)), demo.output)
        self.assertEqual(tenths[-1], 10, demo.output)
        self.assertNotIn('\r', demo.output)
        self.assertNotIn('\x1b', demo.output)
        self.assertRegexpMatches(demo.output, r'\] 100%  about \d+s left for this file\n'
                                 r'Published: http://api\.orbishare\.com/template/view\.jsp\?id=5001\n$')

    def test_on_a_terminal_ctrl_c_stops_the_bar_where_the_upload_stopped(self):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=1024 * 1024)])
        demo = Demo(preset_mb=32, terminal=True)
        demo.read_until(lambda output: output.count('\r[') >= 3)
        os.write(demo.fd, '\x03')
        self.assertEqual(demo.finish(), 1, demo.output)
        before, last_line = demo.output.rsplit('\n', 2)[:2]
        self.assertEqual(last_line, 'Cancelled', demo.output)
        redraws = before.split('\r')[1:]
        self.assertGreaterEqual(len(redraws), 3, demo.output)
        for redraw in redraws:
            self.assertTrue(BAR.match(redraw) and redraw.endswith(CLEAR_TO_END), repr(redraw))
        self.assertTrue(redraws[-1].endswith('%  Cancelling...' + CLEAR_TO_END), demo.output)
        self.assertLess(int(BAR.match(redraws[-1]).group(1)), 100, demo.output)
        [upload] = self.svc.requests(host=SERVER_HOST, path=UPLOAD_PATH, bodies=False)
        self.assertFalse(upload.complete)

    def test_a_refused_upload_ends_with_the_services_reason(self):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(
            u'<uploadTemplate><errMsg>Title already t\xe4ken</errMsg></uploadTemplate>',
            status=500)])
        demo = Demo(preset_mb=1)
        self.assertEqual(demo.finish(), 1, demo.output)
        self.assertTrue(demo.output.endswith('\nFailed: Title already t\xc3\xa4ken\n'),
                        demo.output)


if __name__ == '__main__':
    unittest.main()
