"""Reads HTTP/1.1 requests from a buffered binary stream.

The head is kept byte for byte as it arrived; the body is handed on in pieces
as it is read (Content-Length or chunked), so a body of any size streams
through without being held in memory.
"""
import time

MAX_HEAD_BYTES = 64 * 1024
MAX_LINE_BYTES = 16 * 1024
READ_BLOCK = 64 * 1024
THROTTLE_TICK = 0.05  # seconds between the pieces of a slow read


class BadRequest(Exception):
    """The client sent something that is not an HTTP request."""


class ClientGone(Exception):
    """The client closed the connection before the body was complete."""


class StopReading(Exception):
    """A body consumer wants no more bytes: the connection is to be dropped."""


class RequestHead(object):
    def __init__(self, raw, method, target, version, headers):
        self.raw = raw
        self.method = method
        self.target = target
        self.version = version
        self.headers = headers  # [(name, value)] in arrival order, latin-1 text

    def header(self, name):
        """Value of the first header of that name (any letter case), or None."""
        wanted = name.lower()
        for key, value in self.headers:
            if key.lower() == wanted:
                return value
        return None

    @property
    def path(self):
        path = self.target.split('?', 1)[0]
        # The detection page is requested without a leading slash as well.
        return path if path.startswith('/') else '/' + path

    @property
    def query(self):
        parts = self.target.split('?', 1)
        return parts[1] if len(parts) == 2 else ''

    def wants_close(self):
        connection = (self.header('Connection') or '').lower()
        if self.version == 'HTTP/1.0':
            return 'keep-alive' not in connection
        return 'close' in connection

    def is_chunked(self):
        coding = self.header('Transfer-Encoding')
        return coding is not None and coding.lower().split(',')[-1].strip() == 'chunked'

    def content_length(self):
        values = set(v.strip() for k, v in self.headers if k.lower() == 'content-length')
        if not values:
            return 0
        value = values.pop()
        if values or not value.isdigit():
            raise BadRequest('bad Content-Length')
        return int(value)


class RequestReader(object):
    def __init__(self, stream):
        self._stream = stream

    def read_head(self):
        """The next request head, or None when the client closed cleanly first."""
        raw = bytearray()
        line = self._read_line(raw)
        while line in (b'\r\n', b'\n'):  # stray line breaks between requests
            del raw[:]
            line = self._read_line(raw)
        if not line:
            return None
        method, target, version = self._parse_request_line(line)
        headers = []
        while True:
            line = self._read_line(raw)
            if not line:
                raise ClientGone('closed inside the request head')
            if line in (b'\r\n', b'\n'):
                break
            self._add_header(headers, line)
        return RequestHead(bytes(raw), method, target, version, headers)

    def read_body(self, head, consume, rate=None):
        """Reads the body, calling consume(wire_bytes, data_bytes) per piece.

        rate limits reading to about that many bytes per second."""
        pacer = _Pacer(rate)
        if head.is_chunked():
            self._read_chunked(consume, pacer)
        else:
            self._read_counted(head.content_length(), consume, pacer)

    def _read_counted(self, length, consume, pacer):
        left = length
        while left > 0:
            piece = self._stream.read1(min(left, pacer.block()))
            if not piece:
                raise ClientGone('closed after %d of %d body bytes' % (length - left, length))
            left -= len(piece)
            consume(piece, piece)
            pacer.took(len(piece))

    def _read_chunked(self, consume, pacer):
        while True:
            size_line = self._read_line(bytearray())
            if not size_line:
                raise ClientGone('closed inside a chunk size line')
            size = self._parse_chunk_size(size_line)
            consume(size_line, b'')
            if size == 0:
                break
            left = size
            while left > 0:
                piece = self._stream.read1(min(left, pacer.block()))
                if not piece:
                    raise ClientGone('closed inside a chunk')
                left -= len(piece)
                consume(piece, piece)
                pacer.took(len(piece))
            end = self._stream.read(2)
            consume(end, b'')
            if end != b'\r\n':
                raise BadRequest('chunk not followed by CRLF')
        while True:  # trailer fields up to the empty line
            line = self._read_line(bytearray())
            consume(line, b'')
            if not line:
                raise ClientGone('closed inside the chunked trailer')
            if line in (b'\r\n', b'\n'):
                return

    def _read_line(self, raw):
        line = self._stream.readline(MAX_LINE_BYTES + 1)
        if len(line) > MAX_LINE_BYTES or len(raw) + len(line) > MAX_HEAD_BYTES:
            raise BadRequest('request head too long')
        raw += line
        return line

    @staticmethod
    def _parse_request_line(line):
        words = line.rstrip(b'\r\n').decode('latin-1').split(' ')
        if len(words) < 3 or not words[-1].startswith('HTTP/1.'):
            raise BadRequest('bad request line')
        # A target holding unescaped spaces is kept whole, as it was sent.
        return words[0], ' '.join(words[1:-1]), words[-1]

    @staticmethod
    def _add_header(headers, line):
        text = line.rstrip(b'\r\n').decode('latin-1')
        if text[:1] in (' ', '\t') and headers:
            name, value = headers[-1]
            headers[-1] = (name, value + ' ' + text.strip())
            return
        name, colon, value = text.partition(':')
        if not colon or not name or name != name.strip():
            raise BadRequest('bad header line')
        headers.append((name, value.strip()))

    @staticmethod
    def _parse_chunk_size(line):
        digits = line.split(b';', 1)[0].strip()
        try:
            return int(digits, 16)
        except ValueError:
            raise BadRequest('bad chunk size')


class _Pacer(object):
    """Spaces out reads so that about `rate` bytes arrive each second."""

    def __init__(self, rate):
        self._rate = rate
        self._start = time.monotonic()
        self._taken = 0

    def block(self):
        if not self._rate:
            return READ_BLOCK
        return max(1, min(READ_BLOCK, int(self._rate * THROTTLE_TICK)))

    def took(self, count):
        if not self._rate:
            return
        self._taken += count
        due = self._start + self._taken / float(self._rate)
        wait = due - time.monotonic()
        if wait > 0:
            time.sleep(wait)
