"""Events sent with telixctl reach the page: telix-tv, the plug-in and the desktop's platform library."""

import os
import threading
import unittest

from television import RUN_LIMIT, Television

PAGE = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages', 'control.html')


class Control(unittest.TestCase):
    def setUp(self):
        self.television = self.enterContext(Television(os.environ['TELIX_TV']))
        self.process = self.enterContext(
            self.television.start('--plugin', os.environ['TELIX_DESK_PLUGIN'], PAGE))
        self.addCleanup(self.process.kill)
        self.lines = []
        self.changed = threading.Condition()
        threading.Thread(target=self.read, daemon=True).start()

    def enterContext(self, context):  # Python has it from 3.11 on
        value = context.__enter__()
        self.addCleanup(context.__exit__, None, None, None)
        return value

    def read(self):
        for line in self.process.stderr:
            with self.changed:
                self.lines.append(line.rstrip('\n'))
                self.changed.notify_all()

    def wait_for(self, note):
        """Waits until the page has logged it."""
        with self.changed:
            self.assertTrue(self.changed.wait_for(lambda: any(line.endswith(': ' + note) for line in self.lines),
                                               RUN_LIMIT / 4), f'no "{note}" in {self.lines}')

    def test_events_reach_the_page(self):
        self.wait_for('channel Telix One')
        self.television.telixctl('channel', 3)
        self.wait_for('channel Telix Three')
        self.television.telixctl('channel-error', 1)
        self.wait_for('error Telix Three 1')
        self.television.telixctl('rating', 18, '--region', 'FRA')
        self.wait_for('rating 18 FRA')
        self.television.telixctl('full-screen', 'on')
        self.wait_for('full screen true')
        self.television.telixctl('stream-event', '--id', 6, '--tag', 31, '--data', 'Hi')
        self.wait_for('event news Hi trigger')
        self.television.telixctl('drm-result', 3, '--id', 'm1', '--message', 'no')
        self.wait_for('drm m1 no 3')
        state = self.television.telixctl('state')
        self.assertEqual(state['channel']['name'], 'Telix Three')
        self.assertTrue(state['picture']['fullScreen'])


if __name__ == '__main__':
    unittest.main()
