"""Recordings of what the viewer saw in a test, which stay if the test fails."""

import glob
import itertools
import os
import shutil
import sys
import unittest

from television import temporary_folder, wait_for


def is_open(file_name):
    """Whether a process has the file open, as a television has its recording until it is complete."""
    for link in glob.iglob('/proc/[0-9]*/fd/*'):
        try:
            if os.readlink(link) == file_name:
                return True
        except OSError:
            pass  # the process has ended, or is another user's
    return False


def count_problems(result):
    return len(result.failures) + len(result.errors) if result else 0


class Recorded(unittest.TestCase):
    """Base class of tests that start televisions with --record. The recordings of a test that fails go to the folder of
    the screenshots, as CLASS.TEST-NUMBER.mp4, and their names to standard error."""

    def run(self, result=None):
        name = '.'.join(self.id().split('.')[-2:])
        kept = os.path.join(os.environ['TELIX_SCREENSHOTS'], name)
        for old in glob.glob(glob.escape(kept) + '-*.mp4'):
            os.remove(old)
        self._numbers = itertools.count(1)
        problems = count_problems(result)
        with temporary_folder() as self.recordings:
            result = super().run(result)
            if count_problems(result) > problems:
                self._keep(kept)
        return result

    def new_recording(self):
        """A file for --record. May be called on any thread."""
        return os.path.join(self.recordings, f'{next(self._numbers)}.mp4')

    def _keep(self, kept):
        for recording in sorted(glob.glob(os.path.join(self.recordings, '*.mp4'))):
            wait_for(lambda recording=recording: not is_open(recording), f'{recording} is not complete')
            target = f'{kept}-{os.path.basename(recording)}'
            shutil.move(recording, target)
            print(f'recording: {target}', file=sys.stderr)
