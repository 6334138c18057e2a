"""The usage errors of ./run.sh, which it reports before it builds anything."""

import os
import subprocess
import unittest

from television import temporary_folder

RUN = os.path.join(os.path.abspath(__file__).rsplit('/tests/', 1)[0], 'run.sh')


class Refusals(unittest.TestCase):
    def setUp(self):
        context = temporary_folder()
        self.folder = context.__enter__()
        self.addCleanup(context.__exit__, None, None, None)

    def write(self, name, content):
        path = os.path.join(self.folder, name)
        with open(path, 'wb') as file:
            file.write(content)
        return path

    def assert_refused(self, *arguments, because):
        run = subprocess.run([RUN, *arguments], stdin=subprocess.DEVNULL, capture_output=True, text=True, check=False)
        self.assertEqual((run.returncode, run.stdout), (2, ''), run)
        self.assertRegex(run.stderr, '^run\\.sh: [^\n]*\n$')
        self.assertIn(because, run.stderr)

    def test_a_file_that_is_not_there(self):
        for name in ('missing.ts', 'missing.html', 'missing'):
            self.assert_refused(os.path.join(self.folder, name), because=f'{self.folder}/{name}: No such file')

    def test_a_file_that_is_neither_a_page_nor_a_transport_stream(self):
        packet = b'G' + 187 * b'x'
        for name, content in (('empty.ts', b''), ('text.ts', b'text'), ('short.ts', 4 * packet),
                              ('wrong.ts', 3 * packet + b'x' + 10 * packet), ('film.mp4', 10000 * b'x')):
            self.assert_refused(self.write(name, content), because='neither a page nor a transport stream')

    def test_a_folder_without_transport_streams(self):
        self.write('film.mp4', b'x')
        self.assert_refused(self.folder, because='no *.ts')

    def test_a_folder_that_has_the_name_of_a_page(self):
        folder = os.path.join(self.folder, 'page.html')
        os.mkdir(folder)
        self.assert_refused(folder, because='not a file')

    def test_a_name_that_a_line_up_cannot_hold(self):
        for name in ('a;b.ts', 'a#1.ts'):
            self.assert_refused(self.write(name, 10 * (b'G' + 187 * b'x')), because='; or #')

    def test_a_page_and_something_else(self):
        page = self.write('page.html', b'')
        self.assert_refused(page, page, because='only argument')
        self.assert_refused('http://127.0.0.1/', page, because='only argument')

    def test_an_option_without_its_value(self):
        self.assert_refused('--size', because='--size')


if __name__ == '__main__':
    unittest.main()
