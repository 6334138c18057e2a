"""The recordings of WebDriver sessions whose test fails."""

import contextlib
import io
import os
import subprocess
import unittest
import unittest.mock

from selenium_tv import DrivenTv
from television import RUN_TIMEOUT, temporary_folder, wait_for
from telix_tv import GREEN

TOLERANCE = 40  # of the encoding
PAGE = '<title>green</title><style>body { margin: 0; background: rgb(0, 128, 0) }</style>'


def run_test(body):
    """Runs a test with a session. Returns its result, and the recordings that it has named."""
    class Session(DrivenTv):
        def test(self):
            with self.session() as session:
                session.get('file://' + self.write(PAGE))
                body(self, session)

    result, errors = unittest.TestResult(), io.StringIO()
    with contextlib.redirect_stderr(errors):
        unittest.TestSuite([Session('test')]).run(result)
    return result, [line[len('recording: '):] for line in errors.getvalue().splitlines() if line.startswith('recording: ')]


class Recordings(unittest.TestCase):
    def setUp(self):
        folder = temporary_folder()
        self.folder = folder.__enter__()
        self.addCleanup(folder.__exit__, None, None, None)
        change = unittest.mock.patch.dict(os.environ, TELIX_SCREENSHOTS=self.folder)
        change.start()
        self.addCleanup(change.stop)

    @staticmethod
    def colours(recording):
        """The mean colour of each frame."""
        data = subprocess.run(['ffmpeg', '-v', 'error', '-i', recording, '-vf', 'scale=1:1:flags=area', '-f', 'rawvideo',
                               '-pix_fmt', 'rgb24', '-'], stdin=subprocess.DEVNULL, capture_output=True, check=True,
                              timeout=RUN_TIMEOUT).stdout
        return [tuple(data[start:start + 3]) for start in range(0, len(data), 3)]

    def test_a_test_that_fails_leaves_what_the_viewer_saw(self):
        def fail(test, session):
            test.television.wait_for_colour((100, 100), GREEN)
            size = os.path.getsize(recording(test))
            wait_for(lambda: os.path.getsize(recording(test)) > size, 'the recording does not grow')
            test.assertEqual(session.title, 'blue')

        def recording(test):
            name, = (name for name in os.listdir(test.recordings) if name.endswith('.mp4'))
            return os.path.join(test.recordings, name)

        result, recordings = run_test(fail)
        self.assertEqual((len(result.failures), result.errors), (1, []), result)
        self.assertEqual(recordings, [os.path.join(self.folder, 'Session.test-1.mp4')])
        self.assertEqual(os.listdir(self.folder), ['Session.test-1.mp4'])
        self.assertTrue(any(all(abs(part - expected) < TOLERANCE for part, expected in zip(colour, GREEN))
                            for colour in self.colours(recordings[0])))

    def test_a_session_that_an_error_ends_leaves_one(self):
        def fail(_, session):
            session.find_element('id', 'absent')

        result, recordings = run_test(fail)
        self.assertEqual((result.failures, len(result.errors)), ([], 1), result)
        self.assertEqual(recordings, [os.path.join(self.folder, 'Session.test-1.mp4')])
        self.assertEqual(os.listdir(self.folder), ['Session.test-1.mp4'])

    def test_a_test_that_passes_leaves_none_and_removes_that_of_its_last_failure(self):
        with open(os.path.join(self.folder, 'Session.test-1.mp4'), 'wb'):
            pass
        with open(os.path.join(self.folder, 'Session.test_of_another_name-1.mp4'), 'wb'):
            pass
        result, recordings = run_test(lambda test, session: test.assertEqual(session.title, 'green'))
        self.assertTrue(result.wasSuccessful(), result)
        self.assertEqual((os.listdir(self.folder), recordings), (['Session.test_of_another_name-1.mp4'], []))


if __name__ == '__main__':
    unittest.main()
