"""Events that telixctl triggers reach the page: telix-tv, the plug-in and the desktop platform library together."""

import os
import unittest

from television import Lines, Television

PAGE = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages', 'control.html')


class Control(unittest.TestCase):
    def setUp(self):
        self.television = self.enterContext(Television(os.environ['TELIX_TV']))
        self.process = self.enterContext(
            self.television.start('--plugin', os.environ['TELIX_DESKTOP_PLUGIN'], PAGE))
        self.addCleanup(self.process.kill)
        self.messages = Lines(self.process.stderr)

    def enterContext(self, context):  # Python has it from 3.11 on
        value = context.__enter__()
        self.addCleanup(context.__exit__, None, None, None)
        return value

    def wait_for(self, event):
        """Waits until the page has logged the event."""
        self.assertTrue(self.messages.wait_for(': ' + event), f'no "{event}" in {self.messages.lines}')

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
