"""A/V control objects, with media of the test's server and the calls that a recording platform gets."""

import http.server
import json
import os
import re
import socket
import threading
import time
import unittest
import urllib.parse

from television import PngImage, Television

ROOT = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
TYPES = {'.html': 'text/html; charset=utf-8', '.js': 'text/javascript', '.css': 'text/css', '.mp4': 'video/mp4',
         '.mp3': 'audio/mpeg', '.asx': 'video/x-ms-asf'}
# How long the server sends an endless stream to a client that does not close the connection, in seconds.
STREAM_TIMEOUT = 120
# A rendered page has many colours, because its text is antialiased; an empty page has one.
COLOURS_OF_A_PAGE = 50
# Lines of the media page: its log, the latest first, and its information on the media.
LOG, PANEL = (f'Array.prototype.map.call(document.querySelectorAll("#{part} > *"), '
              'function (line) { return line.textContent; })' for part in ('log', 'panel'))

PLAYLIST = '''<ASX version="3.0">
<Title>Four clips</Title>
<Entry><Ref href="{base}/one.mp4?length=200"/></Entry>
<Repeat count="2">
<Entry><Ref href="{base}/two.mp4?length=200"/></Entry>
<Entry><Ref href="{base}/three.mp4?length=200"/></Entry>
</Repeat>
<Entry><Ref href="{base}/four.mp4?length=200"/></Entry>
</ASX>
'''


class Handler(http.server.BaseHTTPRequestHandler):
    """Serves the project's files, and media under a folder media/. Records requests, and clients that disconnect."""

    def do_GET(self):
        folder, name = self.path.split('?')[0].rsplit('/', 1)
        name = urllib.parse.unquote(name)
        self.server.requested.append(name)
        if folder.endswith('/dropped'):
            self.respond('text/plain', b'yes' if name in self.server.dropped else b'no')
        elif not folder.endswith('/media') or folder.startswith('/apps/'):
            self.send_file(ROOT + folder + '/' + name)
        elif name.startswith('endless'):
            self.send_endlessly(name)
        elif name == 'list.asx':
            self.respond(TYPES['.asx'], PLAYLIST.format(base=self.server.url + '/media').encode())
        elif name.startswith('missing'):
            self.send_error(404)
        else:
            self.respond(TYPES['.mp4'], b'some bytes')

    def respond(self, kind, content):
        self.send_response(200)
        self.send_header('Content-Type', kind)
        self.send_header('Content-Length', str(len(content)))
        self.end_headers()
        self.wfile.write(content)

    def send_file(self, file_name):
        if not os.path.isfile(file_name):
            self.send_error(404)
            return
        with open(file_name, 'rb') as file:
            self.respond(TYPES[os.path.splitext(file_name)[1]], file.read())

    def send_endlessly(self, name):
        self.send_response(200)
        self.send_header('Content-Type', TYPES[os.path.splitext(name)[1]])
        self.end_headers()
        end = time.monotonic() + STREAM_TIMEOUT
        try:
            while time.monotonic() < end:
                self.wfile.write(bytes(4096))
                time.sleep(0.02)
        except OSError:
            self.server.dropped.add(name)

    def log_message(self, *_):
        pass


class Server(http.server.ThreadingHTTPServer):
    daemon_threads = True

    def __init__(self):
        super().__init__(('127.0.0.1', 0), Handler)
        self.url = f'http://127.0.0.1:{self.server_port}'
        self.requested = []
        self.dropped = set()
        threading.Thread(target=self.serve_forever, daemon=True).start()

    def handle_error(self, *_):
        """Browsers may disconnect during a response."""


class Served(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.television = Television(os.environ['TELIX_TV'])
        cls.addClassCleanup(cls.television.close)

    def setUp(self):
        self.server = Server()
        self.addCleanup(self.server.server_close)
        self.addCleanup(self.server.shutdown)

    def calls(self, run):
        """The A/V calls of the platform, without the server's part of URLs."""
        return [line[len('call TELIX_JS_AV_'):].replace(self.server.url, '') for line in run.errors.splitlines()
                if line.startswith('call TELIX_JS_AV_')]

    @staticmethod
    def plays(calls):
        """The Play calls: file name and codes of source, container and audio."""
        matches = (re.fullmatch(r'Play\(\d+, ".*/([^/"]*)", 1, (\d+), (\d+), (\d+), 0, 0\)', call) for call in calls)
        return [(match[1], *map(int, match.groups()[1:])) for match in matches if match]


class Pages(Served):
    def run_page(self, page):
        """Runs a test page; returns the calls that the platform got."""
        # The other engines' programs add nothing to the plug-in anyway.
        strict = ['--strict'] if os.environ['TELIX_ENGINE'] == 'npapi' else []
        run = self.television.run('--plugin', os.environ['TELIX_PLUGIN'], *strict,
                                  '--wait-for', 'window.testResult', '--eval', 'window.testResult',
                                  f'{self.server.url}/tests/browser/pages/{page}')
        self.assertEqual(run.status, 0, run)
        self.assertEqual(run.value['failed'], [], run)
        self.assertGreater(run.value['passed'], 0, run)
        return self.calls(run)

    def test_each_type_makes_a_player_with_its_codes(self):
        calls = self.run_page('mediatypes.html')
        # The engine creates the objects in its own order, so each object identifies itself by a volume.
        created = [call for call in calls if call.startswith('CreatePlayer')]
        volumes = [re.fullmatch(r'SetVolume\((\d+), (\d+)\)', call) for call in calls]
        players = {int(match[2]): int(match[1]) for match in volumes if match}
        self.assertEqual([created[players[number] - 1] for number in range(9)], [
            f'CreatePlayer(out, {codes}, 0)' for codes in (
                '2, 1', '512, 4', '512, 0', '512, 0', '512, 0', '512, 0', '512, 0', '512, 0', '512, 0')])
        self.assertEqual(len(created), 10)
        self.assertEqual(self.plays(calls), [])
        self.assertEqual(sum(call.startswith('DestroyPlayer') for call in calls), 10)

    def test_a_playlist_repeats_its_section(self):
        # Depending on the attribute, the browser opens the stream on its own or the plug-in requests it.
        for element in ('object&data', 'object&src', 'embed&src'):
            with self.subTest(element):
                played = [name for name, *_ in self.plays(self.run_page(f'mediaplaylist.html?{element}'))]
                self.assertEqual(played, [f'{name}.mp4?length=200'
                                          for name in ('one', 'two', 'three', 'two', 'three', 'four')])
                self.assertIn('list.asx', self.server.requested)

    def test_an_audio_stream_is_looked_at_and_dropped(self):
        self.assertEqual(self.plays(self.run_page('mediaaudio.html')), [
            ('endless.mp3', 6, 2, 1), ('endless-too.mp3', 6, 512, 0), ('next.mp4', 6, 1280, 0)])

    def test_a_stream_that_is_not_there(self):
        with socket.socket() as nobody:
            # Bound and not listening: connections are refused.
            nobody.bind(('127.0.0.1', 0))
            calls = self.run_page(f'mediamissing.html?{nobody.getsockname()[1]}')
        self.assertEqual(self.plays(calls), [])
        self.assertIn('missing.mp4', self.server.requested)

    def test_a_page_that_has_just_changed_ends_well(self):
        changed = 'document.body.insertBefore(document.createElement("p"), document.body.firstChild).innerText = "x"'
        page = f'{self.server.url}/tests/browser/pages/mediatypes.html'
        for expression, title in ((changed, '"x"'),
                                  (f'{changed}; location.href = "second.html"', '"second.html"'),
                                  (f'{changed}; document.body.innerHTML = ""', '""')):
            with self.subTest(expression):
                run = self.television.run('--plugin', os.environ['TELIX_PLUGIN'], '--wait-for', 'window.testResult',
                                          '--eval', f'eval({json.dumps(expression)})', page)
                self.assertEqual(run.status, 0, run)
                self.assertEqual(run.output.splitlines()[-1], title)
                self.assertEqual(sum(call.startswith('DestroyPlayer') for call in self.calls(run)), 10)

    def test_another_page_takes_the_place_of_one_that_has_just_changed(self):
        run = self.television.run(
            '--plugin', os.environ['TELIX_PLUGIN'], '--wait-for',
            # Repeated until the other page is loaded, so that the layout is always out of date.
            '(function () { if (!window.testResult) { return document.title === "second"; } '
            'if (!window.gone) { window.gone = true; location.href = "second.html"; } '
            'document.body.insertBefore(document.createElement("p"), document.body.firstChild).innerText = "x"; }())',
            '--eval', 'document.title', f'{self.server.url}/tests/browser/pages/mediatypes.html')
        self.assertEqual(run.status, 0, run)
        self.assertEqual(sum(call.startswith('DestroyPlayer') for call in self.calls(run)), 10)

    def test_states_and_events_come_in_order(self):
        calls = self.run_page('mediaevents.html')
        playback = [re.sub(r'\((\d+, ".*/(\w+\.mp4)|\d+).*', r' \2', call) for call in calls
                    if re.match(r'(Play|Pause|Resume|Seek)\(', call)]
        self.assertEqual([call.strip() for call in playback], [
            'Play clip.mp4', 'Pause', 'Resume', 'Pause', 'Resume', 'Seek',
            'Play clip.mp4', 'Play absent.mp4', 'Play clip.mp4', 'Play clip.mp4'])


class Application(Served):
    """apps/media, driven by remote control keys."""

    def run_application(self, *arguments, media=('one.mp4', 'two%20clips.mp4', 'absent.mp4'), plugin='TELIX_PLUGIN'):
        query = '&'.join(f'media={self.server.url}/media/{name}' for name in media)
        run = self.television.run('--plugin', os.environ[plugin], *arguments,
                                  f'{self.server.url}/apps/media/index.html?{query}')
        self.assertEqual(run.status, 0, run)
        # Errors of scripts are printed with the name of their file.
        self.assertNotIn('/apps/', run.errors.replace('/apps/media/index.html', ''), run)
        return run

    def after(self, keys, condition, result):
        """Presses keys, waits for a condition and returns the value of an expression."""
        return self.run_application('--keys', keys, '--wait-for', condition, '--eval', result).value

    def test_it_names_its_media(self):
        run = self.run_application('--eval', 'document.getElementById("menu").innerText')
        self.assertEqual(run.value.split(), ['one.mp4', 'two', 'clips.mp4', 'absent.mp4'])

    def test_ok_plays_what_has_the_focus(self):
        run = self.run_application('--keys', 'down,ok', '--wait-for', 'video.playState === 1 && video.playPosition > 0',
                                   '--eval', LOG)
        self.assertEqual(run.value, ['state: playing', 'play(1) returns true', 'state: buffering', 'state: connecting'])
        self.assertEqual([name for name, *_ in self.plays(self.calls(run))], ['two%20clips.mp4'])

    def test_pause_play_and_stop(self):
        self.assertEqual(self.after('play,pause', 'video.playState === 2', PANEL)[0], 'paused')
        self.assertEqual(self.after('play,pause,play', 'video.playState === 1', LOG)[:3],
                         ['play(1) returns false', 'state: playing', 'play(0) returns true'])
        self.assertEqual(self.after('play,stop', 'video.playState === 0', PANEL)[0], 'stopped')

    def test_the_arrows_seek(self):
        calls = self.calls(self.run_application(
            # Paused, so that the position changes by seeks only.
            '--keys', 'play,pause,right,right,left', '--wait-for', 'video.playState === 2', '--eval', '1'))
        targets = [int(re.search(r', (\d+)\)', call)[1]) for call in calls if call.startswith('Seek')]
        self.assertEqual([round(target, -4) for target in targets], [10000, 20000, 10000])

    def test_the_bar_shows_the_position(self):
        width = self.after('play,right,right,right',
                           'video.playState === 1 && parseFloat(document.getElementById("played").style.width) >= 50',
                           'document.getElementById("bar").clientWidth / document.getElementById("played").clientWidth')
        self.assertLessEqual(width, 2)
        self.assertGreater(width, 1.2)

    def test_rewind_and_fast_forward_change_the_speed(self):
        for keys, speed in (('fast-forward', 2), ('fast-forward,fast-forward', 4), ('rewind', -2),
                            ('fast-forward,rewind', 1)):
            with self.subTest(keys):
                self.assertEqual(self.after(f'play,{keys}', 'video.playState === 1', PANEL)[2], f'Speed {speed}')

    def test_an_error_is_told(self):
        self.assertEqual(self.after('up,ok', 'video.playState === 6', PANEL)[0], 'error: not available')

    def screenshot(self, name, *arguments):
        file_name = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'media-{name}.png')
        self.run_application('--screenshot', file_name, *arguments)
        return PngImage(file_name)

    def test_red_fills_the_screen_and_goes_back(self):
        calls = self.calls(self.run_application('--keys', 'red,red', '--eval', '1'))
        self.assertEqual([call for call in calls if call.startswith('SetFullScreen')],
                         ['SetFullScreen(1, 1)', 'SetFullScreen(1, 0)'])
        self.assertEqual(len(self.screenshot('full', '--keys', 'red').colours()), 1)
        self.assertGreater(len(self.screenshot('back', '--keys', 'red,red').colours()), COLOURS_OF_A_PAGE)

    def test_the_page_has_a_hole_for_the_picture(self):
        page = self.screenshot('playing', '--keys', 'play,right,right', '--wait-for', 'video.playState === 1')
        video_plane = self.screenshot('full', '--keys', 'red').colour(626, 228)
        self.assertEqual(page.colour(626, 228), video_plane)
        self.assertNotEqual(page.colour(830, 228), video_plane)

    def test_everything_lies_within_the_safe_area_and_nothing_is_cut_off(self):
        outside = '''Array.prototype.filter.call(document.querySelectorAll('.screen > *'), function (element) {
            var box = element.getBoundingClientRect();
            return box.width > 0 && (box.left < 64 || box.right > 1216 || box.top < 36 || box.bottom > 684 ||
                element.scrollHeight > element.clientHeight || element.scrollWidth > element.clientWidth);
        }).map(function (element) { return element.className; })'''
        for keys in ('back', 'up,ok', 'play,pause,play,pause,play,stop'):
            with self.subTest(keys):
                self.assertEqual(self.after(keys, 'true', outside), [])

    def test_without_media_it_says_so(self):
        self.assertIn('No media', self.run_application('--eval', LOG, media=()).value[0])

    def test_without_the_plug_in_it_says_so(self):
        text = self.run_application('--eval', 'document.body.innerText', plugin='TELIX_FOREIGN_PLUGIN').value
        self.assertIn('The plug-in is missing', text)
        self.assertNotIn('Speed', text)


if __name__ == '__main__':
    unittest.main()
