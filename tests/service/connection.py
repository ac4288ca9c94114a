"""One client connection: reads requests, records them and answers each as
scripted or as the plausible service, until either side closes."""
import logging
import select
import socket
import ssl
import time

from multipart_parser import MultipartParser
from reply_writer import ReplyWriter
from request_reader import BadRequest, ClientGone, RequestReader, StopReading

IDLE_TIMEOUT = 120.0
HANDSHAKE_TIMEOUT = 10.0
GOODBYE_TIMEOUT = 1.0
HOLD_POLL = 0.1
DELIVERY_KEYS = ('status', 'body', 'body_b64', 'raw_b64')

log = logging.getLogger('refservice')


class Connection(object):
    def __init__(self, service, sock, host, address, port, tls):
        self._service = service
        self._sock = sock
        self.host = host
        self.info = {'host': host, 'address': address, 'port': port, 'tls': tls,
                     'opened': time.time(), 'closed': None, 'tls_error': None,
                     'requests': 0}

    def run(self):
        try:
            self._sock.settimeout(IDLE_TIMEOUT)
            if self.info['tls'] and not self._handshake():
                return
            with self._sock.makefile('rb') as stream:
                reader = RequestReader(stream)
                while self._serve_one(reader):
                    pass
            self._say_goodbye()
        except (OSError, ssl.SSLError) as error:
            log.info('connection %s to %s ended: %s', self.info['id'], self.host, error)
        except Exception:
            log.exception('connection %s to %s failed', self.info['id'], self.host)
        finally:
            self.info['closed'] = time.time()
            self._sock.close()
            self._service.connection_closed(self)

    def drop(self):
        """Ends the connection from another thread (the host went down)."""
        try:
            self._sock.shutdown(socket.SHUT_RDWR)
        except OSError:
            pass

    def _say_goodbye(self):
        """Ends TLS with a close_notify, so that a reply framed by the close
        reads as complete."""
        if isinstance(self._sock, ssl.SSLSocket):
            self._sock.settimeout(GOODBYE_TIMEOUT)
            self._sock = self._sock.unwrap()

    def _handshake(self):
        self._sock.settimeout(HANDSHAKE_TIMEOUT)
        try:
            self._sock = self._service.tls.wrap(self._sock)
        except (OSError, ssl.SSLError) as error:
            self.info['tls_error'] = str(error)
            return False
        self._sock.settimeout(IDLE_TIMEOUT)
        return True

    def _serve_one(self, reader):
        """Handles one request; says whether to wait for another."""
        try:
            head = reader.read_head()
        except BadRequest as error:
            self._sock.sendall(b'HTTP/1.1 400 Bad Request\r\nContent-Length: 0\r\n'
                               b'Connection: close\r\n\r\n')
            log.info('bad request on %s: %s', self.host, error)
            return False
        if head is None:
            return False
        record = self._service.recorder.begin_request(self, head)
        if self._service.host_state(self.host) == 'hang':
            self._hold(lambda: self._service.host_state(self.host) == 'hang')
            return False
        plan = self._service.scripts.take(self.host, head.path) or {}
        if not self._read_body(reader, head, record, plan):
            return False
        if plan.get('hang'):
            generation = self._service.generation
            self._hold(lambda: self._service.generation == generation)
            return False
        reply = plan
        if not any(key in plan for key in DELIVERY_KEYS):
            reply = dict(self._service.defaults.reply(head, record), **plan)
        record.reply_status = int(reply.get('status', 200)) if 'raw_b64' not in reply else None
        return ReplyWriter(self._sock).send(reply, head)

    def _read_body(self, reader, head, record, plan):
        parser = self._upload_parser(head, record)
        record.upload = parser
        abort_after = plan.get('abort_after')

        def consume(wire, data):
            record.add_body(wire, data)
            if parser:
                parser.feed(data)
            if abort_after is not None and record.body_size >= abort_after:
                raise StopReading('dropped by the script after %d body bytes' % record.body_size)

        try:
            if (head.header('Expect') or '').lower() == '100-continue':
                self._sock.sendall(b'HTTP/1.1 100 Continue\r\n\r\n')
            if abort_after == 0:
                consume(b'', b'')
            reader.read_body(head, consume, rate=plan.get('read_rate'))
            record.complete = True
            return True
        except (ClientGone, StopReading, BadRequest) as error:
            record.error = str(error)
            return False
        finally:
            if parser:
                parser.finish()

    def _upload_parser(self, head, record):
        content_type = head.header('Content-Type') or ''
        media, _, params = content_type.partition(';')
        if media.strip().lower() != 'multipart/form-data':
            return None
        boundary = None
        for param in params.split(';'):
            key, _, value = param.strip().partition('=')
            if key.lower() == 'boundary':
                boundary = value.strip('"').encode('latin-1')
        if not boundary:
            return None
        return MultipartParser(boundary, self._service.store_dir, 'request-%d' % record.seq)

    def _hold(self, still_hanging):
        """Keeps the connection open without answering while still_hanging()
        holds and the client stays."""
        while still_hanging() and not self._service.stopping:
            readable, _, _ = select.select([self._sock], [], [], HOLD_POLL)
            if readable and not self._sock.recv(64 * 1024):
                return
