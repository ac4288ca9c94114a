"""What the service answers when no script says otherwise: a plausible
community service, the one the demo program talks to."""
import hashlib
import itertools
import threading
from urllib.parse import parse_qs, quote, unquote_to_bytes
from xml.sax.saxutils import escape

import hosts

XML_TYPE = 'text/xml; charset=UTF-8'
SERVER = 'http://' + hosts.SERVER_HOST
FIRST_VIDEO_ID = 1001
FIRST_TEMPLATE_ID = 5001

SERVICE_LINKS = [
    ('APIUrl', hosts.SERVER_HOST),
    ('AdjustmentPreset', '/community/presets.jsp?ap=lumivanta'),
    ('SignUp', '/member/signUp.jsp?ap=lumivanta'),
    ('ForgetPassword', '/member/forgetpwd.jsp?ap=lumivanta'),
    ('LensCorrection', '/lens/correction.jsp?ap=lumivanta'),
    ('VideoGallery', '/video/gallery.jsp?ap=lumivanta'),
]
CATEGORIES = [('3', 'Portrait'), ('7', 'Landscape')]


def elements(children):
    """One element per (name, text), the text escaped."""
    return ''.join('<%s>%s</%s>' % (name, escape(text), name) for name, text in children)


def xml_reply(root, inner, status=200):
    """A reply whose body is a document with the root element holding inner."""
    body = '<?xml version="1.0" encoding="UTF-8"?>\n<%s>%s</%s>\n' % (root, inner, root)
    return {'status': status, 'headers': [['Content-Type', XML_TYPE]],
            'body': body.encode('utf-8')}


def parse_form(body):
    """A urlencoded form as {name: text}; bytes are read as UTF-8."""
    form = {}
    for pair in body.split(b'&'):
        name, _, value = pair.partition(b'=')
        decode = lambda b: unquote_to_bytes(b.replace(b'+', b' ')).decode('utf-8', 'replace')
        form.setdefault(decode(name), decode(value))
    return form


class DefaultService(object):
    def __init__(self):
        self._lock = threading.Lock()
        self.reset()

    def reset(self):
        with self._lock:
            self._video_ids = itertools.count(FIRST_VIDEO_ID)
            self._template_ids = itertools.count(FIRST_TEMPLATE_ID)

    def reply(self, head, record):
        handler = {
            '/': self._home,
            '/observer.jsp': self._service_info,
            '/servlet/memLogin': self._sign_in,
            '/servlet/getPresetCategory': self._categories,
            '/servlet/setRelateVideo': self._related_video,
            '/servlet/GetEffectByGUIDForQZM': self._effect,
            '/servlet/uploadTemplate': self._upload,
        }.get(head.path, self._not_found)
        query = parse_qs(head.query, keep_blank_values=True, errors='replace')
        return handler(dict((k, v[0]) for k, v in query.items()), record)

    def _home(self, query, record):
        return {'status': 200, 'headers': [['Content-Type', 'text/html; charset=UTF-8']],
                'body': b'<html><body>Orbishare</body></html>\n'}

    def _not_found(self, query, record):
        return {'status': 404, 'headers': [['Content-Type', 'text/plain']],
                'body': b'not found\n'}

    def _service_info(self, query, record):
        return xml_reply('INFO', elements(SERVICE_LINKS))

    def _sign_in(self, query, record):
        form = parse_form(bytes(record.body))
        account, password = form.get('account', ''), form.get('pwd', '')
        if not account or not password:
            return xml_reply('info', elements([('errMsg', 'Invalid account or password')]))
        token = hashlib.sha1(account.encode('utf-8')).hexdigest()[:24]
        return xml_reply('info', elements([
            ('tokenid', token),
            ('username', account),
            ('profileURL', SERVER + '/member/profile.jsp?user=' + quote(account)),
            ('AdjustmentPreset', SERVER + '/community/presets.jsp?ap=lumivanta'),
            ('search', SERVER + '/search.jsp'),
            ('errMsg', ''),
        ]))

    def _categories(self, query, record):
        body = ''.join('<category categoryid="%s">%s</category>' % (cid, escape(name))
                       for cid, name in CATEGORIES)
        return xml_reply('categories', body)

    def _related_video(self, query, record):
        if not query.get('tokenid'):
            return xml_reply('info', elements([('errMsg', 'Invalid token')]))
        if 'videoID' not in query:
            with self._lock:
                return xml_reply('info', elements([('videoId', str(next(self._video_ids)))]))
        video_url = SERVER + '/video/play.jsp?id=' + quote(query['videoID'])
        return xml_reply('info', elements([('videoUrl', video_url)]))

    def _effect(self, query, record):
        guid = query.get('guid', '')
        if not guid:
            return xml_reply('PIP', '')
        link = SERVER + '/download/pip/' + guid + '.zip'
        return xml_reply('PIP', elements([('pipURL', quote(link, safe=''))]))

    def _upload(self, query, record):
        upload = record.upload
        if upload is None or upload.error:
            problem = upload.error if upload else 'not a multipart/form-data body'
            return self._upload_reply(400, '', 'Malformed upload: ' + problem)
        tokens = [p.content for p in upload.parts if p.filename is None and p.name == b'token']
        if not tokens or not tokens[0]:
            return self._upload_reply(403, '', 'Invalid token')
        with self._lock:
            template_id = next(self._template_ids)
        link = SERVER + '/template/view.jsp?id=%d' % template_id
        return self._upload_reply(200, quote(link, safe=''), '')

    @staticmethod
    def _upload_reply(status, url, error):
        fields = [('templateUrl', url), ('errMsg', error)]
        return xml_reply('uploadTemplate', elements(fields), status)
