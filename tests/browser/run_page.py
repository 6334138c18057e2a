"""Runs a test page in telix-tv and reports its result:
run_page.py --browser FILE --screenshot FILE [--environment NAME=VALUE]... PAGE -- OPTION...

The page sets window.testResult to {passed: number, failed: [message...]} (see pages/testpage.js). The run fails if a
test of the page fails, if the page has no tests or sets no result, or if telix-tv fails.
"""

import argparse
import json
import sys

from television import Television


def failure_of(run):
    """Why the run failed; empty if it passed."""
    if run.status != 0:
        return 'the page set no result'
    try:
        result = run.value
        passed, failed = result['passed'], result['failed']
    except (IndexError, KeyError, TypeError, json.JSONDecodeError):
        return 'the result is malformed'
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
    failure = failure_of(run)
    if failure:
        sys.exit(f'{run}\n{failure}')


main()
