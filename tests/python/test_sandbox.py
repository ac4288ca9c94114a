"""The network sandbox looks like the internet to the code under test: the
service's names resolve to their own addresses, TLS verifies against the
system store with the test CA alone, and hosts can be taken down."""
import errno
import os
import socket
import subprocess
import unittest

from refservice import (ADDRESSES, DEFAULT_HOST, DETECTION_HOST, SERVER_HOST, STAGING_HOST,
                        TLS_PORT, RefService, exchange)

SYSTEM_BUNDLE = '/etc/ssl/certs/ca-certificates.crt'
SANDBOX_RUN = os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', 'sandbox', 'run')
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

    def test_a_host_set_down_refuses_connections_while_others_answer(self):
        self.svc.host_state(STAGING_HOST, 'down')
        for port in (80, TLS_PORT):
            with self.assertRaises(socket.error) as caught:
                socket.create_connection((STAGING_HOST, port), 5)
            self.assertEqual(caught.exception.errno, errno.ECONNREFUSED)
        self.assertEqual(curl('http://%s/' % SERVER_HOST), 0)
        self.svc.host_state(STAGING_HOST, 'up')
        self.assertEqual(curl('http://%s/' % STAGING_HOST), 0)

    def test_a_nested_call_runs_its_command_in_the_same_sandbox(self):
        self.assertEqual(subprocess.call([SANDBOX_RUN, 'sh', '-c', 'exit 3']), 3)
        output = subprocess.check_output(
            [SANDBOX_RUN, 'sh', '-c', 'echo $REFSERVICE_CONTROL; getent hosts ' + SERVER_HOST])
        self.assertIn(os.environ['REFSERVICE_CONTROL'], output)
        self.assertIn('127.0.0.5', output)


if __name__ == '__main__':
    unittest.main()
