"""The server certificates the service can present: good, expired or made
out for another name. One is in use at a time, for every TLS listener."""
import os
import ssl
import threading

KINDS = ('good', 'expired', 'wrong-name')
KEY_FILE = 'server.key'


class TlsContexts(object):
    def __init__(self, cert_dir):
        self._lock = threading.Lock()
        self._contexts = {}
        for kind in KINDS:
            context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
            context.load_cert_chain(os.path.join(cert_dir, kind + '.pem'),
                                    os.path.join(cert_dir, KEY_FILE))
            self._contexts[kind] = context
        self._current = 'good'

    def select(self, kind):
        if kind not in self._contexts:
            raise ValueError('unknown certificate %r (one of %s)' % (kind, ', '.join(KINDS)))
        with self._lock:
            self._current = kind

    @property
    def current(self):
        return self._current

    def wrap(self, sock):
        with self._lock:
            context = self._contexts[self._current]
        return context.wrap_socket(sock, server_side=True)
