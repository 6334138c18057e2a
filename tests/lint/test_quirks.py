#!/usr/bin/env python3
"""The check of the quirks finds each way in which document and code can part."""

import os
import subprocess
import sys
import tempfile
import unittest

PROGRAM = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'quirks.py')
ROWS = ['| 1 | a | b | c |', '| 2 | a; see quirk 1 | b | c |']
CODE = ['int a; // quirk 1: because', '// quirk 2: because', '// quirk 2: here too']


class QuirksTest(unittest.TestCase):
    def check(self, rows, code):
        with tempfile.TemporaryDirectory() as folder:
            document = os.path.join(folder, 'document.md')
            for path, lines in ((document, rows), (os.path.join(folder, 'code.cpp'), code)):
                with open(path, 'w', encoding='utf-8') as file:
                    file.write('\n'.join(lines) + '\n')
            result = subprocess.run([sys.executable, '-B', PROGRAM, '--document', document, folder],
                                    capture_output=True, text=True)
            return result.returncode, result.stdout

    def expect_fault(self, rows, code, text):
        status, output = self.check(rows, code)
        self.assertEqual(status, 1, output)
        self.assertIn(text, output)

    def test_passes_what_agrees(self):
        self.assertEqual(self.check(ROWS, CODE), (0, '2 quirks, 3 marks\n'))

    def test_a_number_that_is_marked_nowhere(self):
        self.expect_fault(ROWS, CODE[:1], 'quirk 2 is marked nowhere')

    def test_a_mark_that_the_document_does_not_have(self):
        self.expect_fault(ROWS, CODE + ['// quirk 3: because'], 'code.cpp:4: quirk 3 is not in')

    def test_a_mark_without_number_or_reason(self):
        for mark in ('// quirk: because', '// Quirk 1: because', '// quirk 1:', '// quirk 1 because', '/* quirk 1: a */'):
            self.expect_fault(ROWS, CODE + [mark], 'code.cpp:4: a mark reads')

    def test_rows_that_do_not_count_from_one(self):
        self.expect_fault(ROWS[1:], CODE, 'number 2 stands in row 1')
        self.expect_fault(ROWS + ROWS[:1], CODE, 'number 1 stands in row 3')

    def test_a_row_with_an_empty_or_missing_cell(self):
        self.expect_fault([ROWS[0], '| 2 | a |  | c |'], CODE, 'four cells')
        self.expect_fault([ROWS[0], '| 2 | a | c |'], CODE, 'four cells')

    def test_a_reference_to_a_row_that_is_not_there(self):
        self.expect_fault([ROWS[0], '| 2 | see quirk 7 | b | c |'], CODE, 'no quirk 7')

    def test_an_empty_document(self):
        self.expect_fault([], [], 'no rows')


if __name__ == '__main__':
    unittest.main()
