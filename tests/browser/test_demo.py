"""The demonstration application, driven by remote control keys, on platform libraries with scripted responses."""

import contextlib
import functools
import http.server
import os
import sys
import threading
import unittest

from demo import APPS, COLOURS_OF_A_PAGE, DEMO, ROOT, Demonstration, Keys, Note, is_hidden, is_visible, media_state, \
    shows, steps, text
from television import PngImage

sys.path.insert(0, os.path.join(ROOT, 'tools'))
from media_server import MediaServer  # noqa: E402 (found by the line above)

TUNED = is_visible('banner-rating')  # then the programmes are known, too
OBJECT = 'document.querySelector("#videos object")'


def occurs(number, argument=0):
    """Triggers an event of the platform; see platforms/broadcast.cpp."""
    return f'({OBJECT}.setChannelByTriplet(0xFFFE, {number}, {argument}), true)'


class Channels(Demonstration):
    """Live television, on the platform library of platforms/broadcast.cpp."""
    plugin = 'TELIX_BROADCAST_PLUGIN'

    def test_the_banner_says_what_is_on_and_goes_by_itself(self):
        *texts, width = self.notes(
            TUNED, *(Note(text(f'banner-{part}')) for part in ('number', 'name', 'rating', 'now', 'next')),
            Note('document.getElementById("banner-played").style.width'), is_hidden('banner'),
            'info', is_visible('banner'))
        self.assertEqual(texts[:3], ['1', 'One', '12+'])
        # In local time, whose offset from UTC is a multiple of half an hour.
        self.assertRegex(texts[3], r'^\d\d:[14]3.\d\d:[14]3 News$')
        self.assertRegex(texts[4], r'^\d\d:[14]3.\d\d:[14]3 Film$')
        self.assertEqual(width, '100%')

    def test_arrows_digits_and_the_list_lead_to_channels(self):
        name = Note(text('banner-name'))
        noted = self.notes(
            TUNED, 'up', TUNED, name, 'down', TUNED, name, 'down', TUNED, name,
            '1', TUNED, name, '9', is_visible('number'), Note(text('number')),
            'left', Note(text('channels')), 'down', Note(text('channel-list') + ' + '
                                                         'document.querySelector("#channels .focused").innerText'),
            'ok', is_hidden('channels'), TUNED, name,
            # OK opens the list while the banner is shown, else the banner.
            'ok', is_visible('channels'), 'back', is_hidden('channels'), 'back', is_hidden('banner'), 'ok',
            is_visible('banner'), is_hidden('channels'))
        self.assertEqual(noted[:6], ['Two', 'One', 'Three', 'One', 'No channel 9', 'Channels 1One\u25b6 2Two 3Three'])
        self.assertRegex(noted[6], r'2\s*Two$')
        self.assertEqual(noted[7], 'Two')

    def test_several_quick_steps_are_one_channel_change(self):
        record = f'{OBJECT}.createChannelObject(0, 0xFFFF, 0, 0).name'
        noted = self.notes(TUNED, f'({record}, true)', Keys('up', 'up', 'up', 'up'), TUNED, shows('banner', 'Two'),
                           Note(f'{record}.split("\\n").filter(function (call) {{ '
                                'return call.indexOf("TELIX_JS_VB_SetChannel(") === 0; }).length'))
        self.assertEqual(noted, [1])

    def test_each_channel_has_an_object_of_its_own_and_no_other_stays(self):
        ids = Note('Array.prototype.map.call(document.querySelectorAll("#videos object"), '
                   'function (object) { return object.id; })')
        one = 'document.querySelectorAll("#videos object").length === 1'
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
            # Nothing is announced on the next channel.
            'up', TUNED, 'red', is_hidden('more'), f'!({shows("banner", "More")})')
        self.assertEqual(registered, 'RegisterStreamEvent(1, callback, "1", "1f", "red-button")')
        self.assertRegex(more, r'^id 1 tag 1f One News What has happened Next \d\d:\d\d.\d\d:\d\d Film Received at '
                               r'\d\d:\d\d:\d\d BACKTelevision$')

    def test_the_notice_goes_by_itself_or_by_the_viewers_will(self):
        self.announce('back', is_hidden('notice'), occurs(4), 'red', is_visible('more'))
        self.announce(is_hidden('notice'))

    def test_over_http_the_description_of_the_stream_event_is_fetched(self):
        with MediaServer({'': APPS}) as server:
            self.assertEqual(self.announce(page=server.url + '/demo/index.html'),
                             ['RegisterStreamEvent(1, callback, "1", "1f", "red-button")'])

    def test_programmes_that_change_are_read_anew(self):
        question = 'TELIX_JS_SI_GetProgrammeHandles('
        noted = self.notes(TUNED, f'({OBJECT}.createChannelObject(0, 0xFFFF, 0, 0), true)', occurs(1),
                           f'(window.calls = (window.calls || "") + {OBJECT}.createChannelObject(0, 0xFFFF, 0, 0).name)'
                           f'.indexOf("{question}") >= 0', Note(text('banner-next')))
        self.assertIn('Film', noted[0])

    def test_an_error_is_told_until_a_channel_is_there(self):
        noted = self.notes(TUNED, occurs(5, 0), is_visible('message'), Note(text('message')),
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
        # Without channels the keys have no effect.
        self.notes(*'up down 1 ok left info red green back'.split(), is_visible('message'), is_visible('legend'),
                   is_hidden('banner'), plugin='TELIX_PLUGIN')

    def test_without_the_plug_in_it_says_so(self):
        self.assertIn('The plug-in is missing', self.text('message', plugin='TELIX_FOREIGN_PLUGIN'))


class MediaHandler(http.server.SimpleHTTPRequestHandler):
    """Serves apps/, and under /media/ a playlist for *.asx and a few bytes for any other name."""

    def do_GET(self):
        if not self.path.startswith('/media/'):
            super().do_GET()
            return
        folder = f'http://127.0.0.1:{self.server.server_port}/media'
        clips = ''.join(f'<Entry><Ref href="{folder}/{name}.mp4?length=4000"/></Entry>' for name in ('one', 'two'))
        playlist = f'<ASX version="3.0">{clips}</ASX>'.encode()
        content = playlist if self.path.endswith('.asx') else b'some bytes'
        self.send_response(200)
        self.send_header('Content-Type', 'video/x-ms-asf')
        self.send_header('Content-Length', str(len(content)))
        self.end_headers()
        with contextlib.suppress(OSError):
            self.wfile.write(content)

    def log_message(self, *_):
        pass


class Media(Demonstration):
    """Media, on the platform library of platforms/media.cpp: each clip lasts a minute."""
    plugin = 'TELIX_MEDIA_PLUGIN'

    def setUp(self):
        server = http.server.ThreadingHTTPServer(
            ('127.0.0.1', 0), functools.partial(MediaHandler, directory=APPS))
        server.daemon_threads = True
        threading.Thread(target=server.serve_forever, daemon=True).start()
        self.addCleanup(server.server_close)
        self.addCleanup(server.shutdown)
        self.url = f'http://127.0.0.1:{server.server_port}'

    def play(self, *parts):
        """Opens the media page and performs the steps; returns the recorded values and the calls of the platform."""
        run = self.run_demo('--wait-for', steps('yellow', is_visible('media-player'), *parts), '--eval', 'notes',
                            page=self.url + '/demo/index.html')
        marker = 'call TELIX_JS_AV_'
        calls = [line[len(marker):].replace(self.url, '') for line in run.errors.splitlines()
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
        # The last call before each new speed.
        speed_arguments = [(1, 2, 0), (1, 4, 0), (1, 2, 0), (1, 1, 0), (1, 0, 5), (0, 1, 0), (1, 1, 0)]
        distinct = [speeds[index] for index in range(len(speeds)) if index == 0 or speeds[index] != speeds[index - 1]]
        self.assertEqual(distinct, ['SetPlaySpeed(1, 1, 1, 0)'] +
                         [f'SetPlaySpeed(1, {positive}, {whole}, {tenths})'
                          for positive, whole, tenths in speed_arguments])

    def test_a_clip_is_queued(self):
        notes, calls = self.play('ok', media_state('Playing'), 'down', 'yellow', Note(text('media-notice')))
        self.assertEqual(notes, ['Next: Second clip'])
        self.assertIn('Queue(1, "/media/second.mp4", 1, 6, 512, 0, 0, 0)', calls)

    def test_a_playlist_plays_one_clip_after_the_other(self):
        notes, calls = self.play(*['down'] * 5, 'ok', shows('media-track', 'Track 1 of 2'), Note(text('media-title')),
                                 shows('media-track', 'Track 2 of 2'), media_state('Finished'))
        self.assertEqual(notes, ['Playlist of two clips'])
        self.assertEqual([call for call in calls if call.startswith('Play(')],
                         [f'Play(1, "/media/{name}.mp4?length=4000", 1, 6, 512, 0, 0, 0)' for name in ('one', 'two')])

    def test_an_error_is_told_and_the_next_clip_plays(self):
        self.play(*['up'] * 3, 'ok', media_state('The content is not available.'), *['down'] * 3, 'ok',
                  media_state('Playing'))

    def test_the_picture_has_the_screen_for_itself_until_a_key_is_pressed(self):
        self.play('ok', media_state('Playing'), is_hidden('media-bar'), is_hidden('media-choice'), is_hidden('background'),
                  'info', is_visible('media-bar'))

    def test_each_clip_has_a_player_of_its_own_that_ends_at_the_way_back(self):
        _, calls = self.play('ok', media_state('Playing'), 'down', 'ok', media_state('Playing'), 'back',
                             is_hidden('media'), is_visible('message'))
        self.assertEqual(sum(call.startswith('CreatePlayer') for call in calls), 2)
        self.assertEqual(sorted(call for call in calls if call.startswith('DestroyPlayer')),
                         ['DestroyPlayer(1)', 'DestroyPlayer(2)'])
        for player in (1, 2):
            self.assertLess(calls.index(f'Stop({player})'), calls.index(f'DestroyPlayer({player})'))

    def test_without_a_media_player_it_says_so(self):
        self.assertEqual(self.run_demo('--wait-for', steps('yellow', 'ok', is_visible('media-notice')), '--eval',
                                       text('media-notice'), plugin='TELIX_PLUGIN',
                                       page=self.url + '/demo/index.html').value, 'This set has no media player.')


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
        self.assertIn('returned an application', self.text('state', '--keys', 'blue,green'))
        self.assertGreater(len(self.screenshot('second', '--keys', 'blue,green').colours()), COLOURS_OF_A_PAGE)

    def test_the_second_application_ends_itself(self):
        for key in ('back', 'ok'):
            self.assertIn('createApplication("second.html", true) returns an application',
                          self.text('log', '--keys', f'blue,green,{key}'))

    def test_blue_opens_it_and_takes_it_away_again(self):
        self.assertIn('destroyApplication() brings this page back', self.text(
            'log', '--keys', 'blue,blue', '--wait-for', 'document.title !== "A second application"'))

    def test_a_preview_that_the_viewer_has_closed_takes_nothing_else_away(self):
        # Longer than the preview lasts.
        preview_is_over = '(window.start = window.start || Date.now()) + 4000 < Date.now()'
        self.assertIn('telix', self.text('device', '--keys', 'blue,blue,back', '--wait-for', preview_is_over))

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
        self.run_demo('--keys', 'blue,down,back', '--wait-for', f'{is_hidden("device")} && {is_visible("message")}',
                      '--eval', '1')

    def test_without_the_plug_in_it_says_so(self):
        device = self.text('device', '--keys', 'blue', plugin='TELIX_FOREIGN_PLUGIN')
        self.assertIn('The plug-in is missing', device)
        self.assertNotIn('Remote control', device)


class Look(Demonstration):
    """On every page everything is in the safe area, not clipped, and large enough for the distance to a television."""

    # Elements outside the safe area, clipped elements and small text. Only text with an ellipsis may be clipped.
    FAULTS = '''(function () {
        var faults = [];
        function isVisible(element) { return element.offsetWidth > 0; }
        function report(element, fault) {
            faults.push((element.id || element.className || element.tagName) + ' ' + fault);
        }
        Array.prototype.filter.call(document.querySelectorAll('.sheet, .screen > *, .small, #device-content > *'),
            isVisible).forEach(function (element) {
            var box = element.getBoundingClientRect();
            if (box.width > 0 && element.id !== 'device-content' &&
                (box.left < 64 || box.right > 1216 || box.top < 36 || box.bottom > 684)) { report(element, 'outside'); }
            if (element.scrollHeight > element.clientHeight + 1 || element.scrollWidth > element.clientWidth + 1) {
                report(element, 'clipped');
            }
        });
        Array.prototype.filter.call(document.querySelectorAll('body *'), isVisible).forEach(function (element) {
            var hasText = Array.prototype.some.call(element.childNodes, function (child) {
                return child.nodeType === 3 && child.textContent.trim() !== '';
            });
            if (hasText && parseFloat(getComputedStyle(element).fontSize) < 24) { report(element, 'small'); }
        });
        return faults;
    }())'''

    def check(self, name, parts, **options):
        with self.subTest(name):
            file_name = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'demo-{name}.png')
            run = self.run_demo('--wait-for', steps(*parts), '--screenshot', file_name, '--eval', self.FAULTS,
                                **options)
            self.assertEqual(run.value, [])
            self.assertGreater(len(PngImage(file_name).colours()), COLOURS_OF_A_PAGE)

    def test_television(self):
        for name, parts in (('banner', [TUNED]), ('channels', [TUNED, 'left']), ('choice', [TUNED, 'green']),
                            ('number', [TUNED, '9']), ('error', [TUNED, occurs(5, 0), is_visible('message')])):
            self.check(name, parts, plugin='TELIX_BROADCAST_PLUGIN')
        self.check('nothing', [])
        self.check('missing', [], plugin='TELIX_FOREIGN_PLUGIN')

    def test_media(self):
        self.check('unserved', ['yellow'])
        with MediaServer({'': APPS}) as server:
            self.check('media', ['yellow'], page=server.url + '/demo/index.html')

    def test_the_set(self):
        for steps_down in range(10):
            self.check(f'set-{steps_down}', ['blue', *['down'] * steps_down, 'ok', 'yellow'] if steps_down != 5
                       else ['blue', *['down'] * 5], plugin='TELIX_DEVICE_PLUGIN')
        self.check('set-desktop', ['blue', 'down'], plugin='TELIX_DESKTOP_PLUGIN')
        self.check('set-schemes', ['blue', 'down', 'down', 'right'], plugin='TELIX_BROADCAST_PLUGIN')

    def test_the_second_application(self):
        distance = '''document.querySelector('.small .legend').getBoundingClientRect().top -
            document.getElementById('state').getBoundingClientRect().bottom'''
        self.assertGreaterEqual(self.run_demo('--keys', 'blue,green', '--eval', distance).value, 0)
        self.assertEqual(self.run_demo('--keys', 'blue,green', '--eval', self.FAULTS).value, [])


if __name__ == '__main__':
    unittest.main()
