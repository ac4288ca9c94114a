"""Publishes the same preset through the module and with `curl -F` to the same
endpoint of the reference service, and compares what each costs. Runs inside
the network sandbox (bench/upload).

For each size and run: the module in a fresh Python 2.7 process (the demo's
companion module; bench/lib/publish_once.py), once with the default pause after
each chunk and once with the pause set to 0, then curl with the fifteen fields
the service received from the module and the same fourteen files. The service's
record of each upload shows that all sent the same parts.
"""
import argparse
import json
import os
import shutil
import subprocess
import sys
import tempfile
import time

import bench_support as bs
from fixtures import RefService, SERVER_HOST

UPLOAD_PATH = '/servlet/uploadTemplate'
UPLOAD_URL = 'http://%s%s' % (SERVER_HOST, UPLOAD_PATH)
PUBLISH_ONCE = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'publish_once.py')
KB = 1000
# name, preset file size, size of each of the twelve images
SIZES = [('realistic', 100 * KB, 300 * KB), ('large', bs.GiB, 300 * KB)]
# The module's file parts, in wire order: the first image goes twice.
FILE_FIELDS = ['PIPfile', 'PIPimg'] + ['PIPimg_%d' % n for n in range(1, bs.IMAGE_COUNT + 1)]
OVERHEAD_TARGET = 0.05  # of the module's wall time, above the pacing floor
CPU_RATIO_TARGET = 1.5  # module's CPU per GiB over curl's
GROWTH_TARGET_MIB = 24  # the module process's peak over its idle size
NO_PAUSE_WALL_TARGETS = {'realistic': 1.25, 'large': 1.1}  # module's wall at pause 0 over curl's
SIDES = ['module', 'module, pause 0', 'curl']


def file_parts(paths):
    return zip(FILE_FIELDS, [paths[0], paths[1]] + paths[1:])


def publish_with_module(paths, chunk_log, pause_ms=None):
    """pause_ms None keeps the engine's default pause."""
    if os.path.exists(chunk_log):
        os.remove(chunk_log)
    env = dict(os.environ, **{bs.CHUNK_LOG_VARIABLE: chunk_log})
    env.pop(bs.CHUNK_PAUSE_VARIABLE, None)
    pause = bs.PAUSE_AFTER_CHUNK
    if pause_ms is not None:
        env[bs.CHUNK_PAUSE_VARIABLE] = str(pause_ms)
        pause = pause_ms / 1000.0
    output = subprocess.check_output([sys.executable, PUBLISH_ONCE] + paths, env=env)
    run = json.loads(output.splitlines()[-1])
    chunks = bs.read_chunk_log(chunk_log)
    run.update(floor=bs.pacing_floor(chunks, pause), chunks=len(chunks))
    return run


def curl_command(fields, paths):
    command = ['curl', '-sS', '-o', '/dev/null', '-w', '%{http_code}', '-H', 'Expect:']
    for name, value in fields:
        command += ['--form-string', '%s=%s' % (name, value)]
    for name, path in file_parts(paths):
        command += ['-F', '%s=@%s;filename=%s;type=application/octet-stream' % (name, path, path)]
    return command + [UPLOAD_URL]


def publish_with_curl(fields, paths):
    start = time.time()
    process = subprocess.Popen(curl_command(fields, paths), stdout=subprocess.PIPE)
    status_line = process.stdout.read()
    _, status, usage = os.wait4(process.pid, 0)
    process.returncode = status
    return {'wall': time.time() - start, 'user': usage.ru_utime, 'system': usage.ru_stime,
            'peak_kib': usage.ru_maxrss, 'success': status == 0 and status_line == '200'}


def received(svc, bodies=False):
    """The service's record of the last upload: sizes and each part's head and digest."""
    record = svc.requests(host=SERVER_HOST, path=UPLOAD_PATH, bodies=bodies)[-1]
    upload = record.upload
    delimiters = len(upload.parts) + 1
    return {'body_size': record.body_size, 'complete': upload.complete,
            'without_boundary': record.body_size - delimiters * len(upload.boundary),
            'parts': [(p.head, p.size, p.sha256) for p in upload.parts],
            'fields': upload.fields}


def run_size(svc, folder, preset_size, image_size, repeat):
    """The runs of each side, by side."""
    paths = bs.make_preset_files(folder, preset_size, image_size)
    chunk_log = os.path.join(folder, 'chunks.log')
    runs, fields = dict((side, []) for side in SIDES), None
    for _ in range(repeat):
        svc.reset()
        module = publish_with_module(paths, chunk_log)
        module['received'] = received(svc, bodies=fields is None)
        fields = fields or module['received']['fields']
        svc.reset()
        no_pause = publish_with_module(paths, chunk_log, pause_ms=0)
        no_pause['received'] = received(svc)
        svc.reset()
        curl = publish_with_curl(fields, paths)
        curl['received'] = received(svc)
        for side, run in zip(SIDES, (module, no_pause, curl)):
            runs[side].append(run)
    svc.reset()
    return runs


def summarize(runs, payload):
    """Medians of the runs of one side."""
    pick = lambda key: bs.median([run[key] for run in runs])
    cpu = bs.median([run['user'] + run['system'] for run in runs])
    summary = {'wall': pick('wall'), 'cpu': cpu, 'cpu_per_gib': cpu / (payload / float(bs.GiB)),
               'peak_mib': pick('peak_kib') / 1024.0,
               'body': runs[0]['received']['body_size'],
               'ok': all(run['success'] and run['received']['complete'] for run in runs)}
    if 'floor' in runs[0]:
        summary.update(growth_mib=bs.median([run['peak_kib'] - run['idle_kib'] for run in runs])
                       / 1024.0, floor=pick('floor'), chunks=pick('chunks'),
                       overhead=bs.median([(run['wall'] - run['floor']) / run['wall']
                                           for run in runs]))
    return summary


def same_bytes(runs):
    """All sides sent the same parts, and the same body apart from the boundary."""
    shapes = set((json.dumps(run['received']['parts']), run['received']['without_boundary'])
                 for side in SIDES for run in runs[side])
    return len(shapes) == 1


def table_rows(name, summaries, same):
    rows = []
    for side in SIDES:
        s = summaries[side]
        rows.append([name, side, '%.3f' % s['wall'], '%.3f' % s['cpu'], '%.3f' % s['cpu_per_gib'],
                     '%.1f' % s['peak_mib'],
                     '%.1f' % s['growth_mib'] if 'growth_mib' in s else '-',
                     '{:,}'.format(s['body']), 'yes' if same else 'NO',
                     '%d' % s['chunks'] if 'chunks' in s else '-',
                     '%.3f' % s['floor'] if 'floor' in s else '-',
                     '%.1f%%' % (100 * s['overhead']) if 'overhead' in s else '-',
                     'ok' if s['ok'] else 'FAILED'])
    return rows


def verdict(value, met):
    return '%s %s' % (value, 'met' if met else 'MISSED')


def print_targets(results):
    overheads, cpus, growths, walls, ratios = [], [], [], [], []
    for name, summaries, _ in results:
        module, no_pause, curl = [summaries[side] for side in SIDES]
        cpu_ratio = module['cpu_per_gib'] / curl['cpu_per_gib']
        no_pause_cpu_ratio = no_pause['cpu_per_gib'] / curl['cpu_per_gib']
        no_pause_wall_ratio = no_pause['wall'] / curl['wall']
        overheads.append('%s %s' % (name, verdict('%.1f%%' % (100 * module['overhead']),
                                                  module['overhead'] < OVERHEAD_TARGET)))
        cpus.append('%s %s, pause 0 %s' % (
            name, verdict('%.2fx' % cpu_ratio, cpu_ratio <= CPU_RATIO_TARGET),
            verdict('%.2fx' % no_pause_cpu_ratio, no_pause_cpu_ratio <= CPU_RATIO_TARGET)))
        growths.append('%s %s' % (name, verdict('%.1f MiB' % module['growth_mib'],
                                                module['growth_mib'] <= GROWTH_TARGET_MIB)))
        walls.append('%s %s (target %.2fx)' % (
            name, verdict('%.2fx' % no_pause_wall_ratio,
                          no_pause_wall_ratio <= NO_PAUSE_WALL_TARGETS[name]),
            NO_PAUSE_WALL_TARGETS[name]))
        ratios.append(('%s wall %.2f cpu %.2f floor/wall %.3f growth_mib %.1f'
                       ' pause-0 wall %.2f cpu %.2f')
                      % (name, module['wall'] / curl['wall'], cpu_ratio,
                         module['floor'] / module['wall'], module['growth_mib'],
                         no_pause_wall_ratio, no_pause_cpu_ratio))
    print('targets:')
    print('  overhead above the pacing floor < %d%% of wall: %s' % (100 * OVERHEAD_TARGET,
                                                                   ', '.join(overheads)))
    print('  CPU per GiB <= %.1fx curl\'s: %s' % (CPU_RATIO_TARGET, ', '.join(cpus)))
    print('  peak memory growth <= %d MiB: %s' % (GROWTH_TARGET_MIB, ', '.join(growths)))
    print('  wall at pause 0 over curl\'s: %s' % ', '.join(walls))
    print('ratios (module/curl): %s' % ' | '.join(ratios))


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument('--repeat', type=int, default=3, help='runs of each side per size')
    parser.add_argument('--only', choices=[name for name, _, _ in SIZES])
    args = parser.parse_args()
    svc = RefService()
    results = []
    for name, preset_size, image_size in SIZES:
        if args.only and name != args.only:
            continue
        folder = tempfile.mkdtemp(prefix='bench-upload-')
        try:
            runs = run_size(svc, folder, preset_size, image_size, args.repeat)
        finally:
            shutil.rmtree(folder, ignore_errors=True)
        payload = preset_size + (bs.IMAGE_COUNT + 1) * image_size
        results.append((name, dict((side, summarize(runs[side], payload)) for side in SIDES),
                        same_bytes(runs)))
    print('upload of a preset (fifteen fields, fourteen files) to %s, medians of %d runs per side'
           % (UPLOAD_URL, args.repeat))
    print('sizes: realistic = 100 KB preset + 12 x 300 KB images; large = 1 GiB preset + the same')
    print('wall and CPU (user + system): module from StartUpload to the completion report, '
           'curl for its whole process')
    rows = []
    for name, summaries, same in results:
        rows += table_rows(name, summaries, same)
    bs.print_table(['size', 'side', 'wall s', 'cpu s', 'cpu s/GiB', 'peak MiB', 'growth MiB',
                    'body bytes', 'same parts', 'chunks', 'floor s', 'above floor', 'result'], rows)
    print_targets(results)
    return 0 if all(same and all(s['ok'] for s in summaries.values())
                    for _, summaries, same in results) else 1


if __name__ == '__main__':
    sys.exit(main())
