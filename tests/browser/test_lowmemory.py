"""A notice of the platform, from its own thread to the browser's, and what becomes of it."""

import os
import signal
import unittest

from television import Television

PAGE = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages', 'lowmemory.html')


class LowMemory(unittest.TestCase):
    def test_the_notice_reaches_the_browser_thread_once_and_no_handler(self):
        with Television(os.environ['TELIX_TV']) as television:
            with television.start('--plugin', os.environ['TELIX_PLUGIN'], PAGE,
                                  environment={'LOG_MODULE': '2'}) as process:
                errors = []
                while not {'handlers set', 'notice dealt with'} <= {line.split(': ')[-1] for line in errors}:
                    line = process.stderr.readline()
                    self.assertNotEqual(line, '', errors)
                    errors.append(line.rstrip('\n'))
                process.send_signal(signal.SIGTERM)
                output, rest = process.communicate(timeout=60)
        errors += rest.splitlines()
        self.assertEqual(process.returncode, 128 + signal.SIGTERM, output)
        self.assertEqual([line for line in errors if line.startswith('call ')],
                         ['call TELIX_JS_APP_RegisterLowMemory(callback)',
                          'call TELIX_JS_APP_UnRegisterLowMemory(callback)'])
        self.assertEqual(output.count(':: handleOnLowMemory ::'), 1, output)
        self.assertFalse([line for line in errors if 'handler called' in line], errors)


if __name__ == '__main__':
    unittest.main()
