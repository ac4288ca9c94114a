"""Client of the reference community service's control interface, for the
Python 2.7 suites that run inside tests/sandbox/run.

    svc = RefService()
    svc.reset()                       # plausible service, nothing recorded
    svc.script(SERVER_HOST, '/servlet/memLogin',
               [reply('<info><tokenid>T1</tokenid></info>')])
    ... exercise the module ...
    [login] = svc.requests(host=SERVER_HOST, path='/servlet/memLogin')
    login.body                        # the form exactly as it was sent

Replies (see reply()) may also set: delay (seconds before answering), pieces
(a count, or a list of sizes) with pause (seconds between them), chunked,
no_length (no Content-Length, close after the body), close_after (bytes of
the reply, then close), hang (take the request, never answer), read_rate
(read the request body at that many bytes per second) and abort_after (drop
the connection after that many body bytes) and drip (send the whole reply,
head included, at that many bytes per second). A reply without a status or a
body answers as the plausible service would, with those options applied.

Host states: 'up', 'down' (connections refused) and 'hang' (accepted, the
request head read, never answered). Certificates: 'good', 'expired',
'wrong-name'. reset() brings back all hosts up and the good certificate.
"""
import base64
import imp
import json
import os
import socket
import ssl
import time
import urllib2

_HOSTS = imp.load_source('_refservice_hosts', os.path.join(
    os.path.dirname(os.path.abspath(__file__)), '..', 'service', 'hosts.py'))
DEFAULT_HOST = _HOSTS.DEFAULT_HOST
STAGING_HOST = _HOSTS.STAGING_HOST
DETECTION_HOST = _HOSTS.DETECTION_HOST
SERVER_HOST = _HOSTS.SERVER_HOST
ADDRESSES = _HOSTS.ADDRESSES
HTTP_PORT = _HOSTS.HTTP_PORT
TLS_PORT = _HOSTS.TLS_PORT

POLL_INTERVAL = 0.05


def reply(body=None, status=None, headers=None, **options):
    """A scripted reply. body is sent byte for byte (unicode as UTF-8)."""
    scripted = dict(options)
    if body is not None:
        if isinstance(body, unicode):
            body = body.encode('utf-8')
        scripted['body_b64'] = base64.b64encode(body)
        scripted.setdefault('status', 200)
    if status is not None:
        scripted['status'] = status
    if headers is not None:
        scripted['headers'] = headers
    return scripted


def xml_reply(xml, status=200, **options):
    """A reply with an XML body (a UTF-8 declaration is not added)."""
    return reply(xml, status, [['Content-Type', 'text/xml; charset=UTF-8']], **options)


class Recorded(object):
    """A recorded item with its fields as attributes; bytes as str."""

    def __init__(self, document):
        for key, value in document.items():
            setattr(self, str(key), _decode(value))

    def __repr__(self):
        return '<%s %r>' % (type(self).__name__, self.__dict__)


class Request(Recorded):
    """One request: method, target, path, query, headers ([name, value]),
    head (request line and headers as sent), body (whole up to 8 MiB;
    body_size and body_sha256 cover all of it), complete, error, host,
    address, port, tls, reply_status, and upload (an Upload or None)."""

    def __init__(self, document):
        Recorded.__init__(self, document)
        if self.upload is not None:
            self.upload = Upload(self.upload)

    def header(self, name):
        for key, value in self.headers:
            if key.lower() == name.lower():
                return value
        return None


class Upload(object):
    """A parsed multipart/form-data body: parts in wire order, each with
    kind ('field' or 'file'), head, name, filename, content_type, size,
    sha256, content (whole up to 64 KiB) and path (the stored file)."""

    def __init__(self, document):
        self.boundary = document['boundary']
        self.complete = document['complete']
        self.error = document['error']
        self.parts = [Recorded(p) for p in document['parts']]
        self.fields = [(p.name, p.content) for p in self.parts if p.kind == 'field']
        self.files = [p for p in self.parts if p.kind == 'file']

    def field(self, name):
        """The value of the first field of that name, or None."""
        return dict(reversed(self.fields)).get(name)


class RefService(object):
    def __init__(self, url=None):
        self.url = url or os.environ.get('REFSERVICE_CONTROL', _HOSTS.CONTROL_URL)

    def reset(self):
        self._call('/reset', {})

    def script(self, host, path, replies, repeat=False):
        """Sets the next replies of path on host ('*' for any); an empty list
        removes the script. repeat keeps the last reply for every later request."""
        self._call('/script', {'host': host, 'path': path, 'replies': list(replies),
                               'repeat': repeat})

    def host_state(self, host, state):
        self._call('/host', {'host': host, 'state': state})

    def tls(self, cert):
        self._call('/tls', {'cert': cert})

    def requests(self, host=None, path=None, bodies=True):
        """Recorded requests in arrival order; bodies=False leaves out the
        bodies and part contents (as None), which makes polling cheap."""
        query = self._query(host=host, path=path, bodies=None if bodies else '0')
        return [Request(r) for r in self._call('/requests' + query)['requests']]

    @staticmethod
    def _query(**values):
        pairs = ['%s=%s' % (k, urllib2.quote(str(v), safe='')) for k, v in sorted(values.items())
                 if v]
        return '?' + '&'.join(pairs) if pairs else ''

    def _call(self, path, body=None):
        data = json.dumps(body) if body is not None else None
        request = urllib2.Request(self.url + path, data, {'Content-Type': 'application/json'})
        try:
            return json.loads(urllib2.urlopen(request, timeout=30).read())
        except urllib2.HTTPError as error:
            raise AssertionError('control %s: %s' % (path, error.read()))


def wait_until(condition, timeout=10.0, what='the condition'):
    """Polls condition() until it gives a true value, and returns that value.
    Raises AssertionError after timeout seconds."""
    deadline = time.time() + timeout
    while True:
        value = condition()
        if value:
            return value
        if time.time() > deadline:
            raise AssertionError('no %s after %.1f s' % (what, timeout))
        time.sleep(POLL_INTERVAL)


def exchange(host, data, port=HTTP_PORT, tls=False, timeout=10.0):
    """Sends raw bytes to a host (TLS verified against the system store) and
    returns everything it answers until it closes the connection."""
    sock = socket.create_connection((host, port), timeout)
    try:
        if tls:
            sock = ssl.create_default_context().wrap_socket(sock, server_hostname=host)
        sock.sendall(data)
        received = []
        while True:
            piece = sock.recv(65536)
            if not piece:
                return ''.join(received)
            received.append(piece)
    finally:
        sock.close()


def _decode(value):
    if isinstance(value, dict):
        if value.keys() == ['base64']:
            return base64.b64decode(value['base64'])
        return dict((k, _decode(v)) for k, v in value.items())
    if isinstance(value, list):
        return [_decode(v) for v in value]
    return value
