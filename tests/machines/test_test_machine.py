"""What tools/test-machine.sh and tools/cross-toolchain.cmake refuse."""

import os
import shutil
import subprocess
import tempfile
import unittest

TOOLS = os.path.join(os.path.abspath(__file__).rsplit('/tests/', 1)[0], 'tools')


def run(*command):
    return subprocess.run(command, check=False, stdin=subprocess.DEVNULL, capture_output=True, text=True, timeout=60)


class InATreeOfItsOwn(unittest.TestCase):
    def setUp(self):
        context = tempfile.TemporaryDirectory()
        self.tree = context.__enter__()
        self.addCleanup(context.__exit__, None, None, None)
        os.mkdir(os.path.join(self.tree, 'tools'))
        self.script = shutil.copy(os.path.join(TOOLS, 'test-machine.sh'), os.path.join(self.tree, 'tools'))
        self.build = os.path.join(self.tree, 'build')

    def assert_ends(self, result, status, reason):
        self.assertEqual((result.returncode, result.stdout), (status, ''), result)
        self.assertRegex(result.stderr, r'\Atest-machine\.sh: [^\n]*\n\Z')
        self.assertIn(reason, result.stderr)
        self.assertFalse(os.path.exists(self.build))

    def test_too_few_arguments_are_refused(self):
        for arguments in ((), ('armhf',)):
            self.assert_ends(run(self.script, *arguments), 2, 'usage: ')

    def test_without_a_sysroot_the_tests_are_skipped_with_the_reason(self):
        self.assert_ends(run(self.script, 'armhf', self.build), 77,
                         'skipped: build-sysroots/armhf: no such sysroot, make it with tools/make-sysroot.sh armhf')

    def test_a_half_made_sysroot_is_not_skipped(self):
        sysroot = os.path.join(self.tree, 'build-sysroots', 'armhf')
        os.makedirs(sysroot)
        self.assertNotIn(run(self.script, 'armhf', self.build).returncode, (0, 77))
        self.assertEqual(os.listdir(sysroot), [])


class Toolchain(unittest.TestCase):
    def reason(self, **settings):
        arguments = [f'-D{name}={value}' for name, value in settings.items()]
        result = run('cmake', *arguments, '-P', os.path.join(TOOLS, 'cross-toolchain.cmake'))
        self.assertNotEqual(result.returncode, 0)
        return ' '.join(result.stderr.split())

    def test_an_unknown_machine_is_refused(self):
        self.assertIn('TELIX_MACHINE: armel: expected armhf, arm64, i386 or mipsel', self.reason(TELIX_MACHINE='armel'))

    def test_a_half_made_sysroot_is_refused(self):
        with tempfile.TemporaryDirectory() as sysroot:
            self.assertIn(f'TELIX_SYSROOT: {sysroot}: no complete sysroot',
                          self.reason(TELIX_MACHINE='mipsel', TELIX_SYSROOT=sysroot))


if __name__ == '__main__':
    unittest.main()
