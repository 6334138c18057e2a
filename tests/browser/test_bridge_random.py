"""Nothing that a page does ends the web process: random steps, each seed another order.
test_bridge_random.py [SEEDS [STEPS [FIRST SEED]]], 3 seeds of 2,000 steps by default."""

import os
import pathlib
import sys
import unittest

from television import Television

PAGE = pathlib.Path(__file__).absolute().parent / 'pages' / 'randomsteps.html'
SEEDS, STEPS, FIRST = [int(text) for text in sys.argv[1:]] + [3, 2000, 1][len(sys.argv) - 1:]


class RandomSteps(unittest.TestCase):
    def test_no_step_ends_the_web_process(self):
        with Television(os.environ['TELIX_TV']) as television:
            for seed in range(FIRST, FIRST + SEEDS):
                with self.subTest(seed=seed):
                    run = television.run('--plugin', os.environ['TELIX_PLUGIN'], '--timeout', 100, '--wait-for',
                                         'window.stepsResult', '--eval', 'window.stepsResult',
                                         f'{PAGE.as_uri()}?seed={seed}&steps={STEPS}')
                    self.assertEqual(run.status, 0, str(run)[-3000:])
                    self.assertEqual(run.value['steps'], STEPS)
                    self.assertGreater(run.value['steps'], run.value['thrown'])


if __name__ == '__main__':
    unittest.main(argv=sys.argv[:1])
