"""Nanoseconds per call of a trivial module function and of one given a refused
argument, beside Python code of the same shape (bench/calls).

Each figure is the best of many short timeit runs, the two sides taking turns
so that a busy spell of the machine hits both; timeit's loop is included and
both sides pay the same loop. Prints the figures as JSON, for side_by_side.py.
"""
import json
import sys
import timeit

import _PyUploader as native
import PyUploader

NUMBER = 200000
REPEAT = 25
REFUSED = "in method 'OBLoginData_GetServerUrl', argument 1 of type 'OBLoginData *'"
SETUP = 'from __main__ import native, pointer, session, get_server_url, py_session'


class PySession(object):
    """A pure Python session with the same accessor."""

    def __init__(self):
        self.url = u''

    def GetServerUrl(self):
        return get_server_url(self)


def get_server_url(session):
    """The module function's shape in Python: check the argument, return the member."""
    if not isinstance(session, PySession):
        raise TypeError(REFUSED)
    return session.url


def refused(call):
    """A statement that makes the call and catches its TypeError."""
    return 'try:\n    %s\nexcept TypeError:\n    pass' % call


# label, module statement, Python statement
CASES = [
    ('plain call: GetServerUrl(session)',
     'native.OBLoginData_GetServerUrl(pointer)', 'get_server_url(py_session)'),
    ('refused argument: GetServerUrl(42), TypeError caught',
     refused('native.OBLoginData_GetServerUrl(42)'), refused('get_server_url(42)')),
    ('method of the companion class: session.GetServerUrl()',
     'session.GetServerUrl()', 'py_session.GetServerUrl()'),
]

session = PyUploader.OBLoginData(u'5.0', u'Retail', u'7f3c2a10-0000-4000-8000-000000000001')
pointer = session.this
py_session = PySession()


def nanoseconds(*statements):
    """The best time per call of each statement, measured in turns."""
    timers = [timeit.Timer(statement, SETUP) for statement in statements]
    best = [min(times) for times in zip(*[[timer.timeit(NUMBER) for timer in timers]
                                          for _ in range(REPEAT)])]
    return [seconds / NUMBER * 1e9 for seconds in best]


def main():
    if native.OBLoginData_GetServerUrl(pointer) != get_server_url(py_session):
        return 'the two sides do not answer alike'
    rows, ratios = [], []
    for label, module_statement, python_statement in CASES:
        module_ns, python_ns = nanoseconds(module_statement, python_statement)
        rows.append([label, '%.0f' % module_ns, '%.0f' % python_ns,
                     '%.2f' % (module_ns / python_ns)])
        ratios.append('%s %.2f' % (label.split(':')[0].replace(' ', '_'), module_ns / python_ns))
    json.dump({'title': 'ns per call, best of %d x %d calls' % (REPEAT, NUMBER),
               'columns': ['call (ns)', 'module', 'python', 'module/python'],
               'rows': rows, 'notes': ['Python %s' % sys.version.split()[0]],
               'ratio_of': 'module/python', 'ratios': '  '.join(ratios)}, sys.stdout)
    return 0


if __name__ == '__main__':
    sys.exit(main())
