"""The web process of telix-tv on WebKitGTK: its end, and the keys that its platform library lets pages have."""

import os
import signal
import subprocess
import unittest

from telix_tv import TelixTv
from television import RUN_TIMEOUT, Lines, wait_for
from patterns import has_bars

DESKTOP_PLUGIN = os.environ['TELIX_DESKTOP_PLUGIN']
READY = '<script>onload = function () { console.log("ready"); }</script>'
TELEVISION = '''<object id="manager" type="application/oipfApplicationManager"></object>
    <object id="tv" type="video/broadcast"></object>
    <script>
        codes = [];
        onkeydown = function (event) { codes.push(event.keyCode); };
        onload = function () { tv.setChannel(tv.getChannelConfig().channelList.item(%d), false); %s };
    </script>'''
NUMERIC = 0x100


class Crash(TelixTv):
    def web_process(self, process):
        children = subprocess.run(['ps', '--ppid', str(process.pid), '-o', 'pid=,comm='], stdout=subprocess.PIPE,
                                  text=True, check=True).stdout
        return next(int(line.split()[0]) for line in children.splitlines() if 'WebKitWeb' in line)

    def test_a_scripted_run_ends_with_one_line_and_status_3(self):
        page = self.write(READY)
        with self.television.start('--plugin', DESKTOP_PLUGIN, '--wait-for', 'false', page) as process:
            self.assertIn('ready', process.stderr.readline())
            os.kill(self.web_process(process), signal.SIGKILL)
            _, errors = process.communicate(timeout=RUN_TIMEOUT)
        self.assertEqual((process.returncode, errors), (3, 'telix-tv: the web process has crashed\n'))

    def test_the_window_stays_with_the_channel_that_was_on(self):
        page = self.write(TELEVISION % (1, 'console.log("ready");'))
        with self.television.start('--plugin', DESKTOP_PLUGIN, page) as process:
            messages = Lines(process.stderr)
            self.assertTrue(messages.wait_for('ready'))
            before = self.television.telixctl('state')['channel']
            wait_for(lambda: has_bars(self.television.screen()), 'no picture')
            os.kill(self.web_process(process), signal.SIGKILL)
            self.assertTrue(messages.wait_for('telix-tv: the web process has crashed'))
            self.assertEqual(before['name'], 'Telix Two')
            # The state of the library in the new web process.
            wait_for(lambda: (self.television.telixctl('state')['channel'] or {}).get('name') == 'Telix Two',
                     'another channel')
            self.assertIsNone(process.poll())
            process.terminate()
            process.communicate(timeout=RUN_TIMEOUT)
        self.assertEqual(process.returncode, 128 + signal.SIGTERM)


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


if __name__ == '__main__':
    unittest.main()
