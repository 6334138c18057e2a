"""Shows a page of pages/testpage.js in Cog with the bridge for WPE WebKit, headless, for the tests: the options and the
output of telix-tv that run_page.py uses.

cog_page_runner.py --cog FILE --extensions DIR --plugin FILE [--timeout SECONDS] --wait-for window.testResult
                   --eval window.testResult [--screenshot FILE] PAGE

The only way out of the page is its console, where testpage.js writes the outcome when the URL asks for that; so nothing
else can be waited for, and there are no screenshots. Ends with 0 when there was an outcome, which is the last line of
standard output, with 1 otherwise, and with 2 for a bad option.
"""

import argparse
import os
import pathlib
import signal
import subprocess
import sys
import threading

OUTCOME = 'window.testResult'
FRAGMENT = '#outcome-on-console'
MARK = 'CONSOLE LOG testResult '
# How long Cog may take to end when it is asked to.
END_LIMIT = 10


def parse_options():
    parser = argparse.ArgumentParser(prog='cog_page_runner')
    parser.add_argument('--cog', required=True)
    parser.add_argument('--extensions', required=True)
    parser.add_argument('--plugin', required=True)
    parser.add_argument('--timeout', type=float, default=30)
    parser.add_argument('--wait-for', choices=[OUTCOME], required=True)
    parser.add_argument('--eval', choices=[OUTCOME], required=True)
    parser.add_argument('--screenshot')
    parser.add_argument('page')
    return parser.parse_args()


def url_of(page):
    return page if '://' in page else pathlib.Path(page).absolute().as_uri()


def start_cog(options):
    return subprocess.Popen(
        [options.cog, '--platform=headless', f'--web-extensions-dir={options.extensions}',
         '--enable-write-console-messages-to-stdout=1', '--allow-file-access-from-file-urls=1',
         '--allow-universal-access-from-file-urls=1', url_of(options.page) + FRAGMENT],
        env={**os.environ, 'TELIX_PLUGIN': options.plugin}, stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
        stderr=subprocess.STDOUT, text=True, start_new_session=True)


def end_cog(cog):
    """Cog's processes for the page and the network are in its session and go with it."""
    cog.terminate()
    try:
        cog.wait(END_LIMIT)
    except subprocess.TimeoutExpired:
        os.killpg(cog.pid, signal.SIGKILL)
        cog.wait()


def outcome_of(cog):
    """The outcome as JSON; empty when Cog ends or is ended before. Everything else goes to standard output. (Some
    versions write console messages to standard error.)"""
    for line in cog.stdout:
        if MARK in line:
            return line.split(MARK, 1)[1].strip()
        print(line, end='')
    return ''


def main():
    options = parse_options()
    cog = start_cog(options)
    timer = threading.Timer(options.timeout, os.killpg, (cog.pid, signal.SIGKILL))
    timer.start()
    try:
        outcome = outcome_of(cog)
    finally:
        timer.cancel()
        end_cog(cog)
    if not outcome:
        sys.exit('cog_page_runner: given up: the page gave no outcome')
    print(outcome)


main()
