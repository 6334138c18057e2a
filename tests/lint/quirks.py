#!/usr/bin/env python3
"""Checks that the document of the quirks and the code name the same ones.

A row of the document's tables begins with the number of its quirk; a line of code that makes the difference has the
comment `// quirk NUMBER: REASON`. Every number has one row and at least one line, and the rows count from 1."""

import argparse
import os
import re
import sys

ROW = re.compile(r'^\| (\d+) \|')
WORD = re.compile(r'\bquirks?\b', re.IGNORECASE)
MARK = re.compile(r'^\s*(?:.*\s)?// quirk (\d+): \S')
REFERENCE = re.compile(r'\b[Qq]uirks? (\d+)')
SOURCES = ('.cpp', '.h')


def read_lines(path):
    with open(path, encoding='utf-8') as file:
        return file.read().splitlines()


def rows_of(document, faults):
    """The numbers of the rows; a reference to a row that is not there is a fault."""
    rows = []
    references = []
    for place, line in enumerate(read_lines(document), 1):
        row = ROW.match(line)
        if row:
            rows.append(int(row[1]))
            if rows[-1] != len(rows):
                faults.append(f'{document}:{place}: number {rows[-1]} stands in row {len(rows)}')
            if len(line.split(' | ')) != 4 or '|  |' in line:
                faults.append(f'{document}:{place}: a row has four cells, none of them empty')
            references += [(place, int(number)) for number in REFERENCE.findall(line)]
    faults += [f'{document}:{place}: no quirk {number}' for place, number in references if number not in rows]
    return rows


def sources_in(folders):
    for folder in folders:
        for parent, _, files in sorted(os.walk(folder)):
            yield from (os.path.join(parent, name) for name in sorted(files) if name.endswith(SOURCES))


def marks_of(folders, faults):
    """The places of each number that the code marks."""
    marks = {}
    for path in sources_in(folders):
        for place, line in enumerate(read_lines(path), 1):
            mark = MARK.match(line)
            if mark:
                marks.setdefault(int(mark[1]), []).append(f'{path}:{place}')
            elif WORD.search(line):
                faults.append(f'{path}:{place}: a mark reads "// quirk NUMBER: REASON"')
    return marks


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument('--document', required=True, metavar='FILE')
    parser.add_argument('folders', nargs='+', metavar='FOLDER', help='with the sources')
    arguments = parser.parse_args()

    faults = []
    rows = rows_of(arguments.document, faults)
    marks = marks_of(arguments.folders, faults)
    if not rows:
        faults.append(f'{arguments.document}: no rows')
    for number, places in sorted(marks.items()):
        if number not in rows:
            faults += [f'{place}: quirk {number} is not in {arguments.document}' for place in places]
    faults += [f'{arguments.document}: quirk {number} is marked nowhere' for number in rows if number not in marks]
    print('\n'.join(faults) if faults else f'{len(rows)} quirks, {sum(map(len, marks.values()))} marks')
    sys.exit(1 if faults else 0)


if __name__ == '__main__':
    main()
