"""Broadcast events in a page that is loaded over HTTP, where the stream event description is fetched, and the pages of
apps/broadcast and apps/parental."""

import functools
import http.server
import os
import threading
import unittest

from television import Television

APPS = os.path.join(os.path.abspath(__file__).rsplit('/tests/', 1)[0], 'apps')
PAGES = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages')


class SilentHandler(http.server.SimpleHTTPRequestHandler):
    def log_message(self, *arguments):
        pass


class OverHttp(unittest.TestCase):
    def test_all_events_arrive_and_the_description_is_fetched(self):
        handler = functools.partial(SilentHandler, directory=PAGES)
        with http.server.ThreadingHTTPServer(('127.0.0.1', 0), handler) as server:
            threading.Thread(target=server.serve_forever, daemon=True).start()
            url = f'http://127.0.0.1:{server.server_port}/broadcastevents.html'
            with Television(os.environ['TELIX_TV']) as television:
                run = television.run('--plugin', os.environ['TELIX_PLUGIN'], '--wait-for', 'window.testResult',
                                     '--eval', 'window.testResult', url)
            server.shutdown()
        self.assertEqual(run.status, 0, run)
        self.assertEqual(run.value['failed'], [])
        self.assertGreater(run.value['passed'], 0)


class Applications(unittest.TestCase):
    """The pages in apps/, driven by remote control keys."""

    @classmethod
    def setUpClass(cls):
        cls.television = Television(os.environ['TELIX_TV'])
        cls.addClassCleanup(cls.television.close)

    def text(self, page, element, *arguments):
        screenshot = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'apps-{page}.png')
        run = self.television.run('--plugin', os.environ['TELIX_PLUGIN'], *arguments, '--screenshot', screenshot, '--eval',
                                  f'document.getElementById("{element}").innerText', os.path.join(APPS, page, 'index.html'))
        self.assertEqual(run.status, 0, run)
        self.assertNotIn('.js:', run.errors, run)
        return run.value

    def after(self, keys, text):
        return self.text('broadcast', 'panel', '--keys', keys, '--wait-for',
                         f'document.getElementById("log").innerText.indexOf("{text}") >= 0')

    def test_the_channels_are_listed(self):
        self.assertEqual(self.text('broadcast', 'menu').split(), ['One', 'Two', 'Three'])

    def test_ok_tunes_to_the_channel_with_the_focus(self):
        self.assertIn('Now: Two', self.after('down,ok', 'tuned to Two'))

    def test_the_coloured_keys_step_and_go_round(self):
        self.assertIn('Now: Two', self.after('green', 'tuned to Two'))
        self.assertIn('Now: Three', self.after('red', 'tuned to Three'))

    def test_blue_takes_the_picture_to_full_screen(self):
        self.after('blue', 'full screen: yes')

    def test_the_schemes_of_ratings_are_listed_with_the_threshold(self):
        self.assertIn('fsk', self.text('parental', 'menu'))
        self.assertIn('Threshold\t12', self.text('parental', 'panel'))
        self.assertIn('Rating 3\tFSK 16', self.text('parental', 'panel', '--keys', 'down'))


if __name__ == '__main__':
    unittest.main()
