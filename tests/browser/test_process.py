"""telix-tv on WebKitGTK: the end of the web process and its memory, the keys that its platform library lets pages have, and
the server of the inspector."""

import contextlib
import ctypes
import json
import os
import pathlib
import re
import signal
import socket
import unittest
import urllib.request

from telix_tv import PLUGIN, TelixTv
from television import RUN_TIMEOUT, Lines, anonymous_kilobytes, wait_for, web_processes
from patterns import has_bars, is_striped

DESKTOP_PLUGIN = os.environ['TELIX_DESKTOP_PLUGIN']
READY = '<script>onload = function () { console.log("ready"); }</script>'
TELEVISION = '''<object id="manager" type="application/oipfApplicationManager"></object>
    <object id="tv" type="video/broadcast"></object>
    <script>
        codes = [];
        onkeydown = function (event) { codes.push(event.keyCode); };
        onload = function () { tv.setChannel(tv.getChannelConfig().channelList.item(%d), false); %s };
    </script>'''
# A DRM message to an object without an id, which gets one unless the window is strict, is answered with an event for
# no element.
DRM_MESSAGE = """<object type="application/oipfDrmAgent"></object>
    <script>
        onload = function () { console.log("ready"); };
        onkeydown = function () {
            document.querySelector("object").sendDRMMessage("application/xml", "<message/>", "urn:dvb:casystemid:1");
        };
    </script>"""
ASSERTION = "Assertion `!id.empty()' failed."
PLAYER = '''<object id="player" type="video/mp4" data="%s" style="width: 640px; height: 360px"></object>
    <script>
        player.onPlayStateChange = function () { if (player.playState === 1) { console.log("playing"); } };
        onload = function () { player.play(1); };
    </script>'''
# Elements that are used and removed, each with a mebibyte that goes with it; then garbage, so that the engine collects.
REMOVED_ELEMENTS = """<script>
        function use(number) {
            var element = document.createElement("object");
            element.type = "video/broadcast";
            element.setAttribute("data-ballast", new Array(1 << 20).join("x") + number);
            document.body.appendChild(element);
            element.playState;
            document.body.removeChild(element);
        }
        onload = function () { console.log("ready"); };
        onkeydown = function () {
            for (var i = 0; i < 300; i++) { setTimeout(use, 0, i); }
            setTimeout(function () {
                console.log("removed");
                setInterval(function () { for (var i = 0; i < 64; i++) { new Uint8Array(1 << 18)[0] = 1; } }, 50);
            }, 0);
        };
    </script>"""
NUMERIC = 0x100
# The threads that push data through a pipeline are named after an element and its pad.
STREAMING_THREAD = re.compile(r'[a-z0-9]+:(src|sink)')


class Crash(TelixTv):
    @staticmethod
    def abort_streaming_thread(web_process):
        """Ends a process by a thread of a pipeline, as an element does that fails a check."""
        threads = [int(task.name) for task in pathlib.Path(f'/proc/{web_process}/task').iterdir()
                   if STREAMING_THREAD.match((task / 'comm').read_text(encoding='utf-8'))]
        assert ctypes.CDLL(None).tgkill(web_process, threads[0], signal.SIGABRT) == 0

    def channel(self):
        """The name of the channel that is on; empty while there is no platform library."""
        with contextlib.suppress(AssertionError):
            return (self.television.telixctl('state')['channel'] or {}).get('name')
        return ''

    def test_a_scripted_run_ends_with_one_line_and_status_3(self):
        page = self.write(READY)
        with self.television.start('--plugin', DESKTOP_PLUGIN, '--wait-for', 'false', page) as process:
            self.assertIn('ready', process.stderr.readline())
            web_process, = web_processes(process)
            os.kill(web_process, signal.SIGKILL)
            _, errors = process.communicate(timeout=RUN_TIMEOUT)
        self.assertEqual((process.returncode, errors), (3, 'telix-tv: the web process has crashed\n'))

    def test_the_window_stays_with_the_channel_that_was_on(self):
        page = self.write(TELEVISION % (1, 'tv.onChannelChangeSucceeded = function () { console.log("tuned"); };'))
        with self.television.start('--plugin', DESKTOP_PLUGIN, page) as process:
            messages = Lines(process.stderr)
            self.assertTrue(messages.wait_for('tuned'))
            first, = web_processes(process)
            os.kill(first, signal.SIGKILL)
            self.assertTrue(messages.wait_for('telix-tv: the web process has crashed'))
            # The library in the new web process.
            wait_for(lambda: has_bars(self.television.screen()) and self.channel() == 'Telix Two', 'another channel')
            self.assertTrue(set(web_processes(process)) - {first})
            self.assertIsNone(process.poll())
            process.terminate()
            process.communicate(timeout=RUN_TIMEOUT)
        self.assertEqual(process.returncode, 128 + signal.SIGTERM)

    def is_true(self, expression):
        """Whether the expression is true in the topmost application; false while there is no web process."""
        with contextlib.suppress(AssertionError):
            self.television.telixctl('wait', expression, '--timeout', 1)
            return True
        return False

    def test_the_notice_has_the_assertion_that_has_failed_and_ok_starts_the_application_again(self):
        page = self.write(DRM_MESSAGE)
        for press_ok in (lambda: self.television.press_key('Return'), lambda: self.television.telixctl('key', 'ok')):
            with self.television.start('--plugin', DESKTOP_PLUGIN, '--strict', '--keys', 'red', page) as process:
                messages = Lines(process.stderr)
                self.assertTrue(messages.wait_for(ASSERTION), messages.lines)
                reason, = (line for line in messages.lines if line.endswith(ASSERTION))
                self.assertRegex(reason, '^telix-tv: the web process has crashed: .*common/PluginUtils')
                reason = reason[len('telix-tv: '):]
                wait_for(lambda reason=reason: self.is_true(
                    f'document.getElementById("notice").textContent.indexOf({json.dumps(reason)}) >= 0'), 'no notice')
                press_ok()
                wait_for(lambda messages=messages: sum(line.endswith('ready') for line in messages.lines) == 2,
                         'the application has not been started again')
                self.assertTrue(self.is_true('document.querySelector("object") && !document.getElementById("notice")'))
                process.terminate()
                process.wait(RUN_TIMEOUT)
            self.assertEqual(process.returncode, 128 + signal.SIGTERM)

    def test_a_crash_in_a_media_pipeline_leaves_the_television_and_its_applications(self):
        page = self.write(PLAYER % pathlib.Path(os.environ['TELIX_CLIPS'], 'clip.mp4').as_uri())
        with self.television.start('--plugin', DESKTOP_PLUGIN, page) as process:
            messages = Lines(process.stderr)
            self.assertTrue(messages.wait_for('playing'))
            first, = web_processes(process)
            self.abort_streaming_thread(first)
            self.assertTrue(messages.wait_for('telix-tv: the web process has crashed'))
            wait_for(lambda: is_striped(self.television.screen()) and self.channel() == 'Telix One', 'no channel')
            messages.lines.clear()
            self.television.telixctl('reload')
            self.assertTrue(messages.wait_for('playing'))
            self.assertIsNone(process.poll())
            process.terminate()
            process.communicate(timeout=RUN_TIMEOUT)
        self.assertEqual(process.returncode, 128 + signal.SIGTERM)

    def test_without_an_application_the_channel_comes_back(self):
        with self.television.start('--plugin', DESKTOP_PLUGIN, '--keys', '2') as process:
            wait_for(lambda: has_bars(self.television.screen()), 'no picture')
            first, = web_processes(process)
            os.kill(first, signal.SIGKILL)
            wait_for(lambda: set(web_processes(process)) - {first}, 'no web process')
            wait_for(lambda: has_bars(self.television.screen()) and self.channel() == 'Telix Two', 'another channel')
            process.terminate()
            _, errors = process.communicate(timeout=RUN_TIMEOUT)
        self.assertEqual(process.returncode, 128 + signal.SIGTERM)
        self.assertIn('telix-tv: the web process has ended, starting it again', errors)


class Memory(TelixTv):
    @staticmethod
    def megabytes(web_process):
        return anonymous_kilobytes(web_process) // 1024

    def test_an_element_goes_when_it_has_been_removed(self):
        page = self.write(REMOVED_ELEMENTS)
        # Garbage that has survived one collection would stay.
        with self.television.start('--plugin', DESKTOP_PLUGIN, page, environment={'JSC_useGenerationalGC': '0'}) as process:
            messages = Lines(process.stderr)
            self.assertTrue(messages.wait_for('ready'))
            web_process, = web_processes(process)
            before = self.megabytes(web_process)
            self.television.telixctl('key', 'ok')
            self.assertTrue(messages.wait_for('removed'), messages.lines)
            wait_for(lambda: self.megabytes(web_process) < before + 150,
                     lambda: f'{before} MB before, {self.megabytes(web_process)} MB after 300 elements of 1 MB each')
            process.terminate()
            process.communicate(timeout=RUN_TIMEOUT)


class KeySet(TelixTv):
    def run_keys(self, keys, script, expression):
        page = self.write(TELEVISION % (0, script))
        run = self.television.run('--plugin', DESKTOP_PLUGIN, '--wait-for-picture', '--keys', keys, '--eval', expression,
                                  page)
        self.assertEqual(run.status, 0, run)
        return run.value

    def test_a_page_that_has_not_asked_for_digits_gets_none(self):
        self.assertEqual(self.run_keys('red,5,down', '', 'codes'), [403, 40])

    def test_a_page_gets_the_keys_that_it_has_asked_for_and_no_others(self):
        ask = f'manager.getOwnerApplication(document).privateData.keyset.setValue({NUMERIC});'
        self.assertEqual(self.run_keys('red,5,down', ask, 'codes'), [53])

    def test_a_digit_that_no_page_has_asked_for_selects_the_channel(self):
        page = self.write(TELEVISION % (0, ''))
        run = self.television.run('--plugin', DESKTOP_PLUGIN, '--keys', '2', '--wait-for',
                                  'tv.currentChannel && tv.currentChannel.name === "Telix Two"', '--eval', 'codes', page)
        self.assertEqual((run.status, run.value), (0, []), run)

    def test_channel_keys_are_the_television_s(self):
        for keys, name in (('channel-up', 'Telix Two'), ('channel-down', 'Telix Three')):
            page = self.write(TELEVISION % (0, ''))
            run = self.television.run('--plugin', DESKTOP_PLUGIN, '--keys', keys, '--wait-for',
                                      f'tv.currentChannel && tv.currentChannel.name === "{name}"', '--eval', 'codes', page)
            self.assertEqual((run.status, run.value), (0, []), run)

    def test_exit_ends_the_application(self):
        page = self.write(TELEVISION % (0, ''))
        run = self.television.run('--plugin', DESKTOP_PLUGIN, '--keys', 'exit', '--eval', '1', page)
        self.assertEqual(run.status, 1, run)
        self.assertIn('no application', run.errors)


class InspectorServer(TelixTv):
    def test_the_inspector_is_served(self):
        with socket.socket() as free:
            free.bind(('127.0.0.1', 0))
            address = f'127.0.0.1:{free.getsockname()[1]}'
        page = self.write(READY)
        with self.television.start('--plugin', PLUGIN, '--inspector-server', address, page) as process:
            self.assertIn('ready', process.stderr.readline())
            with urllib.request.urlopen(f'http://{address}/', timeout=RUN_TIMEOUT) as response:
                self.assertIn(b'page.html', response.read())
            process.terminate()
            process.communicate(timeout=RUN_TIMEOUT)

    def test_a_port_in_use_is_refused(self):
        with socket.socket() as used:
            used.bind(('127.0.0.1', 0))
            used.listen()
            address = f'127.0.0.1:{used.getsockname()[1]}'
            self.assert_refused(self.run_tv('--inspector-server', address, self.write(READY)), address, 'in use')


if __name__ == '__main__':
    unittest.main()
