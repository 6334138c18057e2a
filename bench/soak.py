#!/usr/bin/env python3
"""Measures what page loads and plays leave in the memory of the desktop television: repeats them in one window and prints the
least memory that each of its processes had in each tenth of the time, in which the garbage of script is collected, and the slope
of that after the first tenths.
Usage: soak.py BUILD-FOLDER webkit|npapi none|untouched|used|play COUNT
  none, untouched, used   loads of a page without objects, with all seven objects, and with all seven that script uses
  play                    plays of a clip over HTTP, each with an element of its own"""

import contextlib
import os
import statistics
import sys
import threading
import time

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path[:0] = [os.path.join(TOP, 'tests', 'browser'), os.path.join(TOP, 'tools')]
from media_server import MediaServer  # noqa: E402
from television import Television, anonymous_kilobytes, signal  # noqa: E402

WORKS = 'none', 'untouched', 'used', 'play'
COLLECTIONS = 50  # of the garbage of script, in a run
PARTS = 10
# The caches of the engine and of the libraries fill before.
SETTLED = 3
READ_INTERVAL = 0.005  # seconds
READINGS = 20  # of a process before the next one
SECONDS = 5  # for each load and play, at most, on a slow machine
NAMES = {'telix-tv-webkit': 'window', 'telix-tv-npapi': 'television', 'WebKitWebProces': 'web process',
         'WebKitNetworkPr': 'network process'}


def stat(pid):
    """The name and the parent of a process; nothing if it has ended."""
    try:
        with open(f'/proc/{pid}/stat', encoding='utf-8') as file:
            name, _, rest = file.read().partition('(')[2].rpartition(')')
            return name, int(rest.split()[1])
    except OSError:
        return None, None


class Memory:
    """The memory of the processes of a television, read again and again on a thread until they end."""

    def __init__(self, process):
        self._process = process
        self._lock = threading.Lock()
        self._least = {}
        threading.Thread(target=self._watch, daemon=True).start()

    def _family(self):
        pids = [int(pid) for pid in os.listdir('/proc') if pid.isdigit()]
        return [pid for pid in pids if pid == self._process.pid or stat(pid)[1] == self._process.pid]

    def _watch(self):
        while self._process.poll() is None:
            for pid in self._family():
                for _ in range(READINGS):
                    self._read(pid)
                    time.sleep(READ_INTERVAL)

    def _read(self, pid):
        name = NAMES.get(stat(pid)[0])
        with contextlib.suppress(OSError, StopIteration), self._lock:
            if name:
                kilobytes = anonymous_kilobytes(pid)
                self._least[name] = min(kilobytes, self._least.get(name, kilobytes))

    def least(self):
        """Kilobytes by the name of each process, the least since the last call."""
        with self._lock:
            least, self._least = self._least, {}
        return least


def slope(points):
    """The median slope between any two points: single points that are far off do not move it."""
    return statistics.median((later[1] - earlier[1]) / (later[0] - earlier[0])
                             for index, earlier in enumerate(points) for later in points[index + 1:])


def run(build, engine, work, count):
    """What has been measured at each collection: the number of loads or plays, and the least memory since the one before."""
    samples = []
    environment = {'TELIX_CONFIG': os.path.join(TOP, 'tests', 'desktop', 'tv.conf'), 'PULSE_SERVER': 'none',
                   'JSC_useGenerationalGC': '0'}  # or else WebKit leaves old garbage for hundreds of loads
    with MediaServer({'': os.path.join(TOP, 'bench', 'pages'), 'media': os.path.join(build, 'tests', 'desktop', 'clips')}) \
            as server, Television(os.path.join(build, 'desktop', 'telix-tv')) as television:
        url = f'{server.url}/soak.html?work={work}&count={count}&interval={count // COLLECTIONS}'
        with television.start('--engine', engine, '--timeout', 60 + SECONDS * count, '--wait-for', 'window.soakDone', '--eval',
                              'true', url, environment=environment) as process:
            errors, memory = [], Memory(process)
            for line in process.stderr:
                number = line.rpartition('soak ')[2].strip()
                if number == '0':
                    memory.least()  # of the start
                elif number.isdigit():
                    samples.append((int(number), memory.least()))
                else:
                    errors.append(line)
        if process.returncode != 0:
            sys.exit(''.join(errors))
    return samples


def in_parts(samples):
    """The samples of each part of a run as one: the last number, and the least memory of each process."""
    size = len(samples) // PARTS
    for i in range(0, size * PARTS, size):
        part = samples[i:i + size]
        names = set().union(*(memory for _, memory in part))
        yield part[-1][0], {name: min(memory[name] for _, memory in part if name in memory) for name in sorted(names)}


def main():
    if len(sys.argv) != 5 or sys.argv[2] not in ('webkit', 'npapi') or sys.argv[3] not in WORKS or \
            not sys.argv[4].isdigit() or int(sys.argv[4]) < COLLECTIONS:
        print(__doc__, file=sys.stderr)
        sys.exit(2)
    signal.alarm(0)  # a soak may take longer than a test
    samples = list(in_parts(run(*sys.argv[1:4], int(sys.argv[4]))))
    names = list(samples[-1][1])
    print('\t'.join(['count', *names]))
    for number, memory in samples:
        print('\t'.join([str(number), *(f'{memory[name] / 1024:.1f} MB' for name in names)]))
    for name in names:
        growth = slope([(number, memory[name]) for number, memory in samples[SETTLED:]])
        print(f'{name}: {growth:+.2f} kB a {"play" if sys.argv[3] == "play" else "load"}')


if __name__ == '__main__':
    main()
