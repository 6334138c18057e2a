"""The picture of the channel while an application begins and while it goes from one page to another, as a recording has it."""

import glob
import os
import subprocess
import time
import unittest

from patterns import is_striped
from telix_tv import GREEN, TelixTv, running_server
from television import RUN_TIMEOUT, has_opengl, wait_for

PLUGIN = os.environ['TELIX_DESKTOP_PLUGIN']
NAVIGATIONS = 6
# Full-screen video under a badge of the page's own. As soon as the channel is on, the page goes to the other one, and
# the last page stays for some time, for the recording to have it.
PAGE = '''<!DOCTYPE html><html><head><title>%(title)s</title><style>
    body { margin: 0; background: transparent; }
    object { position: absolute; left: 0; top: 0; width: 1280px; height: 720px; }
    #badge { position: absolute; left: 1080px; top: 620px; width: 200px; height: 100px; background: %(colour)s; }
</style></head><body><object id="tv" type="video/broadcast"></object><div id="badge"></div><script>
    number = Number(location.search.slice(1));
    onload = function () {
        var timer = setInterval(function () {
            if (tv.playState !== 2) { return; }
            clearInterval(timer);
            setTimeout(function () {
                done = number === %(last)d;
                if (!done) { location.href = '%(next)s?' + (number + 1); }
            }, 500);
        }, 20);
        tv.bindToCurrentChannel();
    };
</script></body></html>'''
# An opaque page, or one that the channel shows through.
FIRST_PAGE = '''<!DOCTYPE html><html><head><title>first</title></head>
    <body style="margin: 0; background: %s"><div style="position: absolute; left: 1080px; top: 620px; width: 200px;
    height: 100px; background: rgb(0, 128, 0)"></div></body></html>'''
OPAQUE = 'rgb(0, 128, 0)'
# The frames are looked at in this size. A point of it is 20 by 20 pixels of the page.
WIDTH, HEIGHT = 64, 36
# The stripes of the first channel, of which something moving covers a part, and the badge.
STRIPES = {1: (255, 0, 0), 34: (0, 0, 255), 47: (255, 0, 255), 62: (0, 255, 255)}
ROWS = range(7, 22)
BADGE = (58, 33)
COLOURS = {'first': (0, 128, 0), 'second': (255, 255, 0)}
TOLERANCE = 80  # of scaling and encoding


def is_near(colour, expected):
    return all(abs(part - other) < TOLERANCE for part, other in zip(colour, expected))


def frames_of(recording):
    """The frames of a recording, as functions of a point."""
    data = subprocess.run(['ffmpeg', '-v', 'error', '-i', recording, '-vf', f'scale={WIDTH}:{HEIGHT}:flags=area',
                           '-f', 'rawvideo', '-pix_fmt', 'rgb24', '-'], stdin=subprocess.DEVNULL,
                          capture_output=True, check=True, timeout=RUN_TIMEOUT).stdout
    size = 3 * WIDTH * HEIGHT

    def frame_at(start):
        def colour(point):
            offset = start + 3 * (point[1] * WIDTH + point[0])
            return tuple(data[offset:offset + 3])
        return colour
    return [frame_at(start) for start in range(0, len(data), size)]


def columns(frame):
    """The median colours of the columns of the stripes."""
    def median(values):
        return sorted(values)[len(values) // 2]
    return {x: tuple(median([frame((x, y))[part] for y in ROWS]) for part in range(3)) for x in STRIPES}


def shows_channel(frame):
    colours = columns(frame)
    return all(is_near(colours[x], stripe) for x, stripe in STRIPES.items())


class FirstPage(TelixTv):
    """An application begins while the channel is on."""

    def open_over_channel(self, url):
        """Opens the page while the channel is on and returns, a second after it is there, the frames from the first one of the
        channel on, and whether the engine uses OpenGL."""
        recording = os.path.join(self.folder, 'run.mp4')
        with self.television.start('--plugin', PLUGIN, '--record', recording) as process:
            wait_for(lambda: is_striped(self.television.screen()), 'no channel')
            self.television.telixctl('open', url)
            self.television.wait_for_colour((1180, 670), GREEN)
            time.sleep(1)
            uses_opengl = has_opengl(process)
            process.terminate()
            process.communicate(timeout=RUN_TIMEOUT)
        frames = frames_of(recording)
        return frames[[shows_channel(frame) for frame in frames].index(True):], uses_opengl

    def open_slowly_over_channel(self, background):
        """The same for a page with that background, whose body comes late."""
        with running_server((FIRST_PAGE % background).encode()) as server:
            return self.open_over_channel(f'{server.url}/slow')

    def test_the_channel_stays_under_a_transparent_page(self):
        frames, _ = self.open_slowly_over_channel('transparent')
        self.assertEqual([(index, columns(frame)) for index, frame in enumerate(frames) if not shows_channel(frame)], [])
        self.assertTrue(is_near(frames[-1](BADGE), GREEN))

    def assert_channel_then_green(self, frames):
        is_green = [all(is_near(colour, GREEN) for colour in columns(frame).values()) for frame in frames]
        first = is_green.index(True)
        self.assertEqual([(index, columns(frame)) for index, frame in enumerate(frames[:first])
                          if not shows_channel(frame)], [])
        self.assertEqual(is_green[first:], [True] * (len(frames) - first))

    def test_the_channel_stays_until_an_opaque_page_is_there(self):
        frames, _ = self.open_slowly_over_channel(OPAQUE)
        self.assert_channel_then_green(frames)

    @unittest.skipIf(glob.glob('/dev/dri/renderD*'), 'the engine uses OpenGL from the start')
    def test_an_opaque_page_needs_no_opengl(self):
        frames, uses_opengl = self.open_over_channel(self.write(FIRST_PAGE % OPAQUE))
        self.assert_channel_then_green(frames)
        self.assertFalse(uses_opengl)


class Navigation(TelixTv):
    def setUp(self):
        super().setUp()
        for title, following in (('first', 'second'), ('second', 'first')):
            self.write(PAGE % {'title': title, 'next': f'{following}.html', 'last': NAVIGATIONS,
                               'colour': 'rgb(%d, %d, %d)' % COLOURS[title]}, f'{title}.html')

    def recorded_frames(self):
        """The frames of a run through all pages."""
        file_name = os.path.join(self.folder, 'run.mp4')
        run = self.television.run('--plugin', PLUGIN, '--record', file_name, '--wait-for', 'window.done',
                                  f'file://{self.folder}/first.html?0')
        self.assertEqual((run.status, run.errors), (0, ''), run)
        return frames_of(file_name)

    def test_no_frame_is_without_the_channel_from_the_first_page_to_the_last(self):
        frames = self.recorded_frames()
        shown = [shows_channel(frame) for frame in frames]
        self.assertIn(True, shown)
        start = shown.index(True)
        without = [(index, columns(frame)) for index, frame in enumerate(frames)
                   if index > start and not shown[index]]
        self.assertEqual(without, [], f'of {len(frames)} frames from {start} on')
        # The recording has both pages, and the channel under them.
        for title, colour in COLOURS.items():
            self.assertTrue(any(is_near(frame(BADGE), colour) for frame in frames[start:]), title)


if __name__ == '__main__':
    unittest.main()
