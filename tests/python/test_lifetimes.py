"""Objects that go away while they are still at work: an uploader dropped on another
Python thread while the main thread handles its reports, a session deleted while it
signs in, a callable that lets go of itself during its call, a class registered again."""
# ctest timeout: 75
import sys
import threading
import time
import unittest
import weakref

import _PyUploader as native
import PyUploader
from fixtures import (DETECTION_HOST, SERVER_HOST, STAGING_HOST, Test, UploadTest, pump,
                      run_python, wait_until, xml_reply)

DROP_ROUNDS = 300
REFUSING_HOST = STAGING_HOST  # taken down: its uploads complete at once, with a failure

# The child: each round starts an upload, hands the only reference to a second thread
# and lets the main thread take the reports. The second thread drops the reference at
# one of four moments, spinning for it so that it takes the interpreter lock as soon as
# the main thread lets it go: once the completion has begun (its trace line is written
# just before the worker is joined), inside a progress callable, inside the completion
# callable, or after a random pause. Afterwards no report may arrive, no worker may be
# left and the callable must be let go.
DROPS = r'''
import os, random, sys, tempfile, threading, time
from fixtures import SESSION, TEXTS, Reports, counts, text_type
from PyUploader import PyPresetUploader

ROUNDS, SERVING, REFUSING = int(sys.argv[1]), sys.argv[2], sys.argv[3]
TRACE = os.environ['PYUPLOADER_DEBUG_OUTPUT']
files = [os.path.join(tempfile.mkdtemp(), str(i)) for i in range(13)]
for path in files:
    with open(path, 'wb') as out:
        out.write(os.urandom(700))
threads_before = counts()[0]


def trace_size():
    return os.path.getsize(TRACE) if os.path.exists(TRACE) else 0


def spin(condition, limit=5.0):
    deadline = time.time() + limit
    while not condition() and time.time() < deadline:
        pass
    return condition()


# name, server host, the moment to drop at
MOMENTS = [('join', REFUSING, lambda state: trace_size() > state['trace']),
           ('progress', SERVING, lambda state: state['progress']),
           ('callable', REFUSING, lambda state: state['completing']),
           ('any time', REFUSING, lambda state: time.time() > state['at'])]


def note(state, report):
    state['progress' if report[1] == u'ProgressChanged' else 'completing'] = True
    time.sleep(0.001)  # lets the other thread in while the callable runs


def drop(holder, moment, state):
    spin(lambda: moment(state))
    del holder[:]


for number in range(ROUNDS):
    name, host, moment = MOMENTS[number % len(MOMENTS)]
    state = dict(trace=trace_size(), progress=False, completing=False,
                 at=time.time() + random.uniform(0, 0.003))
    reports = Reports(then=lambda reports, report: note(state, report))
    holder = [PyPresetUploader(text_type(host), *SESSION[1:])]
    holder[0].SetCallback(reports)
    assert holder[0].StartUpload(files[0], files[1:], *TEXTS) == 1
    dropper = threading.Thread(target=drop, args=(holder, moment, state))
    dropper.start()
    assert spin(lambda: not dropper.is_alive()), 'the drop did not end'  # reports are handled meanwhile
    heard = len(reports.items)
    spin(lambda: False, 0.005)
    assert len(reports.items) == heard, 'a report after the drop'
    assert sys.getrefcount(reports) == 2, 'the callable is still held'
    sys.stdout.write('%d %s\n' % (number, name))
    sys.stdout.flush()
assert spin(lambda: counts()[0] == threads_before), 'a worker thread is left'  # threads leave soon after
'''
SIGN_IN_REPLY = '<info><tokenid>T1</tokenid><username>member</username></info>'
ANSWER_DELAY = 1.0  # seconds the service keeps the operation waiting


class WhileAtWork(Test):

    def test_drops_in_the_join_the_reports_and_the_callables_neither_hang_nor_crash(self):
        self.svc.host_state(REFUSING_HOST, 'down')
        code, out, err = run_python(DROPS, str(DROP_ROUNDS), SERVER_HOST, REFUSING_HOST, timeout=45)
        self.assertEqual((code, out.count('\n')), (0, DROP_ROUNDS), err)

    def test_deleting_a_session_waits_for_the_operation_running_on_another_thread(self):
        for name, args, host, path, answer, result in [
                ('LoginOrbishare', (u'member', u'secret'), SERVER_HOST, '/servlet/memLogin', SIGN_IN_REPLY, 1),
                ('InitOBServerURL', (), DETECTION_HOST, '/observer.jsp',
                 '<INFO><APIUrl>%s</APIUrl></INFO>' % SERVER_HOST, None)]:
            self.svc.reset()
            self.svc.script(host, path, [xml_reply(answer, delay=ANSWER_DELAY)])
            session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
            outcome, operation = [], getattr(native, 'OBLoginData_' + name)
            worker = threading.Thread(target=lambda: outcome.append(operation(session, *args)))
            worker.start()
            wait_until(lambda: self.svc.requests(host=host, path=path, bodies=False), 10.0, 'request of ' + name)
            started = time.time()
            native.delete_OBLoginData(session)
            waited = time.time() - started
            worker.join(10.0)
            self.assertEqual((worker.is_alive(), outcome, waited > ANSWER_DELAY / 2), (False, [result], True), name)

    def test_a_class_registered_again_is_held_once_and_let_go_for_another(self):
        self.addCleanup(native.infoEffectURL_swigregister, PyUploader.infoEffectURL)
        first, second = type('First', (object,), {}), type('Second', (object,), {})
        unregistered = sys.getrefcount(first)
        native.infoEffectURL_swigregister(first)
        registered = sys.getrefcount(first)
        native.infoEffectURL_swigregister(first)
        again = sys.getrefcount(first)
        native.infoEffectURL_swigregister(second)
        self.assertEqual((registered > unregistered, again, sys.getrefcount(first)),
                         (True, registered, unregistered))


class CallableLetGoDuringItsCall(UploadTest):

    def test_the_callable_lives_until_its_call_has_returned_and_no_longer(self):
        # Its only reference is the uploader's; on its first report it lets go of itself.
        for way, let_go in [('unregisters itself', lambda holder: holder[0].SetCallback(None)),
                            ('replaces itself', lambda holder: holder[0].SetCallback(self.reports)),
                            ('drops its uploader', lambda holder: holder.pop())]:
            holder, alive_after = [self.new_uploader()], []

            def once(*report):
                if not alive_after:
                    let_go(holder)
                    alive_after.append(held() is not None)
            held = weakref.ref(once)
            holder[0].SetCallback(once)
            del once
            self.assertEqual(self.start(uploader=holder[0]), 1, way)
            wait_until(lambda: alive_after, 30.0, 'first report')
            if way == 'replaces itself':  # the new callable gets the rest
                self.assertEqual(self.completion()[3:5], (1, u'http://api.orbishare.com/template/view.jsp?id=5001'))
            del holder[:]
            pump(0.05)
            self.assertEqual((alive_after, held()), ([True], None), way)


if __name__ == '__main__':
    unittest.main()
