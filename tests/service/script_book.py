"""Scripted replies that tests set for an endpoint of a host.

A script is a list of replies used one per request, in order. When the list
is used up the endpoint answers as the plausible service again, unless the
script repeats, in which case its last reply stays. Host or path "*" matches
any; the most specific script wins.
"""
import threading

ANY = '*'

REPLY_KEYS = frozenset([
    'status', 'reason', 'headers', 'body', 'body_b64', 'raw_b64', 'delay', 'pieces',
    'pause', 'chunked', 'no_length', 'close_after', 'hang', 'read_rate', 'abort_after',
    'drip',
])


class ScriptError(ValueError):
    pass


class ScriptBook(object):
    def __init__(self):
        self._lock = threading.Lock()
        self._scripts = {}

    def reset(self):
        with self._lock:
            self._scripts = {}

    def set(self, host, path, replies, repeat):
        for reply in replies:
            unknown = set(reply) - REPLY_KEYS
            if unknown:
                raise ScriptError('unknown reply keys: %s' % ', '.join(sorted(unknown)))
        if repeat and not replies:
            raise ScriptError('a repeating script needs a reply')
        with self._lock:
            if replies:
                self._scripts[(host, path)] = {'replies': list(replies), 'repeat': repeat}
            else:
                self._scripts.pop((host, path), None)

    def take(self, host, path):
        """The scripted reply for the next request, or None."""
        with self._lock:
            for key in ((host, path), (host, ANY), (ANY, path), (ANY, ANY)):
                script = self._scripts.get(key)
                if script:
                    return self._next(key, script)
        return None

    def _next(self, key, script):
        replies = script['replies']
        if len(replies) > 1 or not script['repeat']:
            reply = replies.pop(0)
            if not replies:
                del self._scripts[key]
            return reply
        return replies[0]
