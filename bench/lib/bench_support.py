"""What the benchmarks share: the preset they publish, files to publish, the
process's resident memory, the engine's chunk log, waiting for the completion
report and printing tables. Python 2.7 and 3, like the module; it never imports
the module itself, so a driver may use it without loading the module."""
from __future__ import print_function

import os
import time

KiB = 1024
MiB = 1024 * KiB
GiB = 1024 * MiB

CHUNK_LOG_VARIABLE = 'PYUPLOADER_CHUNK_LOG'
CHUNK_PAUSE_VARIABLE = 'PYUPLOADER_CHUNK_PAUSE_MS'
PAUSE_AFTER_CHUNK = 0.050  # the engine's pause after every chunk it writes, unless set
UI_TURN = 0.010  # how long the benchmarks' main thread sleeps between turns

# The uploader's constructor arguments, as a signed-in session would give them.
SESSION = (u'api.orbishare.com', u'0123456789abcdef01234567', u'5.0', u'Retail',
           u'7f3c2a10-0000-4000-8000-000000000001')
# Template key, title, category, tags, description.
TEXTS = (u'golden-hour', u'Golden h\xf6ur', u'7', u'warm,sunset', u'Soft warm light for evenings')
IMAGE_COUNT = 12

_BLOCK = os.urandom(MiB)


def argument_text(value):
    """A command-line argument as text: 2.7 gives bytes, Python 3 text already."""
    return value if isinstance(value, type(u'')) else value.decode('utf-8')


def write_file(path, size):
    """A file of `size` bytes that do not compress."""
    with open(path, 'wb') as out:
        left = size
        while left > 0:
            out.write(_BLOCK[:min(left, MiB)])
            left -= MiB
    return path


def make_preset_files(folder, preset_size, image_size):
    """A preset file and twelve images; returns their paths, the preset first."""
    paths = [write_file(os.path.join(folder, 'preset.bin'), preset_size)]
    for number in range(1, IMAGE_COUNT + 1):
        paths.append(write_file(os.path.join(folder, 'preview_%02d.png' % number), image_size))
    return paths


def memory_kib(field):
    """A size from /proc/self/status, such as 'VmRSS' or 'VmHWM', in KiB."""
    with open('/proc/self/status') as status:
        for line in status:
            if line.startswith(field + ':'):
                return int(line.split()[1])
    raise KeyError(field)


def reset_peak_memory():
    """Starts the peak (VmHWM) again from the current resident size."""
    with open('/proc/self/clear_refs', 'w') as refs:
        refs.write('5')


def read_chunk_log(path):
    """(bytes, seconds) of each chunk the engine wrote, in order."""
    if not os.path.exists(path):
        return []
    with open(path) as log:
        return [(int(size), int(micros) / 1e6) for size, micros in
                (line.split() for line in log if line.strip())]


def pacing_floor(chunks, pause=PAUSE_AFTER_CHUNK):
    """The time the pacing itself takes: every write and every pause after it."""
    return sum(seconds for _, seconds in chunks) + pause * len(chunks)


class Completion(object):
    """The upload's callable: notes when the completion report arrives."""

    def __init__(self):
        self.done = False
        self.success = False
        self.at = None

    def __call__(self, kind, event, percent, *rest):
        if event == u'UploadComplete':
            self.at = time.time()
            self.done = True
            self.success = bool(rest[0])


def wait_for(completion, timeout=600.0):
    """Runs Python on the main thread, where reports arrive, until the completion."""
    deadline = time.time() + timeout
    while not completion.done:
        if time.time() > deadline:
            raise RuntimeError('no completion report after %.0f s' % timeout)
        time.sleep(UI_TURN)


def median(values):
    ordered = sorted(values)
    return ordered[len(ordered) // 2]


def print_table(header, rows):
    """Columns as wide as their widest cell; the first left-aligned, the rest right."""
    cells = [list(header)] + [[str(cell) for cell in row] for row in rows]
    widths = [max(len(row[i]) for row in cells) for i in range(len(header))]
    for row in cells:
        print('  '.join(cell.ljust(width) if i == 0 else cell.rjust(width)
                        for i, (cell, width) in enumerate(zip(row, widths))))
