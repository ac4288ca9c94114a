"""The demo program end to end: through a pipe a line per tenth of the upload, on a
terminal one bar redrawn in place, and a last line that says what became of the upload."""
import errno
import os
import pty
import re
import select
import subprocess
import sys
import time
import unittest

from fixtures import SERVER_HOST, UPLOAD_PATH, RefService, reply

DEMO = os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', '..', 'examples', 'publish_preset.py')
NO_HANG = 30.0  # seconds, well within the ctest bound
CLEAR_TO_END = u'\x1b[K'
BAR = re.compile(u'\\[[#.]{40}\\] +(\\d+)%  ')


class Demo(object):
    """The demo in a child process, its output read as it comes (as Latin-1, byte for character)."""

    def __init__(self, preset_mb, terminal=False):
        args = [sys.executable, '-u', DEMO, '--preset-mb', str(preset_mb)]
        if terminal:  # a terminal of its own that does not echo what is typed
            self.pid, self.fd = pty.fork()
            if self.pid == 0:
                try:
                    os.execv('/bin/sh', ['sh', '-c', 'stty -echo && exec "$@"', 'sh'] + args)
                finally:
                    os._exit(127)
        else:
            self.process = subprocess.Popen(args, stdout=subprocess.PIPE, stderr=subprocess.STDOUT)
            self.pid, self.fd = self.process.pid, self.process.stdout.fileno()
        self.output, self.deadline = u'', time.time() + NO_HANG

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
                piece = b''
            if not piece:
                return
            self.output += piece.decode('latin-1')

    def finish(self):
        """The exit status, once the output has ended; a terminal's line ends as written."""
        self.read_until(lambda output: False)
        self.output = self.output.replace(u'\r\n', u'\n')
        return os.waitpid(self.pid, 0)[1] >> 8


class PublishPresetDemo(unittest.TestCase):

    def setUp(self):
        self.svc = RefService()
        self.svc.reset()

    def test_through_a_pipe_a_line_per_tenth_and_the_published_url_or_the_reason_of_a_refusal(self):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=2 * 1024 * 1024), reply(
            u'<uploadTemplate><errMsg>Title already t\xe4ken</errMsg></uploadTemplate>', status=500)])
        demo = Demo(preset_mb=2)
        self.assertEqual(demo.finish(), 0, demo.output)
        self.assertIn(u'Signed in as demo@example.org on api.orbishare.com\n', demo.output)
        self.assertIn(u'  category 3: Portrait\n  category 7: Landscape\n', demo.output)
        tenths = [int(BAR.match(line).group(1)) // 10 for line in demo.output.splitlines() if BAR.match(line)]
        self.assertEqual((tenths, tenths[-1], len(tenths) >= 3), (sorted(set(tenths)), 10, True), demo.output)
        self.assertEqual((u'\r' in demo.output, u'\x1b' in demo.output), (False, False))
        self.assertTrue(re.search(u'\\] 100%  about \\d+s left for this file\n'
                                  u'Published: http://api\\.orbishare\\.com/template/view\\.jsp\\?id=5001\n$', demo.output),
                        demo.output)
        demo = Demo(preset_mb=1)
        self.assertEqual(demo.finish(), 1, demo.output)
        self.assertTrue(demo.output.endswith(u'\nFailed: Title already t\xc3\xa4ken\n'), demo.output)

    def test_on_a_terminal_ctrl_c_stops_the_bar_where_the_upload_stopped(self):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=1024 * 1024)])
        demo = Demo(preset_mb=32, terminal=True)
        demo.read_until(lambda output: output.count(u'\r[') >= 3)
        os.write(demo.fd, b'\x03')
        self.assertEqual(demo.finish(), 1, demo.output)
        before, last_line = demo.output.rsplit(u'\n', 2)[:2]
        redraws = before.split(u'\r')[1:]
        self.assertEqual((last_line, len(redraws) >= 3), (u'Cancelled', True), demo.output)
        self.assertEqual([r for r in redraws if not (BAR.match(r) and r.endswith(CLEAR_TO_END))], [])
        self.assertTrue(redraws[-1].endswith(u'%  Cancelling...' + CLEAR_TO_END), demo.output)
        self.assertLess(int(BAR.match(redraws[-1]).group(1)), 100, demo.output)
        [upload] = self.svc.requests(host=SERVER_HOST, path=UPLOAD_PATH, bodies=False)
        self.assertFalse(upload.complete)


if __name__ == '__main__':
    unittest.main()
