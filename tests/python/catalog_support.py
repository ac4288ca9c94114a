"""Helpers for the suites of the preset categories, the related video, the
effect lookup and the service links, on top of the session suites' fixture."""
from refservice import SERVER_HOST
from service_session import SessionTest


class ServiceTest(SessionTest):
    """A new session against the plausible service, the trace on."""

    def use_server_host(self):
        """Names the server host, so that no detection is sent."""
        self.call('SetOBURLAsReg', unicode(SERVER_HOST))

    def sign_in(self):
        self.assertEqual(self.call('LoginOrbishare', u'member', u'secret'), 1)
        self.svc.reset()  # later assertions see only the operation's requests
        self.clear_trace()

    def sent(self, path):
        """The requests the server host received for path, in order."""
        return self.svc.requests(host=SERVER_HOST, path=path)
