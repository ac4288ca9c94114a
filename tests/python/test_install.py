"""`cmake --install` of the build: the module and its companion land in the interpreter's
own site-packages, or in the same layout below a given prefix, and import from there
with no PYTHONPATH; help() documents every method."""
import os
import shutil
import subprocess
import sys
import sysconfig
import tempfile
import unittest

BUILD = os.environ['UPLOADER_BUILD_DIR']
MODULE_FILE = '_PyUploader' + (sysconfig.get_config_var('EXT_SUFFIX') or '.so')  # no suffix var on 2.7
# Imports the companion from the user site (PYTHONUSERBASE) and names what has no docstring.
IMPORT_AND_DOCUMENT = """
import inspect, PyUploader, _PyUploader
print(PyUploader.__file__)
print(_PyUploader.__file__)
for name, cls in inspect.getmembers(PyUploader, inspect.isclass):
    for label, thing in [(name, cls)] + inspect.getmembers(cls, lambda m: inspect.isfunction(m) or inspect.ismethod(m)):
        if not (thing.__doc__ or '').strip():
            print('undocumented %s %s' % (name, label))
"""


class Install(unittest.TestCase):

    def test_into_the_interpreters_site_packages_or_below_a_prefix_and_importable(self):
        root = tempfile.mkdtemp(prefix='install-')
        self.addCleanup(shutil.rmtree, root, True)
        for options, env, site in [
                ([], dict(DESTDIR=root + '/destdir'), root + '/destdir' + sysconfig.get_paths()['platlib']),
                (['--prefix', root], {}, sysconfig.get_paths(vars={'base': root, 'platbase': root})['platlib'])]:
            subprocess.check_output(['cmake', '--install', BUILD] + options, env=dict(os.environ, **env),
                                    stderr=subprocess.STDOUT)
            self.assertEqual(sorted(os.listdir(site)), ['PyUploader.py', MODULE_FILE])
        env = dict(os.environ, PYTHONUSERBASE=root)
        env.pop('PYTHONPATH')
        if sysconfig.get_paths('posix_user', vars={'userbase': root})['platlib'] != site:
            env['PYTHONPATH'] = site  # Debian's prefix layout (local/.../dist-packages) is no user site
        output = subprocess.check_output([sys.executable, '-c', IMPORT_AND_DOCUMENT], env=env, cwd=root,
                                         stderr=subprocess.STDOUT).decode('utf-8')
        self.assertEqual(output.splitlines(), [os.path.join(site, 'PyUploader.py'), os.path.join(site, MODULE_FILE)])


if __name__ == '__main__':
    unittest.main()
