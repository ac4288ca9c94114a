"""A listening socket of one host on one port, with its accepting thread."""
import logging
import socket
import threading

BACKLOG = 128

log = logging.getLogger('refservice')


class Listener(object):
    def __init__(self, service, host, address, port, tls):
        self._service = service
        self._host, self._address, self._port, self._tls = host, address, port, tls
        self._sock = socket.socket(socket.AF_INET, socket.SOCK_STREAM)
        self._sock.setsockopt(socket.SOL_SOCKET, socket.SO_REUSEADDR, 1)
        self._sock.bind((address, port))
        self._sock.listen(BACKLOG)
        self._thread = threading.Thread(target=self._accept_loop, daemon=True,
                                         name='listen-%s:%d' % (host, port))
        self._thread.start()

    def close(self):
        """Stops listening: new connections are refused from now on."""
        try:
            self._sock.shutdown(socket.SHUT_RDWR)  # wakes the blocked accept
        except OSError:
            pass
        self._sock.close()
        self._thread.join()

    def _accept_loop(self):
        while True:
            try:
                sock, _ = self._sock.accept()
            except OSError:
                return
            # A reply goes out in several writes; without this, each write after
            # the first waits for the client's delayed acknowledgement (40 ms).
            sock.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
            self._service.connection_accepted(sock, self._host, self._address,
                                              self._port, self._tls)
