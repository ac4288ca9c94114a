"""Preset categories: the request, the replies the walk reads or skips, the map
that only grows, and the name look-up."""
import unittest

import _PyUploaderTestPeer as peer
from catalog_support import ServiceTest
from refservice import DETECTION_HOST, SERVER_HOST, reply, xml_reply
from service_session import Ticker

PATH = '/servlet/getPresetCategory'
FIRST = (u'<categories><category categoryid="3">Portrait</category>'
         u'<category categoryid="7">Landscape</category></categories>')


class CategoryTest(ServiceTest):

    def setUp(self):
        ServiceTest.setUp(self)
        self.use_server_host()

    def categories(self, reply, language=u'ENU'):
        if reply is not None:
            self.svc.script(SERVER_HOST, PATH, [xml_reply(reply)])
        return self.call('GetPresetCategory', language)

    def name_of(self, category_id, initial=u'unchanged'):
        text = peer.new_CString(initial)
        try:
            found = self.call('GetCategroyName', category_id, text)
            return found, peer.CString_value(text)
        finally:
            peer.delete_CString(text)


class Request(CategoryTest):

    def test_posts_the_language_and_version_with_an_empty_body(self):
        self.categories(FIRST)
        [request] = self.sent(PATH)
        self.assertEqual((request.method, request.target, request.body),
                         ('POST', PATH + '?Locid=ENU&Version=5.0', ''))

    def test_bytes_that_cannot_stand_in_a_request_are_escaped(self):
        self.categories(FIRST, u'en US&x=\xe4')
        [request] = self.sent(PATH)
        self.assertEqual(request.target, PATH + '?Locid=en%20US&x=%C3%A4&Version=5.0')

    def test_a_long_language_code_is_sent_whole(self):
        language = u'L' * 3000
        self.categories(FIRST, language)
        [request] = self.sent(PATH)
        self.assertEqual(request.target, PATH + '?Locid=' + 'L' * 3000 + '&Version=5.0')



class Replies(CategoryTest):

    def test_two_categories(self):
        result = self.categories(FIRST)
        self.assertEqual(result, {u'3': u'Portrait', u'7': u'Landscape'})
        self.assertEqual(set(type(key) for key in result), set([unicode]))
        self.assertEqual(set(type(value) for value in result.values()), set([unicode]))
        self.assertEqual(self.call('GetCategoryCount'), 2)
        self.assertEqual(self.name_of(7), (1, u'Landscape'))

    def test_a_later_language_adds_and_renames_but_removes_nothing(self):
        self.categories(FIRST)
        result = self.categories(u'<categories><category categoryid="3">Portr\xe4t</category>'
                                 u'<category categoryid="9">Natur</category></categories>',
                                 u'DEU')
        self.assertEqual(result, {u'3': u'Portr\xe4t', u'7': u'Landscape', u'9': u'Natur'})
        self.assertEqual(self.call('GetCategoryCount'), 3)

    def test_element_names_ignore_case_and_the_attribute_name_does_not(self):
        result = self.categories(u'<CATEGORIES><Category categoryid="4">Read</Category>'
                                 u'<category CategoryID="5">Skipped</category></CATEGORIES>')
        self.assertEqual(result, {u'4': u'Read'})

    def test_comments_and_other_elements_are_passed_over(self):
        result = self.categories(u'<?xml version="1.0"?><!-- list --><categories>'
                                 u'<!-- first --><category categoryid="3">Port<b>rait</b></category>'
                                 u'<item categoryid="8">Other</item></categories>')
        self.assertEqual(result, {u'3': u'Portrait'})

    def test_categories_without_an_id_are_skipped(self):
        result = self.categories(u'<categories><category>None</category>'
                                 u'<category categoryid="">Empty</category>'
                                 u'<category categoryid="-2">Negative</category></categories>')
        self.assertEqual(result, {u'-2': u'Negative'})
        self.assertEqual(self.name_of(-2), (1, u'Negative'))

    def test_one_reply_adds_at_most_ten_thousand_categories(self):
        listed = u''.join(u'<category categoryid="%d">C%d</category>' % (i, i)
                          for i in range(10005))
        result = self.categories(u'<categories>%s</categories>' % listed)
        self.assertEqual(len(result), 10000)
        self.assertEqual((result[u'0'], result[u'9999']), (u'C0', u'C9999'))
        self.assertEqual(self.trace_lines(),
                         [u'GetPresetCategory: only the first 10000 categories of the reply are kept.'])

    def test_a_reply_that_is_not_the_expected_xml_adds_nothing(self):
        self.categories(FIRST)
        for reply in (u'<categories><category categoryid="1">cut', u'<other/>', u''):
            self.assertEqual(self.categories(reply), {u'3': u'Portrait', u'7': u'Landscape'})

    def test_the_categories_read_before_when_the_server_is_down(self):
        self.categories(FIRST)
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertEqual(self.categories(None), {u'3': u'Portrait', u'7': u'Landscape'})

    def test_an_empty_dictionary_when_nothing_was_ever_read(self):
        self.svc.host_state(SERVER_HOST, 'down')
        self.assertEqual(self.categories(None), {})
        self.assertEqual(self.call('GetCategoryCount'), 0)


class NameLookup(CategoryTest):

    def test_hit_and_miss(self):
        self.categories(FIRST)
        self.assertEqual(self.name_of(3), (1, u'Portrait'))
        self.assertEqual(self.name_of(True, u'x'), (0, u'x'))  # id 1
        self.assertEqual(self.name_of(70), (0, u'unchanged'))



class InterpreterLock(ServiceTest):

    def test_stays_held_through_the_discovery_and_the_request(self):
        self.svc.script(DETECTION_HOST, '/observer.jsp', [reply(delay=0.5)])
        self.svc.script(SERVER_HOST, PATH, [reply(delay=0.5)])
        with Ticker() as ticker:
            before = ticker.ticks
            self.assertEqual(self.call('GetPresetCategory', u'ENU'),
                             {u'3': u'Portrait', u'7': u'Landscape'})
            ticks = ticker.ticks - before
        self.assertLess(ticks, 10, 'another Python thread ran while the categories were read')


if __name__ == '__main__':
    unittest.main()
