"""The examples for authors of tests, docs/examples: the demonstration on the desktop television with Selenium."""

import os
import subprocess
import sys
import unittest

from recordings import Recorded
from television import RUN_TIMEOUT, PngImage, Television

ROOT = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
APPS = os.path.join(ROOT, 'apps')
EXAMPLES = os.path.join(ROOT, 'docs', 'examples')
sys.path.insert(0, os.path.join(ROOT, 'tools'))
from media_server import MediaServer  # noqa: E402 (found by the line above)

# A page with text has many colours, because text is antialiased; an empty one has few.
COLOURS_OF_A_PAGE = 50


class Examples(Recorded, unittest.TestCase):
    def recorded_television(self):
        """A program that starts telix-tv with a recording, because the examples choose the options themselves."""
        program = os.path.join(self.recordings, 'telix-tv')
        with open(program, 'w', encoding='utf-8') as file:
            file.write(f'#!/bin/sh\nexec "{os.environ["TELIX_TV"]}" "$@" --record "{self.new_recording()}"\n')
        os.chmod(program, 0o755)
        return program

    def run_example(self, *command):
        """Runs an example with the demonstration and a file for its screenshot."""
        name = os.path.basename(command[-1])
        screenshot = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'example-{name}.png')
        server = MediaServer({'': APPS, 'media': os.environ['TELIX_CLIPS']})
        self.addCleanup(server.close)
        television = Television(os.environ['TELIX_TV'])
        self.addCleanup(television.close)
        # The keys of a television without settings.
        environment = {**television.environment, 'TELIX_CONFIG': '', 'TELIX_TV': self.recorded_television()}
        run = subprocess.run([*command, server.url + '/demo/index.html', screenshot], env=environment,
                             stdin=subprocess.DEVNULL, capture_output=True, text=True, timeout=RUN_TIMEOUT, check=False)
        self.assertEqual((run.returncode, run.stdout.splitlines()[-1:]), (0, ['passed']), run)
        picture = PngImage(screenshot)
        self.assertEqual((picture.width, picture.height), (1280, 720))
        self.assertGreater(len(picture.colours()), COLOURS_OF_A_PAGE)

    def test_python(self):
        self.run_example(sys.executable, '-B', os.path.join(EXAMPLES, 'first_test.py'))

    def test_javascript(self):
        self.run_example(os.environ['TELIX_NODE'], os.path.join(EXAMPLES, 'first_test.js'))


if __name__ == '__main__':
    unittest.main()
