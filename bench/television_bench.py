#!/usr/bin/env python3
"""Measures the CPU load of the desktop television with 720p25 video, compared with decoding alone in the same run, and the
time from program start to the first picture. Usage: television_bench.py BUILD-FOLDER"""

import os
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
PAGE = '''<!DOCTYPE html><html><body style="margin: 0">
<object id="tv" type="video/broadcast" style="position: absolute; width: 1280px; height: 720px"></object>
<script>
    var tv = document.getElementById('tv');
    tv.onChannelChangeSucceeded = function () { console.log('presenting'); };
    window.onload = function () { tv.setChannel(tv.getChannelConfig().channelList.item(0), false); };
</script></body></html>'''


def make_stream(file):
    subprocess.run(
        ['ffmpeg', '-hide_banner', '-loglevel', 'error', '-f', 'lavfi', '-i', 'testsrc2=size=1280x720:rate=25',
         '-f', 'lavfi', '-i', 'sine=frequency=440:sample_rate=48000', '-t', str(SECONDS + 15), '-c:v', 'mpeg2video',
         '-b:v', '6M', '-maxrate', '8M', '-bufsize', '2M', '-g', '12', '-c:a', 'mp2', '-b:a', '192k',
         '-muxdelay', '0.2', '-muxpreload', '0.2', '-f', 'mpegts', file], check=True)


def cpu_seconds(process):
    with open(f'/proc/{process.pid}/stat', encoding='ascii') as file:
        fields = file.read().rpartition(')')[2].split()
    return (int(fields[11]) + int(fields[12])) / os.sysconf('SC_CLK_TCK')


def television_load(television, page, environment):
    """The CPU load of the whole process from the first picture on, 1 for one core."""
    with television.start(page, environment=environment) as process:
        try:
            for line in process.stderr:
                if 'presenting' in line:
                    break
            else:
                sys.exit('television_bench.py: telix-tv exited without a picture')
            before, begin = cpu_seconds(process), time.monotonic()
            time.sleep(SECONDS)
            return (cpu_seconds(process) - before) / (time.monotonic() - begin)
        finally:
            process.terminate()
            process.communicate()


def decoding_load(build, stream):
    run = subprocess.run([os.path.join(build, 'bench', 'decode_load'), stream, str(SECONDS)], check=True,
                         stdout=subprocess.PIPE, text=True)
    return float(run.stdout)


def start_seconds(television, page, environment):
    """The time from program start to the first picture in the window."""
    begin = time.time()
    run = television.run('--wait-for-picture', '--eval', 'Date.now()', page, environment=environment)
    if run.status != 0:
        sys.exit(str(run))
    return run.value / 1000 - begin


def main():
    if len(sys.argv) != 2 or not os.path.isfile(os.path.join(sys.argv[1], 'desktop', 'telix-tv-npapi')):
        print(__doc__, file=sys.stderr)
        sys.exit(2)
    build = sys.argv[1]
    with temporary_folder() as folder, Television(os.path.join(build, 'desktop', 'telix-tv-npapi')) as television:
        stream, page = os.path.join(folder, 'stream.ts'), os.path.join(folder, 'page.html')
        make_stream(stream)
        with open(page, 'w', encoding='utf-8') as file:
            file.write(PAGE)
        channels = {'TELIX_CHANNELS': stream}
        # In turns, so that other load of the machine affects both.
        loads = [(television_load(television, page, channels), decoding_load(build, stream)) for _ in range(ROUNDS)]
        ours, decoding = (statistics.median(each) for each in zip(*loads))
        starts = [start_seconds(television, page, {}) for _ in range(STARTS)]
    print(f'CPU load at 720p25, of one core: television {100 * ours:.1f} %, decoding alone {100 * decoding:.1f} %, '
          f'difference {100 * (ours - decoding):.1f} %')
    print(f'program start to first picture, test multiplex: median {statistics.median(starts):.2f} s '
          f'({min(starts):.2f} to {max(starts):.2f} s)')


if __name__ == '__main__':
    main()
