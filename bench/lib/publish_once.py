"""Publishes one preset through the module and prints, as one JSON line, what it
cost from StartUpload to the completion report: wall and CPU seconds (all
threads), and the resident memory before the upload and at its peak.

    publish_once.py PRESET IMAGE1 ... IMAGE12
"""
import json
import resource
import sys
import time

from PyUploader import PyPresetUploader
import bench_support


def cpu_seconds():
    usage = resource.getrusage(resource.RUSAGE_SELF)
    return usage.ru_utime, usage.ru_stime


def publish(paths):
    uploader = PyPresetUploader(*bench_support.SESSION)
    completion = bench_support.Completion()
    uploader.SetCallback(completion)
    idle_kib = bench_support.memory_kib('VmRSS')
    bench_support.reset_peak_memory()
    user, system = cpu_seconds()
    start = time.time()
    if not uploader.StartUpload(paths[0], paths[1:], *bench_support.TEXTS):
        raise SystemExit('the upload could not be started')
    bench_support.wait_for(completion)
    end_user, end_system = cpu_seconds()
    return {'wall': completion.at - start, 'user': end_user - user, 'system': end_system - system,
            'idle_kib': idle_kib, 'peak_kib': bench_support.memory_kib('VmHWM'),
            'success': completion.success}


if __name__ == '__main__':
    print(json.dumps(publish([bench_support.argument_text(path) for path in sys.argv[1:]])))
