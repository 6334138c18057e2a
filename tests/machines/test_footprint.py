"""What tools/footprint.py complains about."""

import os
import sys
import unittest

sys.path.insert(0, os.path.join(os.path.abspath(__file__).rsplit('/tests/', 1)[0], 'tools'))
import footprint  # noqa: E402


class Plugin:
    """A plug-in that needs the limits and every library of a set."""

    machine = 'armhf'
    size = 300 * 1024

    def __init__(self, *libraries, **versions):
        self._libraries = ['libglib-2.0.so.0', 'libgmodule-2.0.so.0', 'libstdc++.so.6', 'libgcc_s.so.1', 'libc.so.6',
                           'libm.so.6', 'libpthread.so.0', 'ld-linux-armhf.so.3', 'ld.so.1', *libraries]
        self._versions = {**footprint.LIMITS, **versions}

    def libraries(self):
        return self._libraries

    def newest_versions(self):
        return self._versions

    def stripped_size(self):
        return self.size


def complaints(*libraries, **versions):
    return list(footprint.complaints(Plugin(*libraries, **versions), footprint.LIMITS))


class Complaints(unittest.TestCase):
    def test_none_about_what_every_set_has(self):
        self.assertEqual(complaints(), [])
        self.assertEqual(complaints(GLIBC=(2, 4), GLIBCXX=(3, 4)), [])

    def test_a_library_that_a_set_may_lack(self):
        self.assertEqual(complaints('libgstreamer-1.0.so.0'), ['needs libgstreamer-1.0.so.0'])
        self.assertEqual(complaints('libc.so.60x'), ['needs libc.so.60x'])

    def test_a_symbol_that_is_newer_than_the_limit(self):
        self.assertEqual(complaints(GLIBC=(2, 18)), ['needs GLIBC 2.18'])
        self.assertEqual(complaints(GLIBCXX=(3, 4, 20)), ['needs GLIBCXX 3.4.20'])
        self.assertEqual(complaints(CXXABI=(1, 3, 8)), ['needs CXXABI 1.3.8'])

    def test_a_version_of_an_unknown_kind(self):
        self.assertEqual(complaints(LIBFOO=(1,)), ['needs LIBFOO 1'])

    def test_a_plug_in_that_is_too_large_for_a_set(self):
        plugin = Plugin()
        plugin.size += 1
        self.assertEqual(list(footprint.complaints(plugin, footprint.LIMITS)),
                         ['has 307201 bytes stripped, more than 307200'])
        plugin.machine = 'amd64'
        self.assertEqual(list(footprint.complaints(plugin, footprint.LIMITS)), [])


if __name__ == '__main__':
    unittest.main()
