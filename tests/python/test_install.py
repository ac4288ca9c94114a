"""`cmake --install` of the build: the module and its companion land in the
interpreter's own site-packages, or in the same layout below a given prefix,
and import from there with no PYTHONPATH; help() documents every method."""
import os
import shutil
import subprocess
import sys
import sysconfig
import tempfile
import unittest

BUILD = os.environ['UPLOADER_BUILD_DIR']
INSTALLED = ['_PyUploader.so', 'PyUploader.py']
# Imports the companion from the user site (PYTHONUSERBASE) and names what has
# no docstring.
IMPORT_AND_DOCUMENT = """
import inspect, PyUploader, _PyUploader
print PyUploader.__file__
print _PyUploader.__file__
for name, cls in inspect.getmembers(PyUploader, inspect.isclass):
    for label, thing in [(name, cls)] + inspect.getmembers(cls, inspect.ismethod):
        if not (thing.__doc__ or '').strip():
            print 'undocumented', name, label
"""


class Install(unittest.TestCase):

    def setUp(self):
        self.root = tempfile.mkdtemp(prefix='install-')
        self.addCleanup(shutil.rmtree, self.root, True)

    def install(self, *options, **env):
        subprocess.check_output(['cmake', '--install', BUILD] + list(options),
                                env=dict(os.environ, **env), stderr=subprocess.STDOUT)

    def assert_installed(self, folder):
        self.assertEqual(sorted(os.listdir(folder)), sorted(INSTALLED))

    def test_by_default_into_the_interpreters_site_packages(self):
        self.install(DESTDIR=self.root)
        self.assert_installed(self.root + sysconfig.get_paths()['platlib'])

    def test_below_a_prefix_in_the_interpreters_layout_and_importable(self):
        self.install('--prefix', self.root)
        site = sysconfig.get_paths(vars={'base': self.root, 'platbase': self.root})['platlib']
        self.assert_installed(site)
        env = dict(os.environ, PYTHONUSERBASE=self.root)
        env.pop('PYTHONPATH')
        output = subprocess.check_output([sys.executable, '-c', IMPORT_AND_DOCUMENT], env=env,
                                         cwd=self.root, stderr=subprocess.STDOUT)
        self.assertEqual(output.splitlines(),
                         [os.path.join(site, 'PyUploader.py'), os.path.join(site, '_PyUploader.so')])


if __name__ == '__main__':
    unittest.main()
