"""Drives bench/reply_memory: scripts each reply on the reference service, then
reads it in a fresh interpreter, so that the peak resident size it prints is
the reading's alone."""
import subprocess
import sys

from bench_support import MiB
from fixtures import RefService, SERVER_HOST, xml_reply

REPLY_BOUND = 16 * MiB
PATH = '/servlet/getPresetCategory'


def filled(size, unit):
    """<categories> holding unit(0), unit(1), ... up to size bytes."""
    parts, used, number = [], len('<categories></categories>'), 0
    while True:
        piece = unit(number)
        if used + len(piece) > size:
            return '<categories>%s</categories>' % ''.join(parts)
        parts.append(piece)
        used += len(piece)
        number += 1


SHAPES = [
    ('categories, 8 MiB', lambda: filled(8 * MiB, lambda n: '<category categoryid="%d">Name %d</category>' % (n, n))),
    ('categories, 16 MiB', lambda: filled(REPLY_BOUND - 1024, lambda n: '<category categoryid="%d">Name %d</category>' % (n, n))),
    ('empty elements, 16 MiB', lambda: filled(REPLY_BOUND - 1024, lambda n: '<a/>' * 1024)),
    ('one 16 MiB name', lambda: '<categories><category categoryid="1">%s</category></categories>'
     % ('n' * (REPLY_BOUND - 1024))),
]

READER = r'''
import sys, time
import _PyUploader as native
from bench_support import memory_kib, reset_peak_memory
session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
native.OBLoginData_SetOBURLAsReg(session, u'%s')
reset_peak_memory()
before = memory_kib('VmRSS')
started = time.time()
read = native.OBLoginData_GetPresetCategory(session, u'ENU')
peak = memory_kib('VmHWM') - before
sys.stdout.write('%%.1f %%.2f %%d' %% (peak / 1024.0, time.time() - started, len(read)))
native.delete_OBLoginData(session)
'''


def main():
    service = RefService()
    service.reset()
    print('%-24s %17s %8s %11s' % ('reply', 'peak growth MiB', 'seconds', 'categories'))
    for name, make in SHAPES:
        service.script(SERVER_HOST, PATH, [xml_reply(make())])
        peak, seconds, count = subprocess.check_output(
            [sys.executable, '-c', READER % SERVER_HOST]).split()
        print('%-24s %17s %8s %11s' % (name, peak, seconds, count))


if __name__ == '__main__':
    main()
