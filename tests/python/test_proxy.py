"""A real HTTP proxy (tinyproxy, in the sandbox): with http_proxy and https_proxy set,
discovery, categories and the upload go through it, sign-in tunnels through CONNECT
(the certificate checks are the service suite's), and no_proxy bypasses it."""
import os
import re
import shutil
import socket
import subprocess
import tempfile
import unittest

import _PyUploader as native
from fixtures import DEFAULT_HOST, DETECTION_HOST, SERVER_HOST, UPLOAD_PATH, UploadTest, text_type, wait_until

PROXY = ('127.0.0.1', 8888)
CONFIG = ('User nobody\nGroup nogroup\nListen %s\nPort %d\nTimeout 60\nLogFile "%s"\nLogLevel Info\n'
          'Allow 127.0.0.1\nViaProxyName "testproxy"\nConnectPort 443\n')
LOGGED_REQUEST = re.compile(r'Request \(file descriptor \d+\): (\S+) (\S+) HTTP/')
OBSERVER, CATEGORIES, SIGN_IN = '/observer.jsp', '/servlet/getPresetCategory', '/servlet/memLogin'


def proxy_accepts():
    try:
        socket.create_connection(PROXY, 1).close()
        return True
    except socket.error:
        return False


class ThroughTheProxy(UploadTest):

    @classmethod
    def setUpClass(cls):
        cls.folder = tempfile.mkdtemp(prefix='proxy-')
        os.chmod(cls.folder, 0o777)  # the proxy writes its log as nobody
        cls.log, config = os.path.join(cls.folder, 'proxy.log'), os.path.join(cls.folder, 'tinyproxy.conf')
        with open(config, 'w') as out:
            out.write(CONFIG % (PROXY + (cls.log,)))
        cls.proxy = subprocess.Popen(['tinyproxy', '-d', '-c', config],
                                     stdout=open(os.devnull, 'w'), stderr=subprocess.STDOUT)
        wait_until(proxy_accepts, 10.0, 'proxy accepting connections')

    @classmethod
    def tearDownClass(cls):
        cls.proxy.terminate()
        cls.proxy.wait()
        shutil.rmtree(cls.folder, ignore_errors=True)

    def setUp(self):
        UploadTest.setUp(self)  # which restores the environment afterwards
        os.environ.update(http_proxy='http://%s:%d' % PROXY, https_proxy='http://%s:%d' % PROXY)
        self.session = native.new_OBLoginData(u'5.0', u'Retail', u'machine-1')
        self.addCleanup(native.delete_OBLoginData, self.session)
        self.logged_before = len(self.proxied())

    def call(self, operation, *args):
        return getattr(native, 'OBLoginData_' + operation)(self.session, *args)

    def proxied(self):
        """(method, target without its query) of every request the proxy logged since the test began."""
        with open(self.log) as log:
            logged = LOGGED_REQUEST.findall(log.read())[getattr(self, 'logged_before', 0):]
        return [(method, target.split('?')[0]) for method, target in logged]

    def test_discovery_categories_and_the_upload_go_through_it_sign_in_tunnels_and_no_proxy_bypasses(self):
        self.call('InitOBServerURL')
        self.assertEqual(self.call('GetServerUrl'), text_type(SERVER_HOST))
        self.call('GetPresetCategory', u'ENU')
        self.assertEqual((self.start(), self.completion()[3]), (1, 1))
        self.assertEqual(self.call('LoginOrbishare', u'member', u'secret'), 1)
        self.assertEqual(self.proxied(), [
            ('GET', 'http://%s/' % DETECTION_HOST), ('GET', 'http://%s%s' % (DETECTION_HOST, OBSERVER)),
            ('POST', 'http://%s%s' % (SERVER_HOST, CATEGORIES)), ('POST', 'http://%s%s' % (SERVER_HOST, UPLOAD_PATH)),
            ('GET', 'http://%s/' % DEFAULT_HOST), ('CONNECT', '%s:443' % SERVER_HOST)])
        self.assertEqual(self.uploads()[0].complete, True)
        [sign_in] = self.svc.requests(host=SERVER_HOST, path=SIGN_IN)
        self.assertEqual((sign_in.tls, sign_in.header('Via')), (True, None))  # an opaque tunnel
        self.svc.reset()  # a host named by no_proxy goes direct
        os.environ['no_proxy'] = 'orbishare.com'
        self.logged_before += len(self.proxied())
        self.call('GetPresetCategory', u'ENU')
        self.assertEqual(self.call('LoginOrbishare', u'member', u'secret'), 1)
        self.assertEqual(self.proxied(), [])


if __name__ == '__main__':
    unittest.main()
