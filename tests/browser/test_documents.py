"""HbbTV documents of HTTP and HTTPS servers: where they are, what they load, and their cookies."""

import contextlib
import http.cookies
import http.server
import os
import ssl
import subprocess
import threading
import unittest
import urllib.parse

from telix_tv import TelixTv, temporary_folder
from television import RUN_TIMEOUT

HBBTV = 'application/vnd.hbbtv.xhtml+xml'
XHTML = 'http://www.w3.org/1999/xhtml'
DOCUMENT = '''<?xml version="1.0" encoding="utf-8"?>
<!DOCTYPE html PUBLIC "-//HbbTV//1.1.1//EN" "http://www.hbbtv.org/dtd/HbbTV-1.1.1.dtd">
<html xmlns="http://www.w3.org/1999/xhtml"><head><title>{title}</title><script src="scripts/page.js"/></head>
<body><a id="link" href="../other/page.xhtml?a=b#c"/>{body}</body></html>'''
# Relative to the document.
SCRIPT = '''script = document.title;
    onload = function () {
        var request = new XMLHttpRequest();
        document.cookie = 'script=' + document.title;
        request.onload = function () { data = request.responseText; };
        request.open('GET', 'data/' + document.title + '?x=y');
        request.send();
    };'''
# Of a window.
FACTS = '''(function (view) {
    var page = view.document;
    return { location: page.location.href, url: page.URL, link: page.getElementById('link').href, title: page.title,
             namespace: page.createElement('div').namespaceURI, script: view.script, data: view.data,
             cookies: page.cookie.split('; ').sort() };
})(%s)'''


class Response:
    def __init__(self, body='', kind='text/plain', cookies=(), location=None):
        self.body = body.encode()
        self.kind = kind
        self.cookies = cookies
        self.location = location


class Handler(http.server.BaseHTTPRequestHandler):
    """Sends the server's responses, which it has by path, and records the cookies that come with each request."""

    def do_GET(self):  # pylint: disable=invalid-name
        parts = urllib.parse.urlsplit(self.path)
        response = self.server.responses.get(parts.path)
        cookies = http.cookies.SimpleCookie(self.headers['Cookie'])
        self.server.requests.append((parts.path, {name: each.value for name, each in cookies.items()}))
        self.send_response(404 if response is None else 302 if response.location else 200)
        response = response or Response()
        self.send_header('Content-Type', response.kind)
        self.send_header('Content-Length', str(len(response.body)))
        for cookie in response.cookies:
            self.send_header('Set-Cookie', cookie)
        if response.location:
            self.send_header('Location', response.location)
        self.end_headers()
        with contextlib.suppress(ConnectionError):
            self.wfile.write(response.body)

    def log_message(self, *_):
        pass


class Server(http.server.ThreadingHTTPServer):
    """With a certificate, over HTTPS."""

    def __init__(self, responses, certificate=None):
        super().__init__(('127.0.0.1', 0), Handler)
        self.responses = responses
        self.requests = []
        if certificate:
            context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
            context.load_cert_chain(certificate)
            # The handshake is left to the thread of the connection.
            self.socket = context.wrap_socket(self.socket, server_side=True, do_handshake_on_connect=False)
        self.url = f'{"https" if certificate else "http"}://127.0.0.1:{self.server_port}'

    def handle_error(self, request, client_address):
        """Nothing: a client that does not trust the certificate ends the connection."""

    def cookies_of(self, path):
        """Those of the last request for the path."""
        return next(cookies for each, cookies in reversed(self.requests) if each == path)


def make_certificate(folder):
    """A file with a certificate of 127.0.0.1 that nobody has signed, and its key."""
    certificate, key = os.path.join(folder, 'certificate.pem'), os.path.join(folder, 'key.pem')
    subprocess.run(['openssl', 'req', '-x509', '-newkey', 'rsa:2048', '-nodes', '-days', '2', '-subj', '/CN=127.0.0.1',
                    '-addext', 'subjectAltName=IP:127.0.0.1', '-keyout', key, '-out', certificate],
                   check=True, capture_output=True, timeout=RUN_TIMEOUT)
    with open(key, encoding='utf-8') as source, open(certificate, 'a', encoding='utf-8') as target:
        target.write(source.read())
    return certificate


def document(title, body=''):
    return DOCUMENT.format(title=title, body=body)


class Documents(TelixTv):
    """Of a server without HTTPS; the class below has the same tests with it."""

    certificate = None
    options = ()

    def serve(self, responses, certificate=None):
        server = Server(responses, certificate)
        thread = threading.Thread(target=server.serve_forever)
        thread.start()
        self.addCleanup(thread.join)
        self.addCleanup(server.server_close)
        self.addCleanup(server.shutdown)
        return server

    def setUp(self):
        super().setUp()
        self.server = self.serve({
            '/app/main.hbbtv': Response(document('main'), HBBTV, ['visible=1; Path=/', 'hidden=2; Path=/; HttpOnly']),
            '/app/outer.hbbtv': Response(document('outer', '<iframe id="frame" src="frames/inner.hbbtv?1#2"/>'), HBBTV,
                                         ['visible=1; Path=/']),
            '/app/redirecting.hbbtv': Response(document('outer', '<iframe id="frame" src="../start"/>'), HBBTV),
            '/app/frames/inner.hbbtv': Response(document('inner'), HBBTV, ['frame=3; Path=/']),
            '/start': Response(location='app/frames/inner.hbbtv?from=start', cookies=['start=4; Path=/']),
            '/app/scripts/page.js': Response(SCRIPT, 'application/javascript'),
            '/app/frames/scripts/page.js': Response(SCRIPT, 'application/javascript'),
            '/app/data/main': Response('data of main'),
            '/app/data/outer': Response('data of outer'),
            '/app/frames/data/inner': Response('data of inner'),
        }, self.certificate)

    def facts(self, url, view='window'):
        return self.value(*self.options, url, '--wait-for', f'window.data && {view}.data', '--eval', FACTS % view)

    def assert_facts(self, facts, location, cookies):
        """Those of a document that has found what its relative URLs name."""
        base, title = location.rsplit('/', 1)[0], facts['title']
        self.assertEqual(facts, {
            'location': location, 'url': location, 'link': urllib.parse.urljoin(base, 'other/page.xhtml?a=b#c'),
            'title': title, 'namespace': XHTML, 'script': title, 'data': f'data of {title}', 'cookies': cookies})

    def test_a_document_has_its_location_and_its_cookies(self):
        location = self.server.url + '/app/main.hbbtv?q=1#part'
        self.assert_facts(self.facts(location), location, ['script=main', 'visible=1'])
        self.assertEqual(self.server.cookies_of('/app/scripts/page.js'), {'visible': '1', 'hidden': '2'})
        self.assertEqual(self.server.cookies_of('/app/data/main'), {'visible': '1', 'hidden': '2', 'script': 'main'})

    def test_a_document_after_a_redirection_is_where_that_leads(self):
        location = self.server.url + '/app/frames/inner.hbbtv?from=start'
        self.assert_facts(self.facts(self.server.url + '/start'), location, ['frame=3', 'script=inner', 'start=4'])
        self.assertEqual(self.server.cookies_of('/app/frames/inner.hbbtv'), {'start': '4'})

    def test_a_document_in_a_frame_has_its_own_location_and_the_cookies_of_the_server(self):
        url = self.server.url + '/app/outer.hbbtv'
        self.assert_facts(self.facts(url, 'frames[0]'), self.server.url + '/app/frames/inner.hbbtv?1#2',
                          ['frame=3', 'script=inner', 'script=outer', 'visible=1'])
        self.assertEqual(self.server.cookies_of('/app/frames/inner.hbbtv'), {'visible': '1'})
        self.assertEqual(self.server.cookies_of('/app/frames/data/inner')['frame'], '3')

    def test_a_document_around_a_frame_has_its_own_location_and_the_cookies_of_its_path(self):
        location = self.server.url + '/app/outer.hbbtv?1'
        self.assert_facts(self.facts(location), location, ['frame=3', 'script=outer', 'visible=1'])

    def test_a_document_in_a_frame_after_a_redirection_is_where_that_leads(self):
        facts = self.facts(self.server.url + '/app/redirecting.hbbtv', 'frames[0]')
        self.assert_facts(facts, self.server.url + '/app/frames/inner.hbbtv?from=start',
                          ['frame=3', 'script=inner', 'script=outer', 'start=4'])


class SecureDocuments(Documents):
    options = ('--ignore-certificate-errors',)

    @classmethod
    def setUpClass(cls):
        super().setUpClass()
        folder = temporary_folder()
        cls.certificate = make_certificate(folder.__enter__())
        cls.addClassCleanup(folder.__exit__, None, None, None)

    def test_a_certificate_that_nobody_has_signed_is_refused(self):
        url = self.server.url + '/app/main.hbbtv'
        self.assert_refused(self.run_tv(url, '--eval', '1'), url, 'certificate')
        self.assertEqual(self.server.requests, [])

    def test_a_frame_with_a_certificate_that_nobody_has_signed_stays_empty(self):
        url = self.server.url + '/app/main.hbbtv'
        # The load event comes after the frames have been loaded or refused.
        page = self.write(f'<iframe id="frame" src="{url}"></iframe><script>onload = function () {{ loaded = true; }}'
                          '</script>')
        self.assertTrue(self.value(page, '--wait-for', 'window.loaded', '--eval', 'loaded'))
        self.assertEqual(self.server.requests, [])
        self.value(*self.options, page, '--wait-for', 'window.loaded', '--eval', 'loaded')
        self.assertIn('/app/main.hbbtv', [path for path, _ in self.server.requests])

    def test_a_redirection_leads_from_http_to_https(self):
        location = self.server.url + '/app/main.hbbtv'
        plain = self.serve({'/start': Response(location=location)})
        self.assert_facts(self.facts(plain.url + '/start'), location, ['script=main', 'visible=1'])

    def test_an_application_of_https_is_created(self):
        location = self.server.url + '/app/main.hbbtv'
        page = self.write(f'<script>onload = function () {{ created = createHbbTVApplication("{location}"); }}</script>')
        self.assert_facts(self.facts(page), location, ['script=main', 'visible=1'])
        run = self.run_tv(page, '--wait-for', 'typeof created === "boolean"', '--eval', 'created')
        self.assertEqual((run.status, run.value), (0, False), run)


if __name__ == '__main__':
    unittest.main()
