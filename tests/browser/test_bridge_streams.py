"""Streams of the bridge: requests of the test plug-in, and of its elements, to a server of the test's own."""

import http.server
import os
import sys
import threading
import unittest

from television import Television

PAGES = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages')
TIME_LIMIT = 60
LARGE = 300000  # bytes, several pieces


class Handler(http.server.BaseHTTPRequestHandler):
    protocol_version = 'HTTP/1.1'

    def do_GET(self):
        name = self.path.split('?')[0].lstrip('/')
        self.server.asked.append((self.command, name, self.headers.get('Cookie', '')))
        if name.endswith(('.html', '.js')):
            with open(os.path.join(PAGES, name), 'rb') as file:
                kind = 'text/html' if name.endswith('.html') else 'text/javascript'
                self.answer(200, file.read().replace(b'OTHER-ORIGIN', self.server.other.encode()),
                            {'Content-Type': kind, 'Set-Cookie': 'session=of-the-page; Path=/'})
        elif name == 'text':
            self.answer(200, b'some text', {'Content-Type': 'text/x-test; charset=utf-8', 'X-Own': 'yes',
                                            'Last-Modified': 'Thu, 01 Jan 1970 01:00:00 GMT'})
        elif name == 'bytes':
            self.answer(200, bytes(range(256)), {'Content-Type': 'application/octet-stream'})
        elif name == 'large':
            self.answer(200, b'0123456789' * (LARGE // 10), {'Content-Type': 'text/plain'})
        elif name == 'empty':
            self.answer(200, b'', {'Content-Type': 'text/plain'})
        elif name == 'moved':
            self.answer(302, b'', {'Location': '/text'})
        elif name == 'shared':
            self.answer(200, b'shared', {'Content-Type': 'text/plain', 'Access-Control-Allow-Origin': '*'})
        elif name == 'cookie':
            self.answer(200, self.headers.get('Cookie', 'none').encode(), {'Content-Type': 'text/plain'})
        elif name == 'broken':
            self.send_response(200)
            self.send_header('Content-Length', '1000')
            self.end_headers()
            self.wfile.write(b'the beginning')
            self.wfile.flush()
            self.close_connection = True
        else:
            self.answer(404, b'not there', {'Content-Type': 'text/plain'})

    def do_POST(self):
        body = self.rfile.read(int(self.headers.get('Content-Length', '0')))
        self.answer(200, b'%s|%s|' % (self.headers.get('Content-Type', '').encode(),
                                      self.headers.get('X-Own', '').encode()) + body, {'Content-Type': 'text/plain'})

    def answer(self, status, content, headers):
        self.send_response(status)
        for name, value in headers.items():
            self.send_header(name, value)
        self.send_header('Content-Length', str(len(content)))
        self.end_headers()
        self.wfile.write(content)

    def log_message(self, *_):
        pass


class Server(http.server.ThreadingHTTPServer):
    daemon_threads = True

    def __init__(self):
        super().__init__(('127.0.0.1', 0), Handler)
        self.asked = []
        self.address = f'http://127.0.0.1:{self.server_port}'
        self.other = ''
        threading.Thread(target=self.serve_forever, daemon=True).start()

    def handle_error(self, *_):
        """A browser that drops a response is nothing special."""


class Streams(unittest.TestCase):
    def setUp(self):
        self.server, other = Server(), Server()
        self.server.other = other.address
        for each in (self.server, other):
            self.addCleanup(each.server_close)
            self.addCleanup(each.shutdown)

    def run_page(self, page, *options):
        with Television(os.environ['TELIX_TV']) as television:
            run = television.run(*os.environ.get('TELIX_TV_OPTIONS', '').split(), '--plugin',
                                 os.environ['TELIX_PLUGIN'], '--timeout', TIME_LIMIT, '--wait-for',
                                 'window.testResult', '--eval', 'window.testResult', *options,
                                 f'{self.server.address}/{page}')
        self.assertEqual(run.status, 0, run)
        self.assertEqual(run.value['failed'], [], run)
        self.assertGreater(run.value['passed'], 0, run)

    def test_requests_of_the_plug_in(self):
        self.run_page('bridgestreams.html')

    def test_other_origins_for_an_application_that_lets_pages_read_them(self):
        self.run_page('bridgestreams.html?cors', '--cors')


if __name__ == '__main__':
    sys.exit(unittest.main())
