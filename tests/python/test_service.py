"""The session against the reference service: discovery and its reachability
probe, sign-in over TLS and sign-out, categories, related video, effect lookup
and the service links; what is sent, what each reply leaves, the trace lines,
the interpreter lock, and the references of what the module builds."""
# ctest timeout: 45
import os
import sys
import threading
import time
import unittest

import _PyUploaderTestPeer as peer
from fixtures import (DEFAULT_HOST, DETECTION_HOST, SERVER_HOST, STAGING_HOST, UUID, SessionTest,
                      Ticker, cell, reply, xml_reply)

OBSERVER = '/observer.jsp'
SIGN_IN = '/servlet/memLogin'
CATEGORIES = '/servlet/getPresetCategory'
VIDEO = '/servlet/setRelateVideo'
EFFECT = '/servlet/GetEffectByGUIDForQZM'
PROBE_LIMIT = 5.5  # seconds a probe is waited for before it is cancelled
FALLBACK = [u'Get OB server URL from server. URL = ', u'Use static URL as OB server URL.']
GETTERS = ('GetPresetDownloadURL', 'GetSignUpURL', 'GetForgetPasswordURL', 'GetLensCorrectionURL')
# The links of the plausible service's information reply, in the getters' order.
SERVICE_LINKS = ('/community/presets.jsp?ap=lumivanta', '/member/signUp.jsp?ap=lumivanta',
                 '/member/forgetpwd.jsp?ap=lumivanta', '/lens/correction.jsp?ap=lumivanta')
ACCOUNT, PASSWORD, TOKEN = u'Ann Lee', u'p&w=%41+\xe4', u'T0KEN-5ecret'
TWO = (u'<categories><category categoryid="30">Portrait</category>'
       u'<category categoryid="77">Landscape</category></categories>')


def info_xml(root='INFO', **fields):
    order = ['APIUrl', 'AdjustmentPreset', 'SignUp', 'ForgetPassword', 'LensCorrection',
             'VideoGallery', 'firstloginUrl', 'tokenid', 'username', 'profileURL', 'search',
             'errMsg']
    return '<%s>%s</%s>' % (root, ''.join('<%s>%s</%s>' % (name, fields[name], name)
                                          for name in order if name in fields), root)


SIGNED_IN = info_xml('info', firstloginUrl='', tokenid=TOKEN, username='Ann', profileURL='/u/ann',
                     AdjustmentPreset='/mine?p=1', search='', errMsg='')


class Discovery(SessionTest):

    def discover(self, *replies):
        if replies:
            self.svc.script(DETECTION_HOST, OBSERVER, list(replies))
        self.call('InitOBServerURL')
        return self.call('GetServerUrl')

    def test_the_six_fields_are_stored_in_order_and_make_the_links(self):
        fields = dict(APIUrl='api2.example.test', AdjustmentPreset='/presets?x=1', SignUp='/join?a=1',
                      ForgetPassword='/lost?b=2', LensCorrection='/lens?c=3', VideoGallery='/v?d=4')
        self.assertEqual(self.discover(xml_reply(info_xml(**fields))), u'api2.example.test')
        self.assertEqual(self.trace(), [
            u'KRV SignUp = /join?a=1', u'KRV ForgetPassword = /lost?b=2',
            u'KRV LensCorrection = /lens?c=3', u'KRV VideoGallery = /v?d=4',
            u'Get OB server URL from server. URL = api2.example.test'])
        self.assertEqual([self.call(getter) for getter in GETTERS],
                         [u'http://api2.example.test%s&uuid=%s' % (link, UUID) for link in
                          ('/presets?x=1', '/join?a=1', '/lost?b=2', '/lens?c=3')])
        self.discover()
        self.assertEqual(len(self.sent(OBSERVER, DETECTION_HOST)), 1, 'detection is sent once')

    def test_the_probe_then_the_request_with_its_values_fit_for_a_request_target(self):
        self.discover()
        probe, detection = self.svc.requests(host=DETECTION_HOST)
        self.assertEqual((probe.path, detection.head), ('/', (
            'GET /observer.jsp?ap=lumivanta&version=5.0&versionType=Retail HTTP/1.1\r\n'
            'Host: %s\r\n\r\n' % DETECTION_HOST)))
        self.svc.reset()
        self.new_session(u'5.0 b', u'')  # an empty value drops its pair
        self.discover()
        self.assertEqual(self.sent(OBSERVER, DETECTION_HOST)[0].target, '/observer.jsp?ap=lumivanta&version=5.0%20b')

    def test_replies_that_name_no_server_fall_back_to_staging(self):
        cases = [(xml_reply(info_xml(SignUp='/join')), [u'KRV SignUp = /join'] + FALLBACK, u'/join'),
                 (xml_reply(info_xml('info', APIUrl=SERVER_HOST, SignUp='/join')), FALLBACK,
                  u'http://%s/signUp' % DEFAULT_HOST)]
        for answer, lines, link in cases:
            self.new_session()
            self.assertEqual(self.discover(answer), unicode(STAGING_HOST))
            self.assertEqual(self.trace(), lines)
            self.assertEqual(self.call('GetSignUpURL'), u'http://%s%s&uuid=%s' % (STAGING_HOST, link, UUID))

    def test_a_server_host_that_is_not_a_bare_host_name_is_refused(self):
        for value in [u'api.orbishare.com:8080/evil?x=', u'user@api.orbishare.com', u'api.orbishare.com/path',
                      u'api orbishare', u'api.orbishare.com?q', u'', u'\xe4pi.test']:
            self.new_session()
            self.assertEqual(self.discover(xml_reply(info_xml(APIUrl=value.encode('utf-8')))), unicode(STAGING_HOST))
            self.assertEqual(self.trace(), [u'Update OBInfo fail: APIUrl is not a host name: ' + value] + FALLBACK)

    def test_values_written_from_python_into_the_handles_are_never_closed(self):
        # Answered while it waits, the probe closes its handles itself; silent, the
        # waiting thread closes them: neither may close a foreign value.
        cells = [self.call(m + '_get') for m in ('m_hInternet', 'm_hConnect')]
        for handle in cells:
            cell(handle).value = 0x1000
        stop = threading.Event()

        def overwrite():
            while not stop.is_set():
                self.call('m_hInternet_set', cells[0])
                self.call('m_hConnect_set', cells[1])
                time.sleep(0.001)
        for delay, host in ((1, SERVER_HOST), (PROBE_LIMIT + 0.5, STAGING_HOST)):
            self.call('LogoutOrbishare')
            self.svc.script(DETECTION_HOST, '/', [reply(delay=delay)])
            writer = threading.Thread(target=overwrite)
            writer.start()
            try:
                self.assertEqual(self.discover(), unicode(host))
            finally:
                stop.set()
                writer.join()
                stop.clear()

    def test_an_empty_field_empties_its_link_and_an_absent_one_keeps_the_default(self):
        self.discover(xml_reply(info_xml(APIUrl=SERVER_HOST, SignUp=''), status=500))
        self.assertEqual(self.call('GetSignUpURL'), u'http://%s&uuid=%s' % (SERVER_HOST, UUID))
        self.assertEqual(self.call('GetForgetPasswordURL'),
                         u'http://%shttp://%s/forgetpwd&uuid=%s' % (SERVER_HOST, DEFAULT_HOST, UUID))

    def test_any_framing_is_read_whole_up_to_16_mib_and_cut_at_the_announced_length(self):
        # Cut anywhere, the document would not be well-formed and would yield nothing.
        document = '<INFO><P>%s</P><APIUrl>%s</APIUrl></INFO>' % ('p' * 200000, SERVER_HOST)
        too_long = info_xml(APIUrl=SERVER_HOST) + ' ' * (16 << 20)
        for answer, host in [(xml_reply(document, chunked=True, pieces=[1, 7, 100]), SERVER_HOST),
                             (xml_reply(document, no_length=True, pieces=4, pause=0.05), SERVER_HOST),
                             (reply(document + '<x', 200, [['Content-Length', str(len(document))]]), SERVER_HOST),
                             (xml_reply(too_long), STAGING_HOST), (xml_reply(too_long, no_length=True), STAGING_HOST)]:
            self.new_session()
            self.assertEqual(self.discover(answer), unicode(host))

    def test_a_404_is_reachable_a_refusing_host_falls_back_at_once_and_a_long_url_is_not_probed(self):
        self.svc.script(DETECTION_HOST, '/', [reply('missing', 404)])
        self.assertEqual(self.discover(), unicode(SERVER_HOST))
        self.assertEqual((self.call('m_bServerReachable_get'), self.call('m_szChkServerUrl_get')),
                         (1, 'http://' + DETECTION_HOST))
        self.new_session()
        self.svc.reset()
        self.svc.host_state(DETECTION_HOST, 'down')
        self.assertEqual(self.discover(), unicode(STAGING_HOST))
        self.assertEqual((self.trace(), self.call('m_bServerReachable_get')), (FALLBACK, 0))
        self.assertEqual(self.svc.requests(), [])
        os.environ['PYUPLOADER_DETECTION_HOST'] = 'd' * 253  # with "http://", 260 bytes
        self.new_session()
        self.assertEqual(self.discover(), unicode(STAGING_HOST))
        self.assertEqual((self.call('m_szChkServerUrl_get'), self.svc.requests()), ('', []))

    def test_a_silent_host_is_given_up_at_the_limit_while_other_threads_run(self):
        self.svc.script(DETECTION_HOST, '/', [reply(delay=PROBE_LIMIT + 1)])
        started = time.time()
        with Ticker() as ticker:
            self.assertEqual(self.discover(), unicode(STAGING_HOST))
        elapsed = time.time() - started
        self.assertGreaterEqual(elapsed, PROBE_LIMIT - 0.1)
        self.assertLess(elapsed, PROBE_LIMIT + 2.0, 'the cancelled probe did not end')
        self.assertGreater(ticker.ticks, 50, 'other Python threads were held up')
        handles = [(cell(self.call(m + '_get')).value or 0) for m in ('m_hInternet', 'm_hConnect')]
        self.assertEqual((handles, self.call('m_bServerReachable_get')), ([0, 0], 0))
        self.assertEqual((self.trace(), self.sent(OBSERVER, DETECTION_HOST)), (FALLBACK, []))


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
            (DETECTION_HOST, '/'), (DETECTION_HOST, OBSERVER), (DEFAULT_HOST, '/'),
            (SERVER_HOST, SIGN_IN)])
        [login] = self.sent(SIGN_IN)
        body = ('account=Ann%20Lee&pwd=p%26w%3d%2541%2b%c3%a4&AP=KRV&Version=5.0'
                '&versionType=Retail&uuid=' + UUID)
        self.assertEqual((login.tls, login.port, login.body), (True, 443, body))
        self.assertEqual(login.head, 'POST /servlet/memLogin HTTP/1.1\r\nHost: %s\r\n'
                         'User-Agent: Lumivanta\r\nContent-Type: application/x-www-form-urlencoded'
                         '\r\nContent-Length: %d\r\n\r\n' % (SERVER_HOST, len(body)))
        self.assertEqual(self.state(), (TOKEN, u'Ann'))
        self.assertEqual(self.call('GetPresetDownloadURL'), u'/mine?p=1')  # stored, as it is
        self.svc.reset()
        self.call('SetOBURLAsReg', unicode(STAGING_HOST))  # a host set by the application: no detection
        self.assertEqual(self.login(), 1)
        self.assertEqual([(r.host, r.path) for r in self.svc.requests()],
                         [(DEFAULT_HOST, '/'), (STAGING_HOST, SIGN_IN)])
        self.call('SetOBURLAsReg', u'')  # unknown again
        self.assertEqual((self.call('InitOBServerURL'), self.call('GetServerUrl')), (None, unicode(SERVER_HOST)))

    def test_a_first_login_page_is_opened_and_its_token_not_kept(self):
        first_login = 'https://www.orbishare.com/firstLogin?id=7'
        self.login(ACCOUNT, PASSWORD, xml_reply(SIGNED_IN), xml_reply(info_xml(
            'info', firstloginUrl=first_login, tokenid=u'T-5econd', username='Bo')))
        self.assertEqual(self.login(), 0)
        self.assertEqual(self.opened_links(), [first_login])
        self.assertEqual(self.state(), (TOKEN, u'Bo'))

    def test_replies_without_a_token_sign_nobody_in(self):
        cases = [(info_xml('info', username='Ann'), u'Ann', [u'No tokenID, login failed!!']),
                 (info_xml('INFO', tokenid=TOKEN, username='Ann'), u'', None), ('not xml', u'', None)]
        for document, user_name, trace in cases:
            self.call('LogoutOrbishare')
            self.clear_trace()
            self.assertEqual(self.login(ACCOUNT, PASSWORD, xml_reply(document)), 0, document)
            self.assertEqual(self.state(), (u'', user_name), document)
            if trace:
                self.assertEqual(self.trace()[-1:], trace, document)

    def test_long_values_are_kept_whole(self):
        token = u't' * 400
        self.assertEqual(self.login(u'a' * 3000, u'&' * 1000, xml_reply(info_xml('info', tokenid=token))), 1)
        self.assertEqual(self.call('GetLoginTokenID'), token)
        self.assertTrue(self.sent(SIGN_IN)[0].body.startswith(
            'account=' + 'a' * 3000 + '&pwd=' + '%26' * 1000 + '&AP=KRV'))

    def test_refusals_before_anything_is_sent_and_refused_certificates(self):
        for account, password in [(u'', PASSWORD), (ACCOUNT, u'')]:
            self.clear_trace()
            self.assertEqual(self.login(account, password), 0)
            self.assertEqual(self.trace(), [u'Login OB fail: Empty user name or password'])
        self.assertEqual(self.svc.requests(), [])
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
        self.assertEqual(self.login(), 0)
        self.assertEqual(self.call('GetLoginTokenID'), TOKEN)
        self.svc.reset()
        self.call('GetPresetCategory', u'en')
        categories = self.call('GetCategoryCount')
        self.svc.reset()
        self.svc.host_state(DETECTION_HOST, 'down')  # the getters below find nothing anew
        self.call('LogoutOrbishare')
        self.assertEqual(self.svc.requests(), [], 'sign-out sent something')
        self.assertEqual((self.state(), self.call('GetServerUrl')), ((u'', u''), u''))
        self.assertEqual((self.call('m_bServerReachable_get'), self.call('GetCategoryCount')),
                         (0, categories))
        # Signed out, each getter composes host + stored link + machine id, all now empty.
        self.assertEqual([self.call(getter) for getter in GETTERS],
                         [u'http://%s&uuid=%s' % (STAGING_HOST, UUID)] * 4)


class Categories(SessionTest):

    def setUp(self):
        SessionTest.setUp(self)
        self.call('SetOBURLAsReg', unicode(SERVER_HOST))

    def categories(self, document, language=u'ENU'):
        if document is not None:
            self.svc.script(SERVER_HOST, CATEGORIES, [xml_reply(document)])
        return self.call('GetPresetCategory', language)

    def name_of(self, category_id):
        text = peer.new_CString(u'unchanged')
        try:
            return self.call('GetCategroyName', category_id, text), peer.CString_value(text)
        finally:
            peer.delete_CString(text)

    def test_the_request_carries_the_language_and_version_fit_for_a_request_target(self):
        for language, query in [(u'ENU', 'Locid=ENU'), (u'L' * 3000, 'Locid=' + 'L' * 3000)]:
            self.svc.reset()
            self.categories(TWO, language)
            [request] = self.sent(CATEGORIES)
            self.assertEqual((request.method, request.target, request.body),
                             ('POST', CATEGORIES + '?' + query + '&Version=5.0', ''))

    def test_the_map_grows_from_each_reply_and_names_are_found_by_id(self):
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertEqual((self.categories(None), self.call('GetCategoryCount')), ({}, 0))
        self.svc.host_state(SERVER_HOST, 'up')
        self.assertEqual(self.categories(TWO), {u'30': u'Portrait', u'77': u'Landscape'})
        self.assertEqual((self.call('GetCategoryCount'), self.name_of(77)), (2, (1, u'Landscape')))
        self.assertEqual(self.name_of(70), (0, u'unchanged'))
        replies = [
            (u'<categories><category categoryid="30">Portr\xe4t</category>'
             u'<category categoryid="9">Natur</category></categories>', {u'30': u'Portr\xe4t', u'9': u'Natur'}),
            (u'<CATEGORIES><Category categoryid="4">Read</Category>'
             u'<category CategoryID="5">Skipped</category></CATEGORIES>', {u'4': u'Read'}),
            (u'<?xml version="1.0"?><!-- l --><categories><!-- c --><category categoryid="3">'
             u'Port<b>rait</b></category><item categoryid="8">Other</item></categories>',
             {u'3': u'Portrait'}),
            (u'<categories><category>None</category><category categoryid="">Empty</category>'
             u'<category categoryid="-2">Negative</category></categories>', {u'-2': u'Negative'}),
            (u'<categories><category categoryid="1">cut', {}), (u'<other/>', {}), (u'', {}),
        ]
        expected = {u'77': u'Landscape'}
        for document, added in replies:
            expected.update(added)
            self.assertEqual(self.categories(document, u'DEU'), expected, document)
        self.assertEqual(self.name_of(-2), (1, u'Negative'))
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertEqual(self.categories(None), expected)
        self.svc.host_state(SERVER_HOST, 'up')
        self.clear_trace()
        many = self.categories(u'<categories>%s</categories>' % u''.join(  # one reply adds at most 10000
            u'<category categoryid="%d">C%d</category>' % (i, i) for i in range(100000, 110005)))
        self.assertEqual((len(many) - len(expected), many[u'100000'], many[u'109999']), (10000, u'C100000', u'C109999'))
        self.assertEqual(self.trace(), [u'GetPresetCategory: only the first 10000 categories of the reply are kept.'])

class RelatedVideo(SessionTest):
    QUERY = '&AP=KRV&Version=5.0&versionType=Retail&uuid=machine-1'
    ID_REPLY = xml_reply(u'<info><videoId>V42</videoId></info>')

    def relate(self, *replies, **texts):
        self.svc.script(SERVER_HOST, VIDEO, list(replies))
        return self.call('SetRelateVideo', texts.get('video', u'http://videos.example/v?id=1'),
                         texts.get('site', u'VidSite'), texts.get('details', u'a=1&b=2'))

    def test_the_two_requests_with_the_details_last(self):
        self.sign_in()
        token = str(self.call('GetLoginTokenID'))
        page = xml_reply(u'<info><videoUrl>http://x/play?id=V42</videoUrl></info>')
        self.assertEqual(self.relate(self.ID_REPLY, page), u'http://x/play?id=V42')
        self.assertEqual([(r.method, r.target, r.body) for r in self.sent(VIDEO)], [
            ('POST', VIDEO + '?tokenid=' + token + self.QUERY, ''),
            ('POST', VIDEO + '?tokenid=%s&videoID=V42&videoURL=http://videos.example/v?id=1'
             '&website=VidSite%s&a=1&b=2' % (token, self.QUERY), '')])

    def test_the_answers_decide_the_result_and_the_trace_line(self):
        self.assertIsNone(self.relate())
        self.assertEqual((self.trace(), self.svc.requests()), ([u'SetRelateVideo GetTokenID fail'], []))
        self.sign_in()
        answer = xml_reply(u'<info><videoUrl>http://x/\xe9%20</videoUrl></info>')
        self.assertEqual(self.relate(self.ID_REPLY, answer), u'http://x/\xe9%20')
        self.assertEqual(self.trace(), [])
        cases = [(xml_reply(u'<info><errMsg>no</errMsg></info>'), None),
                 (reply(''), None), (xml_reply(u'<info><videoUrl></videoUrl></info>'), u''),
                 (xml_reply(u'<INFO><videoUrl>x</videoUrl></INFO>'), None)]
        for answer, expected in cases:
            self.assertEqual(self.relate(self.ID_REPLY, answer), expected, answer)
        for answer in (xml_reply(u'<info><videoUrl>x</videoUrl></info>'), reply(''),
                       xml_reply(u'<info><videoId></videoId></info>')):
            self.svc.reset()
            self.clear_trace()
            self.assertIsNone(self.relate(answer))
            self.assertEqual((len(self.sent(VIDEO)), self.trace()),
                             (1, [u'SetRelateVideo GetVideoID fail']))
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertIsNone(self.relate())


class EffectsAndLinks(SessionTest):

    def lookup(self, document=None, guid=u'G-1'):
        if document is not None:
            self.svc.script(SERVER_HOST, EFFECT, [xml_reply(document)])
        return self.call('GetEffectByGUID', guid)

    def test_the_lookup_sends_the_token_and_the_last_pip_url_wins(self):
        self.call('SetOBURLAsReg', unicode(SERVER_HOST))
        self.lookup(u'<PIP/>')
        self.assertEqual([(r.method, r.target, r.body) for r in self.sent(EFFECT)],
                         [('POST', EFFECT + '?token=&guid=G-1', '')])
        cases = [
            (u'<!-- c --><pip><!-- c --><pipURL>x%2Fy</pipURL></pip>', u'x/y'),
            (u'<PIP><pipURL>first</pipURL><PIPurl>second</PIPurl></PIP>', u'second'),
            (u'<PIP><pipURL>a<b>%41</b></pipURL><other>x</other></PIP>', u'aA'),
            (u'<PIP><link>x</link></PIP>', u''), (u'<info><pipURL>x</pipURL></info>', u''),
            (u'not xml', u''),
        ]
        for document, expected in cases:
            self.assertEqual(self.lookup(document), expected, document)
        self.sign_in()
        token = str(self.call('GetLoginTokenID'))
        self.assertEqual(self.lookup(guid=u'{AB CD}'), u'http://%s/download/pip/{AB CD}.zip' % SERVER_HOST)
        self.assertEqual(self.sent(EFFECT)[0].target, EFFECT + '?token=%s&guid={AB%%20CD}' % token)
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertEqual(self.lookup(), u'')

    def test_links_signed_out_are_composed_and_signed_in_are_the_stored_ones_decoded(self):
        self.assertEqual([self.call(getter) for getter in GETTERS],
                         [u'http://%s%s&uuid=%s' % (SERVER_HOST, link, UUID) for link in SERVICE_LINKS])
        self.new_session()
        self.svc.host_state(DETECTION_HOST, 'down')
        self.assertEqual([self.call(getter) for getter in GETTERS[1:]], [
            u'http://%shttp://%s/signUp&uuid=%s' % (STAGING_HOST, DEFAULT_HOST, UUID),
            u'http://%shttp://%s/forgetpwd&uuid=%s' % (STAGING_HOST, DEFAULT_HOST, UUID),
            u'http://%s&uuid=%s' % (STAGING_HOST, UUID)])
        self.svc.reset()
        self.call('SetOBURLAsReg', u'h%41st')
        self.assertTrue(self.call('GetSignUpURL').startswith(u'http://hAst'))
        self.assertEqual(self.svc.requests(), [])
        self.call('SetOBURLAsReg', unicode(SERVER_HOST))
        self.svc.script(SERVER_HOST, SIGN_IN, [xml_reply(
            u'<info><tokenid>T</tokenid><AdjustmentPreset>http%3A%2F%2Fp%2Fx%3Fa%3D1</AdjustmentPreset>'
            u'</info>')])
        self.sign_in()
        self.assertEqual([self.call(getter) for getter in GETTERS][:1], [u'http://p/x?a=1'])
        self.assertEqual(self.svc.requests(), [])


class References(SessionTest):
    """Every object the module builds holds only the references Python holds."""

    def test_results_and_the_items_of_the_category_dictionary(self):
        self.svc.script(SERVER_HOST, SIGN_IN, [xml_reply(info_xml('info', tokenid='tok', username='Ann'))])
        self.sign_in()
        self.svc.script(SERVER_HOST, CATEGORIES, [xml_reply(TWO)])
        self.svc.script(SERVER_HOST, EFFECT, [xml_reply(u'<PIP><pipURL>link</pipURL></PIP>')])
        self.svc.script(SERVER_HOST, VIDEO, [RelatedVideo.ID_REPLY, xml_reply(u'<info><videoUrl>vu</videoUrl></info>')])
        results = [self.call(name) for name in ('GetUserName', 'GetLoginTokenID', 'GetServerUrl')
                   + GETTERS + ('m_szChkServerUrl_get',)]
        results += [self.call('GetEffectByGUID', u'g'), self.call('SetRelateVideo', u'v', u's', u'i')]
        dictionary = self.call('GetPresetCategory', u'ENU')
        self.assertEqual(sys.getrefcount(dictionary), 2)
        results += dictionary.keys() + dictionary.values()
        del dictionary
        self.assertEqual([sys.getrefcount(r) for r in results], [3] * len(results))


if __name__ == '__main__':
    unittest.main()
