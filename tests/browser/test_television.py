"""The desktop television as a whole: browser, plug-in and platform library with decoded video. The events of the page, the
state of the pipeline and the pixels of the screen are compared with the known content of the test multiplex."""

import contextlib
import http.server
import json
import os
import queue
import signal
import subprocess
import threading
import time
import unittest

from television import RUN_TIMEOUT, WAIT_TIMEOUT, Television, temporary_folder, wait_for
from patterns import has_bars, is_dark, is_striped

TOP = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
PAGES = os.path.join(TOP, 'tests', 'browser', 'pages')

# The services of the test multiplex: the titles of their programmes in turn, and the test pattern.
SERVICES = {
    'Telix One': (['Morning Patterns', 'The Colour Hour', 'News at the Minute'], is_striped),
    'Telix Two': (['Bars of the World', 'Night of the Test Card'], has_bars),
    'Telix Three': (['Gradients', 'Slow Colours', 'Fast Colours', 'Colours Live'], is_dark),
}
PROGRAMME_SECONDS = 4  # as in tests/desktop/tv.conf
TABLE_SECONDS = 2  # at most, from the start of a programme to the table that names it
# PIDs: audio of the first service, subtitles of the third.
GERMAN_AUDIO, ENGLISH_AUDIO = 0x111, 0x112
GERMAN_SUBTITLES = 0x133
UNKNOWN_CHANNEL = 5


class Handler(http.server.BaseHTTPRequestHandler):
    """Serves the page's files, hands it expressions (GET /command) and receives their values (POST)."""

    # With HTTP/1.0 Qt repeats a request whose response has no length.
    protocol_version = 'HTTP/1.1'
    FILES = {'/television.xhtml': (os.path.join(PAGES, 'television.xhtml'), 'application/vnd.hbbtv.xhtml+xml'),
             '/television.js': (os.path.join(PAGES, 'television.js'), 'application/javascript'),
             '/streamevent.xml': (os.path.join(TOP, 'apps', 'demo', 'streamevent.xml'), 'application/xml')}

    def do_GET(self):  # pylint: disable=invalid-name
        if self.path.startswith('/command?'):
            try:
                self.reply(200, 'text/plain; charset=utf-8', self.server.commands.get(timeout=1).encode())
            except queue.Empty:
                self.reply(204, 'text/plain', b'')
        elif self.path in self.FILES:
            name, kind = self.FILES[self.path]
            with open(name, 'rb') as file:
                self.reply(200, kind, file.read())
        else:
            self.reply(404, 'text/plain', b'')

    def do_POST(self):  # pylint: disable=invalid-name
        body = self.rfile.read(int(self.headers['Content-Length']))
        self.reply(204, 'text/plain', b'')
        self.server.results.put(json.loads(body))

    def reply(self, status, kind, body):
        with contextlib.suppress(ConnectionError):
            self.send_response(status)
            self.send_header('Content-Type', kind)
            self.send_header('Content-Length', str(len(body)))
            self.end_headers()
            self.wfile.write(body)

    def log_message(self, *_):
        pass


@contextlib.contextmanager
def page_server():
    with http.server.ThreadingHTTPServer(('127.0.0.1', 0), Handler) as server:
        server.commands, server.results = queue.Queue(), queue.Queue()
        thread = threading.Thread(target=server.serve_forever)
        thread.start()
        try:
            yield server
        finally:
            server.shutdown()
            thread.join()


class DesktopTelevision(unittest.TestCase):
    """Base class: one television for all tests of the class."""

    environment = {}

    @classmethod
    def setUpClass(cls):
        stack = contextlib.ExitStack()
        cls.addClassCleanup(stack.close)
        cls.television = stack.enter_context(Television(os.environ['TELIX_TV']))
        cls.server = stack.enter_context(page_server())
        cls.process = cls.television.start(
            '--plugin', os.environ['TELIX_DESKTOP_PLUGIN'],
            f'http://127.0.0.1:{cls.server.server_port}/television.xhtml', environment=cls.environment)
        stack.callback(cls.stop_television)

    @classmethod
    def stop_television(cls):
        cls.process.terminate()
        try:
            _, errors = cls.process.communicate(timeout=RUN_TIMEOUT)
        except subprocess.TimeoutExpired:
            cls.process.kill()
            raise
        if cls.process.returncode != 128 + signal.SIGTERM or 'television.js:' in errors:
            raise RuntimeError(f'telix-tv exited with {cls.process.returncode}\n{errors}')

    def setUp(self):
        self.value('replaceObject()')

    def value(self, expression):
        """The value of an expression in the page."""
        self.server.commands.put(expression)
        result = self.server.results.get(timeout=WAIT_TIMEOUT)
        self.assertNotIn('error', result, expression)
        return result['value']

    def wait_for(self, expression):
        """Waits until an expression in the page is true."""
        return wait_for(lambda: self.value(expression), lambda: f'{expression}: {self.value("events")}')

    def tune(self, name):
        self.value(f'tune({json.dumps(name)})')
        self.wait_for(f'hasTuned({json.dumps(name)})')

    def state(self):
        return self.television.telixctl('state')

    def wait_for_state(self, key, value):
        wait_for(lambda: self.state()[key] == value, lambda: f'{key}: {self.state()[key]}')

    def is_near(self, point, colour, tolerance=40):
        """Whether the screen has about that colour at a point."""
        return all(abs(component - expected) < tolerance
                   for component, expected in zip(self.television.screen().colour(*point), colour))

    def patterns(self):
        """The services of the test multiplex whose test pattern matches the screen."""
        screen = self.television.screen()
        return [name for name, (_, pattern) in SERVICES.items() if pattern(screen)]

    def wait_for_pattern(self, name):
        wait_for(lambda: self.patterns() == [name], lambda: f'expected {name}, matching: {self.patterns()}')


class Broadcast(DesktopTelevision):
    def test_each_channel_has_its_name_and_its_picture(self):
        self.assertEqual(self.value('channels().map(function (each) { return each.name; })'), list(SERVICES))
        for name in [*SERVICES, 'Telix One']:
            self.tune(name)
            self.assertEqual(self.value('tv.currentChannel.name'), name)
            self.wait_for_pattern(name)
            self.assertEqual(self.state()['channel']['name'], name)

    def test_the_viewer_changes_the_channel_as_well(self):
        self.tune('Telix One')
        self.television.telixctl('channel', '2')
        self.wait_for('hasTuned("Telix Two")')
        self.wait_for_pattern('Telix Two')

    def present_and_following(self, name):
        """Tunes with a new object, because an object keeps the programmes that it reads first. Empty if the following
        programme has not been received by then, or if the present one is over, as on a machine that is too busy."""
        begin = time.time()
        self.value('replaceObject()')
        self.tune(name)
        self.wait_for('tv.programmes && tv.programmes.length > 0')
        programmes = self.value('programmes()')
        start = programmes[0][1]
        is_present = start <= time.time() and begin < start + PROGRAMME_SECONDS + TABLE_SECONDS
        return programmes if is_present and len(programmes) > 1 else []

    def assert_scheduled(self, name):
        """The present and the following programme are those of the current time. Returns the number of the present one
        since 1970."""
        titles = SERVICES[name][0]
        programmes = wait_for(lambda: self.present_and_following(name), 'no present and following programme')
        slot = programmes[0][1] // PROGRAMME_SECONDS
        self.assertEqual(programmes, [[titles[each % len(titles)], each * PROGRAMME_SECONDS, PROGRAMME_SECONDS,
                                       f'A programme of {name}.'] for each in (slot, slot + 1)])
        return slot

    def test_now_and_next_are_those_of_the_tables_and_follow_the_time(self):
        for name in SERVICES:
            first = self.assert_scheduled(name)
            known = len(self.value('events'))
            # The page gets an event when the present programme ends.
            wait_for(lambda first=first: time.time() > (first + 1) * PROGRAMME_SECONDS + 1, 'the clock does not advance')
            self.wait_for(f'events.slice({known}).some(function (each) {{ return each[0] === "programmes"; }})')
            self.assertGreater(self.assert_scheduled(name), first)

    def test_sound_of_another_language_is_heard_when_it_is_selected(self):
        self.tune('Telix One')
        self.wait_for_state('activeAudioPid', GERMAN_AUDIO)
        self.assertEqual(self.value('active(1)'), ['deu'])
        for language, pid in (('eng', ENGLISH_AUDIO), ('deu', GERMAN_AUDIO)):
            self.value(f'tv.selectComponent(component(1, "{language}"))')
            self.wait_for_state('activeAudioPid', pid)
            self.assertEqual(self.value('active(1)'), [language])

    def white_pixels(self):
        """The number of white pixels in the area of the subtitles; the test pattern of the third service has none."""
        screen = self.television.screen()
        return sum(min(screen.colour(x, y)) > 200 for y in range(560, 720, 3) for x in range(200, 1080, 3))

    def assert_no_subtitles(self):
        # The gaps between subtitles are shorter than 2 s.
        end = time.monotonic() + 2
        while time.monotonic() < end:
            self.assertEqual(self.white_pixels(), 0)
            time.sleep(0.1)

    def test_subtitles_are_on_the_screen_while_they_are_selected(self):
        self.tune('Telix Three')
        self.wait_for_pattern('Telix Three')
        self.assertEqual((self.value('active(2)'), self.state()['activeSubtitlePid']), ([], None))
        self.assert_no_subtitles()
        self.value('tv.selectComponent(component(2, "deu"))')
        self.wait_for_state('activeSubtitlePid', GERMAN_SUBTITLES)
        self.assertEqual(self.value('active(2)'), ['deu'])
        wait_for(lambda: self.white_pixels() > 100, 'no subtitles')
        self.value('tv.unselectComponent(component(2, "deu"))')
        self.wait_for_state('activeSubtitlePid', None)
        wait_for(lambda: self.white_pixels() == 0, 'subtitles')
        self.assert_no_subtitles()

    def test_stream_events_of_the_channel_reach_the_page(self):
        for name in ('Telix One', 'Telix Two'):
            self.value('replaceObject()')
            self.tune(name)
            self.value('watchStreamEvents()')
            event = json.dumps(['streamEvent', 'red-button', f'Red button on {name}', 'trigger'])
            count = f'events.filter(function (each) {{ return JSON.stringify(each) === {json.dumps(event)}' \
                    '.replace(/, /g, ","); }).length'
            # The event is sent once a second.
            self.wait_for(f'{count} >= 2')
            self.assertEqual({each[2] for each in self.value('events') if each[0] == 'streamEvent'},
                             {f'Red button on {name}'})

    def test_a_channel_that_is_not_known_is_an_error(self):
        self.tune('Telix One')
        self.value('events = []; tv.setChannelByTriplet(1, 2, 3)')
        self.wait_for('events.some(function (each) { return each[0] === "failed"; })')
        self.assertEqual([each[-1] for each in self.value('events') if each[0] == 'failed'], [UNKNOWN_CHANNEL])

    def test_the_picture_stands_where_the_page_wants_it(self):
        self.tune('Telix One')
        self.wait_for_pattern('Telix One')
        self.value('tv.style.cssText = "left: 640px; top: 360px; width: 640px; height: 360px"')
        # The first and the last stripe of the pattern, and black outside the video.
        for point, colour in (((1270, 700), (0, 255, 255)), ((660, 700), (255, 0, 0)), ((30, 300), (0, 0, 0))):
            wait_for(lambda point=point, colour=colour: self.is_near(point, colour), f'{point} is not {colour}')
        self.assertEqual(self.state()['picture']['area'], {'x': 640, 'y': 360, 'width': 640, 'height': 360})
        self.television.telixctl('full-screen', 'on')
        self.wait_for_pattern('Telix One')
        self.wait_for('events.some(function (each) { return each[0] === "fullScreen"; })')
        self.assertEqual(self.value('tv.fullScreen'), True)

    def test_a_stopped_picture_is_black_and_a_released_one_the_channel_of_the_set(self):
        self.tune('Telix One')
        self.value('tv.style.cssText = "left: 640px; top: 360px; width: 320px; height: 180px"')
        self.value('tv.stop()')
        wait_for(lambda: self.is_near((800, 450), (0, 0, 0)) and self.is_near((1200, 300), (0, 0, 0)), 'not black')
        self.value('tv.release()')
        self.wait_for_pattern('Telix One')


class Files(DesktopTelevision):
    """Transport streams of one colour each in a folder."""

    COLOURS = {'Sea': (32, 64, 192), 'Meadow': (32, 160, 64)}

    @classmethod
    def setUpClass(cls):
        folder = temporary_folder()
        cls.addClassCleanup(folder.__exit__, None, None, None)
        path = folder.__enter__()
        for name, colour in cls.COLOURS.items():
            subprocess.run(['ffmpeg', '-hide_banner', '-loglevel', 'error', '-nostdin', '-f', 'lavfi', '-i',
                            'color=c=0x%02x%02x%02x:s=640x360:r=25:d=3' % colour, '-c:v', 'mpeg2video', '-q:v', '2',
                            '-metadata', f'service_name={name}', '-f', 'mpegts', f'{path}/{name.lower()}.ts'],
                           stdin=subprocess.DEVNULL, check=True)
        cls.environment = {'TELIX_CHANNELS': path}
        super().setUpClass()

    def test_each_file_is_a_channel_with_its_name_and_its_picture(self):
        self.assertEqual(self.value('channels().map(function (each) { return each.name; }).sort()'),
                         sorted(self.COLOURS))
        for name in [*self.COLOURS, 'Sea']:
            self.tune(name)
            for point in ((5, 5), (640, 360), (1275, 715)):
                wait_for(lambda name=name, point=point: self.is_near(point, self.COLOURS[name], 12),
                         f'{name} at {point}')


if __name__ == '__main__':
    unittest.main()
