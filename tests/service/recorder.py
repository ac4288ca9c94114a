"""Keeps every request and connection the service saw, in arrival order."""
import hashlib
import itertools
import threading
import time

BODY_INLINE_LIMIT = 8 * 1024 * 1024


class Record(object):
    """One request: its head as it arrived, its body, and what was answered.

    The body is kept whole up to BODY_INLINE_LIMIT; its size and SHA-256
    always cover all of it."""

    def __init__(self, seq, connection, head):
        self.seq = seq
        self.connection = connection
        self.head = head
        self.time = time.time()
        self.body = bytearray()
        self.body_size = 0
        self.wire_size = 0
        self._sha256 = hashlib.sha256()
        self.complete = False
        self.error = None
        self.upload = None
        self.reply_status = None

    def add_body(self, wire, data):
        self.wire_size += len(wire)
        if data:
            self.body_size += len(data)
            self._sha256.update(data)
            room = BODY_INLINE_LIMIT - len(self.body)
            if room > 0:
                self.body += data[:room]

    def to_json(self, bodies=True):
        """The record for the control interface; without bodies, the body and
        the parts' contents are left out (for cheap polling)."""
        head = self.head
        info = self.connection.info
        return {
            'seq': self.seq, 'time': self.time, 'connection': info['id'],
            'host': info['host'], 'address': info['address'], 'port': info['port'],
            'tls': info['tls'],
            'method': head.method, 'target': head.target, 'path': head.path,
            'query': head.query, 'version': head.version,
            'headers': [[k, v] for k, v in head.headers], 'head': head.raw,
            'chunked': head.is_chunked(), 'body': bytes(self.body) if bodies else None,
            'body_size': self.body_size, 'body_sha256': self._sha256.hexdigest(),
            'body_truncated': self.body_size > len(self.body), 'wire_size': self.wire_size,
            'complete': self.complete, 'error': self.error,
            'upload': self.upload.to_json(bodies) if self.upload else None,
            'reply_status': self.reply_status,
        }


class Recorder(object):
    def __init__(self):
        self._lock = threading.Lock()
        self._requests = []
        self._connections = []
        self._request_seq = itertools.count(1)
        self._connection_seq = itertools.count(1)

    def reset(self):
        with self._lock:
            self._requests = []
            self._connections = []

    def add_connection(self, info):
        """Registers a connection's info dict and gives it its id."""
        with self._lock:
            info['id'] = next(self._connection_seq)
            self._connections.append(info)

    def begin_request(self, connection, head):
        with self._lock:
            record = Record(next(self._request_seq), connection, head)
            self._requests.append(record)
            connection.info['requests'] += 1
            return record

    def requests(self, host=None, path=None, since=0, bodies=True):
        with self._lock:
            records = list(self._requests)
        return [r.to_json(bodies) for r in records
                if r.seq > since and host in (None, r.connection.info['host'])
                and path in (None, r.head.path)]

    def connections(self, host=None):
        with self._lock:
            return [dict(c) for c in self._connections if host in (None, c['host'])]
