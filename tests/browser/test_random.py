"""Nothing that a page does ends the web process: random steps, each seed another order. The environment may set other
numbers of seeds and steps, as tools/random-pages.sh does."""

import os
import pathlib
import re
import unittest
import urllib.parse

from television import Television

TESTS = pathlib.Path(__file__).absolute().parent
PAGES = TESTS / 'pages'
REFERENCE = TESTS.parent.parent / 'docs' / 'api' / 'telix.d.ts'
SEEDS = int(os.environ.get('TELIX_RANDOM_SEEDS', 3))
STEPS = int(os.environ.get('TELIX_RANDOM_STEPS', 2000))
FIRST = int(os.environ.get('TELIX_RANDOM_FIRST', 1))
# These end the page, or put another one above it.
ENDING = {'createApplication', 'destroyApplication'}


def names_of_objects():
    """The properties and methods of all objects."""
    return sorted(set(re.findall(r'^ {8}(?:readonly )?(\w+)[(:]', REFERENCE.read_text(encoding='utf-8'), re.MULTILINE)) - ENDING)


class RandomSteps(unittest.TestCase):
    def run_steps(self, page, **query):
        with Television(os.environ['TELIX_TV']) as television:
            for seed in range(FIRST, FIRST + SEEDS):
                with self.subTest(seed=seed):
                    url = f'{(PAGES / page).as_uri()}?{urllib.parse.urlencode(dict(query, seed=seed, steps=STEPS))}'
                    run = television.run('--plugin', os.environ['TELIX_PLUGIN'], '--wait-for',
                                         'window.stepsResult', '--eval', 'window.stepsResult', url)
                    self.assertEqual(run.status, 0, str(run)[-3000:])
                    self.assertEqual(run.value['steps'], STEPS)
                    self.assertGreater(run.value['steps'], run.value['thrown'])


class Plugin(RandomSteps):
    def test_no_step_with_a_plug_in_ends_the_web_process(self):
        self.run_steps('randomsteps.html')


class Objects(RandomSteps):
    def test_no_step_with_the_objects_of_the_television_ends_the_web_process(self):
        names = names_of_objects()
        self.assertIn('setChannelByTriplet', names)
        self.run_steps('randomobjects.html', names=','.join(names),
                       **({'frames': 0} if os.environ['TELIX_ENGINE'] == 'npapi' else {}))


if __name__ == '__main__':
    unittest.main()
