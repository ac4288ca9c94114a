"""Drives bench/soak: 1,000 uploads in a row on one uploader, 200 on fresh
uploaders, 2,000 sign-in and sign-out pairs. The files are empty, so that an
upload writes no chunk and the engine's pause after each chunk costs nothing.

Each run starts after a few warm-up rounds (libcurl, TLS and the allocator
set up what they keep); then descriptors and threads must come back to what
they were, and the resident size may grow by RSS_MARGIN_KIB at most."""
import argparse
import os
import shutil
import sys
import tempfile
import time

import _PyUploader as native
import bench_support as bs
from PyUploader import PyPresetUploader
from fixtures import RefService, SERVER_HOST

WARM_UP_ROUNDS = 20
RSS_MARGIN_KIB = 4 * 1024
RESET_EVERY = 200  # the service forgets what it recorded, so that it stays quick
TURN = 0.001  # the main thread's sleep while it waits for a report
COMPLETION_TIMEOUT = 30.0


def open_descriptors():
    return len(os.listdir('/proc/self/fd'))


def threads():
    return len(os.listdir('/proc/self/task'))


def figures():
    return open_descriptors(), threads(), bs.memory_kib('VmRSS')


def upload_on(uploader, paths):
    completion = bs.Completion()
    uploader.SetCallback(completion)
    if not uploader.StartUpload(paths[0], paths[1:], *bs.TEXTS):
        raise SystemExit('soak: an upload could not be started')
    deadline = time.time() + COMPLETION_TIMEOUT
    while not completion.done:
        if time.time() > deadline:
            raise SystemExit('soak: no completion report after %.0f s' % COMPLETION_TIMEOUT)
        time.sleep(TURN)
    if not completion.success:
        raise SystemExit('soak: an upload failed')


def uploads_on_one_object(paths):
    uploader = PyPresetUploader(*bs.SESSION)
    return lambda: upload_on(uploader, paths)


def uploads_on_fresh_objects(paths):
    return lambda: upload_on(PyPresetUploader(*bs.SESSION), paths)


def sign_in_and_out():
    session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')

    def pair():
        native.OBLoginData_SetOBURLAsReg(session, unicode(SERVER_HOST))
        if native.OBLoginData_LoginOrbishare(session, u'member', u'secret') != 1:
            raise SystemExit('soak: a sign-in failed')
        native.OBLoginData_LogoutOrbishare(session)
    return pair


def soak(name, rounds, one_round, service):
    for _ in range(WARM_UP_ROUNDS):
        one_round()
    service.reset()
    before = figures()
    started = time.time()
    for number in range(1, rounds + 1):
        one_round()
        if number % RESET_EVERY == 0:
            service.reset()
    after = figures()
    grown = [what for what, b, a in zip(('descriptors', 'threads'), before, after) if a > b]
    if after[2] - before[2] > RSS_MARGIN_KIB:
        grown.append('resident memory')
    row = [name, rounds, '%.1f' % (time.time() - started)]
    row += ['%d -> %d' % (b, a) for b, a in zip(before[:2], after[:2])]
    row += ['%.1f -> %.1f' % (before[2] / 1024.0, after[2] / 1024.0)]
    return row + [', '.join(grown) or 'flat'], not grown


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument('--scale', type=float, default=1.0)
    scale = parser.parse_args().scale
    folder = tempfile.mkdtemp(prefix='soak-')
    try:
        paths = bs.make_preset_files(folder, 0, 0)
        service = RefService()
        service.reset()
        runs = [('uploads, one uploader', 1000, uploads_on_one_object(paths)),
                ('uploads, fresh uploaders', 200, uploads_on_fresh_objects(paths)),
                ('sign-in and sign-out', 2000, sign_in_and_out())]
        rows, flat = [], True
        for name, rounds, one_round in runs:
            row, ok = soak(name, max(1, int(rounds * scale)), one_round, service)
            rows.append(row)
            flat = flat and ok
        bs.print_table(['run', 'rounds', 'seconds', 'descriptors', 'threads', 'RSS MiB',
                        'verdict'], rows)
        print('(RSS may grow by %d MiB at most)' % (RSS_MARGIN_KIB // 1024))
    finally:
        shutil.rmtree(folder, ignore_errors=True)
    sys.exit(0 if flat else 1)


if __name__ == '__main__':
    main()
