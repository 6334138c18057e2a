"""Many channel changes, media starts and page reloads on the television of the desk: nothing hangs, nothing is lost, and
the memory stays level."""

import json
import os
import sys
import unittest

from television import Television

TOP = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
sys.path.insert(0, os.path.join(TOP, 'tools'))
from media_server import MediaServer  # noqa: E402

ROUNDS, TUNES, STARTS = 10, 20, 5  # of each round
TIME_LIMIT = 200  # seconds
# What the process may hold more at the end than after the first rounds, in which caches fill.
GROWTH_LIMIT = 48 * 1024 * 1024
SETTLED_ROUNDS = 3


def resident_bytes(process):
    with open(f'/proc/{process.pid}/statm', encoding='ascii') as file:
        return int(file.read().split()[1]) * os.sysconf('SC_PAGE_SIZE')


class Stress(unittest.TestCase):
    def test_many_tunes_and_media_starts_with_reloads_between_them(self):
        pages = os.path.join(TOP, 'tests', 'browser', 'pages')
        rounds = []  # resident bytes when each began
        with MediaServer({'': pages, 'media': os.environ['TELIX_CLIPS']}) as server, \
                Television(os.environ['TELIX_TV']) as television:
            address = f'{server.url}/stress.html?rounds={ROUNDS}&tunes={TUNES}&starts={STARTS}'
            with television.start('--plugin', os.environ['TELIX_DESK_PLUGIN'], '--timeout', TIME_LIMIT, '--wait-for',
                                  'window.stressResult', '--eval', 'window.stressResult', address) as process:
                errors = ''
                # The page says when a round begins.
                for line in process.stderr:
                    errors += line
                    if ' round ' in line:
                        rounds.append(resident_bytes(process))
                output = process.stdout.read()
            self.assertEqual(process.returncode, 0, output + errors)
        result = json.loads(output.rstrip('\n').split('\n')[-1])
        tunes, starts = ROUNDS * TUNES, ROUNDS * STARTS
        # Each tune is answered once: the ones that were overtaken with an error.
        self.assertEqual(result['changed'] + result['failed'], tunes)
        self.assertGreaterEqual(result['changed'], ROUNDS)
        self.assertEqual(result['played'] + result['refused'], starts)
        self.assertEqual(result['refused'], starts // 5)  # every fifth clip is missing
        self.assertEqual(len(rounds), ROUNDS)
        self.assertLess(rounds[-1] - rounds[SETTLED_ROUNDS], GROWTH_LIMIT, [each >> 20 for each in rounds])


if __name__ == '__main__':
    unittest.main()
