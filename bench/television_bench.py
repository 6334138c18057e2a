#!/usr/bin/env python3
"""What the television of the desk takes of a processor at 1280 by 720 pixels and 25 frames a second, beside decoding alone
in the same run, and how long it takes from its start to the first picture. Usage: television_bench.py BUILD-FOLDER"""

import os
import statistics
import subprocess
import sys
import time

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path.insert(0, os.path.join(TOP, 'tests', 'browser'))
from television import Television, temporary_folder  # noqa: E402

SECONDS = 15
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


def used_seconds(process):
    with open(f'/proc/{process.pid}/stat', encoding='ascii') as file:
        fields = file.read().rpartition(')')[2].split()
    return (int(fields[11]) + int(fields[12])) / os.sysconf('SC_CLK_TCK')


def television_share(television, page, environment):
    """The share of one processor that the whole process takes, from the first picture on."""
    with television.start(page, environment=environment) as process:
        try:
            for line in process.stderr:
                if 'presenting' in line:
                    break
            else:
                sys.exit('the television ended without a picture')
            before, begin = used_seconds(process), time.monotonic()
            time.sleep(SECONDS)
            return (used_seconds(process) - before) / (time.monotonic() - begin)
        finally:
            process.terminate()
            process.communicate()


def decoding_share(build, stream):
    run = subprocess.run([os.path.join(build, 'bench', 'decode_load'), stream, str(SECONDS)], check=True,
                         stdout=subprocess.PIPE, text=True)
    return float(run.stdout)


def start_seconds(television, page, environment):
    """From the start of the program until the first picture is in the window."""
    begin = time.time()
    run = television.run('--wait-for-picture', '--eval', 'Date.now()', page, environment=environment)
    if run.status != 0:
        sys.exit(str(run))
    return run.value / 1000 - begin


def main():
    if len(sys.argv) != 2 or not os.path.isfile(os.path.join(sys.argv[1], 'desktop', 'telix-tv')):
        print(__doc__, file=sys.stderr)
        sys.exit(2)
    build = sys.argv[1]
    with temporary_folder() as folder, Television(os.path.join(build, 'desktop', 'telix-tv')) as television:
        stream, page = os.path.join(folder, 'stream.ts'), os.path.join(folder, 'page.html')
        make_stream(stream)
        with open(page, 'w', encoding='utf-8') as file:
            file.write(PAGE)
        of_file = {'TELIX_CHANNELS': stream}
        # One after the other, so that what else the machine does falls on both.
        shares = [(television_share(television, page, of_file), decoding_share(build, stream)) for _ in range(ROUNDS)]
        ours, decoding = (statistics.median(each) for each in zip(*shares))
        starts = [start_seconds(television, page, {}) for _ in range(STARTS)]
    print(f'processor at 1280x720, 25 frames: television {100 * ours:.1f} % of one, decoding alone {100 * decoding:.1f} %, '
          f'difference {100 * (ours - decoding):.1f} %')
    print(f'start to first picture, test multiplex: median {statistics.median(starts):.2f} s '
          f'({min(starts):.2f} to {max(starts):.2f} s)')


if __name__ == '__main__':
    main()
