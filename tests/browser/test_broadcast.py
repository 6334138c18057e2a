"""Events of the broadcast on a page that comes over HTTP, where a stream event's description is fetched."""

import functools
import http.server
import os
import threading
import unittest

from television import Television

PAGES = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages')


class SilentHandler(http.server.SimpleHTTPRequestHandler):
    def log_message(self, *arguments):
        pass


class OverHttp(unittest.TestCase):
    def test_all_events_arrive_and_the_description_is_fetched(self):
        handler = functools.partial(SilentHandler, directory=PAGES)
        with http.server.ThreadingHTTPServer(('127.0.0.1', 0), handler) as server:
            threading.Thread(target=server.serve_forever, daemon=True).start()
            address = f'http://127.0.0.1:{server.server_port}/broadcastevents.html'
            with Television(os.environ['TELIX_TV']) as television:
                run = television.run('--plugin', os.environ['TELIX_PLUGIN'], '--wait-for', 'window.testResult',
                                     '--eval', 'window.testResult', address)
            server.shutdown()
        self.assertEqual(run.status, 0, run)
        self.assertEqual(run.value['failed'], [])
        self.assertGreater(run.value['passed'], 0)


if __name__ == '__main__':
    unittest.main()
