"""The network sandbox looks like the internet to the code under test: the
service's names resolve to their own addresses, TLS verifies against the
system store with the test CA alone, and hosts can be taken down."""
import errno
import os
import socket
import ssl
import subprocess
import unittest

from refservice import (ADDRESSES, DEFAULT_HOST, DETECTION_HOST, SERVER_HOST, STAGING_HOST,
                        TLS_PORT, RefService, exchange, wait_until)

SYSTEM_BUNDLE = '/etc/ssl/certs/ca-certificates.crt'
SANDBOX_RUN = os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', 'sandbox', 'run')
CURL_PEER_FAILED_VERIFICATION = 60
GET_ROOT = 'GET / HTTP/1.1\r\nHost: %s\r\nConnection: close\r\n\r\n'


def curl(url):
    """curl's exit code for fetching url, with the system CA store."""
    with open(os.devnull, 'w') as quiet:
        return subprocess.call(['curl', '-sS', '-o', os.devnull, '--max-time', '20', url],
                               stdout=quiet, stderr=quiet)


class SandboxTest(unittest.TestCase):
    def setUp(self):
        self.svc = RefService()
        self.svc.reset()

    def test_each_service_name_resolves_to_its_own_address(self):
        expected = {DETECTION_HOST: '127.0.0.2', DEFAULT_HOST: '127.0.0.3',
                    STAGING_HOST: '127.0.0.4', SERVER_HOST: '127.0.0.5'}
        self.assertEqual(ADDRESSES, expected)
        for name, address in expected.items():
            self.assertEqual(socket.gethostbyname(name), address)

    def test_system_store_holds_only_the_test_ca(self):
        with open(SYSTEM_BUNDLE) as bundle, open(os.environ['SANDBOX_CA']) as ca:
            self.assertEqual(bundle.read(), ca.read())

    def test_tls_verifies_against_the_system_store(self):
        for host in ADDRESSES:
            answer = exchange(host, GET_ROOT % host, TLS_PORT, tls=True)
            self.assertTrue(answer.startswith('HTTP/1.1 200 '), answer[:80])
            self.assertEqual(curl('https://%s/' % host), 0)
        probes = self.svc.requests(host=SERVER_HOST)
        self.assertEqual([(r.tls, r.port) for r in probes], [(True, TLS_PORT)] * 2)

    def test_expired_and_wrong_name_certificates_are_refused(self):
        for cert in ('expired', 'wrong-name'):
            self.svc.tls(cert)
            self.assertEqual(curl('https://%s/' % SERVER_HOST), CURL_PEER_FAILED_VERIFICATION,
                             cert)
            with self.assertRaises((ssl.SSLError, ssl.CertificateError)):
                exchange(SERVER_HOST, GET_ROOT % SERVER_HOST, TLS_PORT, tls=True)
            self.assertEqual(self.svc.requests(), [])
        # An expired certificate fails the handshake itself; the service says so.
        self.svc.reset()
        self.svc.tls('expired')
        curl('https://%s/' % SERVER_HOST)
        [refused] = wait_until(lambda: [c for c in self.svc.connections() if c.closed])
        self.assertIn('alert', refused.tls_error)

    def test_a_host_set_down_refuses_connections_while_others_answer(self):
        self.svc.host_state(STAGING_HOST, 'down')
        for port in (80, TLS_PORT):
            with self.assertRaises(socket.error) as caught:
                socket.create_connection((STAGING_HOST, port), 5)
            self.assertEqual(caught.exception.errno, errno.ECONNREFUSED)
        self.assertEqual(curl('http://%s/' % SERVER_HOST), 0)
        self.svc.host_state(STAGING_HOST, 'up')
        self.assertEqual(curl('http://%s/' % STAGING_HOST), 0)

    def test_a_hanging_host_accepts_but_never_answers(self):
        self.svc.host_state(DETECTION_HOST, 'hang')
        sock = socket.create_connection((DETECTION_HOST, 80), 5)
        try:
            sock.settimeout(0.5)
            sock.sendall(GET_ROOT % DETECTION_HOST)
            self.assertRaises(socket.timeout, sock.recv, 1)
        finally:
            sock.close()
        [request] = self.svc.requests(host=DETECTION_HOST)
        self.assertIsNone(request.reply_status)

    def test_the_control_interface_records_requests_byte_for_byte(self):
        sent = ('POST /servlet/getPresetCategory?Locid=ENU&Version=5.0 HTTP/1.1\r\n'
                'Host: %s\r\nContent-Length: 3\r\nConnection: close\r\n\r\n' % SERVER_HOST)
        exchange(SERVER_HOST, sent + 'a\x00b')
        [request] = self.svc.requests(host=SERVER_HOST, path='/servlet/getPresetCategory')
        self.assertEqual(request.head, sent)
        self.assertEqual(request.body, 'a\x00b')
        self.assertEqual((request.address, request.port, request.tls), ('127.0.0.5', 80, False))
        self.assertEqual(request.query, 'Locid=ENU&Version=5.0')

    def test_a_nested_call_runs_its_command_in_the_same_sandbox(self):
        self.assertEqual(subprocess.call([SANDBOX_RUN, 'sh', '-c', 'exit 3']), 3)
        output = subprocess.check_output(
            [SANDBOX_RUN, 'sh', '-c', 'echo $REFSERVICE_CONTROL; getent hosts ' + SERVER_HOST])
        self.assertIn(os.environ['REFSERVICE_CONTROL'], output)
        self.assertIn('127.0.0.5', output)


if __name__ == '__main__':
    unittest.main()
