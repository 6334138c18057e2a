"""Many channel changes, media starts and page reloads on the desktop television: nothing hangs, no event is lost, and
memory does not grow."""

import json
import os
import sys
import unittest

from television import PROGRAM_TIMEOUT, Television

TOP = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
sys.path.insert(0, os.path.join(TOP, 'tools'))
from media_server import MediaServer  # noqa: E402

ROUNDS, TUNES, STARTS = 10, 20, 5  # tunes and starts per round
TIMEOUT = PROGRAM_TIMEOUT - 60  # seconds
# How much the resident memory may grow after the first rounds, in which caches fill.
MAX_GROWTH = 48 * 1024 * 1024
WARM_UP_ROUNDS = 3


def resident_bytes(process):
    with open(f'/proc/{process.pid}/statm', encoding='ascii') as file:
        return int(file.read().split()[1]) * os.sysconf('SC_PAGE_SIZE')


class Stress(unittest.TestCase):
    def test_many_tunes_and_media_starts_with_reloads_between_them(self):
        pages = os.path.join(TOP, 'tests', 'browser', 'pages')
        rounds = []  # resident bytes at the start of each
        with MediaServer({'': pages, 'media': os.environ['TELIX_CLIPS']}) as server, \
                Television(os.environ['TELIX_TV']) as television:
            url = f'{server.url}/stress.html?rounds={ROUNDS}&tunes={TUNES}&starts={STARTS}'
            with television.start('--plugin', os.environ['TELIX_DESKTOP_PLUGIN'], '--timeout', TIMEOUT, '--wait-for',
                                  'window.stressResult', '--eval', 'window.stressResult', url) as process:
                errors = ''
                # The page logs the start of each round.
                for line in process.stderr:
                    errors += line
                    if ' round ' in line:
                        rounds.append(resident_bytes(process))
                output = process.stdout.read()
            self.assertEqual(process.returncode, 0, output + errors)
        result = json.loads(output.rstrip('\n').split('\n')[-1])
        tunes, starts = ROUNDS * TUNES, ROUNDS * STARTS
        # Each tune has one result; a tune that a later one preempts fails.
        self.assertEqual(result['changed'] + result['failed'], tunes)
        self.assertGreaterEqual(result['changed'], ROUNDS)
        self.assertEqual(result['played'] + result['errors'], starts)
        self.assertEqual(result['errors'], starts // 5)  # every fifth clip is missing
        self.assertEqual(len(rounds), ROUNDS)
        self.assertLess(rounds[-1] - rounds[WARM_UP_ROUNDS], MAX_GROWTH, [each >> 20 for each in rounds])


if __name__ == '__main__':
    unittest.main()
