"""Streaming multipart/form-data parser.

Bytes are fed in as they arrive; file parts go to temporary files while they
stream, so the size of an upload does not matter. Every part is recorded with
its raw header block, name, file name, content type, size and SHA-256; small
contents are kept inline as well.
"""
import hashlib
import os

INLINE_LIMIT = 64 * 1024
MAX_PART_HEAD = 16 * 1024
MAX_PADDING = 64


class MultipartParser(object):
    def __init__(self, boundary, store_dir, prefix):
        # The first delimiter may open the body directly: a leading CRLF makes
        # it look like every other one.
        self._delimiter = b'\r\n--' + boundary
        self._boundary = boundary
        self._store_dir = store_dir
        self._prefix = prefix
        self._buffer = bytearray(b'\r\n')
        self._state = self._in_preamble
        self._part = None
        self.parts = []
        self.complete = False
        self.error = None

    def feed(self, data):
        if self._state is None:
            return
        self._buffer += data
        while self._state is not None and self._state():
            pass

    def finish(self):
        if self._part is not None:
            self._part.close()
            self._part = None
        if not self.complete and self.error is None:
            self.error = 'body ended before the closing delimiter'
        self._state = None

    def to_json(self, contents=True):
        return {'boundary': self._boundary, 'parts': [p.to_json(contents) for p in self.parts],
                'complete': self.complete, 'error': self.error}

    # Each state consumes what it can and says whether it made progress.

    def _in_preamble(self):
        at = self._buffer.find(self._delimiter)
        if at < 0:
            self._keep_tail()
            return False
        del self._buffer[:at + len(self._delimiter)]
        self._state = self._after_delimiter
        return True

    def _after_delimiter(self):
        if len(self._buffer) < 2:
            return False
        if self._buffer[:2] == b'--':
            self.complete = True
            self._state = None
            return False
        line_end = self._buffer.find(b'\r\n', 0, MAX_PADDING)
        if line_end < 0:
            return self._fail_if(len(self._buffer) >= MAX_PADDING, 'garbage after a delimiter')
        if self._buffer[:line_end].strip(b' \t'):
            return self._fail_if(True, 'garbage after a delimiter')
        del self._buffer[:line_end + 2]
        self._state = self._in_part_head
        return True

    def _in_part_head(self):
        end = self._buffer.find(b'\r\n\r\n')
        if end < 0:
            return self._fail_if(len(self._buffer) > MAX_PART_HEAD, 'part head too long')
        head = bytes(self._buffer[:end + 4])
        del self._buffer[:end + 4]
        self._part = self._open_part(head)
        self.parts.append(self._part)
        self._state = self._in_part_data
        return True

    def _in_part_data(self):
        at = self._buffer.find(self._delimiter)
        if at < 0:
            safe = len(self._buffer) - (len(self._delimiter) - 1)
            if safe > 0:
                self._part.write(bytes(self._buffer[:safe]))
                del self._buffer[:safe]
            return False
        self._part.write(bytes(self._buffer[:at]))
        self._part.close()
        self._part = None
        del self._buffer[:at + len(self._delimiter)]
        self._state = self._after_delimiter
        return True

    def _keep_tail(self):
        surplus = len(self._buffer) - (len(self._delimiter) - 1)
        if surplus > 0:
            del self._buffer[:surplus]

    def _fail_if(self, condition, message):
        if condition:
            self.error = message
            self._state = None
        return False

    def _open_part(self, head):
        name, filename, content_type = parse_part_head(head)
        path = None
        if filename is not None:
            path = os.path.join(self._store_dir, '%s-%d' % (self._prefix, len(self.parts)))
        return Part(head, name, filename, content_type, path)


def parse_part_head(head):
    """Name, file name (None for a field) and content type of a part head.

    Nothing in these heads is escaped, so a quote may sit inside a name or a
    path: the name runs up to '"; filename="' (or the line's last quote), the
    file name up to the line's last quote."""
    name = filename = content_type = None
    for line in head.split(b'\r\n'):
        key, _, value = line.partition(b':')
        key = key.strip().lower()
        if key == b'content-disposition':
            name, filename = _parse_disposition(value.strip())
        elif key == b'content-type':
            content_type = value.strip()
    return name, filename, content_type


def _parse_disposition(value):
    name_at = value.find(b'name="')
    if name_at < 0:
        return None, None
    rest = value[name_at + len(b'name="'):]
    file_marker = b'"; filename="'
    split = rest.find(file_marker)
    if split < 0:
        return rest[:rest.rfind(b'"')] if b'"' in rest else rest, None
    filename = rest[split + len(file_marker):]
    if filename.endswith(b'"'):
        filename = filename[:-1]
    return rest[:split], filename


class Part(object):
    """One part of the body: a field held in memory or a file on disk."""

    def __init__(self, head, name, filename, content_type, path):
        self.head = head
        self.name = name
        self.filename = filename
        self.content_type = content_type
        self.path = path
        self.size = 0
        self._inline = bytearray()
        self._sha256 = hashlib.sha256()
        self._file = open(path, 'wb') if path else None

    def write(self, data):
        if not data:
            return
        self.size += len(data)
        self._sha256.update(data)
        room = INLINE_LIMIT - len(self._inline)
        if room > 0:
            self._inline += data[:room]
        if self._file:
            self._file.write(data)

    @property
    def content(self):
        """The first INLINE_LIMIT bytes of the part's data."""
        return bytes(self._inline)

    def close(self):
        if self._file:
            self._file.close()
            self._file = None

    def to_json(self, contents=True):
        return {'kind': 'field' if self.filename is None else 'file',
                'head': self.head, 'name': self.name, 'filename': self.filename,
                'content_type': self.content_type, 'size': self.size,
                'sha256': self._sha256.hexdigest(), 'content': self.content if contents else None,
                'inline': self.size <= INLINE_LIMIT, 'path': self.path}
