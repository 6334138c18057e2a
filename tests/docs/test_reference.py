"""The reference for authors of pages: agrees with the plug-in, is up to date, and describes the demonstration's objects.

The environment names telix_script_tables (TELIX_SCRIPT_TABLES), the tree (TELIX_SOURCE) and the TypeScript compiler
(TELIX_TSC)."""

import glob
import json
import os
import re
import subprocess
import sys
import tempfile
import tomllib
import unittest

SOURCE = os.environ['TELIX_SOURCE']
TABLES = os.environ['TELIX_SCRIPT_TABLES']
API = os.path.join(SOURCE, 'docs', 'api')
HERE = os.path.dirname(os.path.abspath(__file__))
LIMIT = 300  # seconds; reached only if a test fails

# Where a DOM event is named in the sources.
EVENT = re.compile(r'(?:dispatchDomEvent\(|domEventScript\([^"\n]*|carrying<\w+>\(|eventType)\{?"(\w+)"'
                   r'|\{"(\w+)", deliver')


def read(*path):
    with open(os.path.join(SOURCE, *path), encoding='utf-8') as file:
        return file.read()


def make_reference(*arguments):
    return subprocess.run([sys.executable, '-B', os.path.join(SOURCE, 'tools', 'make_reference.py'), TABLES, *arguments],
                          capture_output=True, text=True, timeout=LIMIT)


class Reference(unittest.TestCase):
    def test_is_up_to_date(self):
        result = make_reference('--check')
        self.assertEqual((result.returncode, result.stderr), (0, ''))

    def test_has_every_wrapper_class(self):
        tables = subprocess.run([TABLES], capture_output=True, check=True, timeout=LIMIT).stdout
        headers = glob.glob(os.path.join(SOURCE, 'src', '*', 'JS*.h'))
        classes = {name for path in headers
                   for name in re.findall(r'^class (JS\w+) final', read(path), re.MULTILINE)}
        self.assertGreater(len(classes), 20)
        self.assertEqual({each['class'] for each in json.loads(tables)}, classes)

    def test_names_the_dom_events_of_the_sources(self):
        described = {}  # by folder
        for page in tomllib.loads(read('docs', 'api', 'names.toml'))['page']:
            for each in page['object']:
                folder = os.path.dirname(glob.glob(os.path.join(SOURCE, 'src', '*', each['class'] + '.h'))[0])
                described.setdefault(folder, set()).update(each.get('events', []))
        for folder, events in described.items():
            found = {first or second for path in glob.glob(os.path.join(folder, '*.cpp'))
                     for first, second in EVENT.findall(read(path))}
            self.assertEqual(events, found, folder)
        self.assertEqual(len(set().union(*described.values())), 14)


class Faults(unittest.TestCase):
    """Each way in which prose and tables can part is an error."""

    def check(self, old, new):
        text = read('docs', 'api', 'names.toml')
        self.assertIn(old, text)
        with tempfile.NamedTemporaryFile('w', suffix='.toml', encoding='utf-8') as names:
            names.write(text.replace(old, new, 1))
            names.flush()
            result = make_reference('--check', '--names', names.name)
        self.assertEqual(result.returncode, 1)
        return result.stderr

    def expect_fault(self, old, new, fault):
        self.assertIn(f'make_reference.py: {fault}\n', self.check(old, new))

    def test_a_name_without_prose(self):
        self.expect_fault("stop = ['(): void', 'Stops the presentation.']", '', 'VideoBroadcast.stop: no prose')

    def test_prose_without_a_name(self):
        self.expect_fault('preferredAudioLanguage = ', 'preferredLanguage = ',
                          'Configuration.preferredLanguage: no such member')

    def test_a_class_without_prose(self):
        self.expect_fault("class = 'JSDRMAgent'", "class = 'JSAgent'", 'JSDRMAgent: no prose')

    def test_another_type_of_a_property(self):
        self.expect_fault("onid = ['number'", "onid = ['string'", 'Channel.onid: gives number, described as string')

    def test_a_string_that_would_never_be_null(self):
        self.expect_fault("ccid = ['string | null'", "ccid = ['string'", 'Channel.ccid: gives string, described as string')

    def test_another_type_of_a_written_value(self):
        # Only its writer states a type.
        self.expect_fault("data = ['string | null'", "data = ['number'",
                          'AVControl.data: written as string, described as number')

    def test_other_arguments(self):
        self.expect_fault('(milliseconds: number): boolean', '(milliseconds: string): boolean',
                          "AVControl.seek: takes ['number'], described as ['(milliseconds: string): boolean']")

    def test_another_result(self):
        self.expect_fault('(volume: number): boolean', '(volume: number): void',
                          'AVControl.setVolume: gives boolean, described as void')

    def test_an_unknown_type(self):
        self.expect_fault('(): ChannelConfig | null', '(): Channels | null',
                          'VideoBroadcast.getChannelConfig: unknown type Channels')

    def test_another_kind(self):
        self.expect_fault("RED = 'The red key.'", "RED = ['number', 'The red key.']",
                          'Keyset.RED: a constant is described as something else')
        self.expect_fault("hide = ['(): void'", "hide = ['boolean'", 'Application.hide: a method has signatures')

    def test_a_member_listed_as_missing(self):
        self.expect_fault("missing = ['localSystem']", "missing = ['keyset']", 'OipfConfiguration.keyset: listed as missing')

    def test_a_quirk_that_is_not_there(self):
        self.expect_fault('quirk 39', 'quirk 939', 'ParentalRatingScheme.threshold: no quirk 939')

    def test_a_stale_file(self):
        self.expect_fault('Stops the presentation.', 'Ends the presentation.',
                          'video-broadcast.md: stale, run tools/make_reference.py')


class TypeScript(unittest.TestCase):
    """The compiler checks scripts against the declarations."""

    def compile(self, *scripts):
        with tempfile.TemporaryDirectory() as folder:
            examples = os.path.join(folder, 'examples.js')
            result = make_reference('--check', '--examples', examples)
            self.assertEqual(result.returncode, 0, result.stderr)
            options = {'allowJs': True, 'checkJs': True, 'noEmit': True, 'target': 'es5', 'lib': ['es2015', 'dom'],
                       'types': []}
            files = [os.path.join(API, 'telix.d.ts'), os.path.join(HERE, 'page.d.ts'), examples]
            for index, script in enumerate(scripts):
                if not os.path.isabs(script):  # the text of a script
                    path = os.path.join(folder, f'{index}.js')
                    with open(path, 'w', encoding='utf-8') as file:
                        file.write(script)
                    script = path
                files.append(script)
            configuration = os.path.join(folder, 'tsconfig.json')
            with open(configuration, 'w', encoding='utf-8') as file:
                json.dump({'compilerOptions': options, 'files': files}, file)
            result = subprocess.run([os.environ['TELIX_TSC'], '--project', configuration], capture_output=True, text=True,
                                    timeout=LIMIT)
            return result.returncode, result.stdout + result.stderr

    def test_the_demonstration_and_the_examples_fit_the_declarations(self):
        scripts = glob.glob(os.path.join(SOURCE, 'apps', 'demo', '*.js'))
        self.assertGreater(len(scripts), 9)
        self.assertEqual(self.compile(*scripts), (0, ''))

    def test_a_mistake_is_found(self):
        status, output = self.compile(
            'document.getElementById("video").setChannels(null);\n',
            'document.getElementById("player").seek("1");\n',
            'document.getElementById("player").playPosition = 1;\n',
            'document.getElementById("capabilities").extraSDVideoDecodes.length;\n')
        self.assertNotEqual(status, 0)
        for found in ("0.js(1,34): error TS2551: Property 'setChannels' does not exist",
                      '1.js(1,40): error TS2345', '2.js(1,35): error TS2540', '3.js(1,61): error TS2339'):
            self.assertIn(found, output)


if __name__ == '__main__':
    unittest.main()
