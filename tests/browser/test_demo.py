"""The demonstration application, driven by the remote control as a viewer would: first on platforms that answer as the
tests want, then on the desk's own."""

import contextlib
import functools
import http.server
import json
import os
import sys
import tempfile
import threading
import unittest

from television import Picture, Television

ROOT = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
DEMO = os.path.join(ROOT, 'apps', 'demo', 'index.html')
sys.path.insert(0, os.path.join(ROOT, 'tools'))
from media_server import MediaServer  # noqa: E402 (found by the line above)

# A page that is drawn has many colours, for its letters are smoothed; an empty one has a single one.
COLOURS_OF_A_PAGE = 50
KEYS = {'up': 38, 'down': 40, 'left': 37, 'right': 39, 'ok': 13, 'back': 461, 'info': 457, 'red': 403, 'green': 404,
        'yellow': 405, 'blue': 406, 'play': 415, 'pause': 19, 'stop': 413, 'rewind': 412, 'fast-forward': 417,
        **{str(digit): 48 + digit for digit in range(10)}}


def text(element):
    """The text of an element as an expression; empty while the element cannot be seen."""
    return f'document.getElementById("{element}").innerText.replace(/\\s+/g, " ").trim()'


def shows(element, words):
    return f'({is_seen(element)} && {text(element)}.indexOf({json.dumps(words)}) >= 0)'


def is_seen(element):
    return f'(document.getElementById("{element}").offsetWidth > 0)'


def is_hidden(element):
    return f'(document.getElementById("{element}").offsetWidth === 0)'


class Note:
    """A step that keeps the value of an expression."""

    def __init__(self, expression):
        self.expression = expression


def steps(*parts):
    """An expression to wait for: it goes through names of keys, which are pressed, conditions, which are waited for,
    and notes, and is true at the end. The value of `notes` is then what was noted."""
    actions = []
    for part in parts:
        if isinstance(part, Note):
            actions.append(f'function () {{ notes.push({part.expression}); return true; }}')
        elif part in KEYS:
            actions.append(f'function () {{ pressKey({KEYS[part]}); return true; }}')
        else:
            actions.append(f'function () {{ return {part}; }}')
    return '''(function () {
        window.notes = window.notes || [];
        window.stepsDone = window.stepsDone || 0;
        function pressKey(keyCode) {
            ['keydown', 'keyup'].forEach(function (type) {
                var event = document.createEvent('Event');
                event.initEvent(type, true, true);
                event.keyCode = keyCode;
                document.body.dispatchEvent(event);
            });
        }
        var steps = [%s];
        if (stepsDone < steps.length && steps[stepsDone]()) { stepsDone++; }
        return stepsDone === steps.length;
    }())''' % ', '.join(actions)


class Demonstration(unittest.TestCase):
    plugin = 'TELIX_PLUGIN'

    @classmethod
    def setUpClass(cls):
        cls.television = Television(os.environ['TELIX_TV'])
        cls.addClassCleanup(cls.television.close)

    def run_demo(self, *arguments, plugin=None, page=DEMO, environment=None):
        run = self.television.run('--plugin', os.environ[plugin or self.plugin], *arguments, page,
                                  environment=environment)
        self.assertEqual(run.status, 0, run)
        # Messages of its scripts carry the name of the file.
        self.assertNotIn('.js:', run.errors, run)
        return run

    def text(self, element, *arguments, **options):
        return self.run_demo('--eval', f'document.getElementById("{element}").innerText', *arguments, **options).value

    def notes(self, *parts, **options):
        """Goes through the steps; gives what was noted."""
        return self.run_demo('--wait-for', steps(*parts), '--eval', 'notes', **options).value

    def screenshot(self, name, *arguments, **options):
        file_name = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'demo-{name}.png')
        self.run_demo('--screenshot', file_name, *arguments, **options)
        picture = Picture(file_name)
        self.assertEqual((picture.width, picture.height), (1280, 720))
        return picture


TUNED = f'{is_seen("banner-rating")}'  # its programmes are known then
OBJECT = 'document.querySelector("#pictures object")'


def occurs(number, argument=0):
    """Makes something happen at the platform; see platforms/broadcast.cpp."""
    return f'({OBJECT}.setChannelByTriplet(0xFFFE, {number}, {argument}), true)'


class Channels(Demonstration):
    """Live television, on the platform of platforms/broadcast.cpp."""
    plugin = 'TELIX_BROADCAST_PLUGIN'

    def test_the_banner_says_what_is_on_and_goes_by_itself(self):
        *texts, width = self.notes(
            TUNED, *(Note(text(f'banner-{part}')) for part in ('number', 'name', 'rating', 'now', 'next')),
            Note('document.getElementById("banner-played").style.width'), is_hidden('banner'),
            'info', is_seen('banner'))
        self.assertEqual(texts[:3], ['1', 'One', '12+'])
        # The times are those of the viewer's clock: half an hour and an hour and a half.
        self.assertRegex(texts[3], r'^\d\d:[14]3.\d\d:[14]3 News$')
        self.assertRegex(texts[4], r'^\d\d:[14]3.\d\d:[14]3 Film$')
        self.assertEqual(width, '100%')

    def test_arrows_digits_and_the_list_lead_to_channels(self):
        name = Note(text('banner-name'))
        noted = self.notes(
            TUNED, 'up', TUNED, name, 'down', TUNED, name, 'down', TUNED, name,
            '1', TUNED, name, '9', is_seen('number'), Note(text('number')),
            'left', Note(text('channels')), 'down', Note(text('channel-list') + ' + '
                                                         'document.querySelector("#channels .focused").innerText'),
            'ok', is_hidden('channels'), TUNED, name,
            # With the banner on the screen OK opens the list, without it the banner.
            'ok', is_seen('channels'), 'back', is_hidden('channels'), 'back', is_hidden('banner'), 'ok',
            is_seen('banner'), is_hidden('channels'))
        self.assertEqual(noted[:6], ['Two', 'One', 'Three', 'One', 'No channel 9', 'Channels 1One\u25b6 2Two 3Three'])
        self.assertRegex(noted[6], r'2\s*Two$')
        self.assertEqual(noted[7], 'Two')

    def test_several_quick_steps_are_one_channel_change(self):
        record = f'{OBJECT}.createChannelObject(0, 0xFFFF, 0, 0).name'
        noted = self.notes(TUNED, f'({record}, true)', 'up', 'up', 'up', 'up', TUNED, shows('banner', 'Two'),
                           Note(f'{record}.split("\\n").filter(function (call) {{ '
                                'return call.indexOf("TELIX_JS_VB_SetChannel(") === 0; }).length'))
        self.assertEqual(noted, [1])

    def test_each_channel_has_an_object_of_its_own_and_no_other_stays(self):
        ids = Note('Array.prototype.map.call(document.querySelectorAll("#pictures object"), '
                   'function (object) { return object.id; })')
        one = 'document.querySelectorAll("#pictures object").length === 1'
        noted = self.notes(TUNED, one, ids, '2', TUNED, one, ids, '3', TUNED, one, ids)
        self.assertEqual(len({id for ids in noted for id in ids}), 3)

    def test_sound_and_subtitles_are_chosen(self):
        choice = Note(text('choice'))
        noted = self.notes(TUNED, 'green', choice, 'down', 'ok', 'up', 'up', 'ok', choice, 'up', 'ok', choice, 'back',
                           is_hidden('choice'))
        self.assertEqual(noted, [
            'Sound \u2713English German, audio description, surround Subtitles \u2713Off French, hard of hearing',
            'Sound English \u2713German, audio description, surround Subtitles Off \u2713French, hard of hearing',
            'Sound English \u2713German, audio description, surround Subtitles \u2713Off French, hard of hearing'])

    def test_the_choice_waits_for_the_channel(self):
        self.assertIn('French', self.text('choice', '--keys', 'green', '--wait-for', shows('choice', 'English')))

    def announce(self, *parts, page=DEMO):
        watched = (f'(window.calls = (window.calls || "") + {OBJECT}.createChannelObject(0, 0xFFFF, 0, 0).name)'
                   '.indexOf("RegisterStreamEvent(") >= 0')
        return self.notes(TUNED, watched, Note(r'calls.match(/RegisterStreamEvent\(.*\)/)[0]'), occurs(4),
                          shows('notice', 'id 1 tag 1f'), *parts, page=page)

    def test_a_stream_event_is_announced_and_red_opens_it(self):
        registered, more = self.announce(
            'info', shows('banner', 'More'), 'red', is_hidden('notice'), Note(text('more')), 'back', is_hidden('more'),
            # On the next channel nothing is announced.
            'up', TUNED, 'red', is_hidden('more'), f'!({shows("banner", "More")})')
        self.assertEqual(registered, 'RegisterStreamEvent(1, callback, "1", "1f", "red-button")')
        self.assertRegex(more, r'^id 1 tag 1f One News What has happened Next \d\d:\d\d.\d\d:\d\d Film Received at '
                               r'\d\d:\d\d:\d\d BACKTelevision$')

    def test_the_notice_goes_by_itself_or_by_the_viewers_will(self):
        self.announce('back', is_hidden('notice'), occurs(4), 'red', is_seen('more'))
        self.announce(is_hidden('notice'))

    def test_over_http_the_description_of_the_stream_event_is_fetched(self):
        with MediaServer({'': os.path.join(ROOT, 'apps')}) as server:
            self.assertEqual(self.announce(page=server.url + '/demo/index.html'),
                             ['RegisterStreamEvent(1, callback, "1", "1f", "red-button")'])

    def test_programmes_that_change_are_read_anew(self):
        question = 'TELIX_JS_SI_GetProgrammeHandles('
        noted = self.notes(TUNED, f'({OBJECT}.createChannelObject(0, 0xFFFF, 0, 0), true)', occurs(1),
                           f'(window.calls = (window.calls || "") + {OBJECT}.createChannelObject(0, 0xFFFF, 0, 0).name)'
                           f'.indexOf("{question}") >= 0', Note(text('banner-next')))
        self.assertIn('Film', noted[0])

    def test_an_error_is_told_until_a_channel_is_there(self):
        noted = self.notes(TUNED, occurs(5, 0), is_seen('message'), Note(text('message')),
                           Note(text('banner-now')), 'up', TUNED,
                           is_hidden('message'))
        self.assertEqual(noted, ['One The channel is not known.', 'The channel is not known.'])

    def test_the_way_to_the_set_and_back(self):
        self.notes(TUNED, 'blue', shows('device', 'Settings'), is_hidden('banner'), 'back', is_hidden('device'),
                   shows('banner', 'One'))

    def test_without_a_media_player_and_from_a_file_the_media_page_says_what_to_do(self):
        noted = self.notes(TUNED, 'yellow', Note(text('media')), 'back', is_hidden('media'), TUNED)
        self.assertIn('./run.sh', noted[0])

    def test_without_a_platform_library_it_says_so(self):
        message = self.text('message', plugin='TELIX_PLUGIN')
        self.assertIn('platform library is missing', message)
        # No key leads anywhere where there is nothing.
        self.notes(*'up down 1 ok left info red green back'.split(), is_seen('message'), is_seen('legend'),
                   is_hidden('banner'), plugin='TELIX_PLUGIN')

    def test_without_the_plug_in_it_says_so(self):
        self.assertIn('The plug-in is missing', self.text('message', plugin='TELIX_STRANGER'))


class MediaHandler(http.server.SimpleHTTPRequestHandler):
    """The applications, and below /media/ a beginning of whatever is asked for."""

    def do_GET(self):
        if not self.path.startswith('/media/'):
            super().do_GET()
            return
        address = f'http://127.0.0.1:{self.server.server_port}/media'
        clips = ''.join(f'<Entry><Ref href="{address}/{name}.mp4?length=1500"/></Entry>' for name in ('one', 'two'))
        playlist = f'<ASX version="3.0">{clips}</ASX>'.encode()
        content = playlist if self.path.endswith('.asx') else b'a beginning'
        self.send_response(200)
        self.send_header('Content-Type', 'video/x-ms-asf')
        self.send_header('Content-Length', str(len(content)))
        self.end_headers()
        with contextlib.suppress(OSError):
            self.wfile.write(content)

    def log_message(self, *_):
        pass


def media_state(words):
    return f'{text("media-state")} === {json.dumps(words)}'


class Media(Demonstration):
    """Media, on the platform of platforms/media.cpp: each clip lasts a minute."""
    plugin = 'TELIX_MEDIA_PLUGIN'

    def setUp(self):
        server = http.server.ThreadingHTTPServer(
            ('127.0.0.1', 0), functools.partial(MediaHandler, directory=os.path.join(ROOT, 'apps')))
        server.daemon_threads = True
        threading.Thread(target=server.serve_forever, daemon=True).start()
        self.addCleanup(server.server_close)
        self.addCleanup(server.shutdown)
        self.address = f'http://127.0.0.1:{server.server_port}'

    def play(self, *parts):
        """Opens the media page and goes through the steps; gives the notes and the calls of the platform."""
        run = self.run_demo('--wait-for', steps('yellow', is_seen('media-player'), *parts), '--eval', 'notes',
                            page=self.address + '/demo/index.html')
        marker = 'call TELIX_JS_AV_'
        calls = [line[len(marker):].replace(self.address, '') for line in run.errors.splitlines()
                 if line.startswith(marker) and 'GetPlayInfo' not in line]
        return run.value, calls

    def test_a_clip_plays_pauses_goes_elsewhere_and_stops(self):
        notes, calls = self.play(
            'ok', media_state('Playing'), Note(text('media-title')), 'pause', media_state('Paused'), 'play',
            media_state('Playing'), 'right', 'right', 'right', 'left', shows('media-time', '0:1'),
            'ok', media_state('Paused'), Note(text('media-time')),
            Note('parseFloat(document.getElementById("media-played").style.width)'), 'stop', media_state('Stopped'),
            Note(text('media-time')), 'play', media_state('Playing'))
        self.assertEqual(notes[0], 'Running clock')
        self.assertRegex(notes[1], r'^0:1\d / 1:00$')
        self.assertGreater(notes[2], 100 / 6)
        self.assertEqual(sum(call.startswith('Seek(') for call in calls), 4)
        self.assertEqual([call for call in calls if call.startswith('Play(')][0],
                         'Play(1, "/media/clip.mp4", 1, 6, 512, 0, 0, 0)')

    def test_each_speed_reaches_the_set(self):
        notes, calls = self.play(
            'ok', media_state('Playing'), 'fast-forward', media_state('2\u00d7'),
            'fast-forward', media_state('4\u00d7'), 'rewind', 'rewind', media_state('Playing'),
            'rewind', media_state('0.5\u00d7'), 'rewind',
            media_state('Backward 1\u00d7'), 'play', media_state('Playing'), Note('1'))
        speeds = [call for call in calls if call.startswith('SetPlaySpeed(')]
        # What the set was told last before each new speed.
        told = [(1, 2, 0), (1, 4, 0), (1, 2, 0), (1, 1, 0), (1, 0, 5), (0, 1, 0), (1, 1, 0)]
        reached = [speeds[index] for index in range(len(speeds)) if index == 0 or speeds[index] != speeds[index - 1]]
        self.assertEqual(reached, ['SetPlaySpeed(1, 1, 1, 0)'] +
                         [f'SetPlaySpeed(1, {positive}, {whole}, {tenths})' for positive, whole, tenths in told])

    def test_a_clip_is_queued(self):
        notes, calls = self.play('ok', media_state('Playing'), 'down', 'yellow', Note(text('media-notice')))
        self.assertEqual(notes, ['Next: Second clip'])
        self.assertIn('Queue(1, "/media/second.mp4", 1, 6, 512, 0, 0, 0)', calls)

    def test_a_playlist_plays_one_clip_after_the_other(self):
        notes, calls = self.play(*['down'] * 5, 'ok', shows('media-track', 'Track 1 of 2'), Note(text('media-title')),
                                 shows('media-track', 'Track 2 of 2'), media_state('Finished'))
        self.assertEqual(notes, ['Playlist of two clips'])
        self.assertEqual([call for call in calls if call.startswith('Play(')],
                         [f'Play(1, "/media/{name}.mp4?length=1500", 1, 6, 512, 0, 0, 0)' for name in ('one', 'two')])

    def test_an_error_is_told_and_the_next_clip_plays(self):
        self.play(*['up'] * 3, 'ok', media_state('The content is not available.'), *['down'] * 3, 'ok',
                  media_state('Playing'))

    def test_the_picture_has_the_screen_for_itself_until_a_key_is_pressed(self):
        self.play('ok', media_state('Playing'), is_hidden('media-bar'), is_hidden('media-choice'), is_hidden('ground'),
                  'info', is_seen('media-bar'))

    def test_each_clip_has_a_player_of_its_own_that_ends_at_the_way_back(self):
        _, calls = self.play('ok', media_state('Playing'), 'down', 'ok', media_state('Playing'), 'back',
                             is_hidden('media'), is_seen('message'))
        ends = [call for call in calls if call.startswith(('CreatePlayer', 'Stop', 'DestroyPlayer'))]
        self.assertEqual(sum(call.startswith('CreatePlayer') for call in ends), 2)
        self.assertEqual(sorted(call for call in ends if call.startswith('DestroyPlayer')),
                         ['DestroyPlayer(1)', 'DestroyPlayer(2)'])
        for player in (1, 2):
            self.assertLess(ends.index(f'Stop({player})'), ends.index(f'DestroyPlayer({player})'))

    def test_without_a_media_player_it_says_so(self):
        self.assertEqual(self.run_demo('--wait-for', steps('yellow', 'ok', is_seen('media-notice')), '--eval',
                                       text('media-notice'), plugin='TELIX_PLUGIN',
                                       page=self.address + '/demo/index.html').value, 'This set has no media player.')


class Device(Demonstration):
    """The page of the set and of applications."""

    def panel(self, keys, *arguments, **options):
        return self.text('panel', '--keys', f'blue,{keys}' if keys else 'blue', *arguments, **options)

    def test_it_shows_what_its_application_offers(self):
        panel = self.panel('up,up,up,up')
        for name in ('onKeyPress', 'onKeyUp', 'onKeyDown', 'onApplicationShown', 'onApplicationHidden',
                     'createApplication', 'destroyApplication', 'show', 'hide'):
            self.assertIn(name, panel)
        self.assertEqual(panel.count('null'), 5)
        self.assertEqual(panel.count('function'), 4)

    def test_the_focus_moves_with_the_arrow_keys_and_goes_round(self):
        focused = ('--eval', 'document.querySelector("#menu .focused").innerText')
        for keys, title in (('down', 'Capabilities'), ('down,down,down', 'Keys'), ('up', 'Remote control'),
                            ('up,down', 'Settings')):
            with self.subTest(keys):
                self.assertEqual(self.run_demo('--keys', f'blue,{keys}', *focused).value, title)

    def test_yellow_sets_and_clears_the_handlers(self):
        manager, application = 'up,up,up', 'up,up,up,up'
        self.assertEqual(self.panel(manager).count('null'), 4)
        self.assertEqual(self.panel(f'{manager},yellow').count('function'), 5)
        self.assertEqual(self.panel(f'{manager},yellow,yellow').count('null'), 4)
        self.assertEqual(self.panel(f'{application},yellow').count('function'), 9)
        self.assertEqual(self.panel(f'{application},yellow,yellow').count('function'), 9)

    def test_ok_on_the_manager_sets_the_handlers_as_well(self):
        self.assertEqual(self.panel('up,up,up,ok').count('function'), 5)

    def test_ok_on_the_application_gets_another_one(self):
        self.assertEqual(self.panel('up,up,up,up,yellow,ok').count('null'), 5)

    def test_the_settings_and_capabilities_are_those_of_the_platform(self):
        settings = self.panel('', plugin='TELIX_DEVICE_PLUGIN')
        for words in ('Country\tDEU', 'Audio language\tdeu', 'Subtitle language\teng', 'Free memory\t123456'):
            self.assertIn(words, settings)
        capabilities = self.panel('down', plugin='TELIX_DEVICE_PLUGIN')
        for words in ('OITF_HD_UIPROF\tyes', 'OITF_SD_UIPROF\tno', '2 and 1', 'Profiles described\t2',
                      'MP4_AVC_SD_25\tvideo/mp4'):
            self.assertIn(words, capabilities)

    def test_the_schemes_of_parental_ratings_are_shown_one_after_the_other(self):
        self.assertRegex(self.panel('down,down', plugin='TELIX_BROADCAST_PLUGIN'),
                         r'^dvb-si\s+Scheme\t1 of 4\s+Threshold\t12\s*$')
        self.assertRegex(self.panel('down,down,right', plugin='TELIX_BROADCAST_PLUGIN'),
                         r'^fsk\s+Scheme\t2 of 4\s+Threshold\tnot known\s+Rating 1\tFSK 0\s+Rating 2\tFSK 6\s+'
                         r'Rating 3\tFSK 16\s*$')

    def test_ok_on_the_keys_sets_the_mask(self):
        for keys, mask, groups in (('ok', '0x11f', 'numeric'), ('ok,ok', '0x1f', 'red green yellow blue navigation')):
            with self.subTest(keys):
                panel = self.panel(f'down,down,down,{keys}', plugin='TELIX_DEVICE_PLUGIN')
                self.assertIn(f'Key mask in force\t{mask}\n', panel)
                self.assertIn(groups, panel)

    def test_a_drm_message_comes_back_turned_round(self):
        panel = self.panel('down,down,down,down,right,ok', '--wait-for', shows('panel', 'tes ,olleH'),
                           plugin='TELIX_DEVICE_PLUGIN')
        self.assertIn('DRM system\turn:dvb:casystemid:4096', panel)
        self.assertIn('Id\tmessage 1', panel)
        self.assertIn('Code\t0', panel)

    def test_without_a_platform_library_the_device_is_not_known(self):
        self.assertIn('Country\tnot known', self.panel(''))
        self.assertIn('OITF_HD_UIPROF\tno', self.panel('down'))
        self.assertIn('knows no schemes', self.panel('down,down'))
        self.assertIn('Key mask in force\t0x0', self.panel('down,down,down,ok'))
        self.assertIn('Id\tnot known', self.panel('down,down,down,down,ok'))

    def test_green_opens_the_second_application(self):
        title = ('--eval', 'document.title')
        self.assertEqual(self.run_demo('--keys', 'blue,green', *title).value, 'A second application')
        self.assertEqual(self.run_demo('--keys', 'blue,down,down,down,down,down,ok', *title).value,
                         'A second application')
        self.assertIn('gave an application', self.text('state', '--keys', 'blue,green'))
        self.assertGreater(len(self.screenshot('second', '--keys', 'blue,green').colours()), COLOURS_OF_A_PAGE)

    def test_the_second_application_ends_itself(self):
        for key in ('back', 'ok'):
            self.assertIn('createApplication("second.html", true) gives an application',
                          self.text('log', '--keys', f'blue,green,{key}'))

    def test_blue_opens_it_and_takes_it_away_again(self):
        self.assertIn('destroyApplication() brings this page back', self.text(
            'log', '--keys', 'blue,blue', '--wait-for', 'document.title !== "A second application"'))

    def test_a_preview_that_the_viewer_has_closed_takes_nothing_else_away(self):
        waited = '(window.start = window.start || Date.now()) + 4000 < Date.now()'
        self.assertIn('telix', self.text('device', '--keys', 'blue,blue,back', '--wait-for', waited))

    def test_red_hides_the_page_and_brings_it_back(self):
        self.assertEqual(len(self.screenshot('hidden', '--keys', 'blue,red').colours()), 1)
        self.assertGreater(len(self.screenshot('shown', '--keys', 'blue,red,red').colours()), COLOURS_OF_A_PAGE)

    def test_the_plug_in_is_named(self):
        panel = self.panel('up,up')
        self.assertIn('TELIX Scriptable Plugin', panel)
        self.assertIn('15', panel)

    def test_keys_are_named(self):
        self.assertIn('403', self.panel('up,red'))
        self.assertIn('VK_FAST_FWD', self.panel('up,fast-forward'))

    def test_back_leads_to_television(self):
        self.run_demo('--keys', 'blue,down,back', '--wait-for', f'{is_hidden("device")} && {is_seen("message")}',
                      '--eval', '1')

    def test_without_the_plug_in_it_says_so(self):
        device = self.text('device', '--keys', 'blue', plugin='TELIX_STRANGER')
        self.assertIn('The plug-in is missing', device)
        self.assertNotIn('Remote control', device)


# What the desk broadcasts: the programmes of the test multiplex by channel.
PROGRAMMES = {'Telix One': ('Morning Patterns', 'The Colour Hour', 'News at the Minute'),
              'Telix Two': ('Bars of the World', 'Night of the Test Card'),
              'Telix Three': ('Gradients', 'Slow Colours', 'Fast Colours', 'Colours Live')}


def columns(picture):
    """The colour of most of some columns of a picture that fills the screen, where no sheet covers them."""
    def middle(values):
        return sorted(values)[len(values) // 2]
    return [tuple(middle([picture.colour(x, y)[part] for y in range(130, 440)]) for part in range(3))
            for x in (30, 680, 950, 1250)]


def is_striped(picture):
    """The pattern of the first channel, and of the first clip: stripes of full colours that stay in their places."""
    wanted = ((255, 0, 0), (0, 0, 255), (255, 0, 255), (0, 255, 255))
    return all(abs(part - other) < 60 for colour, stripe in zip(columns(picture), wanted)
               for part, other in zip(colour, stripe))


def has_bars(picture):
    """The bars of the second channel wander; they are of three quarters of the full colours, or grey."""
    return all(all(part < 30 or 160 < part < 230 for part in colour) or all(90 < part < 112 for part in colour)
               for colour in columns(picture))


def is_dark(picture):
    """The third channel has clouds of dark colours."""
    return all(20 < max(colour) < 150 for colour in columns(picture))


class Desk(Demonstration):
    """With the desk's own platform library: pictures that are received and decoded, and media over HTTP."""
    plugin = 'TELIX_DESK_PLUGIN'

    @classmethod
    def setUpClass(cls):
        super().setUpClass()
        server = MediaServer({'': os.path.join(ROOT, 'apps'), 'media': os.environ['TELIX_CLIPS']})
        cls.addClassCleanup(server.close)
        cls.page = server.url + '/demo/index.html'

    def watch(self, name, *parts, environment=None):
        """Goes through the steps; gives the notes and the picture of the window."""
        file_name = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'demo-desk-{name}.png')
        run = self.run_demo('--wait-for', steps(*parts), '--eval', 'notes', '--screenshot', file_name, page=self.page,
                            environment=environment)
        return run.value, Picture(file_name)

    def assert_programmes(self, channel, now, following):
        for programme in (now, following):
            self.assertRegex(programme, r'^\d\d:\d\d.\d\d:\d\d (' + '|'.join(PROGRAMMES[channel]) + ')$')

    def assert_seen(self, pattern, picture):
        seen = [each for each in (is_striped, has_bars, is_dark) if each(picture)]
        self.assertEqual(seen, [pattern], columns(picture))

    received = shows('banner-next', '\u2013')  # with its times
    programmes = tuple(Note(text(f'banner-{part}')) for part in ('name', 'now', 'next'))

    def on_channel(self, name):
        return f'{shows("banner-name", name)} && {self.received}'


class BroadcastOnTheDesk(Desk):
    def test_the_picture_of_each_channel_with_its_banner(self):
        # The list, the arrow and the digit lead there.
        ways = {'Telix One': (['3', self.on_channel('Telix Three'), 'left', 'down', 'ok'],
                              is_striped),
                'Telix Two': (['up'], has_bars), 'Telix Three': (['3'], is_dark)}
        for channel, (keys, pattern) in ways.items():
            with self.subTest(channel):
                notes, picture = self.watch(channel.split()[1].lower(), self.received, *keys, self.on_channel(channel),
                                            *self.programmes)
                self.assertEqual(notes[0], channel)
                self.assert_programmes(channel, *notes[1:])
                self.assert_seen(pattern, picture)

    def test_numbers_of_two_digits_and_a_list_longer_than_the_screen(self):
        number = Note(text('banner-number'))
        tuned = '!/Tuning/.test(' + text('banner-now') + ') && ' + is_hidden('number')
        notes, _ = self.watch(
            'fifteen', tuned, '1', '2', tuned, number, '1', 'ok', tuned, number, '1', is_seen('number'), tuned, number,
            '4', tuned, number, '1', '6', shows('number', 'No channel 16'), 'left', *['up'] * 6,
            Note(text('channel-list')), environment={'TELIX_CHANNELS': ';'.join(['test'] * 5)})
        self.assertEqual(notes[:4], ['12', '1', '1', '4'])
        self.assertRegex(notes[4], '^9.*13.*15Telix Three$')

    def test_programmes_follow_the_broadcast(self):
        # Programmes of four seconds: the one that is next becomes the one that is on.
        notes, _ = self.watch('programmes', self.received, f'(window.next = {text("banner-next")}) !== ""',
                              f'{text("banner-now")} === next', Note(text('banner-name')))
        self.assertEqual(notes, ['Telix One'])

    def test_sound_and_subtitles_of_each_channel(self):
        notes, _ = self.watch(
            'choice', self.received, 'green', 'down', 'ok', 'down', 'down', 'ok', Note(text('choice')), 'back',
            '2', self.on_channel('Telix Two'), 'green', 'down', 'ok', Note(text('choice')))
        self.assertEqual(notes, ['Sound German \u2713English Subtitles Off \u2713German English',
                                 'Sound German \u2713German, audio description Subtitles \u2713Off German English'])

    def test_a_stream_event_of_the_broadcast(self):
        notes, picture = self.watch(
            'announcement', self.received, shows('notice', 'Red button on Telix One'), 'red', Note(text('more')),
            'back', '2', self.on_channel('Telix Two'), shows('notice', 'Red button on Telix Two'))
        self.assertRegex(notes[0], '^Red button on Telix One Telix One .* A programme of Telix One. Next ')
        self.assert_seen(has_bars, picture)


class MediaOnTheDesk(Desk):
    def test_a_clip_plays_and_broadcast_comes_back(self):
        time = 'document.getElementById("media-time").textContent'
        playing = ['yellow', 'ok', media_state('Playing')]
        notes, picture = self.watch('clip', *playing, 'right', f'parseInt({time}.substr(2), 10) >= 6', Note(time))
        self.assertRegex(notes[0], '^0:0[6-9] / 0:20$')
        self.assert_seen(is_striped, picture)
        notes, picture = self.watch(
            'back', *playing, 'pause', media_state('Paused'), 'play', media_state('Playing'), 'fast-forward',
            media_state('2\u00d7'), Note('(window.start = Date.now()) > 0'), f'parseInt({time}.substr(2), 10) >= 8',
            Note('Date.now() - start'), 'back', is_hidden('media'), self.on_channel('Telix One'), 'left', 'back',
            'up', self.on_channel('Telix Two'))
        # Some seven seconds of the clip at twice the speed.
        self.assertLess(notes[1], 6000)
        self.assert_seen(has_bars, picture)

    def test_other_media(self):
        notes, _ = self.watch(
            'media', 'yellow', 'down', 'down', 'ok', media_state('Playing'), 'green', 'down', 'ok',
            Note(text('choice-audio')), 'back', 'down', 'ok', shows('media-title', 'A tune'), media_state('Playing'),
            'down', 'ok', shows('media-title', 'Adaptive'), media_state('Playing'), 'down', 'ok',
            shows('media-track', 'Track 1 of 2'), media_state('Playing'), 'blue', shows('media-track', 'Track 2 of 2'),
            media_state('Playing'), media_state('Finished'))
        self.assertEqual(notes, ['German \u2713English'])

    def test_a_queued_clip_follows(self):
        self.watch('queue', 'yellow', 'down', 'ok', media_state('Playing'), 'up', 'yellow',
                   shows('media-notice', 'Next: Running clock'), shows('media-title', 'Running clock'),
                   media_state('Playing'))

    def test_a_slow_connection_makes_it_wait(self):
        self.watch('slow', 'yellow', *['up'] * 4, 'ok', media_state('Playing'), media_state('Buffering \u2026'),
                   is_seen('media-bar'), media_state('Playing'))

    def test_each_kind_of_error_has_its_words(self):
        self.watch('errors', 'yellow', *['up'] * 3, 'ok', media_state('The content is not available.'), 'down', 'ok',
                   media_state('The connection failed.'), 'down', 'ok', media_state('The set cannot play this format.'),
                   'down', 'ok', media_state('Playing'))


class Look(Demonstration):
    """Everything is in the safe area, whole, and large enough to be read from afar, on every page."""

    # Sheets and boxes outside the safe area, with something cut off, and texts of small letters. Only what has its end
    # in an ellipsis may be cut.
    FAULTS = '''(function () {
        var faults = [];
        function isSeen(element) { return element.offsetWidth > 0; }
        function note(element, fault) {
            faults.push((element.id || element.className || element.tagName) + ' ' + fault);
        }
        Array.prototype.filter.call(document.querySelectorAll('.sheet, .screen > *, .small, #device-content > *'),
            isSeen).forEach(function (element) {
            var box = element.getBoundingClientRect();
            if (box.width > 0 && element.id !== 'device-content' &&
                (box.left < 64 || box.right > 1216 || box.top < 36 || box.bottom > 684)) { note(element, 'outside'); }
            if (element.scrollHeight > element.clientHeight + 1 || element.scrollWidth > element.clientWidth + 1) {
                note(element, 'cut off');
            }
        });
        Array.prototype.filter.call(document.querySelectorAll('body *'), isSeen).forEach(function (element) {
            var hasText = Array.prototype.some.call(element.childNodes, function (child) {
                return child.nodeType === 3 && child.textContent.trim() !== '';
            });
            if (hasText && parseFloat(getComputedStyle(element).fontSize) < 24) { note(element, 'small'); }
        });
        return faults;
    }())'''

    def check(self, name, parts, **options):
        with self.subTest(name):
            file_name = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'demo-{name}.png')
            run = self.run_demo('--wait-for', steps(*parts), '--screenshot', file_name, '--eval', self.FAULTS,
                                **options)
            self.assertEqual(run.value, [])
            self.assertGreater(len(Picture(file_name).colours()), COLOURS_OF_A_PAGE)

    def test_television(self):
        for name, parts in (('banner', [TUNED]), ('channels', [TUNED, 'left']), ('choice', [TUNED, 'green']),
                            ('number', [TUNED, '9']), ('error', [TUNED, occurs(5, 0), is_seen('message')])):
            self.check(name, parts, plugin='TELIX_BROADCAST_PLUGIN')
        self.check('nothing', [])
        self.check('missing', [], plugin='TELIX_STRANGER')

    def test_media(self):
        self.check('unserved', ['yellow'])
        with MediaServer({'': os.path.join(ROOT, 'apps')}) as server:
            self.check('media', ['yellow'], page=server.url + '/demo/index.html')

    def test_the_set(self):
        for steps_down in range(10):
            self.check(f'set-{steps_down}', ['blue', *['down'] * steps_down, 'ok', 'yellow'] if steps_down != 5
                       else ['blue', *['down'] * 5], plugin='TELIX_DEVICE_PLUGIN')
        # With all that the desk tells of itself.
        self.check('set-desk', ['blue', 'down'], plugin='TELIX_DESK_PLUGIN')
        self.check('set-schemes', ['blue', 'down', 'down', 'right'], plugin='TELIX_BROADCAST_PLUGIN')

    def test_the_second_application(self):
        distance = '''document.querySelector('.small .legend').getBoundingClientRect().top -
            document.getElementById('state').getBoundingClientRect().bottom'''
        self.assertGreaterEqual(self.run_demo('--keys', 'blue,green', '--eval', distance).value, 0)
        self.assertEqual(self.run_demo('--keys', 'blue,green', '--eval', self.FAULTS).value, [])


if __name__ == '__main__':
    unittest.main()
