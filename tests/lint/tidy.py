#!/usr/bin/env python3
"""Runs clang-tidy on the sources of some folders, with the commands of the build.

A source that has passed is skipped until it, one of its headers, its command or the checks change. The headers are
those that the build has recorded, so the sources must have been built."""

import argparse
import collections
import concurrent.futures
import functools
import hashlib
import json
import os
import re
import shlex
import subprocess
import sys
import tempfile


def read_dependencies(build):
    """The files that each object depends on, by the object's name."""
    if not os.path.exists(os.path.join(build, 'build.ninja')):
        return {}  # only Ninja can list them
    output = subprocess.run(['ninja', '-C', build, '-t', 'deps'], capture_output=True, text=True, check=True).stdout
    dependencies = collections.defaultdict(list)
    name = None
    for line in output.splitlines():
        if ': #deps ' in line:
            name = line.split(': #deps ', 1)[0] if line.endswith('(VALID)') else None
        elif name and line:
            dependencies[name].append(os.path.join(build, line.strip()))
    return dependencies


@functools.lru_cache(maxsize=None)
def digest_of(path):
    with open(path, 'rb') as file:
        return hashlib.sha256(file.read()).digest()


def key_of(commands, dependencies, tool_digest):
    """A digest of everything that the result depends on; None if the build has not recorded the dependencies."""
    key = hashlib.sha256(tool_digest)
    for command in commands:
        words = shlex.split(command)
        files = dependencies.get(words[words.index('-o') + 1])
        if not files:
            return None
        key.update(command.encode())
        for path in files:  # the source is the first
            if path.endswith('.gch'):
                continue  # clang-tidy reads the headers themselves
            key.update(path.encode() + b'\0' + digest_of(path))
    return key.hexdigest()


def parse_arguments():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument('--clang-tidy', required=True, metavar='PROGRAM')
    parser.add_argument('--build', required=True, metavar='FOLDER', help='with compile_commands.json')
    parser.add_argument('--checks', required=True, action='append', metavar='FILE', help='a .clang-tidy of the sources')
    parser.add_argument('--passed', required=True, metavar='FOLDER', help='records the sources that have passed')
    parser.add_argument('--jobs', type=int, default=os.cpu_count())
    parser.add_argument('folders', nargs='+', metavar='FOLDER')
    return parser.parse_known_args()  # unknown options are for clang-tidy


def read_commands(build):
    """The entries of compile_commands.json without precompiled headers: those of g++ are not clang's, and a source has to
    include what it uses. Of commands that compile the same code there is one."""
    with open(os.path.join(build, 'compile_commands.json'), encoding='utf-8') as file:
        entries = json.load(file)
    for entry in entries:
        entry['command'] = re.sub(r' -Winvalid-pch -include \S+/cmake_pch\.hxx', '', entry['command'])
    return list({code_of(entry): entry for entry in reversed(entries)}.values())


def code_of(entry):
    """What the code depends on: not the name of the object, and of a text in a macro not its characters."""
    return entry['file'], re.sub(r'(-D\w+=)\\"\S*\\"| -o \S+', r'\1', entry['command'])


def commands_of_sources(entries, folders):
    """All commands that compile each source of the folders, by the source's name."""
    prefixes = tuple(os.path.join(folder, '') for folder in folders)
    sources = collections.defaultdict(list)
    for entry in entries:
        if entry['file'].startswith(prefixes):
            sources[entry['file']].append(entry['command'])
    if not sources:
        sys.exit(f'tidy.py: {" ".join(folders)}: no sources')
    return sources


def digest_of_tool(command, checks):
    """A digest of clang-tidy's version, its arguments and the checks."""
    version = subprocess.run([command[0], '--version'], capture_output=True, check=True).stdout
    return hashlib.sha256(version + b''.join(map(digest_of, checks)) + '\0'.join(command).encode()).digest()


class PassedSources:
    """The record of the sources that have passed: an empty file for each key."""

    def __init__(self, folder, keys):
        """Removes all records but those with one of the keys."""
        self._folder = folder
        os.makedirs(folder, exist_ok=True)
        self._passed = set(os.listdir(folder))
        for outdated in self._passed - set(keys):
            os.unlink(os.path.join(folder, outdated))

    def __contains__(self, key):
        return key in self._passed

    def add(self, key):
        with open(os.path.join(self._folder, key), 'w', encoding='utf-8'):
            pass


def main():
    arguments, options = parse_arguments()
    entries = read_commands(arguments.build)
    sources = commands_of_sources(entries, arguments.folders)
    command = [arguments.clang_tidy, '-quiet', *options]
    tool_digest = digest_of_tool(command, arguments.checks)
    dependencies = read_dependencies(arguments.build)
    keys = {source: key_of(commands, dependencies, tool_digest) for source, commands in sources.items()}
    passed = PassedSources(arguments.passed, keys.values())
    unchecked = [source for source, key in keys.items() if key not in passed]

    def check(source):
        result = subprocess.run([*command, f'-p={database}', source], capture_output=True, text=True)
        if result.returncode == 0 and keys[source]:
            passed.add(keys[source])
        return source, result

    failed = 0
    with tempfile.TemporaryDirectory() as database, concurrent.futures.ThreadPoolExecutor(arguments.jobs) as pool:
        with open(os.path.join(database, 'compile_commands.json'), 'w', encoding='utf-8') as file:
            json.dump(entries, file)
        for source, result in pool.map(check, unchecked):
            if result.returncode != 0:
                failed += 1
                print(f'{source}:\n{result.stdout}{result.stderr}', flush=True)
    print(f'{len(sources)} sources: {len(unchecked)} checked, {failed} failed, {len(sources) - len(unchecked)} unchanged '
          'since they passed')
    sys.exit(1 if failed else 0)


if __name__ == '__main__':
    main()
