"""All objects of a page on a set without the platform library: no fault, and nothing said but the loader's lines."""

import json
import os
import unittest

from television import Television

PAGE = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages', 'allobjects.html')


class AllObjects(unittest.TestCase):
    def test_nothing_but_the_loader_speaks(self):
        with Television(os.environ['TELIX_TV']) as television:
            with television.start('--plugin', os.environ['TELIX_PLUGIN'], '--wait-for', 'window.testResult',
                                  '--eval', 'window.testResult', PAGE) as process:
                output, errors = process.communicate(timeout=60)
        self.assertEqual(process.returncode, 0, errors)
        lines = output.splitlines()
        outcome = json.loads(lines.pop())
        self.assertEqual(outcome['failed'], [])
        self.assertGreater(outcome['passed'], 0)
        others = [line for line in lines
                  if not line.startswith('*') and ':: ORDA ::' not in line and ':: VERSION:' not in line]
        self.assertEqual(set(others), {'libtelix.so library will load for first time now.'})
        self.assertEqual([line for line in errors.splitlines() if line and 'libtelix.so, not found' not in line], [])


if __name__ == '__main__':
    unittest.main()
