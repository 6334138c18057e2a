#!/usr/bin/env python3
"""Measures the CPU load of all processes of the desktop television with video of 720p25, 1080p25 and 1080p50 on the video plane,
under a page that stands still and under one with an animation, on each engine, compared in the same run with decoding alone and
with mpv in a window of the same size, as far as it is installed. Exits with 1 if a goal is missed.
Usage: video_load_bench.py BUILD-FOLDER"""

import os
import shutil
import signal
import statistics
import sys

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path.insert(0, os.path.join(TOP, 'tests', 'browser'))
from television import Television, temporary_folder  # noqa: E402
from television_bench import decoding_load, make_stream, mpv_load, television_load  # noqa: E402

ROUNDS = 3
GOALS = {'webkit': 0.9, 'npapi': 0.65}  # times mpv, under a page that stands still
# Size, frames and megabits a second.
FORMATS = {'720p25': ('1280x720', 25, 6), '1080p25': ('1920x1080', 25, 12), '1080p50': ('1920x1080', 50, 18)}
PLAYER = 'mpv --vo=x11'
STILL, ANIMATED = 'page stands still', 'animation'
# What moves is a twentieth of the page: a ticker.
PAGE = '''<!DOCTYPE html><html><head><style>
    @keyframes ticker { from { transform: translateX(0); } to { transform: translateX(-640px); } }
    @-webkit-keyframes ticker { from { -webkit-transform: translateX(0); } to { -webkit-transform: translateX(-640px); } }
    body { margin: 0; overflow: hidden; background: transparent; }
    div { position: absolute; top: 670px; width: 1920px; height: 36px; font: 24px sans-serif; color: white; }
    .animated { animation: ticker 8s linear infinite; -webkit-animation: ticker 8s linear infinite; }
</style></head><body>
<object id="tv" type="video/broadcast" style="position: absolute; width: 1280px; height: 720px"></object>
<div class="CLASS">What a ticker says while the programme goes on</div>
<script>
    var tv = document.getElementById('tv');
    tv.onChannelChangeSucceeded = function () {
        setTimeout(function () { console.log('presenting'); }, 1000);
    };
    window.onload = function () { tv.setChannel(tv.getChannelConfig().channelList.item(0), false); };
</script></body></html>'''


def write_page(folder, name):
    file_name = os.path.join(folder, name + '.html')
    with open(file_name, 'w', encoding='utf-8') as file:
        file.write(PAGE.replace('CLASS', name))
    return file_name


def measurements(build, engines, television, folder, name):
    """Functions that measure, by row: what, or engine and page."""
    size, rate, megabits = FORMATS[name]
    stream = os.path.join(folder, name + '.ts')
    make_stream(stream, size, rate, megabits)
    channels = {'TELIX_CHANNELS': stream}
    rows = {('decoding alone',): lambda: decoding_load(build, stream)}
    if shutil.which('mpv'):
        rows[PLAYER,] = lambda: mpv_load(television, stream, size)
    for engine in engines:
        for row, page in ((STILL, write_page(folder, 'still')), (ANIMATED, write_page(folder, 'animated'))):
            rows[engine, row] = lambda engine=engine, page=page: television_load(television, engine, page, channels, size)
    return rows


def report(name, rounds):
    """Prints the rows of a format, and returns those that miss the goal."""
    medians = {row: statistics.median(each[row] for each in rounds) for row in rounds[0]}
    reference = medians.get((PLAYER,))
    missed = []
    print(f'{name}, of one core, without the X server:')
    for row, median in medians.items():
        times = f', {median / reference:.2f} times mpv' if reference else ''
        print(f'  {", ".join(row)}: median {100 * median:.1f} % ({100 * min(each[row] for each in rounds):.1f} to '
              f'{100 * max(each[row] for each in rounds):.1f} %){times}', flush=True)
        if reference and row[-1] == STILL and median > GOALS[row[0]] * reference:
            missed.append(f'{name}, {row[0]}')
    return missed


def main():
    build = sys.argv[1] if len(sys.argv) == 2 else ''
    program = os.path.join(build, 'desktop', 'telix-tv')
    engines = [engine for engine in ('webkit', 'npapi') if os.path.isfile(f'{program}-{engine}')]
    if not engines:
        print(f'video_load_bench: {program}: No such file', file=sys.stderr)
        sys.exit(2)
    signal.alarm(0)  # the time limit of test programs
    missed = []
    with temporary_folder() as folder, Television(program) as television:
        for name in FORMATS:
            rows = measurements(build, engines, television, folder, name)
            # In turns, so that other load of the machine affects all.
            missed += report(name, [{row: measure() for row, measure in rows.items()} for _ in range(ROUNDS)])
    if missed:
        goals = ' and '.join(f'{goal} ({engine})' for engine, goal in GOALS.items())
        print(f'video_load_bench: more than {goals} times mpv: {"; ".join(missed)}', file=sys.stderr)
        sys.exit(1)


if __name__ == '__main__':
    main()
