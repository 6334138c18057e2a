#!/usr/bin/env python3
"""What the plug-in of each build folder needs of a set: size, memory, relocations, libraries and versions of symbols, as a
table. Usage: footprint.py [--strings new] BUILD-FOLDER...

Ends with 1 if a plug-in needs a library beyond GLib, GModule and the C and C++ run time, or a symbol newer than in
LIMITS, or is larger than in SIZES. --strings new: the plug-in is built with the strings of g++ 5, which the C++ run time before does not have.
Time is not measured under an emulator, where it says nothing about a set."""

import argparse
import os
import re
import subprocess
import sys

PAGE = 4096
# The newest version of each kind that the run time libraries of glibc 2.17 and g++ 4.8 have.
LIMITS = {'GLIBC': (2, 17), 'GLIBCXX': (3, 4, 19), 'CXXABI': (1, 3, 7), 'CXXABI_ARM': (1, 3, 3), 'GCC': (4, 7, 0)}
NEW_STRINGS = (3, 4, 21)
SIZES = {'armhf': 300 * 1024}  # stripped
LIBRARIES = re.compile(r'lib(glib-2\.0|gmodule-2\.0|c|m|pthread|stdc\+\+|gcc_s)\.so\.\d+|ld-linux.*|ld\.so\.1')


def fail(reason):
    print(f'footprint.py: {reason}', file=sys.stderr)
    sys.exit(2)


def output_of(*command):
    try:
        return subprocess.run(command, capture_output=True, check=True, text=True,
                              env={**os.environ, 'LC_ALL': 'C'}).stdout
    except FileNotFoundError:
        fail(f'{command[0]}: No such file')
    except subprocess.CalledProcessError as error:
        fail(f'{command[0]}: {error.stderr.strip() or "failed"}')


class Build:
    def __init__(self, folder):
        self.folder = folder
        self.plugin = os.path.join(folder, 'nptelixjs.so')
        cache = os.path.join(folder, 'CMakeCache.txt')
        for file in (cache, self.plugin):
            if not os.path.isfile(file):
                fail(f'{file}: No such file')
        with open(cache, encoding='utf-8') as lines:
            self.cache = dict(re.findall(r'^(\w+):\w+=(.*)$', lines.read(), re.MULTILINE))
        self.readelf = self.cache['CMAKE_READELF']

    @property
    def machine(self):
        return self.cache.get('TELIX_MACHINE') or output_of('dpkg', '--print-architecture').strip()

    def stripped_size(self):
        file = os.path.join(self.folder, 'nptelixjs.stripped')
        try:
            output_of(self.cache['CMAKE_STRIP'], '-o', file, self.plugin)
            return os.path.getsize(file)
        finally:
            if os.path.exists(file):
                os.remove(file)

    def writable_memory(self):
        """Bytes of the pages that each process has of its own: relocated and variable data."""
        size = 0
        for line in output_of(self.readelf, '-Wl', self.plugin).splitlines():
            columns = line.split()
            if columns[:1] == ['LOAD'] and 'W' in columns[6]:
                start, length = int(columns[2], 16), int(columns[5], 16)
                size += -(-(start + length) // PAGE) * PAGE - start // PAGE * PAGE
        return size

    def relocations(self):
        """The numbers of relative relocations and of those that look up a symbol. On MIPS, most are entries of the global
        offset table that have no relocation of their own."""
        relative = symbolic = 0
        for kind, symbol in re.findall(r'^[0-9a-f]+ +[0-9a-f]+ +(R_\w+)(?: +(.*))?$',
                                       output_of(self.readelf, '-Wr', self.plugin), re.MULTILINE):
            if kind.endswith('_RELATIVE') or not symbol.strip():
                relative += 1
            else:
                symbolic += 1
        table = {name: int(number, 0) for name, number in re.findall(
            r'\(MIPS_(LOCAL_GOTNO|SYMTABNO|GOTSYM)\) +(\w+)', output_of(self.readelf, '-Wd', self.plugin))}
        if table:
            relative += table['LOCAL_GOTNO']
            symbolic += table['SYMTABNO'] - table['GOTSYM']
        return relative, symbolic

    def libraries(self):
        return re.findall(r'\(NEEDED\).*\[(.*)\]', output_of(self.readelf, '-Wd', self.plugin))

    def newest_versions(self):
        """The newest version that is needed of each kind."""
        text = output_of(self.readelf, '-WV', self.plugin).partition("section '.gnu.version_r'")[2]
        newest = {}
        for name in re.findall(r'Name: (\S+)', text):
            kind, _, version = name.rpartition('_')
            numbers = tuple(int(number) for number in version.split('.'))
            newest[kind] = max(newest.get(kind, ()), numbers)
        return newest

    def load_costs(self):
        """What load_bench prints, by name; empty without load_bench or without what runs it."""
        program = os.path.join(self.folder, 'bench', 'load_bench')
        runner = list(filter(None, self.cache.get('TELIX_RUNNER', '').split(';')))
        if not os.path.isfile(program) or (self.cache.get('TELIX_MACHINE') and not runner):
            return {}
        emulated = runner and 'qemu' in os.path.basename(runner[0])
        rounds = ['1'] if emulated else []
        plugin = os.path.join(self.folder, 'bench', 'load', 'nptelixjs.so')
        costs = dict(line.split() for line in output_of(*runner, program, plugin, *rounds).splitlines())
        return {name: cost for name, cost in costs.items() if name.endswith('_heap') or not emulated}


def row_of(build):
    relative, symbolic = build.relocations()
    costs = build.load_costs()
    versions = ', '.join(f'{kind} {".".join(map(str, version))}'
                         for kind, version in sorted(build.newest_versions().items()))
    return {'machine': build.machine, 'stripped, bytes': build.stripped_size(), 'relative relocations': relative,
            'symbols looked up': symbolic, 'own pages, KiB': build.writable_memory() // 1024,
            'heap after loading, bytes': costs.get('load_heap', '–'), 'heap of a page, bytes': costs.get('page_heap', '–'),
            'loading, µs': costs.get('load_us', '–'), 'a page, µs': costs.get('page_us', '–'),
            'newest versions needed': versions}


def complaints(build, limits):
    for library in build.libraries():
        if not LIBRARIES.fullmatch(library):
            yield f'needs {library}'
    for kind, version in build.newest_versions().items():
        if kind not in limits or version > limits[kind]:
            yield f'needs {kind} {".".join(map(str, version))}'
    size = build.stripped_size()
    if size > SIZES.get(build.machine, size):
        yield f'has {size} bytes stripped, more than {SIZES[build.machine]}'


def main():
    parser = argparse.ArgumentParser(usage='footprint.py [--strings new] BUILD-FOLDER...')
    parser.error = fail
    parser.add_argument('--strings', choices=['new'])
    parser.add_argument('folders', nargs='+')
    arguments = parser.parse_args()
    limits = {**LIMITS, 'GLIBCXX': NEW_STRINGS} if arguments.strings else LIMITS
    builds = [Build(folder) for folder in arguments.folders]
    rows = [row_of(build) for build in builds]
    print('| ' + ' | '.join(rows[0]) + ' |\n' + '|---' * len(rows[0]) + '|')
    for row in rows:
        print('| ' + ' | '.join(map(str, row.values())) + ' |')
    found = [f'{build.machine}: {complaint}' for build in builds for complaint in complaints(build, limits)]
    for complaint in found:
        print(f'footprint.py: {complaint}', file=sys.stderr)
    sys.exit(1 if found else 0)


if __name__ == '__main__':
    main()
