"""Recordings of telix-tv: what is seen and heard, as a file that other programs play."""

import array
import json
import os
import signal
import subprocess
import unittest

from telix_tv import IS_NPAPI, TelixTv
from television import AUTOMATION_TIMEOUT, RUN_TIMEOUT, Lines, PngImage, temporary_folder, wait_for

PLUGIN = os.environ['TELIX_DESKTOP_PLUGIN']
RATE = 48000
TONE = 440  # Hz, of clip.mp4

# The upper half of the page is green, the lower one shows the picture.
STYLE = '''<!DOCTYPE html>
    <style>
        body { margin: 0; background: transparent; }
        object { position: absolute; left: 0; top: 0; width: 1280px; height: 720px; }
        div { position: absolute; left: 0; top: 0; width: 1280px; height: 360px; background: rgb(0, 128, 0); }
    </style>'''
BROADCAST = STYLE + '''<object id="tv" type="video/broadcast"></object><div></div>
    <script>
        seconds = 0;
        onload = function () {
            tv.onPlayStateChange = function (state) {
                if (state === 2) { setInterval(function () { seconds += 1; }, 1000); console.log("ready"); }
            };
            tv.bindToCurrentChannel();
        };
    </script>'''
CLIP = STYLE + '''<object id="player" type="video/mp4" data="%s"></object><div></div>
    <script>onload = function () { player.play(1); };</script>'''
STOPPED = STYLE + '''<object id="tv" type="video/broadcast"></object><div></div>
    <script>
        onload = function () {
            tv.addEventListener('PlayStateChange', function () { stopped = tv.playState === 3 && Date.now(); }, false);
            tv.bindToCurrentChannel();
            tv.stop();
        };
    </script>'''
SECONDS_STOPPED = 'window.stopped && Date.now() - stopped > 2000'


def run(*arguments):
    return subprocess.run(arguments, stdin=subprocess.DEVNULL, capture_output=True, check=True, timeout=RUN_TIMEOUT).stdout


class Record(TelixTv):
    def setUp(self):
        super().setUp()
        self.file = os.path.join(self.folder, 'run.mp4')

    def record(self, page, *arguments, environment=None):
        return self.television.run('--plugin', PLUGIN, '--record', self.file, *arguments, page, environment=environment)

    def streams(self):
        """The streams of the file by their kind, with their duration."""
        output = run('ffprobe', '-v', 'error', '-show_streams', '-of', 'json', self.file)
        return {stream['codec_type']: stream for stream in json.loads(output)['streams']}

    def last_frame(self):
        """The last frame of the file."""
        name = os.path.join(self.folder, 'frame.png')
        run('ffmpeg', '-v', 'error', '-sseof', '-1', '-i', self.file, '-update', '1', '-pix_fmt', 'rgb24', name)
        return PngImage(name)

    def sound(self):
        """The samples of the left channel, from -1 to 1."""
        samples = array.array('f')
        samples.frombytes(run('ffmpeg', '-v', 'error', '-i', self.file, '-map', 'a', '-af', 'pan=mono|c0=c0', '-f', 'f32le',
                              '-ar', str(RATE), '-'))
        return samples

    def assert_colour(self, image, point, colour, tolerance=50):
        self.assertTrue(all(abs(part - expected) < tolerance for part, expected in zip(image.colour(*point), colour)),
                        f'{point} is {image.colour(*point)}, expected {colour}')

    def assert_playable(self, seconds):
        """Both streams are there, and last so long at least, and end together."""
        streams = self.streams()
        self.assertEqual(sorted(streams), ['audio', 'video'])
        picture, sound = streams['video'], streams['audio']
        self.assertEqual((picture['codec_name'], picture['width'], picture['height'], picture['avg_frame_rate']),
                         ('h264', 1280, 720, '25/1'))
        self.assertEqual((sound['codec_name'], sound['sample_rate'], sound['channels']), ('aac', str(RATE), 2))
        durations = float(picture['duration']), float(sound['duration'])
        self.assertGreater(min(durations), seconds)
        self.assertLess(abs(durations[0] - durations[1]), 0.5)

    def test_page_and_picture_and_sound_of_a_broadcast_are_recorded(self):
        result = self.record(self.write(BROADCAST), '--wait-for', 'seconds >= 3')
        self.assertEqual((result.status, result.errors.count('--record')), (0, 0), result)
        self.assert_playable(seconds=3)
        frame = self.last_frame()
        self.assert_colour(frame, (100, 100), (0, 128, 0))
        # The last stripe of the channel.
        self.assert_colour(frame, (1250, 600), (0, 255, 255), tolerance=80)
        # The sound starts with the channel, and is there until the end.
        self.assertGreater(max(self.sound()[-RATE:]), 0.02)

    def test_a_clip_is_heard_as_it_is(self):
        clip = os.path.join(os.environ['TELIX_CLIPS'], 'clip.mp4')
        result = self.record(self.write(CLIP % f'file://{clip}'), '--wait-for', 'player.playPosition > 4000')
        self.assertEqual(result.status, 0, result)
        self.assert_playable(seconds=4)
        samples = self.sound()
        start = next(index for index, sample in enumerate(samples) if abs(sample) > 0.02)
        second = samples[start + RATE // 2:start + RATE // 2 + RATE]
        self.assertEqual(len(second), RATE)
        # A tone without gaps: a rising zero crossing for each of its periods.
        rising = sum(before < 0 <= after for before, after in zip(second, second[1:]))
        self.assertAlmostEqual(rising, TONE, delta=4)
        # Seen and heard at the same time: the clip starts with both.
        self.assertLess(start / RATE, float(self.streams()['video']['duration']) - 3)

    def test_without_media_there_is_silence(self):
        result = self.record(self.write(STOPPED), '--wait-for', SECONDS_STOPPED)
        self.assertEqual(result.status, 0, result)
        self.assert_playable(seconds=2)
        # The channel is heard until the page stops it.
        self.assertLess(max(self.sound()[-RATE:]), 0.001)
        self.assert_colour(self.last_frame(), (100, 600), (0, 0, 0))

    def test_a_window_of_another_size_is_recorded_with_the_size_of_the_page(self):
        result = self.record(self.write(STOPPED), '--size', '500x300', '--wait-for', SECONDS_STOPPED)
        self.assertEqual(result.status, 0, result)
        self.assert_playable(seconds=2)
        frame = self.last_frame()
        for point, colour in (((3, 3), (0, 128, 0)), ((1276, 350), (0, 128, 0)), ((1276, 370), (0, 0, 0))):
            self.assert_colour(frame, point, colour)

    def test_a_signal_completes_the_file(self):
        process = self.start(BROADCAST)
        process.terminate()
        process.communicate(timeout=RUN_TIMEOUT)
        self.assertEqual(process.returncode, 128 + signal.SIGTERM)
        self.assert_playable(seconds=1)

    def start(self, page, *arguments):
        """Starts a recorded run and returns when it has recorded a while."""
        process = self.television.start('--plugin', PLUGIN, '--record', self.file, *arguments, self.write(page))
        self.addCleanup(process.__exit__, None, None, None)
        self.addCleanup(process.kill)
        self.messages = Lines(process.stderr)
        self.assertTrue(self.messages.wait_for('ready'))
        seconds = self.recorded_sound()
        wait_for(lambda: self.recorded_sound() > seconds + 2, 'the recording does not grow')
        return process

    def recorded_sound(self):
        """The seconds of sound that the file has by now; 0 if it cannot be played yet."""
        probe = subprocess.run(['ffprobe', '-v', 'quiet', '-select_streams', 'a', '-show_entries', 'packet=pts_time', '-of',
                                'csv=p=0', self.file], stdin=subprocess.DEVNULL, capture_output=True, text=True, check=False,
                               timeout=RUN_TIMEOUT)
        times = probe.stdout.split()
        return float(times[-1].rstrip(',')) if times else 0

    def test_a_process_that_is_killed_leaves_a_file_that_can_be_played(self):
        process = self.start(BROADCAST)
        process.kill()
        process.communicate(timeout=RUN_TIMEOUT)
        self.assertGreater(len(self.sound()), RATE // 2)
        self.assert_colour(self.last_frame(), (100, 100), (0, 128, 0))

    @unittest.skipIf(IS_NPAPI, 'there is no web process')
    def test_a_crash_of_the_web_process_completes_the_file(self):
        process = self.start(BROADCAST, '--timeout', AUTOMATION_TIMEOUT, '--wait-for', 'false')
        children = subprocess.run(['ps', '--ppid', str(process.pid), '-o', 'pid=,comm='], stdout=subprocess.PIPE,
                                  text=True, check=True).stdout
        os.kill(next(int(line.split()[0]) for line in children.splitlines() if 'WebKitWeb' in line), signal.SIGKILL)
        process.wait(timeout=RUN_TIMEOUT)
        self.assertEqual(process.returncode, 3)
        self.assert_playable(seconds=1)

    def test_a_file_that_cannot_be_written_is_refused(self):
        page = self.write(STOPPED)
        self.file = os.path.join(self.folder, 'absent', 'run.mp4')
        self.assert_refused(self.record(page), f'--record {self.file}: No such file or directory')
        self.file = self.folder
        self.assert_refused(self.record(page), f'--record {self.file}: Is a directory')

    def test_a_missing_encoder_is_named_and_no_file_is_left(self):
        with temporary_folder() as empty:
            result = self.record(self.write(STOPPED), environment={
                'GST_PLUGIN_SYSTEM_PATH': empty, 'GST_REGISTRY': os.path.join(empty, 'registry')})
        # The platform library, which has no elements either, may have started already.
        own = [line for line in result.errors.splitlines() if line != 'libtelix: channel: a GStreamer element is missing']
        self.assertEqual((result.status, own), (
            2, [f'telix-tv: --record {self.file}: the GStreamer element x264enc is not installed']), result)
        self.assertFalse(os.path.exists(self.file))


if __name__ == '__main__':
    unittest.main()
