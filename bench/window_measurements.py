"""What television_bench.py measures of the window: start, channel changes, frame rates and memory, on each engine.

Times are those of a viewer: from the start of the program, or a key of the keyboard, to the pixels on the screen."""

import contextlib
import os
import random
import subprocess
import time

from processes import cpu_seconds, memory_bytes

STARTS = 5
CHANGES = 20
FRAME_RATE_SECONDS = 10
LIMIT = 60  # seconds, for what should take a fraction of one
POLL_SECONDS = 0.002
SETTLE_SECONDS = 3

# Points of the page: of the video, and of a badge that the page has above it.
VIDEO, BADGE = (30, 300), (1270, 710)
BADGE_COLOUR = (0, 128, 0)
PAGE = '''<!DOCTYPE html><html><head><style>
    body { margin: 0; background: transparent; }
    object { position: absolute; width: 1280px; height: 720px; }
    #badge { position: fixed; left: 1260px; top: 700px; width: 20px; height: 20px; background: rgb(0, 128, 0); }
</style></head><body><object id="tv" type="video/broadcast"></object>%s<div id="badge"></div>
<script>
    var tv = document.getElementById('tv');
    onload = function () { tv.bindToCurrentChannel(); };
</script>%s</body></html>'''

# Text that scrolls over the video, and a box that moves on it, a step for each frame.
SCROLLED = '<div style="position: absolute; left: 100px; color: white; font: 30px sans-serif">' + \
    ''.join(f'Line {number} of the text<br>' for number in range(500)) + '</div>'
MOVED = '<div id="box" style="position: absolute; width: 200px; height: 200px; background: blue"></div>'
SCROLL = 'scrollTo(0, 2 * frames % 5000);'
MOVE = "document.getElementById('box').style.transform = 'translateX(' + 4 * frames % 1000 + 'px)';"
FRAMES = '''<script>
    var frames = 0, begin = 0, rate = 0;
    function step(now) {
        %s
        begin = begin || now;
        rate = now - begin < %d ? 0 : frames / (now - begin) * 1000;
        frames += 1;
        if (!rate) { requestAnimationFrame(step); }
    }
    // When the channel is on.
    var timer = setInterval(function () {
        if (tv.playState === 2) { clearInterval(timer); requestAnimationFrame(step); }
    }, 100);
</script>'''

# COUNT channel changes, or clips that are played until they show a picture, when OK is pressed.
TUNES = '''<script>
    var count = 0;
    function next() {
        if (count === %d) { console.log('repeated'); return; }
        count += 1;
        tv.setChannel(tv.getChannelConfig().channelList.item(count %% 2), false);
    }
    tv.onChannelChangeSucceeded = function () { if (count) { setTimeout(next, 0); } };
    onkeydown = next;
</script>'''
CLIPS = '''<object id="player" type="video/mp4"></object><script>
    var count = 0, player = document.getElementById('player');
    function next() {
        if (count === %d) { console.log('repeated'); return; }
        count += 1;
        player.data = ['%s', '%s'][count %% 2];
        player.play(1);
    }
    player.onPlayStateChange = function () {
        if (player.playState === 1) { setTimeout(function () { player.stop(); }, 0); }
        if (player.playState === 0) { setTimeout(next, 0); }
    };
    onkeydown = next;
</script>'''


class Failure(Exception):
    """Why nothing could be measured."""


def wait_until(condition, what, limit=LIMIT):
    """Polls until the condition is true and returns the time of that."""
    end = time.monotonic() + limit
    while not condition():
        if time.monotonic() > end:
            raise Failure(f'{what}: not within {limit} s')
        time.sleep(POLL_SECONDS)
    return time.monotonic()


def is_first_channel(colour):
    """The red stripe of the first service of the test multiplex; the second one has colours that are less bright."""
    return colour[0] > 225 and max(colour[1:]) < 30


def is_second_channel(colour):
    return not is_first_channel(colour) and max(colour) > 80


class Window:
    """Measurements of one engine."""

    def __init__(self, television, engine, folder):
        self._television = television
        self._engine = engine
        self._folder = folder

    def _page(self, name, content='', script=''):
        file_name = os.path.join(self._folder, f'{name}.html')
        with open(file_name, 'w', encoding='utf-8') as file:
            file.write(PAGE % (content, script))
        return file_name

    @contextlib.contextmanager
    def _running(self, *arguments):
        process = self._television.start('--engine', self._engine, *arguments)
        try:
            yield process
        finally:
            process.terminate()
            process.communicate()

    def _has(self, point, condition):
        return lambda: condition(self._television.colour(*point))

    def start(self):
        """Seconds to the first page and to the first picture on the screen, and of CPU time until both are there."""
        wait_until(self._has(BADGE, lambda colour: colour != BADGE_COLOUR), 'the end of the television before')
        page = self._page('start')
        begin = time.monotonic()
        with self._running(page) as process:
            first = {}
            conditions = {'page': self._has(BADGE, lambda colour: colour == BADGE_COLOUR),
                          'picture': self._has(VIDEO, is_first_channel)}
            while conditions:
                name = wait_for_any(conditions)
                first[name] = time.monotonic() - begin
                del conditions[name]
            return first['page'], first['picture'], cpu_seconds(process)

    def changes(self):
        """Seconds from the key to the picture of the other channel, of several changes."""
        seconds = []
        with self._running(self._page('changes')):
            wait_until(self._has(VIDEO, is_first_channel), 'the first picture')
            for number in range(CHANGES):
                # A viewer looks at a channel for a while; the keyframe before has any age.
                time.sleep(0.5 + random.random())
                key, condition = ('F12', is_first_channel) if number % 2 else ('F11', is_second_channel)
                begin = time.monotonic()
                self._television.press_key(key)
                seconds.append(wait_until(self._has(VIDEO, condition), 'the next channel') - begin)
        return seconds

    def _frame_rate(self, name, content, step):
        page = self._page(name, content, FRAMES % (step, 1000 * FRAME_RATE_SECONDS))
        run = self._television.run('--engine', self._engine, '--wait-for', 'rate', '--eval', 'rate', page)
        if run.status != 0:
            raise Failure(str(run))
        return run.value

    def scroll_rate(self):
        """Frames a second of a page that scrolls over the video."""
        return self._frame_rate('scroll', SCROLLED, SCROLL)

    def animation_rate(self):
        """Frames a second of an animation over the video."""
        return self._frame_rate('animation', MOVED, MOVE)

    def _memory(self, name, script):
        """The bytes after the start, and after what the script does."""
        with self._running(self._page(name, script=script)) as process:
            wait_until(self._has(VIDEO, is_first_channel), 'the first picture')
            time.sleep(SETTLE_SECONDS)
            before = memory_bytes(process)
            self._television.press_key('Return')
            for line in process.stderr:
                if 'repeated' in line:
                    break
            else:
                raise Failure(f'telix-tv exited during {name}')
            time.sleep(SETTLE_SECONDS)
            return before, memory_bytes(process)

    def memory_of_tunes(self, count):
        return self._memory('tunes', TUNES % count)

    def memory_of_clips(self, count):
        clips = [os.path.join(self._folder, f'{source}.mp4') for source in ('testsrc', 'testsrc2')]
        for clip in clips:
            source = os.path.basename(clip).split('.', maxsplit=1)[0]
            subprocess.run(['ffmpeg', '-hide_banner', '-loglevel', 'error', '-y', '-f', 'lavfi', '-i',
                            f'{source}=size=640x360:rate=25', '-f', 'lavfi', '-i', 'sine=frequency=440', '-t', '2',
                            '-c:v', 'libx264', '-pix_fmt', 'yuv420p', '-c:a', 'aac', clip], check=True)
        return self._memory('clips', CLIPS % (count, *(f'file://{clip}' for clip in clips)))


def wait_for_any(conditions):
    """The name of the first of the conditions that is true."""
    end = time.monotonic() + LIMIT
    while time.monotonic() < end:
        for name, condition in conditions.items():
            if condition():
                return name
        time.sleep(POLL_SECONDS)
    raise Failure(f'{", ".join(conditions)}: not within {LIMIT} s')
