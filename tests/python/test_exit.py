"""Interpreter exit while a module's globals still hold a session and an uploader
whose upload runs: both are destroyed as the globals are cleared."""
# ctest timeout: 60
import unittest

from fixtures import SERVER_HOST, UPLOAD_PATH, UploadTest, reply, run_python

# The child starts an upload to a slow reader and spins in pure Python, never letting
# go of the interpreter lock, until a report of progress reaches its callable; then it
# exits with status 3. Its function keeps its globals alive past the modules that only
# sys.modules holds. Only the uploader holds the callable, which says with how many
# threads it is let go: the uploader's destruction lets go of it after the join. The
# callable's class lives outside these globals: one defined in them would make a cycle
# through the uploader that the collector cannot see.
EXIT_DURING_UPLOAD = r'''
import os, sys, time
from fixtures import SESSION, TEXTS, Reports
from PyUploader import OBLoginData, PyPresetUploader

space = dict(Reports=Reports, write=os.write, listdir=os.listdir)
exec("""class Callable(Reports):
    def __del__(self):
        write(1, b'let go with %d threads\\n' % len(listdir('/proc/self/task')))
""", space)

def moved():
    return [r for r in callable.progress() if r[2] > 0]

session = OBLoginData(u'5.0', u'Retail', u'machine-1')
uploader = PyPresetUploader(*SESSION)
callable = space.pop('Callable')()
del space
uploader.SetCallback(callable)
print('before the upload: %d threads' % len(os.listdir('/proc/self/task')))
files = [a.decode('utf-8') if isinstance(a, bytes) else a for a in sys.argv[1:]]
uploader.StartUpload(files[0], files[1:], *TEXTS)
deadline = time.time() + 20
while not moved() and time.time() < deadline:
    pass
print('moved' if moved() else 'no progress')
sys.stdout.flush()
del callable
sys.exit(3)
'''


class ExitTest(UploadTest):

    def test_globals_cleared_at_exit_destroy_the_session_and_cancel_the_upload(self):
        self.svc.script(SERVER_HOST, UPLOAD_PATH, [reply(read_rate=2000)])
        code, out, err = run_python(EXIT_DURING_UPLOAD, self.preset, *self.images, timeout=30)
        threads = out.split('\n', 1)[0].rsplit(' ', 2)[-2]
        self.assertEqual((code, out, err), (3, 'before the upload: %s threads\nmoved\nlet go with %s threads\n'
                                            % (threads, threads), ''))
        self.assertEqual([u.complete for u in self.uploads(bodies=False)], [False])


if __name__ == '__main__':
    unittest.main()
