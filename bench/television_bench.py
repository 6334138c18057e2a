#!/usr/bin/env python3
"""Measures the CPU load of all processes of the desktop television with 720p25 video on each engine, on WebKitGTK on the video
plane and painted by the page, compared in the same run with decoding alone and, where it is installed, with mpv in a window, and
the time from program start to the first picture.
Usage: television_bench.py BUILD-FOLDER"""

import os
import shutil
import statistics
import subprocess
import sys
import time

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path.insert(0, os.path.join(TOP, 'tests', 'browser'))
from television import Television, temporary_folder  # noqa: E402

SECONDS = 15  # of each measurement
ROUNDS = 3
STARTS = 5
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


def stat(pid):
    """The fields of a process after its name; None if it has ended."""
    try:
        with open(f'/proc/{pid}/stat', encoding='ascii', errors='replace') as file:
            return file.read().rpartition(')')[2].split()
    except OSError:
        return None


def cpu_seconds(process):
    """Of the process and all that it has started."""
    processes = {int(pid): stat(pid) for pid in os.listdir('/proc') if pid.isdigit()}
    family, size = {process.pid}, 0
    while len(family) > size:
        size = len(family)
        family |= {pid for pid, fields in processes.items() if fields and int(fields[1]) in family}
    ticks = sum(int(processes[pid][11]) + int(processes[pid][12]) for pid in family if processes.get(pid))
    return ticks / os.sysconf('SC_CLK_TCK')


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


def start_seconds(television, engine, page, environment):
    """The time from program start to the first picture in the window."""
    begin = time.time()
    run = television.run('--engine', engine, '--wait-for-picture', '--eval', 'Date.now()', page, environment=environment)
    if run.status != 0:
        sys.exit(str(run))
    return run.value / 1000 - begin


def main():
    if len(sys.argv) != 2 or not os.path.isfile(os.path.join(sys.argv[1], 'desktop', 'telix-tv-npapi')):
        print(__doc__, file=sys.stderr)
        sys.exit(2)
    build = sys.argv[1]
    engines = [engine for engine in ('webkit', 'npapi')
               if os.path.isfile(os.path.join(build, 'desktop', f'telix-tv-{engine}'))]
    with temporary_folder() as folder, Television(os.path.join(build, 'desktop', 'telix-tv')) as television:
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
        starts = {engine: [start_seconds(television, engine, page, {}) for _ in range(STARTS)] for engine in engines}
    print('CPU load at 720p25, of one core, without the X server:')
    for name in measurements:
        loads = [each[name] for each in rounds]
        print(f'  {name}: median {100 * statistics.median(loads):.1f} % '
              f'({100 * min(loads):.1f} to {100 * max(loads):.1f} %)')
    print('program start to first picture, test multiplex:')
    for engine, times in starts.items():
        print(f'  {engine}: median {statistics.median(times):.2f} s ({min(times):.2f} to {max(times):.2f} s)')


if __name__ == '__main__':
    main()
