#!/usr/bin/env python3
"""What a page pays for the plug-in's objects in WebKitGTK with the bridge, on both of its script engines, beside the engine
that loads the plug-in by itself, in the same run. Usage: bridge_bench.py BUILD-FOLDER

Ends with 1 when a row of the bridge on the C API takes more than 1.5 times what that engine takes. The page loads
themselves have no goal, because WebKitGTK without the bridge, which has a column of its own, takes a multiple for them; what the
plug-in adds to an empty page without the bridge has."""

import os
import sys
import tempfile

TOP = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path.insert(0, os.path.join(TOP, 'tests', 'browser'))
from television import Television  # noqa: E402

PAGES = os.path.join(TOP, 'bench', 'pages')
GOAL = 1.5
ROUNDS = 3
WITH_OBJECTS, WITHOUT_OBJECTS = 'page load with all seven objects', 'page load without objects'
ADDED = 'seven objects minus an empty page'
NPAPI, ALONE, C_API, GOBJECT = 'NPAPI engine', 'WebKitGTK alone', 'bridge, C API', 'bridge, GObject API'


def measure(program, page, *options):
    """Microseconds by row."""
    with Television(program) as television:
        run = television.run(*options, '--timeout', 200, '--wait-for', 'window.benchResult', '--eval',
                             'window.benchResult', os.path.join(PAGES, page))
    if run.status != 0:
        sys.exit(str(run))
    return run.value


def measure_all(programs, plugin):
    """Rows of each program. One after the other, so that what else the machine does falls on all."""
    with tempfile.TemporaryDirectory() as no_extensions:
        alone = measure(programs[C_API], 'pageload.html', '--extensions', no_extensions)
    rows = {name: {row: time for page in ('bridge.html', 'pageload.html')
                   for row, time in measure(program, page, '--plugin', plugin).items()}
            for name, program in programs.items()}
    return {**rows, ALONE: {WITHOUT_OBJECTS: alone[WITHOUT_OBJECTS]}}


def best_of(runs):
    """Of each row the smallest time, and what the objects add to a page load."""
    times = {name: {row: min(run[name][row] for run in runs) for row in rows} for name, rows in runs[0].items()}
    for name in (NPAPI, C_API, GOBJECT):
        empty = times[NPAPI if name == NPAPI else ALONE][WITHOUT_OBJECTS]
        times[name][ADDED] = times[name][WITH_OBJECTS] - empty
    return times


def main():
    build = sys.argv[1] if len(sys.argv) == 2 else ''
    programs = {NPAPI: os.path.join(build, 'desktop', 'telix-tv-npapi'),
                C_API: os.path.join(build, 'tests', 'browser', 'engines', 'webkit'),
                GOBJECT: os.path.join(build, 'tests', 'browser', 'engines', 'webkit-gobject')}
    plugin = os.path.join(build, 'tests', 'browser', 'broadcast', 'nptelixjs.so')
    for file in [*programs.values(), plugin]:
        if not os.path.isfile(file):
            print(f'bridge_bench: {file}: No such file', file=sys.stderr)
            sys.exit(2)
    times = best_of([measure_all(programs, plugin) for _ in range(ROUNDS)])
    columns = (NPAPI, ALONE, C_API, GOBJECT)
    print(f'{"microseconds (times the NPAPI engine)":40}' + ''.join(f'{name:>24}' for name in columns))
    for row, reference in times[NPAPI].items():
        cells = [f'{times[name][row]:.2f} ({times[name][row] / reference:5.2f})' if row in times[name] else ''
                 for name in columns]
        print(f'{row:40}' + ''.join(f'{cell:>24}' for cell in cells))
    missed = [row for row, reference in times[NPAPI].items()
              if row not in (WITH_OBJECTS, WITHOUT_OBJECTS) and times[C_API][row] > GOAL * reference]
    if missed:
        print(f'bridge_bench: more than {GOAL} times the NPAPI engine: {", ".join(missed)}', file=sys.stderr)
        sys.exit(1)


if __name__ == '__main__':
    main()
