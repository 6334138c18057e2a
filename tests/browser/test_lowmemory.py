"""The platform's low memory callback, from its own thread to the browser thread."""

import os
import signal
import unittest

from television import WAIT_TIMEOUT, Lines, Television

PAGE = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages', 'lowmemory.html')


class LowMemory(unittest.TestCase):
    def test_the_notice_reaches_the_browser_thread_once_and_no_handler(self):
        with Television(os.environ['TELIX_TV']) as television:
            with television.start('--plugin', os.environ['TELIX_PLUGIN'], PAGE,
                                  environment={'LOG_MODULE': '2'}) as process:
                output, errors = Lines(process.stdout), Lines(process.stderr)
                for ending in ('handlers set', 'callback handled'):
                    self.assertTrue(errors.wait_for(ending), errors.lines)
                process.send_signal(signal.SIGTERM)
                status = process.wait(WAIT_TIMEOUT)
                messages = output.until_end() + errors.until_end()
        self.assertEqual(status, 128 + signal.SIGTERM, messages)
        self.assertEqual([line for line in messages if line.startswith('call ')],
                         ['call TELIX_JS_APP_RegisterLowMemory(callback)',
                          'call TELIX_JS_APP_UnRegisterLowMemory(callback)'])
        self.assertEqual(len([line for line in messages if ':: handleOnLowMemory ::' in line]), 1, messages)
        self.assertFalse([line for line in messages if 'handler called' in line], messages)


if __name__ == '__main__':
    unittest.main()
