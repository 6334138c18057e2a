#!/usr/bin/env python3
"""How the load of a page grows with the number of its video/broadcast objects, in the NPAPI engine and in WebKitGTK with the
bridge. Exits with 1 if an object costs more than 1.5 times as much among 100 as among 10. Usage: growth_bench.py BUILD-FOLDER"""

import os
import sys

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path.insert(0, os.path.join(TOP, 'tests', 'browser'))
from television import Television  # noqa: E402

PAGE = os.path.join(TOP, 'bench', 'pages', 'growth.html')
GOAL = 1.5
ROUNDS = 3
FEW, MANY = 10, 100


def measure(program, plugin):
    """Microseconds by number of objects."""
    with Television(program) as television:
        run = television.run('--plugin', plugin, '--timeout', 200, '--wait-for', 'window.benchResult', '--eval',
                             'window.benchResult', PAGE)
    if run.status != 0:
        sys.exit(str(run))
    return {int(count): time for count, time in run.value.items()}


def main():
    build = sys.argv[1] if len(sys.argv) == 2 else ''
    programs = {'NPAPI engine': os.path.join(build, 'desktop', 'telix-tv-npapi'),
                'WebKitGTK with the bridge': os.path.join(build, 'tests', 'browser', 'engines', 'webkit')}
    plugin = os.path.join(build, 'tests', 'browser', 'broadcast', 'nptelixjs.so')
    for file in [*programs.values(), plugin]:
        if not os.path.isfile(file):
            print(f'growth_bench: {file}: No such file', file=sys.stderr)
            sys.exit(2)
    # One after the other, so that what else the machine does falls on all; of each row the fastest counts.
    runs = [{name: measure(program, plugin) for name, program in programs.items()} for _ in range(ROUNDS)]
    missed = []
    for name in programs:
        times = {count: min(run[name][count] for run in runs) for count in runs[0][name]}
        each = {count: (time - times[0]) / count for count, time in times.items() if count != 0}
        print(f'{name}: empty page {times[0]:.0f} us; each object of '
              + ', '.join(f'{count}: {time:.0f} us' for count, time in each.items()))
        if each[MANY] > GOAL * each[FEW]:
            missed.append(name)
    if missed:
        print(f'growth_bench: more than {GOAL} times as much for each of {MANY} as of {FEW} objects: {", ".join(missed)}',
              file=sys.stderr)
        sys.exit(1)


if __name__ == '__main__':
    main()
