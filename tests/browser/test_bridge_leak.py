"""Nothing of a page with all seven objects is left after it: many loads leave the memory, threads and file descriptors of the
web process level. test_bridge_leak.py [LOADS], 500 by default. Prints what the process holds in each tenth of
the time."""

import contextlib
import os
import pathlib
import statistics
import sys
import threading
import time
import unittest

from television import Television

PAGE = pathlib.Path(__file__).absolute().parents[2] / 'bench' / 'pages' / 'sevenobjects.html'
LOADS = int(sys.argv[1]) if len(sys.argv) > 1 else 500
PARTS = 10
# The caches of the engine fill in the first parts.
SETTLED_PARTS = 5
# What the end may have above the most of the settled parts, in megabytes, threads and file descriptors. The engine collects
# garbage when some 80 MB of it have gathered; a page that is left behind is more than one each.
LIMITS = 64, 4, 6
SAMPLE_INTERVAL = 0.02  # seconds


def web_process_of(parent):
    """The page's process, which the engine starts as a child of the window's; None when there is none."""
    for entry in pathlib.Path('/proc').glob('[0-9]*/stat'):
        try:
            name, _, rest = entry.read_text(encoding='utf-8').partition('(')[2].rpartition(')')
        except OSError:  # gone meanwhile
            continue
        if name.startswith('WebKitWebProces') and int(rest.split()[1]) == parent.pid:
            return entry.parent
    return None


def holdings(process):
    """Megabytes, threads, file descriptors."""
    pages = int((process / 'statm').read_text(encoding='ascii').split()[1])
    return (pages * os.sysconf('SC_PAGE_SIZE') >> 20, len(list((process / 'task').iterdir())),
            len(list((process / 'fd').iterdir())))


class Leak(unittest.TestCase):
    def test_loads_leave_the_web_process_level(self):
        samples = []
        with Television(os.environ['TELIX_TV']) as television:
            with television.start('--plugin', os.environ['TELIX_PLUGIN'], '--timeout', 100 + LOADS, '--wait-for',
                                  'window.loadsResult', '--eval', 'window.loadsResult',
                                  f'{PAGE.as_uri()}?loads={LOADS}') as process:
                outputs = []
                reader = threading.Thread(target=lambda: outputs.extend(process.communicate()))
                reader.start()
                web = None
                while reader.is_alive():
                    web = web or web_process_of(process)
                    with contextlib.suppress(OSError, IndexError):  # it has just ended
                        samples += [holdings(web)] if web else []
                    time.sleep(SAMPLE_INTERVAL)
                output, errors = outputs
        self.assertEqual(process.returncode, 0, errors)
        self.assertEqual(output.splitlines()[-1], '7')
        self.assertGreater(len(samples), 2 * PARTS)
        # Medians, because garbage comes and goes.
        size = len(samples) // PARTS
        parts = [[statistics.median(each) for each in zip(*samples[i * size:(i + 1) * size])] for i in range(PARTS)]
        for i, (memory, threads, descriptors) in enumerate(parts):
            print(f'part {i + 1} of {PARTS}: {memory:.0f} MB, {threads:.0f} threads, {descriptors:.0f} file descriptors')
        for first, last, limit in zip(zip(*parts[:SETTLED_PARTS]), parts[-1], LIMITS):
            self.assertLessEqual(last - max(first), limit, parts)


if __name__ == '__main__':
    unittest.main(argv=sys.argv[:1])
