"""Server discovery against the reference service: the detection request, the
six fields of the service information, the staging fallback, the reachability
probe in front of it, and the interpreter lock released while it all runs."""
import ctypes
import os
import threading
import time
import unittest

import _PyUploader as native
from binding_support import address_of
from refservice import DEFAULT_HOST, DETECTION_HOST, SERVER_HOST, STAGING_HOST, reply, xml_reply
from service_session import PROBE_LIMIT, UUID, SessionTest, Ticker, info_xml

OBSERVER = '/observer.jsp'
SIX_FIELDS = dict(APIUrl='api2.example.test', AdjustmentPreset='/presets?x=1',
                  SignUp='/join?a=1', ForgetPassword='/lost?b=2', LensCorrection='/lens?c=3',
                  VideoGallery='/videos?d=4')
STORED_LINES = [u'KRV SignUp = /join?a=1', u'KRV ForgetPassword = /lost?b=2',
                u'KRV LensCorrection = /lens?c=3', u'KRV VideoGallery = /videos?d=4']
FALLBACK_LINES = [u'Get OB server URL from server. URL = ',
                  u'Use static URL as OB server URL.']


class DiscoveryTest(SessionTest):

    def answer_detection(self, *replies):
        self.svc.script(DETECTION_HOST, OBSERVER, list(replies))

    def discover(self):
        self.call('InitOBServerURL')
        return self.call('GetServerUrl')

    def detections(self):
        return self.svc.requests(host=DETECTION_HOST, path=OBSERVER)


class ServiceInformation(DiscoveryTest):

    def test_all_six_fields_are_stored_in_order(self):
        self.answer_detection(xml_reply(info_xml(**SIX_FIELDS)))
        self.assertEqual(self.discover(), u'api2.example.test')
        self.assertEqual(self.trace_lines(), STORED_LINES + [
            u'Get OB server URL from server. URL = api2.example.test'])
        composed = u'http://api2.example.test%s&uuid=' + UUID
        self.assertEqual(self.call('GetSignUpURL'), composed % u'/join?a=1')
        self.assertEqual(self.call('GetForgetPasswordURL'), composed % u'/lost?b=2')
        self.assertEqual(self.call('GetLensCorrectionURL'), composed % u'/lens?c=3')
        self.assertEqual(self.call('GetPresetDownloadURL'), composed % u'/presets?x=1')

    def test_the_request_carries_the_version_and_its_type(self):
        self.discover()
        [probe] = self.svc.requests(host=DETECTION_HOST, path='/')
        [detection] = self.detections()
        self.assertLess(probe.seq, detection.seq)
        self.assertEqual(detection.head,
                         'GET /observer.jsp?ap=lumivanta&version=5.0&versionType=Retail '
                         'HTTP/1.1\r\nHost: %s\r\n\r\n' % DETECTION_HOST)

    def test_query_values_are_made_fit_for_a_request_target(self):
        cases = [((u'5.0', u''), '/observer.jsp?ap=lumivanta&version=5.0'),
                 ((u'5.0 beta\r\nX: 1', u'Home&Pro=\xe4#1'),
                  '/observer.jsp?ap=lumivanta&version=5.0%20beta%0D%0AX:%201'
                  '&versionType=Home&Pro=%C3%A4%231')]
        for (version, version_type), target in cases:
            self.svc.reset()
            native.delete_OBLoginData(self.session)
            self.session = self.new_session(version, version_type)
            self.discover()
            [detection] = self.detections()
            self.assertEqual(detection.target, target)

    def test_without_a_server_host_the_staging_host_is_used(self):
        self.answer_detection(xml_reply(info_xml(SignUp='/join')))
        self.assertEqual(self.discover(), unicode(STAGING_HOST))
        self.assertEqual(self.trace_lines(), [u'KRV SignUp = /join'] + FALLBACK_LINES)
        self.assertEqual(self.call('GetSignUpURL'),
                         u'http://%s/join&uuid=%s' % (STAGING_HOST, UUID))

    def test_an_empty_field_empties_its_link_and_an_absent_one_keeps_it(self):
        self.answer_detection(xml_reply(info_xml(APIUrl=SERVER_HOST, SignUp='')))
        self.discover()
        self.assertEqual(self.call('GetSignUpURL'), u'http://%s&uuid=%s' % (SERVER_HOST, UUID))
        self.assertEqual(self.call('GetForgetPasswordURL'),
                         u'http://%shttp://%s/forgetpwd&uuid=%s'
                         % (SERVER_HOST, DEFAULT_HOST, UUID))

    def test_a_server_host_that_is_not_a_bare_host_name_is_refused(self):
        refused = [u'api.orbishare.com:8080/evil?x=', u'user@api.orbishare.com',
                   u'api.orbishare.com/path', u'api orbishare', u'api.orbishare.com?q', u'',
                   u'\xe4pi.test']
        for value in refused:
            self.svc.reset()
            self.call('LogoutOrbishare')
            self.clear_trace()
            self.answer_detection(xml_reply(info_xml(APIUrl=value.encode('utf-8'))))
            self.assertEqual(self.discover(), unicode(STAGING_HOST), value)
            self.assertEqual(self.trace_lines(), [
                u'Update OBInfo fail: APIUrl is not a host name: ' + value] + FALLBACK_LINES)

    def test_a_root_spelled_info_yields_nothing(self):
        self.answer_detection(xml_reply(info_xml('info', **SIX_FIELDS)))
        self.assertEqual(self.discover(), unicode(STAGING_HOST))
        self.assertEqual(self.trace_lines(), FALLBACK_LINES)

    def test_any_status_is_read_and_any_framing_is_read_whole(self):
        # Cut anywhere, the document would not be well-formed and would yield nothing.
        document = '<INFO><Padding>%s</Padding><APIUrl>%s</APIUrl></INFO>' % (
            'p' * 200000, SERVER_HOST)
        framings = [dict(status=500), dict(chunked=True), dict(no_length=True),
                    dict(pieces=4, pause=0.05), dict(chunked=True, pieces=[1, 7, 100])]
        for framing in framings:
            self.svc.reset()
            self.call('LogoutOrbishare')
            self.answer_detection(xml_reply(document, **framing))
            self.assertEqual(self.discover(), unicode(SERVER_HOST), framing)

    def test_a_body_longer_than_announced_is_cut_at_the_announced_length(self):
        document = info_xml(APIUrl=SERVER_HOST)
        self.answer_detection(reply(document + '<garbage', 200,
                                    [['Content-Length', str(len(document))]]))
        self.assertEqual(self.discover(), unicode(SERVER_HOST))

    def test_a_reply_announcing_more_than_16_mib_is_refused(self):
        document = info_xml(APIUrl=SERVER_HOST)
        padded = document + ' ' * (16 * 1024 * 1024 + 1 - len(document))
        self.answer_detection(xml_reply(padded))
        self.assertEqual(self.discover(), unicode(STAGING_HOST))


class DetectionOnce(DiscoveryTest):

    def test_a_second_discovery_sends_nothing(self):
        self.discover()
        self.discover()
        self.assertEqual(len(self.detections()), 1)
        self.assertEqual(len(self.svc.requests(host=DETECTION_HOST)), 2)  # probe, detection

    def test_a_host_set_by_the_application_skips_detection(self):
        self.call('SetOBURLAsReg', u'my.server.test')
        self.assertEqual(self.discover(), u'my.server.test')
        self.assertEqual(self.svc.requests(), [])
        self.assertEqual(self.trace_lines(), [])

    def test_an_empty_host_makes_it_unknown_again(self):
        self.call('SetOBURLAsReg', u'my.server.test')
        self.call('SetOBURLAsReg', u'')
        self.assertEqual(self.discover(), unicode(SERVER_HOST))
        self.assertEqual(len(self.detections()), 1)



class Reachability(DiscoveryTest):

    def test_a_404_counts_as_reachable(self):
        self.svc.script(DETECTION_HOST, '/', [reply('missing', 404)])
        self.assertEqual(self.discover(), unicode(SERVER_HOST))
        self.assertEqual(native.OBLoginData_m_bServerReachable_get(self.session), 1)
        self.assertEqual(native.OBLoginData_m_szChkServerUrl_get(self.session),
                         'http://' + DETECTION_HOST)

    def test_a_refusing_host_falls_back_at_once(self):
        self.svc.host_state(DETECTION_HOST, 'down')
        self.assertEqual(self.discover(), unicode(STAGING_HOST))
        self.assertEqual(self.trace_lines(), FALLBACK_LINES)
        self.assertEqual(native.OBLoginData_m_bServerReachable_get(self.session), 0)
        self.assertEqual(self.svc.requests(), [])

    def test_a_probe_url_too_long_for_its_buffer_is_refused_unprobed(self):
        os.environ['PYUPLOADER_DETECTION_HOST'] = 'd' * 253  # with "http://", 260 bytes
        native.delete_OBLoginData(self.session)
        self.session = self.new_session()
        self.assertEqual(self.discover(), unicode(STAGING_HOST))
        self.assertEqual(native.OBLoginData_m_szChkServerUrl_get(self.session), '')
        self.assertEqual(self.svc.requests(), [])

    def test_values_written_from_python_into_the_handles_are_never_closed(self):
        # Answered while it waits, the probe closes its handles itself; silent,
        # the waiting thread closes them: neither may close a foreign value.
        cells = [getattr(native, 'OBLoginData_%s_get' % member)(self.session)
                 for member in ('m_hInternet', 'm_hConnect')]
        for cell in cells:
            ctypes.c_void_p.from_address(address_of(cell)).value = 0x1000
        stop = threading.Event()

        def overwrite():
            while not stop.is_set():
                native.OBLoginData_m_hInternet_set(self.session, cells[0])
                native.OBLoginData_m_hConnect_set(self.session, cells[1])
                time.sleep(0.001)
        for delay, host in ((1, SERVER_HOST), (6, STAGING_HOST)):
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

    def test_a_silent_host_is_given_up_after_the_last_wait(self):
        self.svc.script(DETECTION_HOST, '/', [reply(delay=6)])
        started = time.time()
        with Ticker() as ticker:
            host = self.discover()
        elapsed = time.time() - started
        self.assertEqual(host, unicode(STAGING_HOST))
        self.assertGreaterEqual(elapsed, PROBE_LIMIT - 0.1)
        self.assertLess(elapsed, PROBE_LIMIT + 2.0, 'the cancelled probe did not end')
        self.assertGreater(ticker.ticks, 50, 'other Python threads were held up')
        self.assertEqual(self.handle_values(), [0, 0])
        self.assertEqual(native.OBLoginData_m_bServerReachable_get(self.session), 0)
        self.assertEqual(self.trace_lines(), FALLBACK_LINES)
        self.assertEqual(self.detections(), [])


if __name__ == '__main__':
    unittest.main()
