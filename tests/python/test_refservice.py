"""The reference service is the test bed of every other suite: its default
answers, its scripted deliveries and its recording must be exact."""
import base64
import errno
import hashlib
import os
import socket
import threading
import time
import unittest
import urllib

from refservice import (ADDRESSES, DETECTION_HOST, SERVER_HOST, STAGING_HOST, TLS_PORT,
                        RefService, exchange, reply)

BOUNDARY = '-' * 27 + '0029482318BE'
NO_ANSWER = 0.5  # seconds a test waits to see that nothing is answered


def request(method, target, host=SERVER_HOST, body='', headers=()):
    lines = ['%s %s HTTP/1.1' % (method, target), 'Host: ' + host]
    lines += list(headers) + ['Content-Length: %d' % len(body), 'Connection: close']
    return '\r\n'.join(lines) + '\r\n\r\n' + body


def split_reply(raw):
    """(status, {lower-case header: value}, body) of a reply read to the close."""
    head, _, body = raw.partition('\r\n\r\n')
    lines = head.split('\r\n')
    headers = dict((k.strip().lower(), v.strip())
                   for k, _, v in (line.partition(':') for line in lines[1:]))
    if headers.get('transfer-encoding') == 'chunked':
        body = dechunk(body)
    return int(lines[0].split(' ')[1]), headers, body


def dechunk(framed):
    body = ''
    while True:
        size_line, _, framed = framed.partition('\r\n')
        size = int(size_line, 16)
        if size == 0:
            return body
        body, framed = body + framed[:size], framed[size + 2:]


def call(method, target, host=SERVER_HOST, body='', headers=(), port=80, tls=False):
    raw = exchange(host, request(method, target, host, body, headers), port, tls)
    return split_reply(raw)


def multipart(fields, files):
    """A body in the upload's wire format: fields, then (name, path, data) files."""
    parts = ['--%s\r\nContent-Disposition: form-data; name="%s"\r\n\r\n%s\r\n'
             % (BOUNDARY, name, value) for name, value in fields]
    parts += ['--%s\r\nContent-Disposition: form-data; name="%s"; filename="%s"\r\n'
              'Content-Type: application/octet-stream\r\n\r\n%s\r\n'
              % (BOUNDARY, name, path, data) for name, path, data in files]
    return ''.join(parts) + '--%s--\r\n' % BOUNDARY


def upload(body, host=SERVER_HOST):
    return call('POST', '/servlet/uploadTemplate', host, body,
                ['Content-Type: multipart/form-data; boundary=' + BOUNDARY])


def closed_by_peer(sock):
    """Whether the other side closed: an orderly end or a reset (unread data)."""
    try:
        return sock.recv(1) == ''
    except socket.error as error:
        return error.errno == errno.ECONNRESET


def element(xml, name):
    start = xml.index('<%s>' % name) + len(name) + 2
    return xml[start:xml.index('</%s>' % name)]


class ServiceTestCase(unittest.TestCase):
    def setUp(self):
        self.svc = RefService()
        self.svc.reset()

    def connect(self, host=SERVER_HOST, port=80):
        sock = socket.create_connection((host, port), 10)
        self.addCleanup(sock.close)
        return sock


class DefaultAnswersTest(ServiceTestCase):
    def test_discovery_names_the_server_host_and_the_service_links(self):
        for target in ('/observer.jsp?ap=lumivanta&version=5.0', 'observer.jsp?ap=lumivanta'):
            status, _, body = call('GET', target, DETECTION_HOST)
            self.assertEqual(status, 200)
            self.assertEqual(element(body, 'APIUrl'), SERVER_HOST)
            for link in ('AdjustmentPreset', 'SignUp', 'ForgetPassword', 'LensCorrection',
                         'VideoGallery'):
                self.assertTrue(element(body, link).startswith('/'), link)

    def test_sign_in_gives_a_token_only_for_an_account_and_a_password(self):
        cases = [('account=bob%20b&pwd=p%25w&AP=KRV', True, 'bob b'),
                 ('account=bob&pwd=&AP=KRV', False, None),
                 ('pwd=x', False, None)]
        for form, signed_in, user in cases:
            status, _, body = call('POST', '/servlet/memLogin', body=form, port=TLS_PORT,
                                   tls=True)
            self.assertEqual(status, 200)
            self.assertEqual('<tokenid>' in body, signed_in, form)
            if signed_in:
                self.assertEqual(element(body, 'username'), user)
                self.assertEqual(len(element(body, 'tokenid')), 24)

    def test_categories_are_3_and_7(self):
        _, _, body = call('POST', '/servlet/getPresetCategory?Locid=ENU&Version=5.0')
        self.assertIn('<categories><category categoryid="3">Portrait</category>'
                      '<category categoryid="7">Landscape</category></categories>', body)

    def test_related_video_gives_an_identifier_then_a_page(self):
        _, _, body = call('POST', '/servlet/setRelateVideo?tokenid=T&AP=KRV&Version=5')
        self.assertEqual(element(body, 'videoId'), '1001')
        _, _, body = call('POST', '/servlet/setRelateVideo?tokenid=T&videoID=1001&videoURL=u')
        self.assertEqual(element(body, 'videoUrl'),
                         'http://%s/video/play.jsp?id=1001' % SERVER_HOST)
        _, _, body = call('POST', '/servlet/setRelateVideo?tokenid=&AP=KRV')
        self.assertEqual(element(body, 'errMsg'), 'Invalid token')

    def test_effect_lookup_answers_an_escaped_link(self):
        _, _, body = call('POST', '/servlet/GetEffectByGUIDForQZM?token=T&guid=G-1')
        link = urllib.unquote(element(body, 'pipURL'))
        self.assertEqual(link, 'http://%s/download/pip/G-1.zip' % SERVER_HOST)
        _, _, body = call('POST', '/servlet/GetEffectByGUIDForQZM?token=T&guid=')
        self.assertNotIn('pipURL', body)

    def test_upload_answers_by_what_the_form_holds(self):
        good = multipart([('token', 'T')], [('PIPfile', 'p.xml', 'x')])
        cases = [(good, 200, 'http://%s/template/view.jsp?id=5001' % SERVER_HOST, ''),
                 (multipart([('token', '')], []), 403, '', 'Invalid token'),
                 (good[:-10], 400, '', 'Malformed upload: body ended before the closing '
                                       'delimiter')]
        for body, status, url, error in cases:
            got_status, _, reply_body = upload(body)
            self.assertEqual(got_status, status)
            self.assertEqual(urllib.unquote(element(reply_body, 'templateUrl')), url)
            self.assertEqual(element(reply_body, 'errMsg'), error)

    def test_every_host_answers_the_reachability_probe(self):
        for host in ADDRESSES:
            self.assertEqual(call('GET', '/', host)[0], 200)
        self.assertEqual(call('GET', '/nowhere')[0], 404)


class ScriptedRepliesTest(ServiceTestCase):
    path = '/servlet/getPresetCategory'

    def status_sequence(self, count, host=SERVER_HOST):
        return [call('POST', self.path, host)[0] for _ in range(count)]

    def test_one_shot_replies_come_in_order_then_the_default(self):
        self.svc.script(SERVER_HOST, self.path, [reply('a', 500), reply('b', 404)])
        self.assertEqual(self.status_sequence(3), [500, 404, 200])

    def test_a_repeating_script_keeps_its_last_reply(self):
        self.svc.script(SERVER_HOST, self.path, [reply('a', 500), reply('b', 503)], repeat=True)
        self.assertEqual(self.status_sequence(3), [500, 503, 503])
        self.svc.script(SERVER_HOST, self.path, [])
        self.assertEqual(self.status_sequence(1), [200])

    def test_the_most_specific_script_wins(self):
        self.svc.script('*', '*', [reply('any', 501)], repeat=True)
        self.svc.script(SERVER_HOST, self.path, [reply('exact', 502)], repeat=True)
        self.assertEqual(self.status_sequence(1), [502])
        self.assertEqual(self.status_sequence(1, STAGING_HOST), [501])

    def test_an_unknown_reply_option_is_refused(self):
        with self.assertRaises(AssertionError):
            self.svc.script(SERVER_HOST, self.path, [{'stauts': 200}])

    def test_deliveries_put_exact_bytes_on_the_wire(self):
        body = 'abcdefghij' * 2
        full = ('HTTP/1.1 200 OK\r\nContent-Type: text/xml; charset=UTF-8\r\n'
                'Content-Length: 20\r\nConnection: close\r\n\r\n' + body)
        cases = [
            (reply(body), full),
            (reply(body, close_after=30), full[:30]),
            (reply(body, headers=[['Content-Length', '10']]),
             'HTTP/1.1 200 OK\r\nContent-Length: 10\r\nContent-Type: text/xml; charset=UTF-8'
             '\r\nConnection: close\r\n\r\n' + body),
            (reply(body, no_length=True), full.replace('Content-Length: 20\r\n', '')),
            (reply(body, chunked=True, pieces=[3, 4], pause=0),
             full.replace('Content-Length: 20', 'Transfer-Encoding: chunked')
             .replace(body, '3\r\nabc\r\n4\r\ndefg\r\nd\r\nhijabcdefghij\r\n0\r\n\r\n')),
            ({'raw_b64': base64.b64encode('HTTP/1.0 999 Odd\r\n\r\nx')},
             'HTTP/1.0 999 Odd\r\n\r\nx'),
        ]
        for scripted, wire in cases:
            self.svc.script(SERVER_HOST, self.path, [scripted])
            self.assertEqual(exchange(SERVER_HOST, request('POST', self.path)), wire, scripted)

    def test_delivery_options_without_a_body_keep_the_default_answer(self):
        self.svc.script(DETECTION_HOST, '/observer.jsp', [reply(chunked=True, pieces=3)])
        status, headers, body = call('GET', '/observer.jsp', DETECTION_HOST)
        self.assertEqual(headers['transfer-encoding'], 'chunked')
        self.assertEqual(element(body, 'APIUrl'), SERVER_HOST)

    def test_a_delayed_or_paced_reply_takes_at_least_its_pauses(self):
        for scripted in (reply('x', delay=0.4), reply('abcd', pieces=[1, 1], pause=0.2)):
            self.svc.script(SERVER_HOST, self.path, [scripted])
            start = time.time()
            call('POST', self.path)
            self.assertGreaterEqual(time.time() - start, 0.38)

    def test_a_hanging_reply_takes_the_request_and_never_answers(self):
        self.svc.script(SERVER_HOST, self.path, [reply(hang=True)])
        sock = self.connect()
        sock.sendall(request('POST', self.path, body='xyz'))
        sock.settimeout(NO_ANSWER)
        self.assertRaises(socket.timeout, sock.recv, 1)
        [held] = self.svc.requests(path=self.path)
        self.assertEqual((held.complete, held.body, held.reply_status), (True, 'xyz', None))
        self.svc.reset()  # lets the held connection go
        sock.settimeout(10)
        self.assertEqual(sock.recv(1), '')

    def test_abort_after_drops_the_connection_inside_the_body(self):
        self.svc.script(SERVER_HOST, self.path, [reply(abort_after=1000)])
        sock = self.connect()
        try:
            sock.sendall(request('POST', self.path, body='b' * 100000))
        except socket.error:
            pass  # the service may close while the body is still being sent
        self.assertTrue(closed_by_peer(sock))
        [dropped] = self.svc.requests(path=self.path)
        self.assertFalse(dropped.complete)
        self.assertGreaterEqual(dropped.body_size, 1000)
        self.assertIn('dropped by the script', dropped.error)

    def test_a_slow_reader_takes_the_body_at_its_rate(self):
        size, rate = 300000, 100000
        self.svc.script(SERVER_HOST, self.path, [reply('ok', read_rate=rate)])
        sock = self.connect()
        sender = threading.Thread(target=sock.sendall,
                                  args=(request('POST', self.path, body='s' * size),))
        sender.start()
        [reading] = self.svc.wait_for_requests(path=self.path, ready=lambda r: r.body_size)
        self.assertLess(reading.body_size, size)  # the pace leaves most of it unread
        sender.join()
        sock.settimeout(30)
        self.assertTrue(sock.recv(65536).startswith('HTTP/1.1 200'))
        self.assertEqual(self.svc.requests(path=self.path)[0].body_size, size)


class RecordingTest(ServiceTestCase):
    def test_requests_on_one_connection_are_recorded_in_arrival_order(self):
        sock = self.connect()
        first = 'GET /a HTTP/1.1\r\nHost: x\r\n\r\n'
        second = 'GET /b HTTP/1.1\nHost: x\nConnection: close\n\n'  # bare line feeds
        sock.sendall(first + second)
        while sock.recv(65536):
            pass
        records = self.svc.requests(host=SERVER_HOST)
        self.assertEqual([(r.path, r.head) for r in records], [('/a', first), ('/b', second)])
        self.assertEqual(records[0].connection, records[1].connection)

    def test_a_chunked_body_is_recorded_decoded(self):
        sock = self.connect()
        sock.sendall('POST /c HTTP/1.1\r\nHost: x\r\nTransfer-Encoding: chunked\r\n'
                     'Connection: close\r\n\r\n3\r\nabc\r\n2;ext=1\r\nde\r\n0\r\nT: 1\r\n\r\n')
        self.assertTrue(sock.recv(65536).startswith('HTTP/1.1 404'))
        [record] = self.svc.requests(path='/c')
        self.assertEqual((record.body, record.chunked, record.complete), ('abcde', True, True))

    def test_expect_continue_is_answered_before_the_body(self):
        sock = self.connect()
        sock.sendall('POST /e HTTP/1.1\r\nHost: x\r\nExpect: 100-continue\r\n'
                     'Content-Length: 2\r\nConnection: close\r\n\r\n')
        self.assertEqual(sock.recv(25), 'HTTP/1.1 100 Continue\r\n\r\n')
        sock.sendall('ok')
        self.assertTrue(sock.recv(65536).startswith('HTTP/1.1 404'))

    def test_a_target_with_unescaped_spaces_is_kept_whole(self):
        call('GET', '/servlet/setRelateVideo?tokenid=T&videoID=1&website=a b&x')
        [record] = self.svc.requests(path='/servlet/setRelateVideo')
        self.assertEqual(record.query, 'tokenid=T&videoID=1&website=a b&x')

    def test_a_body_cut_short_by_the_client_is_marked_incomplete(self):
        sock = self.connect()
        sock.sendall('POST /s HTTP/1.1\r\nHost: x\r\nContent-Length: 10\r\n\r\nabc')
        sock.close()
        [record] = self.svc.wait_for_requests(path='/s', ready=lambda r: r.error)
        self.assertEqual((record.complete, record.body), (False, 'abc'))
        self.assertIn('closed after 3 of 10 body bytes', record.error)

    def test_a_malformed_request_is_refused(self):
        self.assertTrue(exchange(SERVER_HOST, 'NONSENSE\r\n\r\n').startswith('HTTP/1.1 400 '))

    def test_a_multipart_body_fed_in_small_pieces_is_parsed_exactly(self):
        tricky = '\r\n--' + BOUNDARY[:-1] + 'X\r\n' + '-' * 60  # almost a delimiter
        files = [('PIPfile', 'C:\\d\xc3\xa4/\xe4\xb8\xad.xml', tricky), ('PIPimg', 'e', '')]
        body = multipart([('title', 'Sun "set"'), ('na"me', '')], files)
        sock = self.connect()
        sock.sendall(request('POST', '/servlet/uploadTemplate', body=body, headers=[
            'Content-Type: multipart/form-data; boundary="%s"' % BOUNDARY])[:-len(body)])
        for at in range(0, len(body), 7):
            sock.sendall(body[at:at + 7])
        self.assertTrue(sock.recv(65536).startswith('HTTP/1.1 403'))  # no token field
        parsed = self.svc.requests(path='/servlet/uploadTemplate')[0].upload
        self.assertEqual((parsed.complete, parsed.error, parsed.boundary), (True, None, BOUNDARY))
        self.assertEqual(parsed.fields, [('title', 'Sun "set"'), ('na"me', '')])
        self.assertEqual([(f.name, f.filename, f.content_type, f.content, f.size)
                          for f in parsed.files],
                         [(n, p, 'application/octet-stream', d, len(d)) for n, p, d in files])
        with open(parsed.files[0].path, 'rb') as stored:
            self.assertEqual(stored.read(), tricky)

    def test_a_large_upload_streams_through_with_its_digest(self):
        data = os.urandom(1 << 20) * 20
        status, _, _ = upload(multipart([('token', 'T')], [('PIPfile', 'big', data)]))
        self.assertEqual(status, 200)
        [record] = self.svc.requests(path='/servlet/uploadTemplate')
        [stored] = record.upload.files
        self.assertEqual((stored.size, stored.sha256),
                         (len(data), hashlib.sha256(data).hexdigest()))
        self.assertEqual(stored.content, data[:64 * 1024])
        self.assertTrue(record.body_truncated)
        self.assertEqual(os.path.getsize(stored.path), len(data))
        [brief] = self.svc.requests(path='/servlet/uploadTemplate', bodies=False)
        self.assertEqual((brief.body, brief.upload.files[0].content), (None, None))
        self.svc.reset()
        self.assertFalse(os.path.exists(stored.path))


class HostStatesTest(ServiceTestCase):
    def test_taking_a_host_down_ends_its_open_connections(self):
        sock = self.connect()
        sock.sendall('GET / HTTP/1.1\r\nHost: x\r\n\r\n')
        sock.recv(65536)
        self.svc.host_state(SERVER_HOST, 'down')
        sock.settimeout(10)
        self.assertEqual(sock.recv(1), '')

    def test_reset_brings_everything_back(self):
        self.svc.host_state(SERVER_HOST, 'down')
        self.svc.tls('expired')
        call('POST', '/servlet/setRelateVideo?tokenid=T', STAGING_HOST)
        self.svc.reset()
        self.assertEqual(self.svc.requests(), [])
        _, _, body = call('POST', '/servlet/setRelateVideo?tokenid=T', port=TLS_PORT, tls=True)
        self.assertEqual(element(body, 'videoId'), '1001')


if __name__ == '__main__':
    unittest.main()
