"""The built module exports its initialiser and nothing else."""
import os
import subprocess
import unittest


class Exports(unittest.TestCase):

    def test_only_the_initialiser_is_exported(self):
        build = os.environ.get('UPLOADER_BUILD_DIR', 'build')
        library = os.path.join(build, 'python', '_PyUploader.so')
        listing = subprocess.check_output(['nm', '-D', '--defined-only', library])
        names = [line.split()[-1] for line in listing.splitlines() if line.strip()]
        self.assertEqual(names, ['init_PyUploader'])


if __name__ == '__main__':
    unittest.main()
