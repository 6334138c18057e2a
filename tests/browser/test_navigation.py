"""The picture of the channel while an application goes from one page to another, as a recording has it."""

import os
import subprocess
import unittest

from telix_tv import TelixTv
from television import RUN_TIMEOUT

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


class Navigation(TelixTv):
    def setUp(self):
        super().setUp()
        for title, following in (('first', 'second'), ('second', 'first')):
            self.write(PAGE % {'title': title, 'next': f'{following}.html', 'last': NAVIGATIONS,
                               'colour': 'rgb(%d, %d, %d)' % COLOURS[title]}, f'{title}.html')

    def recorded_frames(self):
        """The frames of a run through all pages, as functions of a point."""
        file_name = os.path.join(self.folder, 'run.mp4')
        run = self.television.run('--plugin', PLUGIN, '--record', file_name, '--wait-for', 'window.done',
                                  f'file://{self.folder}/first.html?0')
        self.assertEqual((run.status, run.errors), (0, ''), run)
        data = subprocess.run(['ffmpeg', '-v', 'error', '-i', file_name, '-vf', f'scale={WIDTH}:{HEIGHT}:flags=area',
                               '-f', 'rawvideo', '-pix_fmt', 'rgb24', '-'], stdin=subprocess.DEVNULL,
                              capture_output=True, check=True, timeout=RUN_TIMEOUT).stdout
        size = 3 * WIDTH * HEIGHT

        def frame_at(start):
            def colour(point):
                offset = start + 3 * (point[1] * WIDTH + point[0])
                return tuple(data[offset:offset + 3])
            return colour
        return [frame_at(start) for start in range(0, len(data), size)]

    @staticmethod
    def columns(frame):
        """The median colours of the columns of the stripes."""
        def median(values):
            return sorted(values)[len(values) // 2]
        return {x: tuple(median([frame((x, y))[part] for y in ROWS]) for part in range(3)) for x in STRIPES}

    def shows_channel(self, frame):
        columns = self.columns(frame)
        return all(is_near(columns[x], stripe) for x, stripe in STRIPES.items())

    def test_no_frame_is_without_the_channel_from_the_first_page_to_the_last(self):
        frames = self.recorded_frames()
        shown = [self.shows_channel(frame) for frame in frames]
        self.assertIn(True, shown)
        start = shown.index(True)
        without = [(index, self.columns(frame)) for index, frame in enumerate(frames)
                   if index > start and not shown[index]]
        self.assertEqual(without, [], f'of {len(frames)} frames from {start} on')
        # The recording has both pages, and the channel under them.
        for title, colour in COLOURS.items():
            self.assertTrue(any(is_near(frame(BADGE), colour) for frame in frames[start:]), title)


if __name__ == '__main__':
    unittest.main()
