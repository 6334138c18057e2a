"""Runs a test page in telix-tv and reports its outcome:
run_page.py --browser FILE --screenshot FILE [--environment NAME=VALUE]... PAGE -- OPTION...

The page leaves its outcome in window.testResult, {passed: number, failed: [text...]} (see pages/testpage.js). The run
fails when a test of the page failed, when there was none, when there is no outcome, and when telix-tv itself fails.
"""

import argparse
import json
import sys

from television import Television


def complaint_about(run):
    """Why the run is a failure; empty when it is a success."""
    if run.status != 0:
        return 'the page gave no outcome'
    try:
        outcome = run.value
        passed, failed = outcome['passed'], outcome['failed']
    except (IndexError, KeyError, TypeError, json.JSONDecodeError):
        return 'the outcome is malformed'
    if failed:
        return '\n'.join(['failed:', *failed])
    if not isinstance(passed, int) or passed < 1:
        return 'the page has no tests'
    print(f'{passed} passed')
    return ''


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument('--browser', required=True)
    parser.add_argument('--screenshot', required=True)
    parser.add_argument('--environment', action='append', default=[])
    parser.add_argument('page')
    parser.add_argument('options', nargs='*')
    arguments = parser.parse_args()
    with Television(arguments.browser) as television:
        run = television.run('--wait-for', 'window.testResult', '--eval', 'window.testResult',
                             '--screenshot', arguments.screenshot, *arguments.options, arguments.page,
                             environment=dict(setting.split('=', 1) for setting in arguments.environment))
    complaint = complaint_about(run)
    if complaint:
        sys.exit(f'{run}\n{complaint}')


main()
