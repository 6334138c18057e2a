#!/usr/bin/env python3
"""Measures the desktop television on each engine: the time from the start of the program to the first page and picture, from
a key to the picture of the next channel, and the frame rate of a page that moves over the video; then the CPU load of all its
processes with 720p25 video, on WebKitGTK on the video plane and painted by the page, compared in the same run with decoding
alone and, where it is installed, with mpv in a window. With --memory, instead, how much memory all processes need after COUNT
channel changes and after COUNT clips, as a multiple of that before. Exits with 1 if a goal is missed."""

import argparse
import os
import shutil
import signal
import statistics
import subprocess
import sys
import time

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path.insert(0, os.path.join(TOP, 'tests', 'browser'))
from television import Television, temporary_folder  # noqa: E402
from processes import cpu_seconds  # noqa: E402
from window_measurements import STARTS, Failure, Window  # noqa: E402

SECONDS = 15  # of each measurement
ROUNDS = 3
# Goals, of medians.
START_GOALS = {'webkit': 0.8, 'npapi': 0.5}  # seconds to the first picture
CHANGE_GOAL = 0.15  # seconds
FRAME_RATE_GOAL = 25  # a second, as the video
PAGE = '''<!DOCTYPE html><html><body style="margin: 0; background: {background}">
<object id="tv" type="video/broadcast" style="position: absolute; width: 1280px; height: 720px"></object>
<script>
    var tv = document.getElementById('tv');
    tv.onChannelChangeSucceeded = function () {{
        setTimeout(function () {{
            document.body.style.background = '{later}';
            console.log('presenting');
        }}, 1000);
    }};
    window.onload = function () {{ tv.setChannel(tv.getChannelConfig().channelList.item(0), false); }};
</script></body></html>'''


def make_stream(file, size='1280x720', rate=25, megabits=6):
    subprocess.run(
        ['ffmpeg', '-hide_banner', '-loglevel', 'error', '-f', 'lavfi', '-i', f'testsrc2=size={size}:rate={rate}',
         '-f', 'lavfi', '-i', 'sine=frequency=440:sample_rate=48000', '-t', str(SECONDS + 15), '-c:v', 'mpeg2video',
         '-b:v', f'{megabits}M', '-maxrate', f'{megabits + 2}M', '-bufsize', '2M', '-g', '12', '-c:a', 'mp2', '-b:a', '192k',
         '-muxdelay', '0.2', '-muxpreload', '0.2', '-f', 'mpegts', file], check=True)


def write_page(folder, background, later):
    """A page in which the video lies on a background, and on another one when it has begun."""
    file_name = os.path.join(folder, f'{background}-{later}.html')
    with open(file_name, 'w', encoding='utf-8') as file:
        file.write(PAGE.format(background=background, later=later))
    return file_name


def load(process):
    """The CPU load of a process and all that it has started, 1 for one core."""
    before, begin = cpu_seconds(process), time.monotonic()
    time.sleep(SECONDS)
    return (cpu_seconds(process) - before) / (time.monotonic() - begin)


def television_load(television, engine, page, environment, size='1280x720'):
    """The load from the first picture on."""
    with television.start('--engine', engine, '--size', size, page, environment=environment) as process:
        try:
            for line in process.stderr:
                if 'presenting' in line:
                    break
            else:
                sys.exit('television_bench.py: telix-tv exited without a picture')
            return load(process)
        finally:
            process.terminate()
            process.communicate()


def mpv_load(television, stream, size='1280x720'):
    """The load of a player that shows each frame of the stream in a window of the same size, with silent audio."""
    with subprocess.Popen(
            ['mpv', '--no-config', '--vo=x11', '--ao=null', '--hwdec=no', '--framedrop=no', '--no-border',
             f'--geometry={size}+0+0', '--msg-level=all=error,statusline=status',
             '--term-status-msg=${time-pos}', stream],
            env=television.environment, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True) as process:
        try:
            if not process.stdout.read(1):  # the status: it plays
                sys.exit('television_bench.py: mpv exited without a picture')
            return load(process)
        finally:
            process.terminate()
            process.communicate()


def decoding_load(build, stream):
    run = subprocess.run([os.path.join(build, 'bench', 'decode_load'), stream, str(SECONDS)], check=True,
                         stdout=subprocess.PIPE, text=True)
    return float(run.stdout)


class Report:
    """Prints rows, and remembers whether all have met their goals."""

    def __init__(self):
        self.has_missed = False

    def row(self, name, values, unit, goal=None, is_least=False):
        """`goal`: the largest median, or with `is_least` the smallest one."""
        median = statistics.median(values)
        is_missed = goal is not None and (median < goal if is_least else median > goal)
        self.has_missed = self.has_missed or is_missed
        text = '' if goal is None else f', goal {goal:g} {unit}{": MISSED" if is_missed else ""}'
        print(f'  {name}: median {median:.3g} {unit} ({min(values):.3g} to {max(values):.3g} {unit}){text}', flush=True)


def measure_window(report, windows):
    """The engines in turns, so that other load of the machine affects all."""
    starts = [{engine: window.start() for engine, window in windows.items()} for _ in range(STARTS)]
    print('from the start of the program, with the test multiplex:')
    for engine in windows:
        report.row(f'first page, {engine}', [each[engine][0] for each in starts], 's')
        report.row(f'first picture, {engine}', [each[engine][1] for each in starts], 's', START_GOALS[engine])
        report.row(f'CPU time of both, {engine}', [each[engine][2] for each in starts], 's')
    print('from a key to the picture of the next channel:')
    for engine, window in windows.items():
        report.row(engine, window.changes(), 's', CHANGE_GOAL)
    print('frame rate of a page over the video:')
    rates = [{engine: (window.scroll_rate(), window.animation_rate()) for engine, window in windows.items()}
             for _ in range(ROUNDS)]
    for engine in windows:
        for number, name in enumerate(('scrolling', 'animation')):
            report.row(f'{name}, {engine}', [each[engine][number] for each in rates], '/s', FRAME_RATE_GOAL, is_least=True)


def measure_memory(windows, count):
    print(f'memory of all processes, after {count} times what has been named:')
    for engine, window in windows.items():
        for name, measure in (('channel changes', window.memory_of_tunes), ('clips', window.memory_of_clips)):
            before, after = measure(count)
            print(f'  {name}, {engine}: {after / before:.2f} times what it was ({before / 1e6:.0f} MB, then '
                  f'{after / 1e6:.0f} MB)', flush=True)


def measure_load(report, build, engines, television, folder):
    stream = os.path.join(folder, 'stream.ts')
    make_stream(stream)
    page = write_page(folder, 'transparent', 'transparent')
    opaque_pages = {'painted by the page': write_page(folder, 'gray', 'gray'),
                    'painted by the page after the plane': write_page(folder, 'transparent', 'gray')}
    channels = {'TELIX_CHANNELS': stream}
    measurements = {f'television, {engine}': lambda engine=engine: television_load(television, engine, page, channels)
                    for engine in engines}
    if 'webkit' in engines:
        measurements.update({
            f'television, webkit, {name}': lambda each=each: television_load(television, 'webkit', each, channels)
            for name, each in opaque_pages.items()})
    measurements['decoding alone'] = lambda: decoding_load(build, stream)
    if shutil.which('mpv'):
        measurements['mpv --vo=x11'] = lambda: mpv_load(television, stream)
    # In turns, so that other load of the machine affects all.
    rounds = [{name: measure() for name, measure in measurements.items()} for _ in range(ROUNDS)]
    print('CPU load at 720p25, of one core, without the X server:')
    for name in measurements:
        report.row(name, [100 * each[name] for each in rounds], '%')


def refuse(reason):
    print(f'television_bench.py: {reason}', file=sys.stderr)
    sys.exit(2)


def main():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument('build', metavar='BUILD-FOLDER')
    parser.add_argument('--memory', metavar='COUNT', type=int, nargs='?', const=1000, help='default 1000')
    arguments = parser.parse_args()
    program = os.path.join(arguments.build, 'desktop', 'telix-tv')
    engines = [engine for engine in START_GOALS if os.path.isfile(f'{program}-{engine}')]
    if not engines:
        refuse(f'{program}: No such file')
    if arguments.memory is not None and arguments.memory < 1:
        refuse(f'--memory: bad count {arguments.memory}')
    signal.alarm(0)  # the time limit of test programs
    report = Report()
    with temporary_folder() as folder, Television(program) as television:
        windows = {engine: Window(television, engine, folder) for engine in engines}
        try:
            if arguments.memory is not None:
                measure_memory(windows, arguments.memory)
            else:
                measure_window(report, windows)
                measure_load(report, arguments.build, engines, television, folder)
        except Failure as failure:
            sys.exit(f'television_bench.py: {failure}')
    sys.exit(1 if report.has_missed else 0)


if __name__ == '__main__':
    main()
