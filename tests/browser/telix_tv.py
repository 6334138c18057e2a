"""The base of the tests of telix-tv, and a server for their pages."""

import contextlib
import http.server
import os
import threading
import unittest
import urllib.parse

from television import PngImage, Television, temporary_folder

PAGES = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages')
PLUGIN = os.environ['TELIX_PLUGIN']
IS_NPAPI = os.environ['TELIX_ENGINE'] == 'npapi'  # else WebKitGTK
SLOWNESS = 2.5  # seconds between the parts of /slow; the longer, the surer a test sees what is wrong in between
BLACK, GREEN, BLUE = (0, 0, 0), (0, 128, 0), (0, 0, 255)

# The keys of the remote control with their key codes in pages.
KEY_CODES = {
    'left': 37, 'up': 38, 'right': 39, 'down': 40, 'ok': 13, 'back': 461,
    'red': 403, 'green': 404, 'yellow': 405, 'blue': 406,
    'play': 415, 'pause': 19, 'stop': 413, 'rewind': 412, 'fast-forward': 417, 'info': 457,
    '0': 48, '1': 49, '2': 50, '3': 51, '4': 52, '5': 53, '6': 54, '7': 55, '8': 56, '9': 57,
}


def shipped(name):
    """The path of a page in pages/."""
    return os.path.join(PAGES, name)


class TelixTv(unittest.TestCase):
    """Base class: a display for the class, a folder for each test."""

    @classmethod
    def setUpClass(cls):
        cls.television = Television(os.environ['TELIX_TV'])
        cls.addClassCleanup(cls.television.close)

    def setUp(self):
        stack = contextlib.ExitStack()
        self.addCleanup(stack.close)
        self.folder = stack.enter_context(temporary_folder())

    def write(self, content, name='page.html'):
        path = os.path.join(self.folder, name)
        with open(path, 'wb') as file:
            file.write(content if isinstance(content, bytes) else content.encode())
        return path

    def run_tv(self, *arguments, environment=None):
        return self.television.run('--plugin', PLUGIN, *arguments, environment=environment)

    def run_to_timeout(self, *arguments, error):
        return self.television.run_to_timeout('--plugin', PLUGIN, *arguments, error=error)

    def value(self, *arguments):
        run = self.run_tv(*arguments)
        self.assertEqual(run.status, 0, run)
        return run.value

    def screenshot(self, *arguments, size='64x36'):
        """A screenshot of a small window, because PngImage is slow. At 64x36 a pixel shows 20x20 pixels of the page."""
        file_name = os.path.join(self.folder, 'picture.png')
        run = self.run_tv('--size', size, '--screenshot', file_name, *arguments)
        self.assertEqual(run.status, 0, run)
        return PngImage(file_name)

    def assert_refused(self, run, *fragments):
        """The run has printed one line with the fragments and exited with status 2."""
        self.assertEqual(run.status, 2, run)
        self.assertEqual(len(run.errors.splitlines()), 1, run)
        self.assertTrue(run.errors.startswith('telix-tv: '), run)
        for fragment in fragments:
            self.assertIn(fragment, run.errors)


class Server(http.server.BaseHTTPRequestHandler):
    """/page: a page. /error: status 404. /silence: no response. /elsewhere: a redirection. /as/TYPE: the server's
    `document` with that content type. /slow: the document as a page, with a pause before its body. Records the user agents
    of the requests."""

    def do_GET(self):  # pylint: disable=invalid-name
        self.server.agents.append(self.headers['User-Agent'])
        if self.path.startswith('/as/'):
            self.send_response(200)
            self.send_header('Content-Type', urllib.parse.unquote(self.path[len('/as/'):]))
            self.end_headers()
            self.wfile.write(self.server.document)
            return
        if self.path == '/slow':
            self.send_response(200)
            self.send_header('Content-Type', 'text/html')
            self.end_headers()
            body = self.server.document.index(b'<body')
            with contextlib.suppress(ConnectionError):
                self.wfile.write(self.server.document[:body])
                self.server.closing.wait(SLOWNESS)
                self.wfile.write(self.server.document[body:])
            return
        if self.path == '/silence':
            self.server.closing.wait()
            return
        if self.path == '/elsewhere':
            self.send_response(302)
            self.send_header('Location', self.server.redirection)
            self.end_headers()
            return
        self.send_response(200 if self.path == '/page' else 404)
        self.send_header('Content-Type', 'text/html')
        self.end_headers()
        self.wfile.write(b'<title>served</title><script>function say() { console.log("served"); } say();</script>')

    def log_message(self, *_):
        pass


@contextlib.contextmanager
def running_server(document=b'', redirection='/page'):
    with http.server.ThreadingHTTPServer(('127.0.0.1', 0), Server) as running:
        running.closing = threading.Event()
        running.agents = []
        running.document = document
        running.redirection = redirection
        running.url = f'http://127.0.0.1:{running.server_port}'
        thread = threading.Thread(target=running.serve_forever)
        thread.start()
        try:
            yield running
        finally:
            running.closing.set()
            running.shutdown()
            thread.join()


@contextlib.contextmanager
def server():
    """The URL of a server."""
    with running_server() as running:
        yield running.url
