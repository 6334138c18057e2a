"""The platform's low memory callback, from its own thread to the browser thread."""

import os
import queue
import signal
import threading
import unittest

from television import Television

PAGE = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages', 'lowmemory.html')
EXPECTED = 'handlers set', 'notice dealt with'


def read(file, lines):
    for line in file:
        lines.put(line.rstrip('\n'))


class LowMemory(unittest.TestCase):
    def test_the_notice_reaches_the_browser_thread_once_and_no_handler(self):
        with Television(os.environ['TELIX_TV']) as television:
            with television.start('--plugin', os.environ['TELIX_PLUGIN'], PAGE,
                                  environment={'LOG_MODULE': '2'}) as process:
                # Engines write console messages to one or the other.
                lines = queue.SimpleQueue()
                readers = [threading.Thread(target=read, args=(file, lines)) for file in (process.stdout, process.stderr)]
                for reader in readers:
                    reader.start()
                seen = []
                while not all(any(line.endswith(text) for line in seen) for text in EXPECTED):
                    seen.append(lines.get(timeout=60))
                process.send_signal(signal.SIGTERM)
                for reader in readers:
                    reader.join(60)
                process.wait(60)
        while not lines.empty():
            seen.append(lines.get())
        self.assertEqual(process.returncode, 128 + signal.SIGTERM, seen)
        self.assertEqual([line for line in seen if line.startswith('call ')],
                         ['call TELIX_JS_APP_RegisterLowMemory(callback)',
                          'call TELIX_JS_APP_UnRegisterLowMemory(callback)'])
        self.assertEqual(len([line for line in seen if ':: handleOnLowMemory ::' in line]), 1, seen)
        self.assertFalse([line for line in seen if 'handler called' in line], seen)


if __name__ == '__main__':
    unittest.main()
