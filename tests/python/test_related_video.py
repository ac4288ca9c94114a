"""Related video: the identifier request, then the registration request with the
details appended last; what is sent and returned for each kind of reply."""
import unittest

from catalog_support import ServiceTest
from refservice import SERVER_HOST, reply, xml_reply

PATH = '/servlet/setRelateVideo'
ID_QUERY = '?tokenid=%s&AP=KRV&Version=5.0&versionType=Retail&uuid=machine-1'
ID_REPLY = xml_reply(u'<info><videoId>V42</videoId></info>')


class RelatedVideo(ServiceTest):

    def setUp(self):
        ServiceTest.setUp(self)
        self.sign_in()
        self.token = str(self.call('GetLoginTokenID'))

    def relate(self, video=u'http://videos.example/v?id=1', site=u'VidSite', details=u'a=1&b=2'):
        return self.call('SetRelateVideo', video, site, details)

    def script(self, *replies):
        self.svc.script(SERVER_HOST, PATH, list(replies))

    def test_the_two_requests_and_the_returned_page(self):
        self.script(ID_REPLY, xml_reply(u'<info><videoUrl>http://x/play?id=V42</videoUrl></info>'))
        result = self.relate()
        self.assertEqual(result, u'http://x/play?id=V42')
        self.assertIs(type(result), unicode)
        identifier, registration = self.sent(PATH)
        self.assertEqual((identifier.method, identifier.target, identifier.body),
                         ('POST', PATH + ID_QUERY % self.token, ''))
        self.assertEqual(
            (registration.method, registration.target, registration.body),
            ('POST', PATH + '?tokenid=%s&videoID=V42&videoURL=http://videos.example/v?id=1'
             '&website=VidSite&AP=KRV&Version=5.0&versionType=Retail&uuid=machine-1&a=1&b=2'
             % self.token, ''))

    def test_only_bytes_that_cannot_stand_in_a_request_are_escaped(self):
        self.script(ID_REPLY)
        self.relate(u'v&w=x y', u'S\xe9te', u'k=a b&\n=1')
        registration = self.sent(PATH)[1]
        self.assertEqual(registration.target,
                         PATH + '?tokenid=%s&videoID=V42&videoURL=v&w=x%%20y&website=S%%C3%%A9te'
                         '&AP=KRV&Version=5.0&versionType=Retail&uuid=machine-1&k=a%%20b&%%0A=1'
                         % self.token)

    def test_long_details_are_sent_whole(self):
        self.script(ID_REPLY)
        self.relate(details=u'd=' + u'x' * 5000)
        self.assertTrue(self.sent(PATH)[1].target.endswith('&uuid=machine-1&d=' + 'x' * 5000))

    def test_the_service_answer_decides_the_result(self):
        cases = [(xml_reply(u'<info><errMsg>no</errMsg></info>'), None),
                 (reply(''), None),
                 (xml_reply(u'<info><videoUrl></videoUrl></info>'), u''),
                 (xml_reply(u'<INFO><videoUrl>x</videoUrl></INFO>'), None),
                 (xml_reply(u'<info><videoUrl>http://x/\xe9%20</videoUrl></info>'),
                  u'http://x/\xe9%20')]
        for answer, expected in cases:
            self.script(ID_REPLY, answer)
            self.assertEqual(self.relate(), expected, answer)

    def test_no_video_id_sends_no_registration(self):
        for answer in (xml_reply(u'<info><videoUrl>x</videoUrl></info>'), reply(''),
                       xml_reply(u'<info><videoId></videoId></info>')):
            self.svc.reset()
            self.script(answer)
            self.assertIsNone(self.relate())
            self.assertEqual(len(self.sent(PATH)), 1)

    def test_the_server_down(self):
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertIsNone(self.relate())



class TraceLines(ServiceTest):

    def relate(self):
        self.assertIsNone(self.call('SetRelateVideo', u'v', u's', u'a=1'))

    def test_signed_out_nothing_is_sent(self):
        self.relate()
        self.assertEqual(self.trace_lines(), [u'SetRelateVideo GetTokenID fail'])
        self.assertEqual(self.svc.requests(), [])

    def test_no_video_id(self):
        self.sign_in()
        self.svc.script(SERVER_HOST, PATH, [xml_reply(u'<info><errMsg>x</errMsg></info>')])
        self.relate()
        self.assertEqual(self.trace_lines(), [u'SetRelateVideo GetVideoID fail'])
        self.assertEqual(len(self.sent(PATH)), 1)

    def test_a_registered_video_writes_nothing(self):
        self.sign_in()
        self.assertTrue(self.call('SetRelateVideo', u'v', u's', u'a=1'))
        self.assertEqual(self.trace_lines(), [])


if __name__ == '__main__':
    unittest.main()
