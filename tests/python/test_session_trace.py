"""The trace lines a new session writes, for each state of the registry switch.
Every scenario runs in a fresh interpreter: the switch and the prefix belong to
the process."""
import textwrap
import unittest

from trace_support import NO_VALUE, TraceRun

SESSION = """
import _PyUploader as native
def make(version=u'5.0', version_type=u'Retail'):
    native.delete_OBLoginData(native.new_OBLoginData(version, version_type, u'machine-1'))
"""
VERSION_LINES = [u'[OBLoginData]KRV version = 5.0\n', u'[OBLoginData]KRV versionType = Retail\n']


class TraceSwitch(unittest.TestCase):

    def run_session(self, trace, code='make()\n', capture=True):
        code, out, err = trace.run(SESSION + textwrap.dedent(code), capture)
        self.assertEqual(code, 0, err)
        return err

    def test_each_switch_state(self):
        cases = [(None, []), (NO_VALUE, []), (0, []), (1, VERSION_LINES),
                 (0xFFFFFFFF, VERSION_LINES), (0x100, VERSION_LINES)]
        for dump_msg, lines in cases:
            with TraceRun(dump_msg) as trace:
                self.run_session(trace)
                self.assertEqual(trace.lines(), lines, 'DumpMsg %r' % (dump_msg,))

    def test_the_switch_is_read_again_at_each_construction(self):
        with TraceRun(1) as trace:
            self.run_session(trace, """
                import os
                make(u'1')
                with open(HIVE, 'wb') as hive:
                    hive.write('Windows Registry Editor Version 5.00\\n')  # no key: stays on
                make(u'2')
                with open(HIVE, 'wb') as hive:
                    hive.write('REGEDIT4\\n[HKEY_LOCAL_MACHINE\\\\SOFTWARE\\\\Quillmark\\\\Lumivanta]\\n')
                make(u'3')  # no value: off
                os.remove(HIVE)
                make(u'4')  # no file: stays off
                """)
            self.assertEqual([line for line in trace.lines() if 'versionType' not in line],
                             [u'[OBLoginData]KRV version = 1\n', u'[OBLoginData]KRV version = 2\n'])

    def test_long_and_non_ascii_texts(self):
        with TraceRun(1) as trace:
            self.run_session(trace, "make(u'v' * 1500, u'Caf\\xe9 \\U0001F600')\n")
            self.assertEqual(trace.lines(), [
                u'[OBLoginData]' + (u'KRV version = ' + u'v' * 1500)[:1023] + u'\n',
                u'[OBLoginData]KRV versionType = Caf\xe9 \U0001F600\n'])

    def test_text_after_a_zero_character_is_not_seen(self):
        with TraceRun(1) as trace:
            self.run_session(trace, "make(u'5.0\\x00hidden')\n")
            self.assertEqual(trace.lines(), VERSION_LINES)
            trace.assert_secret_absent(self, u'hidden')

    def test_lines_go_to_standard_error_without_an_output_file(self):
        with TraceRun(1) as trace:
            err = self.run_session(trace, capture=False)
            self.assertEqual(err, ''.join(VERSION_LINES))
            self.assertEqual(trace.lines(), [])


if __name__ == '__main__':
    unittest.main()
