"""The session against the reference service: discovery and its reachability probe,
sign-in over TLS and sign-out, categories, related video, effect lookup and the links;
what is sent, what each reply leaves, the trace, the interpreter lock, and the
references of what the module builds."""
# ctest timeout: 60
import os
import sys
import threading
import time
import unittest

import _PyUploaderTestPeer as peer
from fixtures import (DEFAULT_HOST, DETECTION_HOST, SERVER_HOST, STAGING_HOST, UUID, SessionTest,
                      Ticker, cell, reply, text_type, wait_until, xml_reply)

OBSERVER, SIGN_IN = '/observer.jsp', '/servlet/memLogin'
CATEGORIES, VIDEO = '/servlet/getPresetCategory', '/servlet/setRelateVideo'
EFFECT = '/servlet/GetEffectByGUIDForQZM'
PROBE_LIMIT = 5.5  # seconds a probe is waited for before it is cancelled
FALLBACK = [u'Get OB server URL from server. URL = ', u'Use static URL as OB server URL.']
GETTERS = ('GetPresetDownloadURL', 'GetSignUpURL', 'GetForgetPasswordURL', 'GetLensCorrectionURL')
ACCOUNT, PASSWORD, TOKEN = u'Ann Lee', u'p&w=%41+\xe4', u'T0KEN-5ecret'
STAGING, SERVER = text_type(STAGING_HOST), text_type(SERVER_HOST)
TWO = (u'<categories><category categoryid="30">Portrait</category>'
       u'<category categoryid="77">Landscape</category></categories>')


def info_xml(root='INFO', **fields):
    order = ['APIUrl', 'AdjustmentPreset', 'SignUp', 'ForgetPassword', 'LensCorrection',
             'VideoGallery', 'firstloginUrl', 'tokenid', 'username', 'profileURL', 'search', 'errMsg']
    return u'<%s>%s</%s>' % (root, u''.join(u'<%s>%s</%s>' % (name, fields[name], name)
                                            for name in order if name in fields), root)


SIGNED_IN = info_xml('info', firstloginUrl='', tokenid=TOKEN, username='Ann', profileURL='/u/ann',
                     AdjustmentPreset='/mine?p=1', search='', errMsg='')


def links(host, *paths):
    return [u'http://%s%s&uuid=%s' % (host, path, UUID) for path in paths]


class Discovery(SessionTest):

    def discover(self, *replies):
        if replies:
            self.svc.script(DETECTION_HOST, OBSERVER, list(replies))
        self.call('InitOBServerURL')
        return self.call('GetServerUrl')

    def test_the_probe_the_request_and_the_six_fields_stored_in_order(self):
        fields = dict(APIUrl='api2.example.test', AdjustmentPreset='/presets?x=1', SignUp='/join?a=1',
                      ForgetPassword='/lost?b=2', LensCorrection='/lens?c=3', VideoGallery='/v?d=4')
        self.assertEqual(self.discover(xml_reply(info_xml(**fields))), u'api2.example.test')
        self.assertEqual(self.trace(), [u'KRV %s = %s' % (name, fields[name]) for name in (
            'SignUp', 'ForgetPassword', 'LensCorrection', 'VideoGallery')] + [FALLBACK[0] + u'api2.example.test'])
        self.assertEqual([self.call(getter) for getter in GETTERS],
                         links('api2.example.test', '/presets?x=1', '/join?a=1', '/lost?b=2', '/lens?c=3'))
        self.discover()
        probe, detection = self.svc.requests(host=DETECTION_HOST)  # sent once
        self.assertEqual((probe.path, detection.head), ('/', (
            b'GET /observer.jsp?ap=lumivanta&version=5.0&versionType=Retail HTTP/1.1\r\n'
            b'Host: %s\r\n\r\n' % DETECTION_HOST.encode('ascii'))))
        self.svc.reset()
        self.new_session(u'5.0 b', u'')  # an empty value drops its pair
        self.discover()
        self.assertEqual(self.sent(OBSERVER, DETECTION_HOST)[0].target, '/observer.jsp?ap=lumivanta&version=5.0%20b')

    def test_replies_that_name_no_usable_server_fall_back_to_staging(self):
        refused = u'Update OBInfo fail: APIUrl is not a host name: '
        cases = [(info_xml(SignUp='/join'), [u'KRV SignUp = /join'] + FALLBACK, u'/join'),
                 (info_xml('info', APIUrl=SERVER_HOST, SignUp='/join'), FALLBACK, u'http://%s/signUp' % DEFAULT_HOST)]
        cases += [(info_xml(APIUrl=value), [refused + value] + FALLBACK, u'http://%s/signUp' % DEFAULT_HOST)
                  for value in (u'api.orbishare.com:8080/evil?x=', u'user@api.orbishare.com', u'api orbishare',
                                u'', u'\xe4pi.test')]
        for document, lines, link in cases:
            self.new_session()
            self.assertEqual(self.discover(xml_reply(document)), STAGING, document)
            self.assertEqual(self.trace(), lines)
            self.assertEqual(self.call('GetSignUpURL'), links(STAGING_HOST, link)[0])

    def test_any_framing_is_read_whole_up_to_16_mib_and_cut_at_the_announced_length(self):
        # Cut anywhere, the document would not be well-formed and would yield nothing.
        document = '<INFO><P>%s</P><APIUrl>%s</APIUrl></INFO>' % ('p' * 200000, SERVER_HOST)
        too_long = info_xml(APIUrl=SERVER_HOST) + ' ' * (16 << 20)
        for answer, host in [(xml_reply(document, chunked=True, pieces=[1, 7, 100]), SERVER),
                             (xml_reply(document, no_length=True, pieces=4, pause=0.05), SERVER),
                             (reply(document + '<x', 200, [['Content-Length', str(len(document))]]), SERVER),
                             (xml_reply(too_long), STAGING), (xml_reply(too_long, no_length=True), STAGING)]:
            self.new_session()
            self.assertEqual(self.discover(answer), host)

    def test_a_404_is_reachable_a_refusing_host_falls_back_at_once_and_a_long_url_is_not_probed(self):
        self.svc.script(DETECTION_HOST, '/', [reply('missing', 404)])
        # Even with an error status, an empty field empties its link and an absent one keeps the default.
        self.assertEqual(self.discover(xml_reply(info_xml(APIUrl=SERVER_HOST, SignUp=''), status=500)), SERVER)
        self.assertEqual([self.call(g) for g in GETTERS[1:3]], links(SERVER_HOST, '', 'http://%s/forgetpwd' % DEFAULT_HOST))
        self.assertEqual((self.call('m_bServerReachable_get'), self.call('m_szChkServerUrl_get')),
                         (1, 'http://' + DETECTION_HOST))
        self.svc.reset()
        self.svc.host_state(DETECTION_HOST, 'down')
        self.new_session()
        self.assertEqual((self.discover(), self.trace(), self.call('m_bServerReachable_get')), (STAGING, FALLBACK, 0))
        os.environ['PYUPLOADER_DETECTION_HOST'] = 'd' * 253  # with "http://", 260 bytes
        self.new_session()
        self.assertEqual((self.discover(), self.call('m_szChkServerUrl_get'), self.svc.requests()), (STAGING, '', []))

    def test_a_silent_host_is_given_up_at_the_limit_and_no_handle_python_wrote_is_closed(self):
        # Answered, the probe closes its handles itself; silent, the waiting thread
        # closes them: neither may close a foreign value written from Python meanwhile.
        cells = dict((m, self.call(m + '_get')) for m in ('m_hInternet', 'm_hConnect'))
        stop = threading.Event()

        def overwrite():
            while not stop.wait(0.001):
                for member, handle in cells.items():
                    self.call(member + '_set', handle)
        for delay, host in ((0.5, SERVER), (PROBE_LIMIT + 1, STAGING)):
            for handle in cells.values():
                cell(handle).value = 0x1000
            self.call('LogoutOrbishare')
            self.clear_trace()
            self.svc.reset()
            self.svc.script(DETECTION_HOST, '/', [reply(delay=delay)])
            stop.clear()
            writer = threading.Thread(target=overwrite)
            writer.start()
            started = time.time()
            with Ticker() as ticker:
                host_found = self.discover()
            stop.set()
            writer.join()
            self.assertEqual(host_found, host)
        elapsed = time.time() - started
        self.assertTrue(PROBE_LIMIT - 0.1 <= elapsed < PROBE_LIMIT + 2.0, elapsed)
        self.assertGreater(ticker.ticks, 50, 'other Python threads were held up')
        self.assertEqual(([cell(c).value for c in cells.values()], self.call('m_bServerReachable_get'), self.trace(),
                          self.sent(OBSERVER, DETECTION_HOST)), ([0x1000, 0x1000], 0, FALLBACK, []))


class SignIn(SessionTest):

    def tearDown(self):
        text = u'\n'.join(self.trace())
        for secret in (ACCOUNT, PASSWORD, TOKEN, u'5econd'):
            self.assertNotIn(secret, text, 'the trace carries a secret')

    def login(self, account=ACCOUNT, password=PASSWORD, *replies):
        if replies:
            self.svc.script(SERVER_HOST, SIGN_IN, list(replies))
        return self.call('LoginOrbishare', account, password)

    def state(self):
        return self.call('GetLoginTokenID'), self.call('GetUserName')

    def test_the_form_goes_over_tls_after_discovery_and_the_default_host_probe(self):
        with Ticker() as ticker:
            self.assertEqual(self.login(ACCOUNT, PASSWORD, xml_reply(SIGNED_IN, delay=1.5)), 1)
        self.assertGreater(ticker.ticks, 20, 'the interpreter lock was kept while the service answered')
        self.assertEqual([(r.host, r.path) for r in self.svc.requests()], [
            (DETECTION_HOST, '/'), (DETECTION_HOST, OBSERVER), (DEFAULT_HOST, '/'), (SERVER_HOST, SIGN_IN)])
        [login] = self.sent(SIGN_IN)
        body = (b'account=Ann%20Lee&pwd=p%26w%3d%2541%2b%c3%a4&AP=KRV&Version=5.0'
                b'&versionType=Retail&uuid=' + UUID.encode('ascii'))
        self.assertEqual((login.tls, login.port, login.body), (True, 443, body))
        self.assertEqual(login.head, b'POST /servlet/memLogin HTTP/1.1\r\nHost: ' + SERVER_HOST.encode('ascii') +
                         b'\r\nUser-Agent: Lumivanta\r\nContent-Type: application/x-www-form-urlencoded'
                         b'\r\nContent-Length: %d\r\n\r\n' % len(body))
        self.assertEqual(self.state(), (TOKEN, u'Ann'))
        self.assertEqual(self.call('GetPresetDownloadURL'), u'/mine?p=1')  # stored, as it is
        self.svc.reset()
        self.call('SetOBURLAsReg', STAGING)  # a host set by the application: no detection
        token = u't' * 400  # long values are kept whole
        self.svc.script(STAGING_HOST, SIGN_IN, [xml_reply(info_xml('info', tokenid=token))])
        self.assertEqual((self.login(u'a' * 3000, u'&' * 1000), self.call('GetLoginTokenID')), (1, token))
        self.assertEqual([(r.host, r.path, r.body.split(b'&AP=')[0]) for r in self.svc.requests()], [
            (DEFAULT_HOST, '/', b''), (STAGING_HOST, SIGN_IN, b'account=' + b'a' * 3000 + b'&pwd=' + b'%26' * 1000)])
        self.call('SetOBURLAsReg', u'')  # unknown again
        self.assertEqual((self.call('InitOBServerURL'), self.call('GetServerUrl')), (None, SERVER))

    def test_a_first_login_page_is_opened_and_its_token_not_kept(self):
        first_login = 'https://www.orbishare.com/firstLogin?id=7'
        self.login(ACCOUNT, PASSWORD, xml_reply(SIGNED_IN), xml_reply(info_xml(
            'info', firstloginUrl=first_login, tokenid=u'T-5econd', username='Bo')))
        self.assertEqual(self.login(), 0)
        wait_until(lambda: os.path.exists(self.browser + '.links'), 10.0, 'opened link')
        with open(self.browser + '.links') as opened:
            self.assertEqual(opened.read().splitlines(), [first_login])
        self.assertEqual(self.state(), (TOKEN, u'Bo'))

    def test_replies_without_a_token_sign_nobody_in(self):
        cases = [(info_xml('info', username='Ann'), u'Ann', [u'No tokenID, login failed!!']),
                 (info_xml('INFO', tokenid=TOKEN, username='Ann'), u'', None), ('not xml', u'', None)]
        for document, user_name, trace in cases:
            self.call('LogoutOrbishare')
            self.clear_trace()
            self.assertEqual(self.login(ACCOUNT, PASSWORD, xml_reply(document)), 0, document)
            lines = self.trace()[-1:] if trace else None
            self.assertEqual((self.state(), lines), ((u'', user_name), trace), document)

    def test_refusals_before_anything_is_sent_and_refused_certificates(self):
        self.assertEqual((self.login(u'', PASSWORD), self.login(ACCOUNT, u''), self.svc.requests()), (0, 0, []))
        self.assertEqual(self.trace(), [u'Login OB fail: Empty user name or password'] * 2)
        self.svc.host_state(DEFAULT_HOST, 'down')
        self.assertEqual(self.login(), 0)
        self.assertEqual(self.trace()[-1], u'Login OB fail: Can not reach the OB server')
        for certificate in ['expired', 'wrong-name']:
            self.svc.reset()
            self.svc.tls(certificate)
            self.assertEqual(self.login(), 0, certificate)
            self.assertEqual((self.state(), self.sent(SIGN_IN)), ((u'', u''), []), certificate)

    def test_a_failed_sign_in_keeps_the_earlier_one_and_sign_out_forgets_all(self):
        self.assertEqual(self.login(ACCOUNT, PASSWORD, xml_reply(SIGNED_IN)), 1)
        self.assertEqual(self.login(ACCOUNT, PASSWORD, xml_reply(info_xml('info', errMsg='no'))), 0)
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertEqual((self.login(), self.call('GetLoginTokenID')), (0, TOKEN))
        self.svc.reset()
        self.call('GetPresetCategory', u'en')
        categories = self.call('GetCategoryCount')
        self.svc.reset()
        self.svc.host_state(DETECTION_HOST, 'down')  # the getters below find nothing anew
        self.call('LogoutOrbishare')
        self.assertEqual(self.svc.requests(), [], 'sign-out sent something')
        self.assertEqual((self.state(), self.call('GetServerUrl'), self.call('m_bServerReachable_get'),
                          self.call('GetCategoryCount')), ((u'', u''), u'', 0, categories))
        # Signed out, each getter composes host + stored link + machine id, all now empty.
        self.assertEqual([self.call(getter) for getter in GETTERS], links(STAGING_HOST, '', '', '', ''))


class CategoriesRelatedVideoEffectsAndLinks(SessionTest):

    def categories(self, document, language=u'DEU'):
        if document is not None:
            self.svc.script(SERVER_HOST, CATEGORIES, [xml_reply(document)])
        return self.call('GetPresetCategory', language)

    def name_of(self, category_id):
        text = peer.new_CString(u'unchanged')
        found = self.call('GetCategroyName', category_id, text), peer.CString_value(text)
        peer.delete_CString(text)
        return found

    def test_the_map_grows_from_each_reply_and_names_are_found_by_id(self):
        self.call('SetOBURLAsReg', SERVER)
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertEqual((self.categories(None), self.call('GetCategoryCount')), ({}, 0))
        self.svc.host_state(SERVER_HOST, 'up')
        self.assertEqual(self.categories(TWO, u'L' * 3000), {u'30': u'Portrait', u'77': u'Landscape'})
        [request] = self.sent(CATEGORIES)
        self.assertEqual((request.method, request.target, request.body),
                         ('POST', CATEGORIES + '?Locid=' + 'L' * 3000 + '&Version=5.0', b''))
        self.assertEqual((self.call('GetCategoryCount'), self.name_of(77), self.name_of(70)),
                         (2, (1, u'Landscape'), (0, u'unchanged')))
        replies = [
            (u'<categories><category categoryid="30">Portr\xe4t</category>'
             u'<category categoryid="9">Natur</category></categories>', {u'30': u'Portr\xe4t', u'9': u'Natur'}),
            (u'<CATEGORIES><Category categoryid="4">Read</Category>'
             u'<category CategoryID="5">Skipped</category></CATEGORIES>', {u'4': u'Read'}),
            (u'<?xml version="1.0"?><!-- l --><categories><!-- c --><category categoryid="3">'
             u'Port<b>rait</b></category><item categoryid="8">Other</item></categories>', {u'3': u'Portrait'}),
            (u'<categories><category>None</category><category categoryid="">Empty</category>'
             u'<category categoryid="-2">Negative</category></categories>', {u'-2': u'Negative'}),
            (u'<categories><category categoryid="1">cut', {}), (u'<other/>', {}),
        ]
        expected = {u'77': u'Landscape'}
        for document, added in replies:
            expected.update(added)
            self.assertEqual(self.categories(document), expected, document)
        self.assertEqual(self.name_of(-2), (1, u'Negative'))
        self.clear_trace()
        many = self.categories(u'<categories>%s</categories>' % u''.join(  # one reply adds at most 10000
            u'<category categoryid="%d">C%d</category>' % (i, i) for i in range(100000, 110005)))
        self.assertEqual((len(many) - len(expected), many[u'100000'], many[u'109999']), (10000, u'C100000', u'C109999'))
        self.assertEqual(self.trace(), [u'GetPresetCategory: only the first 10000 categories of the reply are kept.'])

    QUERY = '&AP=KRV&Version=5.0&versionType=Retail&uuid=machine-1'
    ID_REPLY = xml_reply(u'<info><videoId>V42</videoId></info>')

    def sign_in(self, document=SIGNED_IN):
        self.svc.script(SERVER_HOST, SIGN_IN, [xml_reply(document)])
        self.assertEqual(self.call('LoginOrbishare', u'member', u'secret'), 1)
        self.svc.reset()  # later assertions see only the operation's requests
        self.clear_trace()

    def relate(self, *replies):
        self.svc.script(SERVER_HOST, VIDEO, list(replies))
        return self.call('SetRelateVideo', u'http://videos.example/v?id=1', u'VidSite', u'a=1&b=2')

    def lookup(self, document=None, guid=u'G-1'):
        if document is not None:
            self.svc.script(SERVER_HOST, EFFECT, [xml_reply(document)])
        return self.call('GetEffectByGUID', guid)

    def test_related_video_sends_two_requests_and_the_answers_decide_result_and_trace(self):
        self.assertIsNone(self.relate())
        self.assertEqual((self.trace(), self.svc.requests()), ([u'SetRelateVideo GetTokenID fail'], []))
        self.sign_in()
        answer = xml_reply(u'<info><videoUrl>http://x/\xe9%20</videoUrl></info>')
        self.assertEqual((self.relate(self.ID_REPLY, answer), self.trace()), (u'http://x/\xe9%20', []))
        self.assertEqual([(r.method, r.target, r.body) for r in self.sent(VIDEO)], [
            ('POST', VIDEO + '?tokenid=' + TOKEN + self.QUERY, b''),
            ('POST', VIDEO + '?tokenid=%s&videoID=V42&videoURL=http://videos.example/v?id=1'
             '&website=VidSite%s&a=1&b=2' % (TOKEN, self.QUERY), b'')])
        for answer, expected in [(xml_reply(u'<info><errMsg>no</errMsg></info>'), None), (reply(''), None),
                                 (xml_reply(u'<info><videoUrl></videoUrl></info>'), u''),
                                 (xml_reply(u'<INFO><videoUrl>x</videoUrl></INFO>'), None)]:
            self.assertEqual(self.relate(self.ID_REPLY, answer), expected, answer)
        for answer in (xml_reply(u'<info><videoUrl>x</videoUrl></info>'), reply(''),
                       xml_reply(u'<info><videoId></videoId></info>')):
            self.svc.reset()
            self.clear_trace()
            self.assertIsNone(self.relate(answer))
            self.assertEqual((len(self.sent(VIDEO)), self.trace()), (1, [u'SetRelateVideo GetVideoID fail']))
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertIsNone(self.relate())

    def test_the_effect_lookup_sends_the_token_and_the_last_pip_url_wins(self):
        self.call('SetOBURLAsReg', SERVER)
        self.lookup(u'<PIP/>')
        self.assertEqual([(r.method, r.target, r.body) for r in self.sent(EFFECT)],
                         [('POST', EFFECT + '?token=&guid=G-1', b'')])
        for document, expected in [
                (u'<!-- c --><pip><!-- c --><pipURL>x%2Fy</pipURL></pip>', u'x/y'),
                (u'<PIP><pipURL>first</pipURL><PIPurl>second</PIPurl></PIP>', u'second'),
                (u'<PIP><pipURL>a<b>%41</b></pipURL><other>x</other></PIP>', u'aA'),
                (u'<PIP><link>x</link></PIP>', u''), (u'<info><pipURL>x</pipURL></info>', u''), (u'not xml', u'')]:
            self.assertEqual(self.lookup(document), expected, document)
        self.sign_in()
        self.assertEqual(self.lookup(guid=u'{AB CD}'), u'http://%s/download/pip/{AB CD}.zip' % SERVER_HOST)
        self.assertEqual(self.sent(EFFECT)[0].target, EFFECT + '?token=%s&guid={AB%%20CD}' % TOKEN)
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertEqual(self.lookup(), u'')

    def test_links_signed_out_are_composed_and_signed_in_are_the_stored_ones_decoded(self):
        self.assertEqual([self.call(getter) for getter in GETTERS], links(
            SERVER_HOST, '/community/presets.jsp?ap=lumivanta', '/member/signUp.jsp?ap=lumivanta',
            '/member/forgetpwd.jsp?ap=lumivanta', '/lens/correction.jsp?ap=lumivanta'))
        self.new_session()
        self.call('SetOBURLAsReg', u'h%41st')
        self.assertTrue(self.call('GetSignUpURL').startswith(u'http://hAst'))
        self.call('SetOBURLAsReg', SERVER)
        self.sign_in(u'<info><tokenid>T</tokenid><AdjustmentPreset>http%3A%2F%2Fp%2Fx%3Fa%3D1</AdjustmentPreset></info>')
        self.assertEqual((self.call(GETTERS[0]), self.svc.requests()), (u'http://p/x?a=1', []))

    def test_every_object_the_module_builds_holds_only_the_references_python_holds(self):
        self.sign_in(info_xml('info', tokenid='tok', username='Ann'))
        self.svc.script(SERVER_HOST, CATEGORIES, [xml_reply(TWO)])
        self.svc.script(SERVER_HOST, EFFECT, [xml_reply(u'<PIP><pipURL>link</pipURL></PIP>')])
        self.svc.script(SERVER_HOST, VIDEO, [self.ID_REPLY, xml_reply(u'<info><videoUrl>vu</videoUrl></info>')])
        results = [self.call(name) for name in ('GetUserName', 'GetLoginTokenID', 'GetServerUrl')
                   + GETTERS + ('m_szChkServerUrl_get',)]
        results += [self.call('GetEffectByGUID', u'g'), self.call('SetRelateVideo', u'v', u's', u'i')]
        dictionary = self.call('GetPresetCategory', u'ENU')
        self.assertEqual(sys.getrefcount(dictionary), 2)
        results += list(dictionary.keys()) + list(dictionary.values())
        del dictionary
        self.assertEqual([sys.getrefcount(r) for r in results], [3] * len(results))


if __name__ == '__main__':
    unittest.main()
