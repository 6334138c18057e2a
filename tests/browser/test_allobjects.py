"""All objects of the plug-in without a platform library: no error, and no output except the loader's."""

import json
import os
import unittest

from television import Television

PAGE = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages', 'allobjects.html')


class AllObjects(unittest.TestCase):
    def test_nothing_but_the_loader_speaks(self):
        with Television(os.environ['TELIX_TV']) as television:
            run = television.run('--plugin', os.environ['TELIX_PLUGIN'], '--wait-for', 'window.testResult',
                                 '--eval', 'window.testResult', PAGE)
        self.assertEqual(run.status, 0, run)
        lines = run.output.splitlines()
        result = json.loads(lines.pop())
        self.assertEqual(result['failed'], [])
        self.assertGreater(result['passed'], 0)
        others = [line for line in lines
                  if not line.startswith('*') and ':: ORDA ::' not in line and ':: VERSION:' not in line]
        self.assertEqual(set(others), {'libtelix.so library will load for first time now.'})
        self.assertEqual([
            line for line in run.errors.splitlines()
            # What the window says of refused calls is not the plug-in's.
            if line and 'libtelix.so, not found' not in line and ': telix: ' not in line], [])


if __name__ == '__main__':
    unittest.main()
