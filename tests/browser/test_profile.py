"""Profiles of telix-tv: what a television keeps for itself, and folders that cannot be used."""

import json
import os
import signal
import subprocess
import unittest

from telix_tv import TelixTv, running_server, shipped
from television import RUN_TIMEOUT, Lines

DESKTOP_PLUGIN = os.environ['TELIX_DESKTOP_PLUGIN']
READY = '<object type="video/broadcast"></object><script>onload = function () { console.log("ready"); }</script>'


class Profile(TelixTv):
    def profile(self, name='profile'):
        return os.path.join(self.folder, name)

    def keep(self, profile, script):
        """Loads a page of a server in a television with that profile; returns the value of the expression."""
        return self.value('--profile', profile, '--eval', script, self.page)

    def ctl(self, profile, *arguments):
        return subprocess.run([os.environ['TELIXCTL'], '--socket', os.path.join(profile, 'control.sock'), *arguments],
                              env=self.television.environment, stdin=subprocess.DEVNULL, capture_output=True, text=True,
                              timeout=RUN_TIMEOUT, check=False)

    def start(self, profile):
        """A television with the desktop's platform library, and the lines that it prints."""
        process = self.television.start('--plugin', DESKTOP_PLUGIN, '--profile', profile, self.write(READY))
        messages = Lines(process.stderr)
        self.assertTrue(messages.wait_for('ready'), messages.lines)
        return process

    def end(self, process):
        process.terminate()
        self.assertEqual(process.wait(timeout=RUN_TIMEOUT), 128 + signal.SIGTERM)

    def test_cookies_and_storage_stay_in_a_profile_and_are_of_no_other(self):
        profile = self.profile()
        with running_server() as server:
            self.page = server.url + '/page'
            self.keep(profile, '[document.cookie = "name=value; max-age=1000", localStorage.name = "value"]')
            read = '[document.cookie, localStorage.name || ""]'
            self.assertEqual(self.keep(profile, read), ['name=value', 'value'])
            self.assertEqual(self.keep(self.profile('other'), read), ['', ''])
            self.assertEqual(self.value('--eval', read, self.page), ['', ''])

    def test_a_profile_has_its_own_configuration(self):
        profile = self.profile()
        os.mkdir(profile)
        with open(os.path.join(profile, 'tv.conf'), 'w', encoding='utf-8') as file:
            file.write('[viewer]\ncountry=FRA\n')
        page = self.write('<object id="configuration" type="application/oipfconfiguration"></object>')
        country = 'document.getElementById("configuration").configuration.countryId'
        for name, expected in (('profile', 'FRA'), ('new', 'DEU')):
            run = self.television.run('--plugin', DESKTOP_PLUGIN, '--profile', self.profile(name), '--eval', country,
                                      page)
            self.assertEqual((run.status, run.value), (0, expected), run)

    def test_each_television_has_the_control_socket_in_its_profile(self):
        profiles = [self.profile('first'), self.profile('second')]
        with self.start(profiles[0]) as first, self.start(profiles[1]) as second:
            for number, profile in enumerate(profiles, 2):
                self.assertEqual(self.ctl(profile, 'channel', str(number)).returncode, 0)
            for number, profile in enumerate(profiles, 2):
                state = json.loads(self.ctl(profile, '--json', 'state').stdout)
                self.assertEqual(state['channel']['number'], number)
            self.end(first)
            self.assertEqual(self.ctl(profiles[1], 'state').returncode, 0)
            self.end(second)

    def test_a_second_television_on_the_same_profile_is_refused(self):
        profile = self.profile()
        with self.start(profile) as process:
            self.assert_refused(self.run_tv('--profile', profile, '--eval', '1', shipped('first.html')),
                                f'--profile {profile}: in use by another television')
            self.assertEqual(self.ctl(profile, 'state').returncode, 0)
            self.end(process)
        # Of a television that has been killed, nothing keeps the profile.
        with self.start(profile) as process:
            process.kill()
            process.wait(timeout=RUN_TIMEOUT)
        self.assertEqual(self.value('--profile', profile, '--eval', '1', shipped('first.html')), 1)

    def test_folders_that_cannot_be_used_are_refused(self):
        file = self.write('text', 'file')
        for folder in (file, os.path.join(file, 'inner'), '/proc/none', '/proc', self.profile('x' * 100)):
            self.assert_refused(self.run_tv('--profile', folder, '--eval', '1', shipped('first.html')), f'--profile {folder}: ')
        self.assert_refused(self.run_tv('--profile=', shipped('first.html')), '--profile: empty value')


if __name__ == '__main__':
    unittest.main()
