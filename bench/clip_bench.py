#!/usr/bin/env python3
"""Measures how long a clip takes in the desktop television, on each engine, compared in the same run with mpv and ffplay as far
as they are installed: from the first request for it, which the server sees, to its first picture on the screen, and from a key
that seeks to the picture there. All of them play the same file from the same server, in a window of the same place on the same
display. Exits with 1 if the television takes longer than the faster of the players.
Usage: clip_bench.py BUILD-FOLDER"""

import contextlib
import os
import shutil
import signal
import statistics
import subprocess
import sys
import time

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path[:0] = [os.path.join(TOP, 'tests', 'browser'), os.path.join(TOP, 'tools')]
from media_server import MediaServer  # noqa: E402
from television import Television, temporary_folder  # noqa: E402

ROUNDS = 9
TIMEOUT = 60  # seconds, for each picture
END_TIMEOUT = 5  # seconds
INTERVAL = 0.001  # seconds between two looks at the screen
SETTLED = 2  # seconds that a clip plays before the seek
SIZE = '1280x720'
POINT = 640, 360
# Half of the clip each. The seek goes to the second half, of which every second begins with a keyframe.
DURATION, TARGET = 60, 40
FIRST, SECOND = 'lime', 'blue'
PAGE = '''<!DOCTYPE html><html><body style="margin: 0">
<object id="clip" type="video/mp4" style="position: absolute; width: 1280px; height: 720px"></object>
<script>
    var clip = document.getElementById('clip');
    window.onload = function () {
        clip.data = 'URL';
        clip.play(1);
    };
    window.onkeydown = function (event) {
        if (event.keyCode === 39) {
            clip.seek(TARGET);
        }
    };
</script></body></html>'''


class Failure(Exception):
    """What a player did not do."""


def make_clip(file):
    """A moving picture with a still patch of one colour, and of another one in the second half."""
    patch = 'drawbox=x=540:y=260:w=200:h=200:t=fill:'
    half = DURATION // 2
    subprocess.run(
        ['ffmpeg', '-hide_banner', '-loglevel', 'error', '-f', 'lavfi', '-i', f'testsrc2=size={SIZE}:rate=25',
         '-f', 'lavfi', '-i', 'sine=frequency=440:sample_rate=48000', '-t', str(DURATION), '-vf',
         f"{patch}color={FIRST}:enable='lt(t,{half})',{patch}color={SECOND}:enable='gte(t,{half})'", '-c:v', 'libx264', '-preset',
         'veryfast', '-pix_fmt', 'yuv420p', '-g', '25', '-b:v', '4M', '-c:a', 'aac', '-movflags', '+faststart', file], check=True)


def is_colour(name, colour):
    """Whether a pixel of decoded video has the colour, which is not exact."""
    red, green, blue = colour
    return red < 90 and (green > 170 and blue < 90 if name == FIRST else blue > 170 and green < 90)


def wait_for(condition, what):
    """The time at which the condition holds."""
    end = time.monotonic() + TIMEOUT
    while not condition():
        if time.monotonic() > end:
            raise Failure(f'no {what} within {TIMEOUT} s')
        time.sleep(INTERVAL)
    return time.monotonic()


def end(process):
    """Ends a program; ffplay sometimes hangs when it is asked to end."""
    process.terminate()
    try:
        process.communicate(timeout=END_TIMEOUT)
    except subprocess.TimeoutExpired:
        process.kill()
        process.communicate()


class Bench:
    """The display, and the server with the clip."""

    def __init__(self, television, server, log):
        self._television = television
        self._server = server
        self._log = log
        self.url = f'{server.url}/clip.mp4'

    def television(self, engine, page):
        return self._television.start('--engine', engine, '--size', SIZE, page)

    def player(self, *command):
        environment = {**self._television.environment, 'SDL_AUDIODRIVER': 'dummy', 'SDL_VIDEODRIVER': 'x11',
                       'SDL_VIDEO_WINDOW_POS': '0,0'}
        return subprocess.Popen([*command, self.url], env=environment, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                                stderr=subprocess.DEVNULL)

    def _has_request(self):
        with contextlib.suppress(FileNotFoundError), open(self._log, encoding='utf-8') as file:
            return '"/clip.mp4' in file.read()
        return False

    def _shows(self, name):
        return is_colour(name, self._television.colour(*POINT))

    def measure(self, start):
        """Seconds to the first picture, and to the picture after the seek."""
        with contextlib.suppress(FileNotFoundError):
            os.remove(self._log)
        wait_for(lambda: not self._shows(FIRST) and not self._shows(SECOND), 'empty screen')
        with start() as process:
            try:
                requested = wait_for(self._has_request, 'request')
                first = wait_for(lambda: self._shows(FIRST), 'picture') - requested
                time.sleep(SETTLED)
                self._television.move_pointer(*POINT)
                begin = time.monotonic()
                self._television.press_key('Right')
                return first, wait_for(lambda: self._shows(SECOND), 'picture after the seek') - begin
            finally:
                end(process)


def players(bench, engines, folder):
    """Functions that start each program, by name."""
    page = os.path.join(folder, 'page.html')
    with open(page, 'w', encoding='utf-8') as file:
        file.write(PAGE.replace('URL', bench.url).replace('TARGET', str(1000 * TARGET)))
    programs = {f'television, {engine}': lambda engine=engine: bench.television(engine, page) for engine in engines}
    if shutil.which('mpv'):
        keys = os.path.join(folder, 'input.conf')
        with open(keys, 'w', encoding='utf-8') as file:
            file.write(f'RIGHT seek {TARGET} absolute+keyframes\n')
        programs['mpv'] = lambda: bench.player('mpv', '--no-config', '--vo=x11', '--ao=null', '--hwdec=no', '--no-border',
                                               f'--geometry={SIZE}+0+0', f'--input-conf={keys}', '--no-osd-bar',
                                               '--force-window=immediate')
    if shutil.which('ffplay'):
        programs['ffplay'] = lambda: bench.player('ffplay', '-loglevel', 'quiet', '-noborder', '-left', '0', '-top', '0', '-x',
                                                  SIZE.split('x', maxsplit=1)[0], '-y', SIZE.split('x')[1],
                                                  '-seek_interval', str(TARGET))
    return programs


def measure_round(bench, programs, number):
    """The seconds of each program once; they are printed as they come."""
    times = {}
    for name, start in programs.items():
        times[name] = bench.measure(start)
        print(f'round {number}: {name}: {times[name][0]:.3f} s, seek {times[name][1]:.3f} s', flush=True)
    return times


def report(name, times):
    """Prints the rows, and returns those of the television that take longer than the fastest player."""
    medians = {program: statistics.median(each) for program, each in times.items()}
    others = [median for program, median in medians.items() if not program.startswith('television')]
    missed = []
    print(f'{name}:')
    for program, median in medians.items():
        ratio = f', {median / min(others):.2f} times the faster player' if others else ''
        print(f'  {program}: median {median:.3f} s ({min(times[program]):.3f} to {max(times[program]):.3f} s){ratio}')
        if others and program.startswith('television') and median > min(others):
            missed.append(f'{name}, {program}')
    return missed


def main():
    build = sys.argv[1] if len(sys.argv) == 2 else ''
    program = os.path.join(build, 'desktop', 'telix-tv')
    engines = [engine for engine in ('webkit', 'npapi') if os.path.isfile(f'{program}-{engine}')]
    if not engines:
        print(f'clip_bench: {program}: No such file', file=sys.stderr)
        sys.exit(2)
    signal.alarm(0)  # the time limit of test programs
    with temporary_folder() as folder, temporary_folder() as logs, Television(program, 1280, 720) as television:
        make_clip(os.path.join(folder, 'clip.mp4'))
        log = os.path.join(logs, 'requests')
        with MediaServer({'': folder}, log=log) as server:
            bench = Bench(television, server, log)
            # In turns, so that other load of the machine affects all.
            try:
                programs = players(bench, engines, folder)
                rounds = [measure_round(bench, programs, number) for number in range(1, ROUNDS + 1)]
            except Failure as failure:
                sys.exit(f'clip_bench: {failure}')
    missed = [row for number, name in enumerate(('request to first picture', 'key to the picture after a seek'))
              for row in report(name, {program: [each[program][number] for each in rounds] for program in programs})]
    if missed:
        print(f'clip_bench: slower than the faster player: {"; ".join(missed)}', file=sys.stderr)
        sys.exit(1)


if __name__ == '__main__':
    main()
