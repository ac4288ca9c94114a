"""Sign-in and sign-out against the reference service: the request as it goes
over TLS, what the reply leaves in the session, the first-login page, the
failures that keep an earlier sign-in, and no secret in the trace."""
import unittest

import _PyUploader as native
from refservice import DEFAULT_HOST, DETECTION_HOST, SERVER_HOST, STAGING_HOST, xml_reply
from service_session import UUID, SessionTest, Ticker, info_xml

MEM_LOGIN = '/servlet/memLogin'
ACCOUNT = u'Ann Lee'
PASSWORD = u'p&w=%41\xe4'
TOKEN = u'T0KEN-5ecret'
SECOND_TOKEN = u'T0KEN-5econd'
FIRST_LOGIN = 'https://www.orbishare.com/firstLogin?id=7'
SIGNED_IN = info_xml('info', firstloginUrl='', tokenid=TOKEN, username='Ann',
                     profileURL='/u/ann', AdjustmentPreset='/mine?p=1', search='', errMsg='')


class LoginTest(SessionTest):

    def setUp(self):
        SessionTest.setUp(self)
        self.secrets = [ACCOUNT, PASSWORD, TOKEN, SECOND_TOKEN]

    def tearDown(self):
        trace = self.trace_text()
        for secret in self.secrets:
            self.assertNotIn(secret, trace, 'the trace carries a secret')
        SessionTest.tearDown(self)

    def answer_login(self, *replies):
        self.svc.script(SERVER_HOST, MEM_LOGIN, list(replies))

    def login(self, account=ACCOUNT, password=PASSWORD):
        return self.call('LoginOrbishare', account, password)

    def logins(self):
        return self.svc.requests(host=SERVER_HOST, path=MEM_LOGIN)

    def signed_in_state(self):
        return (self.call('GetLoginTokenID'), self.call('GetUserName'))


class Request(LoginTest):

    def test_the_form_goes_over_tls_exactly_as_the_service_expects(self):
        self.answer_login(xml_reply(SIGNED_IN))
        self.assertEqual(self.login(), 1)
        [login] = self.logins()
        body = ('account=Ann%20Lee&pwd=p%26w%3d%2541%c3%a4'
                '&AP=KRV&Version=5.0&versionType=Retail&uuid=' + UUID)
        self.assertTrue(login.tls)
        self.assertEqual(login.port, 443)
        self.assertEqual(login.head,
                         'POST /servlet/memLogin HTTP/1.1\r\n'
                         'Host: %s\r\n'
                         'User-Agent: Lumivanta\r\n'
                         'Content-Type: application/x-www-form-urlencoded\r\n'
                         'Content-Length: %d\r\n\r\n' % (SERVER_HOST, len(body)))
        self.assertEqual(login.body, body)

    def test_discovery_and_the_default_host_probe_come_first(self):
        self.login()
        sent = [(r.host, r.path) for r in self.svc.requests()]
        self.assertEqual(sent, [(DETECTION_HOST, '/'), (DETECTION_HOST, '/observer.jsp'),
                                (DEFAULT_HOST, '/'), (SERVER_HOST, MEM_LOGIN)])

    def test_a_host_set_by_the_application_still_probes_the_default_host(self):
        self.call('SetOBURLAsReg', unicode(STAGING_HOST))
        self.assertEqual(self.login(), 1)
        sent = [(r.host, r.path) for r in self.svc.requests()]
        self.assertEqual(sent, [(DEFAULT_HOST, '/'), (STAGING_HOST, MEM_LOGIN)])

    def test_other_python_threads_run_while_the_service_answers(self):
        self.answer_login(xml_reply(SIGNED_IN, delay=1.5))
        with Ticker() as ticker:
            self.assertEqual(self.login(), 1)
        self.assertGreater(ticker.ticks, 20, 'the interpreter lock was kept')


class Reply(LoginTest):

    def test_a_full_reply_with_an_empty_first_login_link_signs_the_member_in(self):
        self.answer_login(xml_reply(SIGNED_IN))
        self.assertEqual(self.login(), 1)
        self.assertEqual(self.signed_in_state(), (TOKEN, u'Ann'))
        # Signed in, the link getters hand out the stored links as they are.
        self.assertEqual(self.call('GetPresetDownloadURL'), u'/mine?p=1')

    def test_a_first_login_page_is_opened_and_the_token_not_kept(self):
        self.answer_login(xml_reply(SIGNED_IN), xml_reply(info_xml(
            'info', firstloginUrl=FIRST_LOGIN, tokenid=SECOND_TOKEN, username='Bo')))
        self.login()
        self.assertEqual(self.login(), 0)
        self.assertEqual(self.opened_links(1), [FIRST_LOGIN])
        self.assertEqual(self.signed_in_state(), (TOKEN, u'Bo'))

    def test_replies_without_a_token_sign_nobody_in(self):
        cases = [(info_xml('info', username='Ann'), u'Ann', [u'No tokenID, login failed!!']),
                 (info_xml('INFO', tokenid=TOKEN, username='Ann'), u'', None),
                 ('not xml', u'', None)]
        for document, user_name, trace in cases:
            self.svc.reset()
            self.call('LogoutOrbishare')
            self.clear_trace()
            self.answer_login(xml_reply(document))
            self.assertEqual(self.login(), 0, document)
            self.assertEqual(self.signed_in_state(), (u'', user_name), document)
            if trace is not None:
                self.assertEqual(self.trace_lines()[-1:], trace, document)

    def test_long_values_are_kept_whole(self):
        token = u't' * 400
        self.secrets.append(token)
        self.answer_login(xml_reply(info_xml('info', tokenid=token)))
        self.assertEqual(self.login(u'a' * 3000, u'&' * 1000), 1)
        self.assertEqual(self.call('GetLoginTokenID'), token)
        [login] = self.logins()
        self.assertTrue(login.body.startswith('account=' + 'a' * 3000 + '&pwd=' + '%26' * 1000 +
                                              '&AP=KRV'))


class Failures(LoginTest):

    def test_an_empty_account_or_password_is_refused_before_anything_is_sent(self):
        for account, password in [(u'', PASSWORD), (ACCOUNT, u''), (u'', u'')]:
            self.clear_trace()
            self.assertEqual(self.login(account, password), 0)
            self.assertEqual(self.trace_lines(), [u'Login OB fail: Empty user name or password'])
        self.assertEqual(self.svc.requests(), [])

    def test_an_unreachable_default_host_stops_the_sign_in(self):
        self.svc.host_state(DEFAULT_HOST, 'down')
        self.assertEqual(self.login(), 0)
        self.assertEqual(self.trace_lines()[-1], u'Login OB fail: Can not reach the OB server')
        self.assertEqual(self.logins(), [])

    def test_certificates_with_a_wrong_name_or_dates_are_refused(self):
        for certificate in ['expired', 'wrong-name']:
            self.svc.reset()
            self.svc.tls(certificate)
            self.assertEqual(self.login(), 0, certificate)
            self.assertEqual(self.signed_in_state(), (u'', u''), certificate)
            self.assertEqual(self.logins(), [], certificate)

    def test_a_failed_second_sign_in_keeps_the_first_and_a_later_success_replaces_it(self):
        self.answer_login(xml_reply(SIGNED_IN))
        self.assertEqual(self.login(), 1)
        failures = [lambda: self.answer_login(xml_reply(info_xml('info', errMsg='no'))),
                    lambda: self.svc.host_state(SERVER_HOST, 'down')]
        for make_it_fail in failures:
            make_it_fail()
            self.assertEqual(self.login(), 0)
            self.assertEqual(self.call('GetLoginTokenID'), TOKEN)
        self.assertEqual(self.call('GetPresetDownloadURL'), u'/mine?p=1', 'still signed in')
        self.svc.host_state(SERVER_HOST, 'up')
        self.answer_login(xml_reply(info_xml('info', tokenid=SECOND_TOKEN, username='Bo')))
        self.assertEqual(self.login(), 1)
        self.assertEqual(self.signed_in_state(), (SECOND_TOKEN, u'Bo'))



class SignOut(LoginTest):

    def test_everything_the_member_and_discovery_left_is_forgotten(self):
        self.answer_login(xml_reply(SIGNED_IN))
        self.login()
        self.call('GetPresetCategory', u'en')
        categories = self.call('GetCategoryCount')
        self.assertGreater(categories, 0)
        self.svc.reset()
        self.svc.host_state(DETECTION_HOST, 'down')  # the getters below find nothing anew

        self.call('LogoutOrbishare')
        self.assertEqual(self.svc.requests(), [], 'sign-out sent something')
        self.assertEqual(self.signed_in_state(), (u'', u''))
        self.assertEqual(self.call('GetServerUrl'), u'')
        self.assertEqual(native.OBLoginData_m_bServerReachable_get(self.session), 0)
        self.assertEqual(self.call('GetCategoryCount'), categories)
        # Signed out, each getter composes host + stored link + machine id: every
        # stored link, the defaults included, is now empty.
        bare = u'http://%s&uuid=%s' % (STAGING_HOST, UUID)
        for getter in ['GetSignUpURL', 'GetForgetPasswordURL', 'GetLensCorrectionURL',
                       'GetPresetDownloadURL']:
            self.assertEqual(self.call(getter), bare, getter)


if __name__ == '__main__':
    unittest.main()
