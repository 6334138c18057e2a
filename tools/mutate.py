#!/usr/bin/python3
"""Breaks the sources of an area, one place at a time, and runs the tests that reach the place: what no test notices is shown as
a diff. Results and everything that is compiled are in BUILD/mutation/AREA; the tree is only read.

The build folder has to be one of Ninja with the tests and with what they need, such as telixctl for those of the platform library
and the engine of the pages for those of the bridge. docs/reliability.md says how to read the figures.
Exit status: 0 every mutant is noticed or listed as equivalent; 1 some are not; 2 bad arguments or a failed build."""

import argparse
import concurrent.futures
import dataclasses
import fnmatch
import json
import os
import pickle
import random
import re
import resource
import shlex
import signal
import subprocess
import sys
import tempfile
import time
import tomllib

try:
    import mutants
except ModuleNotFoundError:
    print('mutate.py: clang.cindex: not installed, expected that of Debian\'s python3-clang-14', file=sys.stderr)
    sys.exit(2)

TREE = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
SUPPORT = os.path.join(TREE, 'tests', 'mutation')
EQUIVALENT = os.path.join(SUPPORT, 'equivalent.toml')
BATCH_SECONDS = (1, 5, 20, 60, float('inf'))  # the quick tests run first, in one process with the others of their batch
MAX_MUTANTS = 65536  # kMaxMutants of tests/mutation/Mutant.h
CAUGHT, TIMED_OUT, SURVIVED, UNREACHED = 'caught', 'timed out', 'survived', 'not reached by a test'
EQUAL, UNCOMPILED = 'equivalent', 'did not compile'


@dataclasses.dataclass
class Area:
    sources: re.Pattern
    program: str  # of GoogleTest, linked with the sources
    libraries: tuple = ()  # linked with the sources and used by
    tests: re.Pattern = re.compile(r'(?!)')  # further tests
    apart: bool = False  # each test of the program needs a process of its own
    memory: int = 4 << 30  # a mutant that allocates without end shall not take the machine with it


AREAS = {
    'plug-in': Area(re.compile(r'(common|src)/.*\.cpp'), 'tests/unit/telix_unit_tests'),
    'platform': Area(re.compile(r'desktop/platform/.*\.cpp'), 'tests/desktop/telix_desktop_tests',
                     ('desktop/platform/libtelix.so',), re.compile(r'desktop\.tools\.(Control|CommandLine)'), apart=True),
    'bridge': Area(re.compile(r'bridge/.*\.cpp'), 'tests/bridge/bridge_tests',
                   ('bridge/webkitgtk/libtelix-webkit-bridge.so',),
                   re.compile(r'webkit(-gobject)?\.(page\.(bridge.*|plugin)|bridgestreams)'),
                   apart=True,  # the engines make their classes once in a process
                   memory=resource.RLIM_INFINITY),  # the engine reserves more than there is
}


def fail(what, reason):
    print(f'mutate.py: {what}: {reason}', file=sys.stderr)
    sys.exit(2)


def output_of(command, folder=None):
    try:
        return subprocess.run(command, cwd=folder, capture_output=True, check=True, text=True).stdout
    except FileNotFoundError:
        fail(command[0], 'No such file')
    except subprocess.CalledProcessError as error:
        lines = (error.stdout + error.stderr).strip().splitlines()
        fail(' '.join(command[:3]), lines[-1] if lines else 'failed')


def read(path):
    with open(path, encoding='utf-8') as file:
        return file.read()


def write_if_changed(path, text):
    os.makedirs(os.path.dirname(path), exist_ok=True)
    if not os.path.exists(path) or read(path) != text:
        with open(path, 'w', encoding='utf-8') as file:
            file.write(text)


def ends_within(process, seconds):
    """Whether the process ends in time. It is not reaped, so that its number stays that of its process group."""
    deadline = time.monotonic() + seconds
    while time.monotonic() < deadline:
        if os.waitid(os.P_PID, process.pid, os.WEXITED | os.WNOWAIT | os.WNOHANG):
            return True
        time.sleep(0.005)
    return False


def run_bounded(command, environment, folder, seconds, memory):
    """Exit status, None if it took too long, and output. Nothing that the command started outlives it."""
    def limit_resources():
        resource.setrlimit(resource.RLIMIT_CORE, (0, 0))
        resource.setrlimit(resource.RLIMIT_DATA, (memory, memory))

    with tempfile.TemporaryFile() as output:
        process = subprocess.Popen(command, env={**os.environ, **environment}, cwd=folder, stdin=subprocess.DEVNULL,
                                   stdout=output, stderr=subprocess.STDOUT, start_new_session=True,
                                   preexec_fn=limit_resources)
        try:
            has_ended = ends_within(process, seconds)
        finally:
            os.killpg(process.pid, signal.SIGKILL)
            status = process.wait()
        output.seek(0)
        return status if has_ended else None, output.read().decode(errors='replace')


class Build:
    """A build folder: how its programs are compiled, linked and tested."""

    def __init__(self, folder, area):
        self.folder = os.path.abspath(folder)
        cache = os.path.join(self.folder, 'CMakeCache.txt')
        if not os.path.isfile(cache):
            fail(folder, 'not a build folder, there is no CMakeCache.txt')
        self.tree = re.search(r'^CMAKE_HOME_DIRECTORY:INTERNAL=(.*)$', read(cache), re.MULTILINE).group(1)
        if not os.path.isfile(os.path.join(self.folder, 'build.ninja')):
            fail(folder, 'not a build folder of Ninja')
        targets = (area.program, *area.libraries)
        output_of(['ninja', '-C', self.folder, *targets])
        self.links = {target: self._link_command(target) for target in targets}
        linked = {argument for link in self.links.values() for argument in link if argument.endswith('.o')}
        self.compiles = {}  # by source, the object and its command
        for entry in json.loads(read(os.path.join(self.folder, 'compile_commands.json'))):
            command = shlex.split(entry['command'])
            target = command[command.index('-o') + 1]
            path = os.path.relpath(entry['file'], self.tree)
            if target in linked and area.sources.fullmatch(path):
                self.compiles[path] = (target, command)
        self.tests = json.loads(output_of(['ctest', '--test-dir', self.folder, '--show-only=json-v1']))['tests']

    def _link_command(self, target):
        line = output_of(['ninja', '-C', self.folder, '-t', 'commands', '-s', target]).strip()
        parts = [part for part in line.split(' && ') if f' -o {target} ' in part]
        if not parts:
            fail(target, 'the command that links it is not understood')
        return shlex.split(parts[0])

    def prepare(self, tests):
        """Runs what those tests need to have run before."""
        required = {name for test in tests for name in properties_of(test).get('FIXTURES_REQUIRED', [])}
        setups = [re.escape(test['name']) for test in self.tests
                  if required & set(properties_of(test).get('FIXTURES_SETUP', []))]
        if setups:
            output_of(['ctest', '--test-dir', self.folder, '-R', f'^({"|".join(setups)})$'])


def properties_of(test):
    return {each['name']: each['value'] for each in test.get('properties', [])}


def environment_of(test):
    return dict(each.split('=', 1) for each in properties_of(test).get('ENVIRONMENT', []))


def patterns_of(test):
    """Of the tests of GoogleTest that a test of ctest runs."""
    return [argument.partition('=')[2] for argument in test['command'] if argument.startswith('--gtest_filter=')]


class Mutated:
    """The programs of a build with mutants in them."""

    def __init__(self, build, area, work, jobs):
        self.build, self.area, self.work, self.jobs = build, area, work, jobs
        self.uncompiled = []

    def path_of(self, target):
        return os.path.join(self.work, 'bin', os.path.basename(target))

    def _object_of(self, path):
        return os.path.join(self.work, 'objects', path + '.o')

    def make(self, chosen):
        """Compiles and links; mutants that do not compile are taken out."""
        by_path = {}
        for mutant in chosen:
            by_path.setdefault(mutant.path, []).append(mutant)
        with concurrent.futures.ThreadPoolExecutor(self.jobs) as pool:
            support = [pool.submit(self._compile_support, name) for name in ('Mutant', 'ReachedByTests')]
            for taken_out in pool.map(self._compile, by_path, by_path.values()):
                self.uncompiled += taken_out
            for each in support:
                each.result()
        for target in self.build.links:
            self._link(target, by_path)

    def _compile_support(self, name):
        target = self._object_of(name)
        os.makedirs(os.path.dirname(target), exist_ok=True)
        output_of(['c++', '-std=c++17', '-fPIC', f'-I{TREE}', '-c', os.path.join(SUPPORT, f'{name}.cpp'), '-o', target])

    def _command(self, path, mutated, target):
        command = list(self.build.compiles[path][1])
        if '-include' in command:  # the precompiled header is of other options; the sources include what they use
            position = command.index('-include')
            del command[position:position + 2]
        command[command.index('-o') + 1] = target
        command[command.index('-c') + 1] = mutated
        sources = os.path.join(self.work, 'sources')
        return command + ['-O0', '-g0', '-w', '-Wno-error', '-Wno-narrowing', f'-I{TREE}',
                          '-include', os.path.join(SUPPORT, 'Mutant.h'), f'-fmacro-prefix-map={sources}/=',
                          '-iquote', os.path.dirname(os.path.join(self.build.tree, path))]

    def _compile(self, path, chosen):
        source = read(os.path.join(self.build.tree, path))
        mutated, target = os.path.join(self.work, 'sources', path), self._object_of(path)
        os.makedirs(os.path.dirname(target), exist_ok=True)
        taken_out = []
        while True:
            remaining = [mutant for mutant in chosen if mutant not in taken_out]
            write_if_changed(mutated, mutants.with_mutants(source, remaining))
            if os.path.exists(target) and os.path.getmtime(target) > os.path.getmtime(mutated):
                return taken_out
            result = subprocess.run(self._command(path, mutated, target), cwd=self.build.folder, capture_output=True,
                                    text=True)
            if result.returncode == 0:
                return taken_out
            if not remaining:
                fail(path, 'does not compile without mutants')
            taken_out += culprits(result.stderr, mutated, source, remaining)

    def _link(self, target, by_path):
        command = list(self.build.links[target])
        replaced = {self.build.compiles[path][0]: self._object_of(path) for path in by_path}
        command = [replaced.get(argument, argument) for argument in command]
        position = command.index('-o')
        command[position + 1] = self.path_of(target)
        command.insert(position, self._object_of('Mutant'))
        if target == self.area.program:
            command.insert(position, self._object_of('ReachedByTests'))
        os.makedirs(os.path.dirname(self.path_of(target)), exist_ok=True)
        output_of(command, self.build.folder)


def culprits(errors, path, source, remaining):
    """The mutants on the lines that the compiler complains about."""
    lines = {int(line) for line in re.findall(
        rf'^{re.escape(path)}:(\d+):\d+: +(?:fatal error|error|required from)', errors, re.MULTILINE)}
    found = []
    for mutant in remaining:
        first = source.count('\n', 0, min(edit[0] for edit in mutant.edits)) + 1
        last = source.count('\n', 0, max(edit[1] for edit in mutant.edits)) + 1
        if any(first <= line <= last for line in lines) and not mutant.relaxes or mutant.line in lines:
            found.append(mutant)
    return found or [mutant for mutant in remaining if mutant.relaxes] or remaining


class GoogleTests:
    """The tests of the area's program, which know which mutants they reach."""

    def __init__(self, mutated, timeout):
        build, self._timeout, self._memory = mutated.build, timeout, mutated.area.memory
        original = os.path.join(build.folder, mutated.area.program)
        listed = [test for test in build.tests if original in test.get('command', [])]
        if not listed:
            fail(mutated.area.program, 'no tests in the build folder')
        build.prepare(listed)
        command = listed[0]['command']
        self._setups = {pattern for test in listed if properties_of(test).get('FIXTURES_SETUP')
                        for pattern in patterns_of(test)}
        self._command = [*command[:command.index(original)], mutated.path_of(mutated.area.program)]
        self._environment = environment_of(listed[0])
        self._folder = os.path.dirname(original)
        self._durations, self._reaching = {}, {}
        self._apart = mutated.area.apart
        self.failing = 0
        filters = ['*']
        if self._apart:
            filters = [pattern for test in listed for pattern in patterns_of(test)]
        with concurrent.futures.ThreadPoolExecutor(mutated.jobs) as pool:
            maps = [os.path.join(mutated.work, 'maps', str(index)) for index in range(len(filters))]
            for path, output in zip(maps, pool.map(self._make_map, maps, filters)):
                self._read_map(path, output)

    def _make_map(self, path, pattern):
        write_if_changed(path, '')
        status, output = self._run_program([pattern], [f'--gtest_filter={pattern}'], {'TELIX_MUTANTS_MAP': path}, 3600)
        write_if_changed(f'{path}.log', output)
        if status not in (0, 1) and not self._apart:
            fail(self._command[-1], f'ends with {status} without a mutant, see {path}.log')
        return output

    def _read_map(self, path, output):
        first, *rest = (line.split() for line in read(path).splitlines() or ['* 0'])
        for name, milliseconds, *numbers in rest:
            self._durations[name] = int(milliseconds) / 1000
            for number in {*numbers, *first[2:]}:
                self._reaching.setdefault(int(number), []).append(name)
        self.failing += len(re.findall(r'^\[ RUN ', output, re.MULTILINE)) - len(rest)

    def __len__(self):
        return len(self._durations)

    def reaching(self, number):
        return sorted(self._reaching.get(number, []), key=self._durations.get)

    def _batches(self, tests):
        if self._apart:
            return [[test] for test in tests]
        sums, total = {}, 0
        for test in tests:
            total += self._durations[test]
            batch = next(index for index, limit in enumerate(BATCH_SECONDS) if total <= limit)
            sums.setdefault(batch, []).append(test)
        return sums.values()

    def _run(self, tests, environment):
        with tempfile.NamedTemporaryFile('w', suffix='.flags') as flags:
            flags.write(f'--gtest_filter={":".join(tests)}\n')
            flags.flush()
            seconds = self._timeout + 10 * sum(self._durations[test] for test in tests)
            return self._run_program(tests, [f'--gtest_flagfile={flags.name}', '--gtest_fail_fast'], environment, seconds)

    def _run_program(self, tests, arguments, environment, seconds):
        """What sets up a fixture for other tests does it again, in a cache of its own."""
        is_setup = any(fnmatch.fnmatchcase(test, setup) or fnmatch.fnmatchcase(setup, test)
                       for test in tests for setup in self._setups)
        with tempfile.TemporaryDirectory() as cache:
            *wrapper, program = self._command
            replaced = ['env', f'XDG_CACHE_HOME={cache}'] if is_setup else []
            return run_bounded([*wrapper, *replaced, program, *arguments], {**self._environment, **environment},
                               self._folder, seconds, self._memory)

    def verdict(self, number):
        """What the tests that reach a mutant say. A test counts if it fails with the mutant when it runs alone, as ctest
        runs it, and passes without."""
        excluded = set()
        for batch in self._batches(self.reaching(number)):
            while batch := [test for test in batch if test not in excluded]:
                status, output = self._run(batch, {'TELIX_MUTANT': str(number)})
                if status == 0:
                    break
                started = re.findall(r'^\[ RUN      \] (\S+)', output, re.MULTILINE)
                failed = re.findall(r'^\[  FAILED  \] (\S+) \(\d+ ms\)$', output, re.MULTILINE)
                test = (failed or started or batch)[-1]
                fails = status is None or self._run([test], {'TELIX_MUTANT': str(number)})[0] != 0
                if fails and self._run([test], {})[0] == 0:
                    return (TIMED_OUT if status is None else CAUGHT), test
                excluded.add(test)
        return SURVIVED, ''


class OtherTests:
    """Tests that use the area's libraries."""

    def __init__(self, mutated, timeout):
        self._mutated, self._timeout = mutated, timeout
        self._tests = {test['name']: test for test in mutated.build.tests if mutated.area.tests.fullmatch(test['name'])}
        mutated.build.prepare(self._tests.values())
        self._durations, self._reaching = {}, {}
        self.failing = 0
        for name in self._tests:
            self._read_reached(name)

    def __len__(self):
        return len(self._durations)

    def _read_reached(self, name):
        with tempfile.NamedTemporaryFile() as reached:
            reached.truncate(MAX_MUTANTS)
            begin = time.monotonic()
            status, output = self._run(name, {'TELIX_MUTANTS_REACHED': reached.name}, 600)
            if status != 0:
                write_if_changed(os.path.join(self._mutated.work, f'{name}.log'), output)
                self.failing += 1
                return
            self._durations[name] = time.monotonic() - begin
            for number, byte in enumerate(reached.read()):
                if byte:
                    self._reaching.setdefault(number, []).append(name)

    def reaching(self, number):
        return sorted(self._reaching.get(number, []), key=self._durations.get)

    def _redirected(self, argument):
        """The argument with the mutated libraries, also where it is a script that names them."""
        for library in self._mutated.area.libraries:
            mutated = self._mutated.path_of(library)
            original = os.path.join(self._mutated.build.folder, library)
            argument = argument.replace(original, mutated)
            if os.path.isfile(argument) and argument.startswith(self._mutated.build.folder):
                with open(argument, 'rb') as file:
                    script = file.read() if file.read(2) == b'#!' else b''
                if os.path.dirname(original).encode() in script:
                    argument = self._script(argument, os.path.dirname(original), os.path.dirname(mutated))
        return argument

    def _script(self, path, original, mutated):
        copy = os.path.join(self._mutated.work, 'scripts', os.path.basename(path))
        write_if_changed(copy, read(path).replace(original, mutated))
        os.chmod(copy, 0o755)
        return copy

    def _run(self, name, environment, seconds):
        test = self._tests[name]
        command = [self._redirected(argument) for argument in test['command']]
        settings = {key: self._redirected(value) for key, value in environment_of(test).items()}
        folder = properties_of(test).get('WORKING_DIRECTORY', self._mutated.build.folder)
        return run_bounded(command, {**settings, **environment}, folder, seconds, self._mutated.area.memory)

    def verdict(self, number):
        for name in self.reaching(number):
            seconds = self._timeout + 5 * self._durations[name]
            status, _ = self._run(name, {'TELIX_MUTANT': str(number)}, seconds)
            if status != 0 and self._run(name, {}, seconds)[0] == 0:
                return (TIMED_OUT if status is None else CAUGHT), name
        return SURVIVED, ''


def change_of(mutant, source):
    """Path, head of the function, and the changed lines before and after with a line around them: what names a mutant,
    whatever its line number is."""
    heads = [line for line in source.splitlines()[:mutant.line] if re.match(r'\w.*\(', line)]
    lines = mutant.diff(source).splitlines()[3:]
    texts = (' '.join(line[1:] for line in lines if line.startswith((' ', sign))) for sign in '-+')
    return (mutant.path, heads[-1] if heads else '', *(' '.join(text.split()) for text in texts))


def read_equivalent(path):
    try:
        with open(path, 'rb') as file:
            listed = tomllib.load(file).get('mutant', [])
            return {(each['path'], each['function'], each['before'], each['after']) for each in listed}
    except OSError as error:
        fail(path, error.strerror)
    except (tomllib.TOMLDecodeError, KeyError) as error:
        fail(path, f'not a list of mutants, {error}')


class Results:
    """The verdicts of a run, in a file after each of them."""

    def __init__(self, path, again):
        self._path, self._again = path, again
        self._known = json.loads(read(path)) if os.path.exists(path) else {}
        self._verdicts = {}

    @staticmethod
    def _key(mutant):
        return f'{mutant.path}:{mutant.start}:{mutant.end}:{mutant.text}'

    def is_uncompiled(self, mutant):
        return self._known.get(self._key(mutant), [''])[0] == UNCOMPILED

    def is_done(self, mutant):
        """With --again, what has been caught before is not run again."""
        known = self._known.get(self._key(mutant))
        if self._again and known and known[0] in (CAUGHT, TIMED_OUT):
            self._verdicts[self._key(mutant)] = known
            return True
        return False

    def add(self, mutant, verdict, test=''):
        self._verdicts[self._key(mutant)] = [verdict, test]
        write_if_changed(self._path, json.dumps({**self._known, **self._verdicts}, indent=1))

    def verdict(self, mutant):
        return self._verdicts[self._key(mutant)][0]

    def counts(self):
        values = [verdict for verdict, _ in self._verdicts.values()]
        return {verdict: values.count(verdict) for verdict in (CAUGHT, TIMED_OUT, SURVIVED, UNREACHED, EQUAL, UNCOMPILED)}


def mutants_of(arguments):
    """Of a source. They are kept in a file until the source or its command changes."""
    tree, work, path, command = arguments
    source = read(os.path.join(tree, path))
    kept = os.path.join(work, 'found', f'{path}.pickle')
    if os.path.exists(kept):
        with open(kept, 'rb') as file:
            of, found = pickle.load(file)
        if of == (source, command):
            return found
    flags = [argument for argument in command if re.match(r'-(D|I|std)', argument)]
    flags += [part for index, argument in enumerate(command) if argument == '-isystem'
              for part in command[index:index + 2]]
    found = mutants.find(os.path.join(tree, path), source, flags)
    for mutant in found:
        mutant.path = path
    os.makedirs(os.path.dirname(kept), exist_ok=True)
    with open(kept, 'wb') as file:
        pickle.dump(((source, command), found), file)
    return found


def find_all(build, work, paths, jobs):
    work = [(build.tree, work, path, build.compiles[path][1]) for path in paths]
    with concurrent.futures.ProcessPoolExecutor(jobs) as pool:
        try:
            return [mutant for found in pool.map(mutants_of, work) for mutant in found]
        except ValueError as error:
            fail('clang', str(error))


def judge(mutant, suites, source, equivalent):
    if change_of(mutant, source) in equivalent:
        return EQUAL, ''
    verdict, test = UNREACHED, ''
    for suite in suites:
        if suite.reaching(mutant.number):
            verdict, test = suite.verdict(mutant.number)
        if verdict in (CAUGHT, TIMED_OUT):
            break
    return verdict, test


def run_all(chosen, suites, sources, results, equivalent, jobs):
    remaining = [mutant for mutant in chosen if not results.is_done(mutant)]
    with concurrent.futures.ThreadPoolExecutor(jobs) as pool:
        running = {pool.submit(judge, mutant, suites, sources[mutant.path], equivalent): mutant
                   for mutant in remaining}
        try:
            for done, future in enumerate(concurrent.futures.as_completed(running), 1):
                mutant = running[future]
                results.add(mutant, *future.result())
                print(f'{done}/{len(remaining)} {mutant.path}:{mutant.line}: {mutant.kind}: {results.verdict(mutant)}',
                      flush=True)
        except KeyboardInterrupt:
            pool.shutdown(cancel_futures=True)
            sys.exit(130)


def report(chosen, sources, results):
    open_ones = [mutant for mutant in chosen if results.verdict(mutant) in (SURVIVED, UNREACHED)]
    for mutant in open_ones:
        print(f'\n{mutant.path}:{mutant.line}: {mutant.kind}: {results.verdict(mutant)}')
        print(mutant.diff(sources[mutant.path]))
    counts = results.counts()
    valid = sum(counts.values()) - counts[EQUAL] - counts[UNCOMPILED]
    caught = counts[CAUGHT] + counts[TIMED_OUT]
    print('\n' + ', '.join(f'{count} {verdict}' for verdict, count in counts.items()))
    print(f'noticed: {caught} of {valid}' + (f', {100 * caught / valid:.1f} %' if valid else ''))
    return 1 if open_ones else 0


def parse_arguments():
    def number(text):
        if not re.fullmatch(r'[0-9]{1,5}', text):
            fail(text, 'not a whole number')
        return int(text)

    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.error = lambda message: fail('arguments', message)
    parser.add_argument('area', metavar='AREA', help=', '.join(AREAS))
    parser.add_argument('--build', default='build', help='build folder, build by default')
    parser.add_argument('--count', type=number, default=200, help='mutants, 200 by default; 0: all')
    parser.add_argument('--seed', type=number, default=1, help='which ones are chosen, 1 by default')
    parser.add_argument('--file', metavar='PATTERN', default='', help='only sources whose path matches')
    parser.add_argument('--jobs', type=number, default=1, help='processes at a time, 1 by default')
    parser.add_argument('--timeout', type=number, default=30,
                        help='seconds that tests may take beyond ten times their usual duration, 30 by default')
    parser.add_argument('--equivalent', metavar='FILE', default=EQUIVALENT,
                        help='mutants that no test can notice, with the reason, tests/mutation/equivalent.toml by default')
    parser.add_argument('--again', action='store_true', help='do not run those that an earlier run caught')
    arguments = parser.parse_args()
    if arguments.area not in AREAS:
        fail(arguments.area, f'unknown area, expected {", ".join(AREAS)}')
    return arguments


def choose(build, work, arguments):
    try:
        pattern = re.compile(arguments.file)
    except re.error as error:
        fail(arguments.file, f'not a pattern, {error}')
    paths = [path for path in sorted(build.compiles) if pattern.search(path)]
    if not paths:
        fail(arguments.file, 'no such source in the area')
    found = find_all(build, work, paths, max(arguments.jobs, 1))
    count = min(arguments.count or len(found), len(found))
    if count > MAX_MUTANTS:
        fail(str(count), f'too many mutants for a build, {MAX_MUTANTS} are possible')
    # In the order in which they were found, the outer ones first, as those with the same extent have to be numbered.
    chosen = [found[index] for index in sorted(random.Random(arguments.seed).sample(range(len(found)), count))]
    print(f'{count} of {len(found)} mutants in {len(paths)} sources')
    for index, mutant in enumerate(chosen):
        mutant.number = index
    return chosen


def interrupt(*_):
    raise KeyboardInterrupt


def main():
    signal.signal(signal.SIGTERM, interrupt)  # a running test ends before
    arguments = parse_arguments()
    area = AREAS[arguments.area]
    equivalent = read_equivalent(arguments.equivalent)
    build = Build(arguments.build, area)
    work = os.path.join(build.folder, 'mutation', arguments.area)
    chosen = choose(build, work, arguments)
    sources = {path: read(os.path.join(build.tree, path)) for path in {mutant.path for mutant in chosen}}
    results = Results(os.path.join(work, 'results.json'), arguments.again)
    mutated = Mutated(build, area, work, max(arguments.jobs, 1))
    mutated.uncompiled = [mutant for mutant in chosen if results.is_uncompiled(mutant)]
    mutated.make([mutant for mutant in chosen if mutant not in mutated.uncompiled])
    for mutant in mutated.uncompiled:
        results.add(mutant, UNCOMPILED)
    suites = [GoogleTests(mutated, arguments.timeout), OtherTests(mutated, arguments.timeout)]
    print(f'{sum(map(len, suites))} tests; {sum(suite.failing for suite in suites)} more fail without a mutant')
    compiled = [mutant for mutant in chosen if mutant not in mutated.uncompiled]
    run_all(compiled, suites, sources, results, equivalent, max(arguments.jobs, 1))
    sys.exit(report(compiled, sources, results))


if __name__ == '__main__':
    main()
