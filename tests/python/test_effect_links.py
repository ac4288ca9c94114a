"""Effect lookup and the four service links: what is sent, which pipURL wins,
how links are composed signed in and signed out, and their percent-decoding."""
import unittest

import _PyUploader as native
from catalog_support import ServiceTest
from service_session import UUID
from refservice import DEFAULT_HOST, DETECTION_HOST, SERVER_HOST, STAGING_HOST, xml_reply

EFFECT = '/servlet/GetEffectByGUIDForQZM'
SIGN_IN = '/servlet/memLogin'
GETTERS = ('GetPresetDownloadURL', 'GetSignUpURL', 'GetForgetPasswordURL', 'GetLensCorrectionURL')
# The links of the plausible service's information reply, in the getters' order.
SERVICE_LINKS = ('/community/presets.jsp?ap=lumivanta', '/member/signUp.jsp?ap=lumivanta',
                 '/member/forgetpwd.jsp?ap=lumivanta', '/lens/correction.jsp?ap=lumivanta')


class EffectLookup(ServiceTest):

    def setUp(self):
        ServiceTest.setUp(self)
        self.use_server_host()

    def lookup(self, reply=None, guid=u'G-1'):
        if reply is not None:
            self.svc.script(SERVER_HOST, EFFECT, [xml_reply(reply)])
        return self.call('GetEffectByGUID', guid)

    def test_signed_out_the_empty_token_is_sent(self):
        self.lookup(u'<PIP/>')
        [request] = self.sent(EFFECT)
        self.assertEqual((request.method, request.target, request.body),
                         ('POST', EFFECT + '?token=&guid=G-1', ''))

    def test_signed_in_the_token_is_sent_and_the_link_decoded(self):
        self.sign_in()
        token = str(self.call('GetLoginTokenID'))
        self.assertEqual(self.lookup(guid=u'{AB CD}'),
                         u'http://%s/download/pip/{AB CD}.zip' % SERVER_HOST)
        [request] = self.sent(EFFECT)
        self.assertEqual(request.target, EFFECT + '?token=%s&guid={AB%%20CD}' % token)

    def test_the_last_pip_url_of_the_last_pip_wins(self):
        cases = [
            (u'<!-- c --><pip><!-- c --><pipURL>x%2Fy</pipURL></pip>', u'x/y'),
            (u'<PIP><pipURL>first</pipURL><PIPurl>second</PIPurl></PIP>', u'second'),
            (u'<PIP><pipURL>a<b>%41</b></pipURL><other>x</other></PIP>', u'aA'),
            (u'<PIP><pipURL></pipURL></PIP>', u''),
            (u'<PIP><link>x</link></PIP>', u''),
            (u'<info><pipURL>x</pipURL></info>', u''),
            (u'not xml', u''),
        ]
        for reply, expected in cases:
            result = self.lookup(reply)
            self.assertEqual(result, expected, reply)
            self.assertIs(type(result), unicode)

    def test_the_server_down_gives_an_empty_link(self):
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertEqual(self.lookup(), u'')

    def test_no_guid_sends_nothing(self):
        self.assertRaisesText(TypeError, 'Unicode string expected',
                              native.OBLoginData_GetEffectByGUID, self.session, None)
        self.assertEqual(self.svc.requests(), [])


class Links(ServiceTest):

    def links(self):
        return [self.call(getter) for getter in GETTERS]

    def test_signed_out_the_links_are_composed_after_discovery(self):
        self.assertEqual(self.links(), [u'http://%s%s&uuid=%s' % (SERVER_HOST, link, UUID)
                                        for link in SERVICE_LINKS])
        self.assertEqual(len(self.svc.requests(host=DETECTION_HOST, path='/observer.jsp')), 1)

    def test_signed_out_with_the_detection_host_down_the_staging_host_and_defaults(self):
        self.svc.host_state(DETECTION_HOST, 'down')
        self.assertEqual(self.call('GetSignUpURL'),
                         u'http://%shttp://%s/signUp&uuid=%s' % (STAGING_HOST, DEFAULT_HOST, UUID))
        self.assertEqual(self.call('GetForgetPasswordURL'),
                         u'http://%shttp://%s/forgetpwd&uuid=%s' % (STAGING_HOST, DEFAULT_HOST, UUID))
        self.assertEqual(self.call('GetLensCorrectionURL'),
                         u'http://%s&uuid=%s' % (STAGING_HOST, UUID))

    def test_a_known_host_is_used_without_detection(self):
        self.use_server_host()
        self.assertEqual(self.call('GetSignUpURL'),
                         u'http://%shttp://%s/signUp&uuid=%s' % (SERVER_HOST, DEFAULT_HOST, UUID))
        self.assertEqual(self.svc.requests(), [])

    def test_signed_in_the_stored_links_decoded(self):
        self.svc.script(SERVER_HOST, SIGN_IN, [xml_reply(
            u'<info><tokenid>T</tokenid><AdjustmentPreset>http%3A%2F%2Fp%2Fx%3Fa%3D1</AdjustmentPreset>'
            u'</info>')])
        self.sign_in()
        self.assertEqual(self.links(), [u'http://p/x?a=1'] + list(SERVICE_LINKS[1:]))
        self.assertEqual(self.svc.requests(), [])

    def test_after_sign_out_the_default_links_are_gone(self):
        self.sign_in()
        self.call('LogoutOrbishare')
        self.svc.host_state(DETECTION_HOST, 'down')
        self.assertEqual(self.links(), [u'http://%s&uuid=%s' % (STAGING_HOST, UUID)] * 4)

    def test_links_are_unicode_and_decoded_signed_out(self):
        self.call('SetOBURLAsReg', u'h%41st')
        for link in self.links():
            self.assertIs(type(link), unicode)
            self.assertTrue(link.startswith(u'http://hAst'), link)


if __name__ == '__main__':
    unittest.main()
