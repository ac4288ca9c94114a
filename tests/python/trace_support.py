"""Helpers for suites that read the debug trace.

Each run is a fresh interpreter, so the process-wide switch and prefix start from
nothing. The switch lives in a registry hive file (PYUPLOADER_REGISTRY) and the
lines go to a file (PYUPLOADER_DEBUG_OUTPUT), both in a temporary folder.

Suites that handle accounts, passwords or tokens run their scenario under a
TraceRun with the switch on and call assert_secret_absent for each secret.
"""
import os
import shutil
import subprocess
import sys
import tempfile
import textwrap
import threading

HEADER = u'Windows Registry Editor Version 5.00\r\n\r\n'
KEY = u'[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\Lumivanta]\r\n'
NO_VALUE = object()


def hive_text(dump_msg=1):
    """A hive with the switch key; dump_msg None leaves the key out, NO_VALUE the value."""
    if dump_msg is None:
        return HEADER
    text = HEADER + KEY
    if dump_msg is not NO_VALUE:
        text += u'"DumpMsg"=dword:%08x\r\n' % dump_msg
    return text


class TraceRun(object):
    """A temporary hive and output file; use as a context manager."""

    def __init__(self, dump_msg=1):
        self.folder = tempfile.mkdtemp(prefix='trace-')
        self.hive = os.path.join(self.folder, 'registry.reg')
        self.output = os.path.join(self.folder, 'debug.log')
        with open(self.hive, 'wb') as hive:
            hive.write(hive_text(dump_msg).encode('ascii'))

    def __enter__(self):
        return self

    def __exit__(self, *exc):
        shutil.rmtree(self.folder, ignore_errors=True)
        return False

    def environment(self, capture=True):
        env = dict(os.environ, PYUPLOADER_REGISTRY=self.hive)
        env.pop('PYUPLOADER_DEBUG_OUTPUT', None)
        if capture:
            env['PYUPLOADER_DEBUG_OUTPUT'] = self.output
        return env

    def run(self, code, capture=True, timeout=60):
        """Runs `code` in a fresh interpreter; returns (exit code, stdout, stderr).
        The code finds the hive's path in the variable HIVE. An interpreter still
        running after `timeout` seconds is killed (exit code -9)."""
        code = 'HIVE = %r\n' % self.hive + textwrap.dedent(code)
        proc = subprocess.Popen([sys.executable, '-c', code], stdout=subprocess.PIPE,
                                stderr=subprocess.PIPE, env=self.environment(capture))
        killer = threading.Timer(timeout, proc.kill)
        killer.start()
        try:
            out, err = proc.communicate()
        finally:
            killer.cancel()
        return proc.returncode, out, err

    def text(self):
        """Everything the trace wrote, decoded."""
        if not os.path.exists(self.output):
            return u''
        with open(self.output, 'rb') as output:
            return output.read().decode('utf-8')

    def lines(self):
        return self.text().splitlines(True)

    def assert_secret_absent(self, testcase, secret):
        testcase.assertNotIn(secret, self.text(), 'the trace carries a secret')
