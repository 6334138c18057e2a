#!/usr/bin/env python3
"""What a page pays for the plug-in's objects in WebKitGTK with the bridge, on both of its script engines, beside the engine
that loads the plug-in by itself, in the same run. Usage: bridge_bench.py BUILD-FOLDER

Ends with 1 when a row of the bridge on the C API takes more than 1.5 times what that engine takes. The last row is what
the engines themselves take for a page, and has no goal."""

import os
import sys

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path.insert(0, os.path.join(TOP, 'tests', 'browser'))
from television import Television  # noqa: E402

PAGE = os.path.join(TOP, 'bench', 'pages', 'bridge.html')
GOAL = 1.5
ROUNDS = 3
WITHOUT_GOAL = 'page load without objects'
NPAPI, C_API, GOBJECT = 'NPAPI engine', 'bridge, C API', 'bridge, GObject API'


def measure(program, plugin):
    """Microseconds by row."""
    with Television(program) as television:
        run = television.run('--plugin', plugin, '--timeout', 100, '--wait-for', 'window.benchResult',
                             '--eval', 'window.benchResult', PAGE)
    if run.status != 0:
        sys.exit(str(run))
    return run.value


def main():
    build = sys.argv[1] if len(sys.argv) == 2 else ''
    programs = {NPAPI: os.path.join(build, 'desktop', 'telix-tv'),
                C_API: os.path.join(build, 'tests', 'browser', 'engines', 'webkit'),
                GOBJECT: os.path.join(build, 'tests', 'browser', 'engines', 'webkit-gobject')}
    plugin = os.path.join(build, 'tests', 'browser', 'broadcast', 'nptelixjs.so')
    for file in [*programs.values(), plugin]:
        if not os.path.isfile(file):
            print(f'bridge_bench: {file}: No such file', file=sys.stderr)
            sys.exit(2)
    # One after the other, so that what else the machine does falls on all.
    runs = [{name: measure(program, plugin) for name, program in programs.items()} for _ in range(ROUNDS)]
    print(f'{"microseconds (times the NPAPI engine)":40}' + ''.join(f'{name:>24}' for name in programs))
    missed = []
    for row in sorted(runs[0][NPAPI], key=WITHOUT_GOAL.__eq__):
        times = {name: min(run[name][row] for run in runs) for name in programs}
        print(f'{row:40}' + ''.join(f'{time:>16.2f} ({time / times[NPAPI]:4.2f})' for time in times.values()))
        if row != WITHOUT_GOAL and times[C_API] > GOAL * times[NPAPI]:
            missed.append(row)
    if missed:
        print(f'bridge_bench: more than {GOAL} times the NPAPI engine: {", ".join(missed)}', file=sys.stderr)
        sys.exit(1)


if __name__ == '__main__':
    main()
