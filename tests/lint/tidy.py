#!/usr/bin/env python3
"""Runs clang-tidy over the sources of some folders, as the build compiles them.

A file that has passed is not looked at again until it, a header of it, its command or the checks change. What it
depends on is what the build has noted, so the build comes first."""

import argparse
import collections
import concurrent.futures
import functools
import hashlib
import json
import os
import shlex
import subprocess
import sys


def read_dependencies(build):
    """The files from which the build has made each object, by the object's name."""
    if not os.path.exists(os.path.join(build, 'build.ninja')):
        return {}  # other build programs tell nothing
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


def key_of(commands, dependencies, means):
    """Stands for all that the outcome depends on; None if the build has not noted that."""
    key = hashlib.sha256(means)
    for command in commands:
        words = shlex.split(command)
        files = dependencies.get(words[words.index('-o') + 1])
        if not files:
            return None
        key.update(command.encode())
        for path in files:  # the source is the first
            key.update(path.encode() + b'\0' + digest_of(path))
    return key.hexdigest()


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument('--clang-tidy', required=True, metavar='PROGRAM')
    parser.add_argument('--build', required=True, metavar='FOLDER', help='with compile_commands.json')
    parser.add_argument('--checks', required=True, metavar='FILE', help='the .clang-tidy of the sources')
    parser.add_argument('--passed', required=True, metavar='FOLDER', help='where it is noted what has passed')
    parser.add_argument('--jobs', type=int, default=os.cpu_count())
    parser.add_argument('folders', nargs='+', metavar='FOLDER')
    arguments, options = parser.parse_known_args()  # what is not known goes to clang-tidy

    with open(os.path.join(arguments.build, 'compile_commands.json'), encoding='utf-8') as file:
        entries = json.load(file)
    prefixes = tuple(os.path.join(folder, '') for folder in arguments.folders)
    sources = collections.defaultdict(list)  # with all the commands that compile them
    for entry in entries:
        if entry['file'].startswith(prefixes):
            sources[entry['file']].append(entry['command'])
    if not sources:
        sys.exit(f'tidy.py: no sources of these folders in {arguments.build}')

    command = [arguments.clang_tidy, '-quiet', f'-p={arguments.build}', *options]
    version = subprocess.run([arguments.clang_tidy, '--version'], capture_output=True, check=True).stdout
    means = hashlib.sha256(version + digest_of(arguments.checks) + '\0'.join(command).encode()).digest()
    dependencies = read_dependencies(arguments.build)
    os.makedirs(arguments.passed, exist_ok=True)
    keys = {source: key_of(commands, dependencies, means) for source, commands in sources.items()}
    passed = set(os.listdir(arguments.passed))
    for outdated in passed - set(keys.values()):
        os.unlink(os.path.join(arguments.passed, outdated))
    waiting = [source for source, key in keys.items() if key not in passed]

    def look_at(source):
        result = subprocess.run([*command, source], capture_output=True, text=True)
        if result.returncode == 0 and keys[source]:
            with open(os.path.join(arguments.passed, keys[source]), 'w', encoding='utf-8'):
                pass
        return source, result

    failed = 0
    with concurrent.futures.ThreadPoolExecutor(arguments.jobs) as pool:
        for source, result in pool.map(look_at, waiting):
            if result.returncode != 0:
                failed += 1
                print(f'{source}:\n{result.stdout}{result.stderr}', flush=True)
    print(f'{len(sources)} files: {len(waiting)} looked at, {failed} with faults, {len(sources) - len(waiting)} as they '
          'were when they passed')
    sys.exit(1 if failed else 0)


if __name__ == '__main__':
    main()
