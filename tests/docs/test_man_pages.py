"""The man pages: agree with the help of the programs and with the sources, and are formatted without a warning.

The environment names the tree (TELIX_SOURCE) and the programs (TELIX_PROGRAMS, separated by colons)."""

import glob
import os
import re
import shutil
import subprocess
import sys
import tempfile
import unittest

SOURCE = os.environ['TELIX_SOURCE']
PAGES = os.path.join(SOURCE, 'docs', 'man')
PROGRAMS = os.environ['TELIX_PROGRAMS'].split(':')
LIMIT = 120  # seconds; reached only if a test fails
VARIABLE = r'(?:LOG|PLUGIN|TELIX|XDG)_[A-Z_]+'


def read(path):
    with open(path, encoding='utf-8') as file:
        return file.read()


def pages():
    return [path for path in glob.glob(os.path.join(PAGES, '*')) if not path.endswith('.in')]


def check(folder=PAGES):
    return subprocess.run([sys.executable, '-B', os.path.join(SOURCE, 'tools', 'make_man_pages.py'), '--check', '--folder',
                           folder, *PROGRAMS], capture_output=True, text=True, timeout=LIMIT)


class ManPages(unittest.TestCase):
    def test_agree_with_the_help_of_the_programs(self):
        result = check()
        self.assertEqual((result.returncode, result.stderr), (0, ''))

    def test_a_page_that_differs_from_the_help_is_found(self):
        with tempfile.TemporaryDirectory() as folder:
            shutil.copytree(PAGES, folder, dirs_exist_ok=True)
            path = os.path.join(folder, 'telixctl.1')
            text = read(path)
            self.assertIn(r'\fB\-\-pid\fR', text)
            with open(path, 'w', encoding='utf-8') as file:
                file.write(text.replace(r'\fB\-\-pid\fR', r'\fB\-\-process\fR'))
            result = check(folder)
            self.assertEqual((result.returncode, result.stderr),
                             (1, 'make_man_pages.py: telixctl.1: stale, run tools/make_man_pages.py\n'))

    def test_there_is_a_page_for_each_program(self):
        names = {os.path.basename(path) for path in pages()}
        # telix-demo is a script without options of its own.
        self.assertEqual(names, {os.path.basename(program) + '.1' for program in PROGRAMS} | {'nptelixjs.7', 'telix-demo.1'})

    def test_name_the_environment_variables_of_the_sources(self):
        read_variables = set()
        for folder in ('common', 'src', 'bridge', 'desktop'):
            for path in glob.glob(os.path.join(SOURCE, folder, '**', '*'), recursive=True):
                if path.endswith(('.cpp', '.h')):
                    read_variables |= set(re.findall(rf'"({VARIABLE})"', read(path)))
        self.assertGreater(len(read_variables), 8)
        described = {name for path in pages() for name in re.findall(rf'^\.B ({VARIABLE})$', read(path), re.MULTILINE)}
        self.assertEqual(described, read_variables)

    def test_are_formatted_without_a_warning(self):
        for path in pages():
            result = subprocess.run(['man', '--warnings', '--local-file', '-Tutf8', '--ditroff', path],
                                    env={**os.environ, 'LC_ALL': 'C.UTF-8'}, capture_output=True, text=True, timeout=LIMIT)
            self.assertEqual((result.returncode, result.stderr), (0, ''), path)
            self.assertGreater(len(result.stdout), 1000, path)


if __name__ == '__main__':
    unittest.main()
