"""Objects that go away while they are still at work: an uploader whose last
reference goes on another Python thread while the main thread handles its
reports, a session deleted while it signs in, a callable that lets go of
itself during its own call, and a class registered again."""
import os
import subprocess
import sys
import tempfile
import threading
import time
import unittest
import weakref

import _PyUploaderTestPeer as peer
import _PyUploader as native
import PyUploader
from fixtures import (DETECTION_HOST, SERVER_HOST, STAGING_HOST, Reports, Test, UploadTest, pump,
                      wait_until, xml_reply)

DROP_ROUNDS = 300
QUIET_LIMIT = 10  # seconds without a round ending; a round takes some milliseconds
REFUSING_HOST = STAGING_HOST  # taken down: its uploads complete at once, with a failure

# The child process: each round starts an upload, hands the only reference to
# a second thread and lets the main thread take the reports. The second thread
# drops the reference at one of four moments, spinning for it so that it takes
# the interpreter lock as soon as the main thread lets it go: once the
# completion has begun (its trace line is written just before the worker is
# joined), inside a progress callable, inside the completion callable, or after
# a random pause. Afterwards no report may arrive, no worker may be left and the
# callable must be let go.
DROPS = r'''
import os, random, sys, tempfile, threading, time
from fixtures import SESSION, TEXTS, Reports, threads_and_descriptors
from PyUploader import PyPresetUploader

ROUNDS, SERVING, REFUSING = int(sys.argv[1]), sys.argv[2], sys.argv[3]
ROUND_LIMIT = 5.0
TRACE = os.environ['PYUPLOADER_DEBUG_OUTPUT']
folder = tempfile.mkdtemp()
files = [os.path.join(folder, str(i)) for i in range(13)]
for path in files:
    open(path, 'wb').write(os.urandom(700))
threads_before = threads_and_descriptors()[0]


def trace_size():
    return os.path.getsize(TRACE) if os.path.exists(TRACE) else 0


# name, server host, the moment to drop at (None: a random pause)
MOMENTS = [
    ('join', REFUSING, lambda state: trace_size() > state['trace']),
    ('progress', SERVING, lambda state: state['progress']),
    ('callable', REFUSING, lambda state: state['completing']),
    ('any time', REFUSING, None),
]


def note(state, report):
    state['progress' if report[1] == u'ProgressChanged' else 'completing'] = True
    time.sleep(0.001)  # lets the other thread in while the callable runs


def drop(holder, moment, state):
    if moment is None:
        time.sleep(random.uniform(0, 0.003))
    else:
        deadline = time.time() + ROUND_LIMIT
        while not moment(state) and time.time() < deadline:
            pass
    del holder[:]


for number in range(ROUNDS):
    name, host, moment = MOMENTS[number % len(MOMENTS)]
    state = dict(trace=trace_size(), progress=False, completing=False)
    reports = Reports(then=lambda reports, report: note(state, report))
    holder = [PyPresetUploader(unicode(host), *SESSION[1:])]
    holder[0].SetCallback(reports)
    assert holder[0].StartUpload(files[0], files[1:], *TEXTS) == 1
    dropper = threading.Thread(target=drop, args=(holder, moment, state))
    dropper.start()
    deadline = time.time() + ROUND_LIMIT
    while dropper.is_alive():  # Python code runs here, so reports are handled
        assert time.time() < deadline, 'the drop did not end'
    heard = len(reports.items)
    settle = time.time() + 0.005
    while time.time() < settle:
        pass
    assert len(reports.items) == heard, 'a report after the drop'
    assert sys.getrefcount(reports) == 2, 'the callable is still held'
    sys.stdout.write('%d %s\n' % (number, name))
    sys.stdout.flush()
deadline = time.time() + ROUND_LIMIT  # ended threads leave the process soon after
while threads_and_descriptors()[0] != threads_before:
    assert time.time() < deadline, 'a worker thread is left'
'''


def run_watched(code, args, environment, quiet_limit):
    """Runs `code` in a fresh interpreter, which writes a line for each step it
    ends; returns (exit code, stdout, stderr). A child that ends no step for
    `quiet_limit` seconds is killed."""
    with tempfile.TemporaryFile() as out, tempfile.TemporaryFile() as err:
        child = subprocess.Popen([sys.executable, '-c', code] + args, stdout=out, stderr=err,
                                 env=environment)
        written, heard_at = 0, time.time()
        while child.poll() is None:
            time.sleep(0.1)
            if os.fstat(out.fileno()).st_size != written:
                written, heard_at = os.fstat(out.fileno()).st_size, time.time()
            elif time.time() - heard_at > quiet_limit:
                child.kill()
                child.wait()
                err.write('\nkilled: no step ended for %d s' % quiet_limit)
        out.seek(0)
        err.seek(0)
        return child.returncode, out.read(), err.read()


class UploaderDroppedOnAnotherThread(Test):

    def test_drops_in_the_join_the_reports_and_the_callables_neither_hang_nor_crash(self):
        self.svc.host_state(REFUSING_HOST, 'down')
        code, out, err = run_watched(DROPS, [str(DROP_ROUNDS), SERVER_HOST, REFUSING_HOST],
                                     dict(os.environ), QUIET_LIMIT)
        self.assertEqual(code, 0, 'status %d after %d rounds: %s' % (code, out.count('\n'), err))
        self.assertEqual(out.count('\n'), DROP_ROUNDS)


SIGN_IN_REPLY = ('<info><tokenid>T1</tokenid><username>member</username><profileURL>p'
                 '</profileURL><AdjustmentPreset>a</AdjustmentPreset><search>s</search>'
                 '<errMsg></errMsg></info>')
SERVICE_INFO = '<INFO><APIUrl>%s</APIUrl></INFO>' % SERVER_HOST
ANSWER_DELAY = 1.0  # seconds the service keeps the operation waiting


class SessionDeletedWhileItWorks(Test):
    # operation, its arguments, the exchange it waits in, its result
    OPERATIONS = [
        ('LoginOrbishare', (u'member', u'secret'), SERVER_HOST, '/servlet/memLogin',
         SIGN_IN_REPLY, 1),
        ('InitOBServerURL', (), DETECTION_HOST, '/observer.jsp', SERVICE_INFO, None),
    ]

    def test_deleting_waits_for_the_operation_running_on_another_thread(self):
        svc = self.svc
        for name, args, host, path, answer, result in self.OPERATIONS:
            svc.reset()
            svc.script(host, path, [xml_reply(answer, delay=ANSWER_DELAY)])
            session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
            outcome = []
            operation = getattr(native, 'OBLoginData_' + name)
            worker = threading.Thread(target=lambda: outcome.append(operation(session, *args)))
            worker.start()
            wait_until(lambda: svc.requests(host=host, path=path, bodies=False), 10.0,
                       'request of ' + name)
            started = time.time()
            native.delete_OBLoginData(session)
            waited = time.time() - started
            worker.join(10.0)
            self.assertFalse(worker.is_alive(), name)
            self.assertEqual(outcome, [result], name)
            self.assertGreater(waited, ANSWER_DELAY / 2, name)


class CallableLetGoDuringItsCall(UploadTest):
    """The callable's only reference is the uploader's; on its first report it
    lets go of itself and then looks whether it is still alive."""
    WAYS = [
        ('unregisters itself', lambda holder: holder[0].SetCallback(None)),
        ('replaces itself', lambda holder: holder[0].SetCallback(Reports())),
        ('drops its uploader', lambda holder: holder.pop()),
    ]

    def test_the_callable_lives_until_its_call_has_returned_and_no_longer(self):
        for way, let_go in self.WAYS:
            holder = [self.new_uploader()]
            alive_after = []

            def once(*report):
                if not alive_after:
                    let_go(holder)
                    alive_after.append(held() is not None)
            held = weakref.ref(once)
            holder[0].SetCallback(once)
            del once
            self.assertEqual(self.start(uploader=holder[0]), 1, way)
            wait_until(lambda: alive_after, 30.0, 'first report')
            del holder[:]
            pump(0.05)
            self.assertEqual(alive_after, [True], way)
            self.assertIsNone(held(), way)


class ClassRegisteredAgain(unittest.TestCase):

    def tearDown(self):
        native.infoEffectURL_swigregister(PyUploader.infoEffectURL)

    def test_the_replaced_class_is_let_go_and_the_new_one_destroys(self):
        destroyed = []

        class First(object):
            __swig_destroy__ = native.delete_infoEffectURL

        class Second(object):
            @staticmethod
            def __swig_destroy__(record):
                destroyed.append(record)
                native.delete_infoEffectURL(record)

        unregistered = sys.getrefcount(First)
        native.infoEffectURL_swigregister(First)
        registered = sys.getrefcount(First)
        for _ in range(100):
            native.infoEffectURL_swigregister(First)
        self.assertEqual(sys.getrefcount(First), registered)
        native.infoEffectURL_swigregister(Second)
        self.assertEqual(sys.getrefcount(First), unregistered)
        text = peer.new_CString(u'x')
        native.new_infoEffectURL(text, text, text)  # owned, dropped at once
        peer.delete_CString(text)
        self.assertEqual(len(destroyed), 1)


if __name__ == '__main__':
    unittest.main()
