"""tools/make-sysroot.sh with a package repository of its own: what it makes, and what it refuses."""

import os
import signal
import socket
import subprocess
import tempfile
import unittest

SCRIPT = os.path.join(os.path.abspath(__file__).rsplit('/tests/', 1)[0], 'tools', 'make-sysroot.sh')


class Repository:
    """The packages that the script asks for, with a file each, and with the links that Debian's have."""

    def __init__(self, folder, architecture, packages=('libc6-dev', 'libglib2.0-dev', 'libstdc++6')):
        self.folder = folder
        for package in packages:
            self.add(package, architecture)
        listing = subprocess.run(['dpkg-scanpackages', '--multiversion', '.'], cwd=folder, check=True,
                                 capture_output=True).stdout
        with open(os.path.join(folder, 'Packages'), 'wb') as file:
            file.write(listing)

    def add(self, package, architecture):
        root = os.path.join(self.folder, 'root')
        os.makedirs(os.path.join(root, 'DEBIAN'), exist_ok=True)
        os.makedirs(os.path.join(root, 'lib'), exist_ok=True)
        with open(os.path.join(root, 'DEBIAN', 'control'), 'w', encoding='utf-8') as file:
            file.write(f'Package: {package}\nVersion: 1\nArchitecture: {architecture}\nMaintainer: Test <test@example.org>\n'
                       'Description: test\n')
        with open(os.path.join(root, 'lib', package), 'w', encoding='utf-8') as file:
            file.write(package)
        if package == 'libc6-dev':
            os.makedirs(os.path.join(root, 'usr', 'lib'), exist_ok=True)
            os.symlink('/lib/libc6-dev', os.path.join(root, 'usr', 'lib', 'absolute'))
            os.symlink('absolute', os.path.join(root, 'usr', 'lib', 'relative'))
        subprocess.run(['dpkg-deb', '--root-owner-group', '-b', root, self.folder], check=True, capture_output=True)
        subprocess.run(['rm', '-r', root], check=True)


class MakeSysroot(unittest.TestCase):
    def setUp(self):
        context = tempfile.TemporaryDirectory()
        self.folder = context.__enter__()
        self.addCleanup(context.__exit__, None, None, None)
        self.sysroot = os.path.join(self.folder, 'made', 'sysroot')
        self.repository = os.path.join(self.folder, 'repository')
        self.machine = os.path.join(self.folder, 'machine')
        for folder in (self.repository, self.machine):
            os.mkdir(folder)

    def environment(self, source):
        """One in which that is the machine's only source of packages, and the machine's package state is in a folder."""
        sources = os.path.join(self.folder, 'sources.list')
        with open(sources, 'w', encoding='utf-8') as file:
            file.write(f'deb [trusted=yes] {source} ./\n')
        configuration = os.path.join(self.folder, 'apt.conf')
        with open(configuration, 'w', encoding='utf-8') as file:
            file.write(f'Dir::Etc::sourcelist "{sources}";\nDir::Etc::sourceparts "-";\n'
                       f'Dir::State "{self.machine}";\nDir::Cache "{self.machine}";\n'
                       'Acquire::http::Proxy "DIRECT";\n'
                       f'APT::Update::Post-Invoke {{ "touch {self.machine}/hook"; }};\n')
        return {**os.environ, 'APT_CONFIG': configuration}

    def run_script(self, *arguments):
        return subprocess.run([SCRIPT, *arguments], env=self.environment(f'copy:{self.repository}'), check=False,
                              stdin=subprocess.DEVNULL, capture_output=True, text=True, timeout=300)

    def assert_refused(self, *arguments, because):
        run = self.run_script(*arguments)
        self.assertEqual((run.returncode, run.stdout), (2, ''), run)
        self.assertRegex(run.stderr, r'\Amake-sysroot\.sh: [^\n]*\n\Z')
        self.assertIn(because, run.stderr)

    def assert_nothing_is_left(self):
        made = os.path.dirname(self.sysroot)
        self.assertEqual(os.listdir(made) if os.path.isdir(made) else [], [])

    def content(self, *path):
        with open(os.path.join(self.sysroot, *path), encoding='utf-8') as file:
            return file.read()

    def test_has_the_packages_of_the_architecture(self):
        Repository(self.repository, 'armhf')
        run = self.run_script('armhf', self.sysroot)
        self.assertEqual((run.returncode, run.stderr), (0, ''), run)
        for package in ('libc6-dev', 'libglib2.0-dev', 'libstdc++6'):
            self.assertEqual(self.content('lib', package), package)
        self.assertEqual(os.listdir(os.path.dirname(self.sysroot)), ['sysroot'])
        self.assertEqual(os.listdir(self.machine), [])

    def test_has_no_link_that_leads_out_of_it(self):
        Repository(self.repository, 'mipsel')
        self.assertEqual(self.run_script('mipsel', self.sysroot).returncode, 0)
        self.assertEqual(os.readlink(os.path.join(self.sysroot, 'usr', 'lib', 'absolute')), '../../lib/libc6-dev')
        self.assertEqual(self.content('usr', 'lib', 'relative'), 'libc6-dev')

    def test_leaves_a_complete_one_as_it_is(self):
        Repository(self.repository, 'arm64')
        self.assertEqual(self.run_script('arm64', self.sysroot).returncode, 0)
        os.remove(os.path.join(self.sysroot, 'lib', 'libstdc++6'))
        self.assertEqual(self.run_script('arm64', self.sysroot).returncode, 0)
        self.assertFalse(os.path.exists(os.path.join(self.sysroot, 'lib', 'libstdc++6')))
        self.assert_refused('armhf', self.sysroot, because='a sysroot of something else: arm64')

    def test_refuses_an_unknown_architecture(self):
        for architecture in ('amd65', '', 'armhf i386', '../armhf'):
            self.assert_refused(architecture, self.sysroot, because=f'{architecture}: unknown architecture, expected armhf')
        self.assert_nothing_is_left()

    def test_refuses_another_number_of_arguments(self):
        for arguments in ((), ('armhf',), ('armhf', self.sysroot, 'more')):
            self.assert_refused(*arguments, because='usage: ')

    def test_refuses_a_half_made_sysroot(self):
        os.makedirs(os.path.join(self.sysroot, 'usr'))
        self.assert_refused('armhf', self.sysroot, because=f'{self.sysroot}: not a complete sysroot')
        self.assertEqual(os.listdir(self.sysroot), ['usr'])

    def test_refuses_a_folder_that_it_cannot_write_to(self):
        path = os.path.join(self.folder, 'file')
        with open(path, 'w', encoding='utf-8'):
            self.assert_refused('armhf', os.path.join(path, 'sysroot'), because='cannot make the folder')

    def test_leaves_nothing_without_the_source_of_packages(self):
        os.rmdir(self.repository)
        self.assert_refused('i386', self.sysroot, because='i386: cannot fetch packages: ')
        self.assert_nothing_is_left()

    def test_leaves_nothing_if_a_package_is_missing(self):
        Repository(self.repository, 'i386', ['libc6-dev', 'libstdc++6'])
        self.assert_refused('i386', self.sysroot, because='libglib2.0-dev')
        self.assert_nothing_is_left()

    def test_leaves_nothing_if_a_package_is_damaged(self):
        Repository(self.repository, 'i386')
        for name in os.listdir(self.repository):
            if name.startswith('libglib'):
                with open(os.path.join(self.repository, name), 'r+b') as file:
                    file.seek(-40, os.SEEK_END)
                    file.write(40 * b'x')
        self.assert_refused('i386', self.sysroot, because='i386: cannot fetch packages: ')
        self.assert_nothing_is_left()

    def test_leaves_nothing_if_it_is_interrupted(self):
        with socket.create_server(('127.0.0.1', 0)) as server:
            server.settimeout(60)
            source = f'http://127.0.0.1:{server.getsockname()[1]}/'
            with subprocess.Popen([SCRIPT, 'i386', self.sysroot], env=self.environment(source), stdin=subprocess.DEVNULL,
                                  start_new_session=True) as script:
                connection, _ = server.accept()  # and never answers
                os.killpg(script.pid, signal.SIGTERM)
                self.assertEqual(script.wait(timeout=60), 2)
                connection.close()
        self.assert_nothing_is_left()


if __name__ == '__main__':
    unittest.main()
