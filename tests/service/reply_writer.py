"""Sends a reply as a script describes it: at once or late, whole or in
pieces, framed by Content-Length, chunked or by closing, or cut short."""
import base64
import time
from http import HTTPStatus

DEFAULT_PAUSE = 0.1


class ReplyWriter(object):
    def __init__(self, sock):
        self._sock = sock
        self._budget = None  # bytes still allowed by close_after

    def send(self, reply, head):
        """Sends the reply to the request; says whether the connection stays open."""
        time.sleep(reply.get('delay', 0))
        self._budget = reply.get('close_after')
        if 'raw_b64' in reply:
            self._write(base64.b64decode(reply['raw_b64']))
            return False
        body = b'' if head.method == 'HEAD' else self._body(reply)
        pieces = self._split(body, reply.get('pieces'))
        if reply.get('chunked'):
            pieces = [b'%x\r\n%s\r\n' % (len(p), p) for p in pieces if p] + [b'0\r\n\r\n']
        pieces[0] = self._head(reply, body, head) + pieces[0]
        pause = reply.get('pause', DEFAULT_PAUSE)
        if reply.get('drip'):
            pieces, pause = self._drip(b''.join(pieces), reply['drip'])
        for index, piece in enumerate(pieces):
            if index:
                time.sleep(pause)
            if not self._write(piece):
                return False
        return not (reply.get('no_length') or self._budget is not None or head.wants_close()
                    or self._says_close(reply))

    @staticmethod
    def _body(reply):
        if 'body_b64' in reply:
            return base64.b64decode(reply['body_b64'])
        body = reply.get('body', b'')
        return body.encode('utf-8') if isinstance(body, str) else body

    @staticmethod
    def _split(body, pieces):
        """The body in pieces: a count of near-equal pieces or a list of sizes
        (what the sizes leave over is the last piece)."""
        if not pieces:
            return [body]
        if isinstance(pieces, int):
            step = -(-len(body) // pieces) or 1
            sizes = [step] * (pieces - 1)
        else:
            sizes = list(pieces)
        out, at = [], 0
        for size in sizes:
            out.append(body[at:at + size])
            at += size
        out.append(body[at:])
        return [p for p in out if p] or [b'']

    @staticmethod
    def _drip(data, bytes_per_second):
        """The whole reply, head included, a byte at a time at that rate."""
        return [data[i:i + 1] for i in range(len(data))], 1.0 / bytes_per_second

    def _head(self, reply, body, head):
        status = int(reply.get('status', 200))
        lines = ['HTTP/1.1 %d %s' % (status, reply.get('reason') or self._reason(status))]
        headers = self._headers(reply)
        names = set(name.lower() for name, _ in headers)
        if body and 'content-type' not in names:
            headers.append(('Content-Type', 'text/xml; charset=UTF-8'))
        if reply.get('chunked'):
            headers.append(('Transfer-Encoding', 'chunked'))
        elif not reply.get('no_length') and 'content-length' not in names:
            headers.append(('Content-Length', str(len(body))))
        closing = reply.get('no_length') or reply.get('close_after') is not None
        if (closing or head.wants_close()) and 'connection' not in names:
            headers.append(('Connection', 'close'))
        lines += ['%s: %s' % (name, value) for name, value in headers]
        return ('\r\n'.join(lines) + '\r\n\r\n').encode('latin-1')

    @staticmethod
    def _headers(reply):
        headers = reply.get('headers') or []
        if isinstance(headers, dict):
            headers = sorted(headers.items())
        return [(str(name), str(value)) for name, value in headers]

    @staticmethod
    def _reason(status):
        try:
            return HTTPStatus(status).phrase
        except ValueError:
            return 'Unknown'

    @staticmethod
    def _says_close(reply):
        return any(name.lower() == 'connection' and 'close' in str(value).lower()
                   for name, value in ReplyWriter._headers(reply))

    def _write(self, data):
        """Writes data within the close_after budget; False once it is spent."""
        if self._budget is not None:
            data = data[:self._budget]
            self._budget -= len(data)
        if data:
            self._sock.sendall(data)
        return self._budget is None or self._budget > 0
