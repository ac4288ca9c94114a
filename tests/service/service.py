"""The reference community service: every host's listeners on 80 and 443,
the scripts, the recording and the host states that tests control."""
import glob
import os
import threading

import hosts
from connection import Connection
from default_service import DefaultService
from listener import Listener
from recorder import Recorder
from script_book import ScriptBook
from tls_contexts import TlsContexts

HOST_STATES = ('up', 'down', 'hang')


class Service(object):
    def __init__(self, cert_dir, store_dir):
        self.store_dir = store_dir
        self.recorder = Recorder()
        self.scripts = ScriptBook()
        self.defaults = DefaultService()
        self.tls = TlsContexts(cert_dir)
        self.generation = 0  # moves on at each reset, ending held connections
        self.stopping = False
        self._lock = threading.Lock()
        self._change_lock = threading.Lock()  # one host state change at a time
        self._states = dict((name, 'down') for name in hosts.ADDRESSES)
        self._listeners = {}
        self._live = set()

    def start(self):
        for name in hosts.ADDRESSES:
            self.set_host_state(name, 'up')

    def stop(self):
        self.stopping = True
        for name in hosts.ADDRESSES:
            self.set_host_state(name, 'down')

    def reset(self):
        self.scripts.reset()
        self.recorder.reset()
        self.defaults.reset()
        self.tls.select('good')
        for name in hosts.ADDRESSES:
            self.set_host_state(name, 'up')
        with self._lock:
            self.generation += 1
        for path in glob.glob(os.path.join(self.store_dir, 'request-*')):
            os.unlink(path)

    def host_state(self, host):
        return self._states[host]

    def set_host_state(self, host, state):
        if host not in self._states:
            raise ValueError('unknown host %r' % host)
        if state not in HOST_STATES:
            raise ValueError('unknown host state %r (one of %s)' % (state, ', '.join(HOST_STATES)))
        with self._change_lock:
            self._change_host_state(host, state)

    def _change_host_state(self, host, state):
        with self._lock:
            was = self._states[host]
            self._states[host] = state
            listeners = self._listeners.pop(host, []) if state == 'down' else []
            doomed = [c for c in self._live if c.host == host] if state == 'down' else []
        for listener in listeners:
            listener.close()
        for connection in doomed:
            connection.drop()
        if was == 'down' and state != 'down':
            address = hosts.ADDRESSES[host]
            made = [Listener(self, host, address, hosts.HTTP_PORT, False),
                    Listener(self, host, address, hosts.TLS_PORT, True)]
            with self._lock:
                self._listeners[host] = made

    def connection_accepted(self, sock, host, address, port, tls):
        connection = Connection(self, sock, host, address, port, tls)
        self.recorder.add_connection(connection.info)
        with self._lock:
            self._live.add(connection)
        threading.Thread(target=connection.run, daemon=True,
                         name='conn-%d' % connection.info['id']).start()

    def connection_closed(self, connection):
        with self._lock:
            self._live.discard(connection)
