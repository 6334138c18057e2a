#!/usr/bin/env python3
"""Checks that the sources of a folder include nothing but what they may: includes.py FOLDER PATTERN...

A pattern is a regular expression for the name with its quotes or brackets, such as '"npapi/.*"' or '<glib.h>'. The headers of
the C and C++ libraries without a folder are allowed in any case."""

import pathlib
import re
import sys

INCLUDE = re.compile(r'^\s*#\s*include\s*(\S+)')
STANDARD = r'<[a-z0-9_]+>|<dlfcn\.h>'
SOURCES = ('.cpp', '.h', '.c')


def includes_of(path):
    """Line numbers and names."""
    for number, line in enumerate(path.read_text(encoding='utf-8').splitlines(), 1):
        found = INCLUDE.match(line)
        if found:
            yield number, found[1]


def main():
    folder, patterns = pathlib.Path(sys.argv[1]), sys.argv[2:]
    allowed = re.compile('|'.join([STANDARD, *patterns]))
    sources = sorted(path for path in folder.rglob('*') if path.suffix in SOURCES)
    if not sources:
        sys.exit(f'includes.py: {folder}: no sources')
    faults = [f'{path}:{number}: {name} is not among what {folder.name}/ may include'
              for path in sources for number, name in includes_of(path) if not allowed.fullmatch(name)]
    if faults:
        sys.exit('\n'.join(faults))


if __name__ == '__main__':
    main()
