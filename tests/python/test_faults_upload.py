"""An upload that goes wrong: the service drops the connection mid-body or
answers with something that is not HTTP; a file removed, truncated or grown
while an earlier one streams; a sparse 4 GiB file, a folder or an unreadable
file among the images. Each upload completes with success 0, no file part
from the faulty one on arrives whole, and no thread or descriptor is left
behind."""
import base64
import hashlib
import os
import unittest

from refservice import SERVER_HOST, reply
from upload_support import UPLOAD_PATH, UploadTest, wait_for_completion, worker_threads

BIG_PRESET = 24 * 1024 * 1024  # streams for seconds at the slow reading rate
SLOW_READ = 8 * 1024 * 1024  # bytes per second
FOUR_GIB = 4 << 30
NOBODY = 65534
FILE_PARTS = 14


def open_descriptors():
    return len(os.listdir('/proc/self/fd'))


def truncate(path):
    with open(path, 'r+b') as f:
        f.truncate(os.path.getsize(path) // 2)


def grow(path):
    with open(path, 'ab') as f:
        f.write('more')


def make_sparse(path):
    with open(path, 'wb') as f:
        f.truncate(FOUR_GIB)


def make_folder(path):
    os.remove(path)
    os.mkdir(path)


def make_unreadable(path):
    """Readable by root only, and the test reads as nobody until the upload ends."""
    os.chmod(os.path.dirname(path), 0o755)
    os.chmod(path, 0)
    os.seteuid(NOBODY)
    return lambda: os.seteuid(0)


def last_image(files):
    return files.images[-1]


# (fault, the file it hits, done before the start or once the preset streams,
#  the service's script, file parts the service may have received whole (those
#  before the fault; None: any), body complete). Bytes taken for sending just
#  before the fault may never go out, so fewer parts may arrive whole.
BEFORE, WHILE_STREAMING = 'before', 'while streaming'
SLOW = [reply(read_rate=SLOW_READ)]
ROWS = [
    ('connection dropped mid-body', None, None, [reply(abort_after=8000)], None, False),
    ('not HTTP', None, None, [reply(raw_b64=base64.b64encode('NOT HTTP\r\n\r\n'))],
     FILE_PARTS, True),
    ('file removed', last_image, (WHILE_STREAMING, os.remove), SLOW, FILE_PARTS - 1, False),
    ('file truncated', last_image, (WHILE_STREAMING, truncate), SLOW, FILE_PARTS - 1, False),
    ('file grown', last_image, (WHILE_STREAMING, grow), SLOW, FILE_PARTS - 1, False),
    ('sparse 4 GiB file', last_image, (BEFORE, make_sparse), [], 0, False),
    ('folder as image 7', lambda files: files.images[6], (BEFORE, make_folder), [], 8, False),
    ('unreadable image', lambda files: files.images[2], (BEFORE, make_unreadable), [], 4, False),
]


class FaultyUploads(UploadTest):

    def test_each_fault_ends_the_upload_as_a_failure_and_keeps_nothing(self):
        held = (open_descriptors(), worker_threads())
        outcomes, wanted = [], []
        for name, target, fault, script, whole, complete in ROWS:
            success, received, finished = self.upload_with(target, fault, script)
            left = (open_descriptors(), worker_threads()) != held
            if whole is None or received <= whole:  # fewer is fine, see ROWS
                received = whole
            outcomes.append((name, success, received, finished, left))
            wanted.append((name, 0, whole, complete, False))
        self.assertEqual(outcomes, wanted)

    def upload_with(self, target, fault, script):
        """Uploads with the fault; gives the success flag, the number of file
        parts the service received whole and whether the body was complete."""
        self.svc.reset()
        self.replace_files(preset_size=BIG_PRESET if script is SLOW else 3000)
        digests = [hashlib.sha256(open(path, 'rb').read()).hexdigest()
                   for _, path in self.files.parts()]
        self.svc.script(SERVER_HOST, UPLOAD_PATH, script)
        undo = None
        if fault and fault[0] == BEFORE:
            undo = fault[1](target(self.files))
        elif fault:
            self.reports.then = self.once(lambda: fault[1](target(self.files)))
        try:
            self.assertEqual(self.start(), 1)
            success = wait_for_completion(self.reports)[3]
        finally:
            if undo:
                undo()
            self.reports.items, self.reports.then = [], None
        return (success,) + self.received(digests)

    @staticmethod
    def once(action):
        done = []

        def then(reports, report):
            if not done:
                done.append(action())
        return then

    def received(self, digests):
        uploads = self.svc.requests(host=SERVER_HOST, path=UPLOAD_PATH)
        if not uploads:
            return 0, False
        [upload] = uploads
        sent = [part.sha256 for part in upload.upload.files]
        whole = 0
        while whole < min(len(sent), len(digests)) and sent[whole] == digests[whole]:
            whole += 1
        return whole, upload.complete


if __name__ == '__main__':
    unittest.main()
