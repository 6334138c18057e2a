"""What tools/mutate.py does to sources, and what it says of tests."""

import os
import subprocess
import sys
import tempfile
import textwrap
import unittest

TREE = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
TOOL = os.path.join(TREE, 'tools', 'mutate.py')
sys.path.insert(0, os.path.dirname(TOOL))
import mutants  # noqa: E402

STANDARD = ['-std=c++17']


def found_in(source):
    return mutants.find('/source.cpp', textwrap.dedent(source), STANDARD)


def changes(source, kind=''):
    """The text that each mutant of that kind leaves instead of what it changes."""
    source = textwrap.dedent(source)
    return [(source[each.start:each.end], each.text) for each in mutants.find('/source.cpp', source, STANDARD)
            if each.kind.startswith(kind)]


class Found(unittest.TestCase):
    def test_statements_are_dropped(self):
        self.assertEqual(changes('''\
            void g(); void f(int* p) { g(); ++*p; *p = p[0]; delete p; for (;;) { break; } return; }
            ''', 'drop statement'),
            [('g();', ''), ('++*p;', ''), ('*p = p[0];', ''), ('delete p;', ''), ('break;', ''), ('return;', '')])

    def test_conditions_are_decided_but_no_loop_goes_on_for_ever(self):
        self.assertEqual(changes('void f(bool a, bool b) { if (a) { f(b, a); } }', 'condition'),
                         [('a', 'false'), ('a', 'true')])
        for loop in ('while (a) {}', 'do {} while (a);', 'for (; a;) {}'):
            self.assertEqual(changes(f'void f(bool a) {{ {loop} }}', 'condition'), [('a', 'false')])
        self.assertEqual(changes('int g(); int f() { if (int a = g()) { return a; } return 1; }', 'condition'),
                         [('int a = g()', 'int a = g(); false')])

    def test_an_else_is_dropped(self):
        self.assertEqual(changes('int f(bool a, int b) { if (a) { b = 1; } else { b = 2; } return b; }', 'drop else'),
                         [('else { b = 2; }', '')])

    def test_operands_and_operators(self):
        self.assertEqual(changes('bool f(bool a, bool b) { return a && b; }', 'operand'), [('a', 'true'), ('b', 'true')])
        self.assertEqual(changes('bool f(bool a, bool b) { return a || b; }', 'operand'), [('a', 'false'), ('b', 'false')])
        self.assertEqual(changes('bool f(int a, int b) { return a < b; }', '<'), [('a < b', 'a <= b')])
        self.assertEqual(changes('int f(int a, int b) { return a - b; }', '-'), [('a - b', 'a + b')])
        self.assertEqual(changes('''\
            struct S {}; bool operator==(const S&, const S&); bool f(S a, S b) { return a == b; }''', '=='),
            [('a == b', 'a != b')])
        self.assertEqual(changes('bool f(bool a) { return !a; }', 'drop negation'), [('!a', 'a')])

    def test_constants(self):
        self.assertEqual(changes('int f() { return 4; }', 'add'), [('4', '(4 + 1)')])
        self.assertEqual(changes('void f(int a) { switch (a) { case 1: f(2); } }', 'add'), [('2', '(2 + 1)')])
        self.assertEqual(changes('bool f() { return true; }', 'false'), [('true', 'false')])
        self.assertEqual(changes('const char* f() { return "a"; }', 'empty'), [('"a"', '""')])
        self.assertEqual(changes('enum { a = 1 }; static_assert(a == 1);'), [])

    def test_results(self):
        self.assertEqual(changes('int f(int a) { return a; }', 'return'), [('return a', 'return {}')])
        self.assertEqual(changes('enum E { kNone, kSome }; E f() { return kNone; }', 'return'), [])
        self.assertEqual(changes('int* f() { return nullptr; }', 'return'), [])

    def test_nothing_in_macros_and_no_log(self):
        self.assertEqual(changes('''\
            #define TWICE(a) ((a) + 2)
            #define PLUGIN_LOG(text) f(text)
            void f(const char*);
            int g(int b) { PLUGIN_LOG("b"); b = TWICE(b + 3); throw b; }
            '''), [('b = TWICE(b + 3);', '')])

    def test_offsets_are_of_characters(self):
        self.assertEqual(changes('// „ä“\nint f() { return 4; }', 'add'), [('4', '(4 + 1)')])

    def test_a_source_that_cannot_be_parsed(self):
        with self.assertRaisesRegex(ValueError, 'line 2'):
            found_in('\nint f( {')

    def test_a_diff(self):
        mutant = next(each for each in found_in('int f() {\n    return 4;\n}\n') if each.kind == 'add 1')
        self.assertEqual(mutant.diff('int f() {\n    return 4;\n}\n').splitlines()[3:],
                         [' int f() {', '-    return 4;', '+    return (4 + 1);', ' }'])


class Compiled(unittest.TestCase):
    """A program with all of its mutants does what it did, and what the diff of a mutant shows if that is on."""

    HEAD = '#include <cstdio>\n#include <string>\n'
    PROGRAM = textwrap.dedent('''\
        constexpr int kLimit = 10;
        static bool isLow(int value, bool strict) {
            return strict ? value < kLimit : value <= kLimit && !strict;
        }
        static std::string nameOf(int value) {
            if (const int rest = value % 7) {
                return std::string("rest ") + char('0' + rest);
            } else {
                puts("none");
            }
            return "whole";
        }
        void run() {
            for (int value = 8; value < 16; value += 2) {
                printf("%d %d %s\\n", isLow(value, true), isLow(value, false), nameOf(value).c_str());
            }
        }
        ''')

    @classmethod
    def setUpClass(cls):
        cls.folder = tempfile.TemporaryDirectory()
        cls.addClassCleanup(cls.folder.cleanup)
        source = cls.HEAD + cls.PROGRAM
        cls.mutants = mutants.find('/source.cpp', source, STANDARD)
        for number, mutant in enumerate(cls.mutants):
            mutant.number = number
        cls.lines = mutants.with_mutants(source, cls.mutants).splitlines()
        cls.mutated = cls.build('mutated', '\n'.join(cls.lines) + '\nint main() { run(); }', f'-I{TREE}', '-include',
                                f'{TREE}/tests/mutation/Mutant.h', f'{TREE}/tests/mutation/Mutant.cpp')
        texts = [source[:each.start] + each.text + source[each.end:] for each in cls.mutants] + [source]
        cls.written = cls.build('written', cls.HEAD + ''.join(
            f'namespace v{number} {{\n{text[len(cls.HEAD):]}}}\n' for number, text in enumerate(texts)) +
            f'int main(int, char** given) {{ void (*all[])() = '
            f'{{{", ".join(f"v{number}::run" for number in range(len(texts)))}}}; all[std::stoi(given[1])](); }}')

    @classmethod
    def build(cls, name, source, *options):
        program = os.path.join(cls.folder.name, name)
        with open(f'{program}.cpp', 'w', encoding='utf-8') as file:
            file.write(source)
        subprocess.run(['c++', '-std=c++17', '-w', f'{program}.cpp', *options, '-o', program], check=True)
        return program

    @staticmethod
    def output(*command, **environment):
        return subprocess.run(command, env=environment, capture_output=True, timeout=60).stdout

    def test_lines_stay_where_they_are(self):
        for number, line in enumerate((self.HEAD + self.PROGRAM).splitlines()):
            if line.startswith(('#', '}')):
                self.assertEqual(self.lines[number], line)
        self.assertIn('puts(', self.lines[(self.HEAD + self.PROGRAM).splitlines().index('        puts("none");')])

    def test_without_a_mutant_the_program_is_what_it_was(self):
        self.assertEqual(self.output(self.mutated), self.output(self.written, str(len(self.mutants))))

    def test_each_mutant_is_the_program_that_its_diff_shows(self):
        self.assertGreaterEqual(len(self.mutants), 30)
        for mutant in self.mutants:
            with self.subTest(mutant.diff(self.HEAD + self.PROGRAM)):
                number = str(mutant.number)
                self.assertEqual(self.output(self.mutated, TELIX_MUTANT=number), self.output(self.written, number))


PROJECT = '''
cmake_minimum_required(VERSION 3.25)
project(small CXX)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_CXX_STANDARD 17)
find_package(GTest REQUIRED)
include(GoogleTest)
enable_testing()
add_executable(telix_unit_tests src/sum.cpp tests.cpp)
set_target_properties(telix_unit_tests PROPERTIES RUNTIME_OUTPUT_DIRECTORY tests/unit)
target_link_libraries(telix_unit_tests PRIVATE GTest::gtest_main)
set(cache ${CMAKE_COMMAND} -E env XDG_CACHE_HOME=${CMAKE_CURRENT_BINARY_DIR}/cache)
set_target_properties(telix_unit_tests PROPERTIES CROSSCOMPILING_EMULATOR "${cache}")
gtest_discover_tests(telix_unit_tests TEST_FILTER -Made.* PROPERTIES ENVIRONMENT SMALL=1)
add_test(NAME made COMMAND telix_unit_tests --gtest_filter=Made.*)
set_tests_properties(made PROPERTIES FIXTURES_SETUP made)
'''
SUM = '''constexpr int kSize = 3;
int list[kSize] = {};
int sum(int a, int b) {
    return a + b;
}
void count(int& a) {
    while (a != 5) {
        ++a;
    }
}
int untested() {
    return list[0];
}
int same(int a) {
    if (a == 1) {
        return 1;
    }
    return a;
}
bool isBig(int a) {
    return a > 10;
}
int make() {
    return 7;
}
'''
TESTS = '''#include <gtest/gtest.h>
#include <fstream>
int sum(int a, int b);
void count(int& a);
int same(int a);
bool isBig(int a);
int make();
TEST(Sum, isThatOfBoth) { EXPECT_EQ(3, sum(1, 2)); }
TEST(Sum, hasTheEnvironmentOfTheTests) { EXPECT_STREQ("1", getenv("SMALL")); }
TEST(Sum, failsAlways) { EXPECT_EQ(0, sum(1, 2)); }
TEST(Count, ends) { int a = 4; count(a); EXPECT_EQ(5, a); }
TEST(Same, isTheNumber) { EXPECT_EQ(1, same(1)); EXPECT_EQ(2, same(2)); }
TEST(Big, isMoreThanTen) { EXPECT_TRUE(isBig(20)); EXPECT_FALSE(isBig(3)); }
TEST(Made, once) {
    const std::string path = std::string(getenv("XDG_CACHE_HOME")) + "/made";
    int made = 0;
    if (!(std::ifstream(path) >> made)) { made = make(); std::ofstream(path) << made; }
    EXPECT_EQ(7, made);
}
'''
EQUIVALENT = '''
[[mutant]]
path = "src/sum.cpp"
function = "int same(int a) {"
before = "int same(int a) { if (a == 1) { return 1;"
after = "int same(int a) { if (false) { return 1;"
reason = "the number itself is returned below"
'''


def run_tool(*arguments, **options):
    return subprocess.run([sys.executable, '-B', TOOL, *arguments], capture_output=True, text=True, **options)


class Run(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        folder = tempfile.TemporaryDirectory()
        cls.addClassCleanup(folder.cleanup)
        cls.tree = os.path.join(folder.name, 'tree')
        cls.build = os.path.join(folder.name, 'build')
        cls.files = {'CMakeLists.txt': PROJECT, 'src/sum.cpp': SUM, 'tests.cpp': TESTS, 'equivalent.toml': EQUIVALENT}
        os.makedirs(os.path.join(cls.tree, 'src'))
        for name, text in cls.files.items():
            with open(os.path.join(cls.tree, name), 'w', encoding='utf-8') as file:
                file.write(text)
        subprocess.run(['cmake', '-S', cls.tree, '-B', cls.build, '-G', 'Ninja'], check=True, stdout=subprocess.DEVNULL)
        os.mkdir(os.path.join(cls.build, 'cache'))
        with open(os.path.join(cls.build, 'cache', 'made'), 'w', encoding='utf-8') as file:
            file.write('7')
        cls.result = cls.run_all()

    @classmethod
    def run_all(cls, *arguments):
        return run_tool('plug-in', '--build', cls.build, '--count', '0', '--timeout', '3', '--equivalent',
                        os.path.join(cls.tree, 'equivalent.toml'), *arguments)

    def verdict(self, place):
        lines = [line for line in self.result.stdout.splitlines() if f'src/sum.cpp:{place}: ' in line and '/' in line]
        self.assertTrue(lines, f'{place} is not in:\n{self.result.stdout}{self.result.stderr}')
        return lines[0].rpartition(': ')[2]

    def test_a_mutant_that_a_test_notices(self):
        self.assertEqual(self.verdict('4: + becomes -'), 'caught')

    def test_a_mutant_in_what_has_been_made_before(self):
        self.assertEqual(self.verdict('24: add 1'), 'caught')

    def test_a_mutant_without_end(self):
        self.assertEqual(self.verdict('8: drop statement'), 'timed out')

    def test_a_mutant_that_no_test_reaches(self):
        self.assertEqual(self.verdict('12: return nothing'), 'not reached by a test')

    def test_a_mutant_that_no_test_notices(self):
        self.assertEqual(self.verdict('21: > becomes >='), 'survived')
        self.assertIn('-    return a > 10;\n+    return a >= 10;', self.result.stdout)
        self.assertEqual(self.result.returncode, 1)

    def test_a_mutant_that_is_listed_as_equivalent(self):
        self.assertEqual(self.verdict('15: condition is false'), 'equivalent')

    def test_a_mutant_that_does_not_compile_is_counted(self):
        self.assertIn('1 did not compile', self.result.stdout)

    def test_a_test_that_always_fails_does_not_count(self):
        self.assertIn('6 tests; 1 more fail without a mutant', self.result.stdout)

    def test_the_tree_is_as_it_was(self):
        found = {os.path.relpath(os.path.join(folder, name), self.tree)
                 for folder, _, names in os.walk(self.tree) for name in names}
        self.assertEqual(found, set(self.files))
        for name, text in self.files.items():
            with open(os.path.join(self.tree, name), encoding='utf-8') as file:
                self.assertEqual(file.read(), text)

    def test_again_runs_only_what_has_not_been_caught(self):
        again = self.run_all('--again')
        self.assertNotIn('+ becomes -: caught', again.stdout)
        self.assertEqual(again.stdout.splitlines()[-1], self.result.stdout.splitlines()[-1])


class BadInput(unittest.TestCase):
    def check(self, line, *arguments):
        result = run_tool(*arguments)
        self.assertEqual((result.returncode, result.stdout, result.stderr), (2, '', f'mutate.py: {line}\n'))

    def test_each_has_a_line(self):
        self.check('arguments: the following arguments are required: AREA')
        self.check('other: unknown area, expected plug-in, platform, bridge', 'other')
        self.check('-1: not a whole number', 'bridge', '--count=-1')
        self.check('many: not a whole number', 'bridge', '--seed', 'many')
        self.check('/absent: No such file or directory', 'bridge', '--equivalent', '/absent')
        self.check('/absent: not a build folder, there is no CMakeCache.txt', 'bridge', '--build', '/absent')


if __name__ == '__main__':
    unittest.main()
