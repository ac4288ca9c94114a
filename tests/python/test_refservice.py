"""The reference service is the test bed of every other suite: what it records
must be byte-exact, and scripted replies must reach the wire exactly as scripted."""
import base64
import socket
import unittest

from refservice import SERVER_HOST, STAGING_HOST, RefService, exchange, reply

PATH = '/servlet/getPresetCategory'


def request(target=PATH, body=''):
    return ('POST %s HTTP/1.1\r\nHost: %s\r\nContent-Length: %d\r\nConnection: close\r\n\r\n%s'
            % (target, SERVER_HOST, len(body), body))


class ServiceTestCase(unittest.TestCase):
    def setUp(self):
        self.svc = RefService()
        self.svc.reset()

    def status_sequence(self, count, host=SERVER_HOST):
        return [exchange(host, request()).split(' ')[1] for _ in range(count)]


class Recording(ServiceTestCase):
    def test_requests_are_recorded_byte_for_byte_in_arrival_order(self):
        first = 'POST /a?x=1&y=a b HTTP/1.1\r\nHost: x\r\nContent-Length: 3\r\n\r\na\x00b'
        second = 'GET /b HTTP/1.1\nHost: x\nConnection: close\n\n'  # bare line feeds
        sock = socket.create_connection((SERVER_HOST, 80), 10)
        self.addCleanup(sock.close)
        sock.sendall(first + second)
        while sock.recv(65536):
            pass
        records = self.svc.requests(host=SERVER_HOST)
        self.assertEqual([(r.path, r.query, r.head, r.body) for r in records],
                         [('/a', 'x=1&y=a b', first[:-3], 'a\x00b'), ('/b', '', second, '')])
        self.assertEqual([(r.address, r.port, r.tls) for r in records],
                         [('127.0.0.5', 80, False)] * 2)
        self.assertEqual(records[0].connection, records[1].connection)


class ScriptedReplies(ServiceTestCase):
    def test_replies_come_in_order_then_the_default_or_the_last_one_repeated(self):
        self.svc.script(SERVER_HOST, PATH, [reply('a', 500), reply('b', 404)])
        self.assertEqual(self.status_sequence(3), ['500', '404', '200'])
        self.svc.script('*', '*', [reply('any', 501)], repeat=True)
        self.svc.script(SERVER_HOST, PATH, [reply('a', 500), reply('b', 503)], repeat=True)
        self.assertEqual(self.status_sequence(3), ['500', '503', '503'])
        self.assertEqual(self.status_sequence(1, STAGING_HOST), ['501'])

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
            self.svc.script(SERVER_HOST, PATH, [scripted])
            self.assertEqual(exchange(SERVER_HOST, request()), wire, scripted)


if __name__ == '__main__':
    unittest.main()
