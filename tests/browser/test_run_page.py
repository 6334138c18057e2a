"""run_page.py reports which pages pass and why others fail."""

import os
import subprocess
import sys
import unittest

from television import temporary_folder

FOLDER = os.path.dirname(os.path.abspath(__file__))


def run_page(content, *arguments, browser=os.environ['TELIX_TV'], options=()):
    with temporary_folder() as folder:
        page = os.path.join(folder, 'page.html')
        with open(page, 'w', encoding='utf-8') as file:
            file.write(f'<script src="file://{FOLDER}/pages/testpage.js"></script><script>{content}</script>')
        return subprocess.run(
            [sys.executable, '-B', os.path.join(FOLDER, 'run_page.py'), '--browser', browser,
             '--screenshot', os.path.join(folder, 'page.png'), *arguments, page, '--',
             '--plugin', os.environ['TELIX_PLUGIN'], *options],
            stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True, check=False)


class RunPage(unittest.TestCase):
    def assert_fails(self, run, failure):
        self.assertEqual(run.returncode, 1, run.stdout)
        self.assertIn(failure, run.stdout)

    def test_passing_checks_pass(self):
        run = run_page("testPage({'one': function () { check(true); }, 'two': function () { same(1, 1); },"
                       "'later': function (done) { setTimeout(function () { check(true); done(); }, 5); }})")
        self.assertEqual(run.returncode, 0, run.stdout)
        self.assertIn('3 passed', run.stdout)

    def test_the_plug_in_gets_the_environment(self):
        content = """var element = document.createElement('object');
            element.type = 'application/oipfapplicationmanager';
            testPage({'object': function () { document.body.appendChild(element); check(!!element.getOwnerApplication);
                                              throw new Error('so that the output is printed'); }})"""
        self.assertIn('PLUGIN >>>', run_page(content, '--environment=LOG_MODULE=1').stdout)
        self.assertNotIn('PLUGIN >>>', run_page(content).stdout)

    def test_one_failed_check_fails(self):
        run = run_page("testPage({'good': function () { check(true); }, 'bad': function () { same(1, 2); }})")
        self.assert_fails(run, 'bad: Error: is 1 (number), should be 2')

    def test_a_number_is_not_its_text(self):
        self.assert_fails(run_page("testPage({'bad': function () { same(1, '1'); }})"), 'bad: ')

    def test_only_true_is_true(self):
        self.assert_fails(run_page("testPage({'bad': function () { check(1); }})"), 'a condition is 1')

    def test_arrays_are_compared_element_by_element(self):
        self.assert_fails(run_page("testPage({'bad': function () { same([1, 2], [1, 3]); }})"), 'bad: ')

    def test_nothing_thrown_fails(self):
        self.assert_fails(run_page("testPage({'bad': function () { throws(function () {}); }})"), 'nothing is thrown')

    def test_a_failed_check_of_a_later_turn_fails(self):
        run = run_page("testPage({'bad': function (done) { setTimeout(function () { check(false); done(); }, 5); }})")
        self.assert_fails(run, 'bad: ')

    def test_a_test_that_never_ends_fails(self):
        run = run_page("testTimeout = 50; testPage({'bad': function (done) { check(true); }})")
        self.assert_fails(run, 'bad: not done within 50 ms')

    def test_a_test_without_a_check_fails(self):
        self.assert_fails(run_page("testPage({'bad': function () {}})"), 'bad: nothing was checked')

    def test_a_page_without_tests_fails(self):
        self.assert_fails(run_page('testPage({})'), 'the page has no tests')

    def test_a_page_without_an_outcome_fails(self):
        self.assert_fails(run_page('nonsense(', options=['--timeout', '5']), 'the page set no result')

    def test_a_malformed_outcome_fails(self):
        self.assert_fails(run_page('window.testResult = 1'), 'the result is malformed')

    def test_a_crash_fails(self):
        with temporary_folder() as folder:
            browser = os.path.join(folder, 'browser')
            with open(browser, 'w', encoding='utf-8') as file:
                file.write('#!/bin/sh\necho \'{"passed": 1, "failed": []}\'\nkill -SEGV $$\n')
            os.chmod(browser, 0o755)
            self.assert_fails(run_page('', browser=browser), 'SIGSEGV')


if __name__ == '__main__':
    unittest.main()
