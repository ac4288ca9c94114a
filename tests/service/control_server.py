"""The control interface for tests: HTTP with JSON bodies.

    GET  /health                          {"ok": true} once the service listens
    POST /reset                           scripts, records, host states, certificate
    POST /script {"host", "path", "replies": [...], "repeat": false}
    POST /host   {"host", "state": "up" | "down" | "hang"}
    POST /tls    {"cert": "good" | "expired" | "wrong-name"}
    GET  /requests?host=&path=&since=&bodies=0
                                          {"requests": [...]} in arrival order;
                                          bodies=0 leaves bodies and part contents out
    GET  /connections?host=               {"connections": [...]}

Byte strings in replies are objects {"base64": "..."}.
"""
import base64
import json
import logging
from http.server import BaseHTTPRequestHandler, ThreadingHTTPServer
from urllib.parse import parse_qs, urlsplit

from script_book import ScriptError

log = logging.getLogger('refservice')


class _Encoder(json.JSONEncoder):
    def default(self, value):
        if isinstance(value, (bytes, bytearray)):
            return {'base64': base64.b64encode(bytes(value)).decode('ascii')}
        return json.JSONEncoder.default(self, value)


class ControlServer(ThreadingHTTPServer):
    daemon_threads = True

    def __init__(self, address, service):
        self.service = service
        ThreadingHTTPServer.__init__(self, address, _ControlHandler)


class _ControlHandler(BaseHTTPRequestHandler):
    protocol_version = 'HTTP/1.1'

    def do_GET(self):
        self._dispatch({'/health': self._health, '/requests': self._requests,
                        '/connections': self._connections})

    def do_POST(self):
        self._dispatch({'/reset': self._reset, '/script': self._script,
                        '/host': self._host, '/tls': self._tls})

    def log_message(self, form, *args):
        log.debug('control: ' + form, *args)

    def _dispatch(self, routes):
        url = urlsplit(self.path)
        handler = routes.get(url.path)
        if handler is None:
            return self._answer(404, {'error': 'no such control endpoint'})
        query = dict((k, v[0]) for k, v in parse_qs(url.query).items())
        try:
            self._answer(200, handler(query, self._json_body()))
        except (KeyError, ValueError, TypeError, ScriptError) as error:
            self._answer(400, {'error': '%s: %s' % (type(error).__name__, error)})

    def _json_body(self):
        length = int(self.headers.get('Content-Length') or 0)
        return json.loads(self.rfile.read(length) or b'{}')

    def _answer(self, status, document):
        body = json.dumps(document, cls=_Encoder).encode('utf-8')
        self.send_response(status)
        self.send_header('Content-Type', 'application/json')
        self.send_header('Content-Length', str(len(body)))
        self.end_headers()
        self.wfile.write(body)

    @property
    def _service(self):
        return self.server.service

    def _health(self, query, body):
        return {'ok': True}

    def _reset(self, query, body):
        self._service.reset()
        return {}

    def _script(self, query, body):
        self._service.scripts.set(body['host'], body['path'], body['replies'],
                                  bool(body.get('repeat')))
        return {}

    def _host(self, query, body):
        self._service.set_host_state(body['host'], body['state'])
        return {}

    def _tls(self, query, body):
        self._service.tls.select(body['cert'])
        return {}

    def _requests(self, query, body):
        since = int(query.get('since', 0))
        bodies = query.get('bodies') != '0'
        return {'requests': self._service.recorder.requests(query.get('host'),
                                                            query.get('path'), since, bodies)}

    def _connections(self, query, body):
        return {'connections': self._service.recorder.connections(query.get('host'))}
