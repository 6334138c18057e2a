#!/usr/bin/env python3
"""The Debian packages: built from the files of this tree, checked by lintian, installed into a fresh root, where the
demonstration has to show its picture, and removed without a trace. Needs root. Usage: test_packages.py [PACKAGE-FOLDER]

PACKAGE-FOLDER: the folder with the packages, which are built if they are not there; a temporary one by default.
Where mmdebstrap cannot make a root, for want of a network for example, the packages are installed over a copy of this
machine's."""

import contextlib
import glob
import os
import shutil
import subprocess
import sys
import tempfile
import unittest

TOP = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
PACKAGES = ('nptelixjs', 'nptelixjs-webkit', 'telix-tv', 'libtelix-dev')
BUILD_TIMEOUT = 3600
ROOT_TIMEOUT = 1800


def run(*command, timeout=ROOT_TIMEOUT, **options):
    return subprocess.run(command, stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True,
                          errors='replace', timeout=timeout, check=False, **options)


def must(*command, **options):
    result = run(*command, **options)
    if result.returncode != 0:
        raise AssertionError(f'{" ".join(command)}: status {result.returncode}\n{result.stdout[-4000:]}')
    return result.stdout


def build_packages(folder):
    """Builds them from a copy of the tree, which the build writes into."""
    source = os.path.join(folder, 'source')
    os.mkdir(source)
    files = subprocess.run(['git', '-C', TOP, 'ls-files', '-z'], check=True, capture_output=True).stdout
    archive = subprocess.run(['tar', '--null', '-T', '-', '-c'], cwd=TOP, input=files, check=True, capture_output=True)
    subprocess.run(['tar', '-x'], cwd=source, input=archive.stdout, check=True)
    must('dpkg-buildpackage', '-b', '-us', '-uc', cwd=source, timeout=BUILD_TIMEOUT)
    shutil.rmtree(source)


class Root:
    """A root of its own below `folder`. Its mounts are made for each command and seen by that command alone, so that nothing is
    left mounted when the folder is deleted."""

    def __init__(self, folder):
        self.path = os.path.join(folder, 'root')
        self.mounts = ''
        made = run('unshare', '--mount', 'mmdebstrap', '--variant=apt', '--include=xvfb,xauth', 'bookworm', self.path)
        if made.returncode != 0:
            print(f'mmdebstrap: {made.stdout.strip().splitlines()[-1]}\nThe root is a copy of this machine\'s.')
            self.copy_of_this_machine(folder)
        else:
            shutil.copy('/etc/resolv.conf', os.path.join(self.path, 'etc'))
            self.run('apt-get', 'update')

    def copy_of_this_machine(self, folder):
        """An overlay, whose changes are in `path`."""
        merged, work = os.path.join(folder, 'merged'), os.path.join(folder, 'work')
        shutil.rmtree(self.path, ignore_errors=True)
        for name in (self.path, merged, work):
            os.mkdir(name)
        os.makedirs(os.path.join(self.path, 'tmp'))
        os.chmod(os.path.join(self.path, 'tmp'), 0o1777)
        self.mounts = f'mount -t overlay overlay -o lowerdir=/,upperdir={self.path},workdir={work} {merged}; cd {merged}; '

    def run(self, *command):
        environment = {'PATH': '/usr/sbin:/usr/bin:/sbin:/bin', 'HOME': '/tmp', 'LC_ALL': 'C.UTF-8',
                       'DEBIAN_FRONTEND': 'noninteractive'}
        script = f'{self.mounts}for name in proc dev sys; do mount --rbind /$name $name; done; exec chroot . "$@"'
        return must('unshare', '--mount', 'sh', '-euc', script, 'sh', *command, cwd=self.path, env=environment)

    def files(self):
        """Those where packages install any, but not what package tools keep for themselves."""
        found = self.run('find', '/etc', '/opt', '/usr', '/var', '-ignore_readdir_race')
        own = ('/var/lib/dpkg/', '/var/lib/apt/', '/var/cache/', '/var/log/')
        return {file for file in found.splitlines() if not file.startswith(own)}

    def copy_in(self, files):
        for file in files:
            shutil.copy(file, os.path.join(self.path, 'tmp'))
        return [os.path.join('/tmp', os.path.basename(file)) for file in files]


class Packages(unittest.TestCase):
    folder = None

    @classmethod
    def setUpClass(cls):
        cls.stack = contextlib.ExitStack()
        cls.addClassCleanup(cls.stack.close)
        cls.work = cls.stack.enter_context(tempfile.TemporaryDirectory())
        cls.folder = cls.folder or cls.work
        os.makedirs(cls.folder, exist_ok=True)
        if not glob.glob(os.path.join(cls.folder, '*.deb')):
            build_packages(cls.folder)

    def package(self, name):
        found = glob.glob(os.path.join(self.folder, f'{name}_*.deb'))
        self.assertEqual(len(found), 1, found)
        return found[0]

    def test_lintian_finds_no_error(self):
        changes = glob.glob(os.path.join(self.folder, '*.changes'))
        print(must('lintian', '--allow-root', '--fail-on', 'error', *changes))

    def test_the_packages_are_installed_work_and_go_without_a_trace(self):
        root = Root(self.work)
        files = root.copy_in([self.package(name) for name in PACKAGES])
        # First what they need, so that only they are removed in the end.
        root.run('apt-get', 'install', '-y', '--no-install-recommends', *files)
        root.run('apt-get', 'purge', '-y', *PACKAGES)
        before = root.files()
        root.run('dpkg', '-i', *files)
        with self.subTest('demonstration'):
            self.check_demonstration(root)
        with self.subTest('tools'):
            self.check_tools(root)
        root.run('dpkg', '--purge', *PACKAGES)
        self.assertEqual(root.files() - before, set())

    def check_demonstration(self, root):
        root.run('xvfb-run', '-a', '-s', '-screen 0 1280x720x24', 'telix-demo', '--wait-for-picture', '--timeout', '120',
                 '--screenshot', '/tmp/demonstration.png')
        shutil.copy(os.path.join(root.path, 'tmp', 'demonstration.png'), self.folder)
        colours = root.run('ffmpeg', '-v', 'error', '-i', '/tmp/demonstration.png', '-vf', 'scale=8:8', '-f', 'rawvideo',
                           '-pix_fmt', 'gray', '/tmp/gray')
        self.assertEqual(colours, '')
        with open(os.path.join(root.path, 'tmp', 'gray'), 'rb') as file:
            shades = set(file.read())
        self.assertGreater(len(shades), 8, 'the screenshot has no picture')

    def check_tools(self, root):
        version = must('dpkg-deb', '-f', self.package('telix-tv'), 'Version').strip()
        for tool in ('telix-tv', 'telixctl'):
            self.assertIn(version, root.run('xvfb-run', '-a', tool, '--version'))
        root.run('telix-conformance', '--help')
        for file in ('/usr/include/telix/telix_platform.h', '/usr/share/doc/nptelixjs/docs/channel-change.md'):
            self.assertTrue(os.path.exists(root.path + file), file)


if __name__ == '__main__':
    if len(sys.argv) > 1:
        Packages.folder = os.path.abspath(sys.argv.pop(1))
    if os.getuid() != 0:
        print('test_packages.py: cannot make a root of its own: not the user root', file=sys.stderr)
        sys.exit(2)
    unittest.main()
