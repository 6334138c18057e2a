"""The demonstration application on the desktop television: received and decoded video, and media over HTTP."""

import os
import sys
import unittest

from demo import APPS, ROOT, Demonstration, Keys, Note, is_hidden, is_visible, media_state, shows, steps, text
from patterns import columns, has_bars, is_dark, is_striped
from television import PngImage

sys.path.insert(0, os.path.join(ROOT, 'tools'))
from media_server import MediaServer  # noqa: E402 (found by the line above)

# The programmes of the test multiplex by channel.
PROGRAMMES = {'Telix One': ('Morning Patterns', 'The Colour Hour', 'News at the Minute'),
              'Telix Two': ('Bars of the World', 'Night of the Test Card'),
              'Telix Three': ('Gradients', 'Slow Colours', 'Fast Colours', 'Colours Live')}
PLAYER = 'document.querySelector("#videos object")'


class DesktopDemonstration(Demonstration):
    """Base class: the demonstration with the desktop platform library, loaded over HTTP with the clips."""
    plugin = 'TELIX_DESKTOP_PLUGIN'

    @classmethod
    def setUpClass(cls):
        super().setUpClass()
        server = MediaServer({'': APPS, 'media': os.environ['TELIX_CLIPS']})
        cls.addClassCleanup(server.close)
        cls.page = server.url + '/demo/index.html'

    def watch(self, name, *parts, environment=None):
        """Performs the steps; returns the recorded values and a screenshot."""
        file_name = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'demo-desktop-{name}.png')
        run = self.run_demo('--wait-for', steps(*parts), '--eval', 'notes', '--screenshot', file_name, page=self.page,
                            environment=environment)
        return run.value, PngImage(file_name)

    def assert_programmes(self, channel, now, following):
        for programme in (now, following):
            self.assertRegex(programme, r'^\d\d:\d\d.\d\d:\d\d (' + '|'.join(PROGRAMMES[channel]) + ')$')

    def assert_pattern(self, pattern, picture):
        matching = [each for each in (is_striped, has_bars, is_dark) if each(picture)]
        self.assertEqual(matching, [pattern], columns(picture))

    received = shows('banner-next', '\u2013')  # the dash between start and end of the following programme
    programmes = tuple(Note(text(f'banner-{part}')) for part in ('name', 'now', 'next'))

    def on_channel(self, name):
        return f'{shows("banner-name", name)} && {self.received}'


class DesktopBroadcast(DesktopDemonstration):
    def test_the_picture_of_each_channel_with_its_banner(self):
        # By the channel list, by an arrow key and by a digit.
        tunes = {'Telix One': (['3', self.on_channel('Telix Three'), 'left', 'down', 'ok'], is_striped),
                 'Telix Two': (['up'], has_bars), 'Telix Three': (['3'], is_dark)}
        for channel, (keys, pattern) in tunes.items():
            with self.subTest(channel):
                notes, picture = self.watch(channel.split()[1].lower(), self.received, *keys, self.on_channel(channel),
                                            *self.programmes)
                self.assertEqual(notes[0], channel)
                self.assert_programmes(channel, *notes[1:])
                self.assert_pattern(pattern, picture)

    def test_numbers_of_two_digits_and_a_list_longer_than_the_screen(self):
        number = Note(text('banner-number'))
        tuned = '!/Tuning/.test(' + text('banner-now') + ') && ' + is_hidden('number')
        notes, _ = self.watch(
            'fifteen', tuned, Keys('1', '2'), tuned, number, Keys('1', 'ok'), tuned, number, '1', is_visible('number'),
            tuned, number, '4', tuned, number, Keys('1', '6'), shows('number', 'No channel 16'), 'left', *['up'] * 6,
            Note(text('channel-list')), environment={'TELIX_CHANNELS': ';'.join(['test'] * 5)})
        self.assertEqual(notes[:4], ['12', '1', '1', '4'])
        self.assertRegex(notes[4], '^9.*13.*15Telix Three$')

    def test_programmes_follow_the_broadcast(self):
        # Programmes last four seconds: the following one becomes the present one.
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
        self.assert_pattern(has_bars, picture)


class DesktopMedia(DesktopDemonstration):
    def test_a_clip_plays_and_broadcast_comes_back(self):
        time = 'document.getElementById("media-time").textContent'
        playing = ['yellow', 'ok', media_state('Playing')]
        notes, picture = self.watch('clip', *playing, 'right', f'parseInt({time}.substr(2), 10) >= 6', Note(time))
        self.assertRegex(notes[0], '^0:0[6-9] / 0:20$')
        self.assert_pattern(is_striped, picture)
        sample = Note(f'[Date.now(), {PLAYER}.playPosition]')
        notes, picture = self.watch(
            'back', *playing, 'pause', media_state('Paused'), 'play', media_state('Playing'), 'fast-forward',
            media_state('2\u00d7'), f'(window.start = {PLAYER}.playPosition) > 0', sample,
            f'{PLAYER}.playPosition >= start + 5000', sample, 'back', is_hidden('media'), self.on_channel('Telix One'),
            'left', 'back', 'up', self.on_channel('Telix Two'))
        (first_time, first_position), (last_time, last_position) = notes
        self.assertGreater((last_position - first_position) / (last_time - first_time), 1.5)
        self.assert_pattern(has_bars, picture)

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
                   is_visible('media-bar'), media_state('Playing'))

    def test_each_kind_of_error_has_its_words(self):
        self.watch('errors', 'yellow', *['up'] * 3, 'ok', media_state('The connection failed.'), 'down', 'ok',
                   media_state('The connection failed.'), 'down', 'ok', media_state('The set cannot play this format.'),
                   'down', 'ok', media_state('Playing'))


if __name__ == '__main__':
    unittest.main()
