"""The commands of telixctl that the window carries out."""

import os
import subprocess
import unittest

from telix_tv import GREEN, IS_NPAPI, TelixTv
from television import RUN_TIMEOUT, Lines, PngImage, wait_for
from patterns import is_striped

# The left half of the page is green, the right one shows the channel.
PAGE = '''<!DOCTYPE html>
    <title>%(title)s</title>
    <style>
        body { margin: 0; background: transparent; }
        object { position: absolute; left: 0; top: 0; width: 1280px; height: 720px; }
        div { position: absolute; left: 0; top: 0; width: 640px; height: 720px; background: rgb(0, 128, 0); }
    </style>
    <object id="tv" type="video/broadcast"></object>
    <div></div>
    <script>
        codes = [];
        onkeydown = function (event) { codes.push(event.keyCode); %(on_key)s };
        onload = function () { tv.bindToCurrentChannel(); };
    </script>'''


class WindowCommands(TelixTv):
    def page(self, title='first', on_key='', name='first.html'):
        return self.write(PAGE % {'title': title, 'on_key': on_key}, name)

    def start(self, page):
        """Starts the television; returns when telixctl finds it."""
        process = self.television.start('--plugin', os.environ['TELIX_DESKTOP_PLUGIN'], page)
        self.addCleanup(self.stop, process)
        self.messages = Lines(process.stderr)
        wait_for(lambda: self.ctl('state').returncode == 0, 'no television')
        return process

    @staticmethod
    def stop(process):
        with process:
            process.terminate()
            process.communicate(timeout=RUN_TIMEOUT)

    def ctl(self, *arguments):
        """The finished telixctl, which has run in the test's folder."""
        return subprocess.run([os.environ['TELIXCTL'], *map(str, arguments)], env=self.television.environment,
                              cwd=self.folder, stdin=subprocess.DEVNULL, capture_output=True, text=True,
                              timeout=RUN_TIMEOUT, check=False)

    def do(self, *arguments):
        """Runs a command that succeeds and prints nothing."""
        run = self.ctl(*arguments)
        self.assertEqual((run.returncode, run.stdout, run.stderr), (0, '', ''), arguments)

    def assert_fails(self, *arguments, status, reason):
        """The command prints one line with the reason."""
        run = self.ctl(*arguments)
        self.assertEqual((run.returncode, run.stdout), (status, ''), run.stderr)
        self.assertEqual(len(run.stderr.splitlines()), 1, run.stderr)
        self.assertTrue(run.stderr.startswith(f'telixctl: {arguments[0]}: '), run.stderr)
        self.assertIn(reason, run.stderr)

    def running(self):
        return [(os.path.basename(each['url']), each['visible'])
                for each in self.television.telixctl('applications')['running']]

    def test_keys_reach_the_page_in_their_order(self):
        self.start(self.page())
        self.do('key', 'red', 'ok', 'down')
        self.do('wait', 'codes.join() === "403,13,40"')

    def test_an_unknown_key_is_refused_and_nothing_is_pressed(self):
        self.start(self.page())
        self.assert_fails('key', 'red', 'purple', status=1, reason='unknown key "purple"')
        self.assert_fails('key', status=2, reason='NAME... is missing')
        self.do('key', 'ok')
        self.do('wait', 'codes.join() === "13"')

    def test_a_key_waits_for_the_page_that_the_one_before_has_opened(self):
        self.page('second', name='second.html')
        self.start(self.page(on_key='location = "second.html";'))
        self.do('key', 'ok', 'red')
        self.do('wait', 'document.title === "second" && codes.join() === "403"')

    def test_a_screenshot_shows_page_and_picture(self):
        self.start(self.page())
        self.do('wait', 'tv.playState === 2')
        self.do('screenshot', 'shot.png')
        image = PngImage(os.path.join(self.folder, 'shot.png'))
        self.assertEqual((image.width, image.height), (1280, 720))
        self.assertEqual(image.colour(100, 100), GREEN)
        # The last stripe of the channel.
        self.assertTrue(all(abs(part - expected) < 60 for part, expected in zip(image.colour(1250, 300), (0, 255, 255))))
        self.assertFalse(is_striped(image))
        self.do('wait', '!document.body.removeChild(document.querySelector("div")) || true')
        self.do('screenshot', 'whole.png')
        self.assertTrue(is_striped(PngImage(os.path.join(self.folder, 'whole.png'))))

    def test_a_screenshot_that_cannot_be_written_is_an_error(self):
        self.start(self.page())
        self.assert_fails('screenshot', 'absent/shot.png', status=1,
                          reason=f'{self.folder}/absent/shot.png: No such file or directory')
        self.assert_fails('screenshot', self.folder, status=1, reason='directory')

    def test_wait_says_whether_the_expression_has_become_true(self):
        self.start(self.page())
        self.do('wait', 'document.title === "first"')
        self.do('wait', '(window.late || setTimeout(function () { late = 2; }, 300)) && late === 2', '--timeout=60')
        self.assert_fails('wait', 'codes.length > 0', '--timeout=1', status=1, reason='not true within 1 s')
        self.assert_fails('wait', 'absent.name', '--timeout', 1, status=1, reason='absent')
        self.assert_fails('wait', '1', '--timeout=0', status=2, reason='from 1 to 3600')

    def test_open_replaces_the_applications(self):
        self.start(self.page(on_key='createHbbTVApplication("upper.html");'))
        self.page('upper', name='upper.html')
        self.page('second', name='second.html')
        self.do('key', 'red')
        wait_for(lambda: self.running() == [('upper.html', True), ('first.html', False)], self.running)
        self.do('open', 'second.html')
        self.do('wait', 'document.title === "second"')
        self.assertEqual(self.running(), [('second.html', True)])
        self.assertRegex(self.ctl('applications').stdout, r'(?m)^running +file://\S*/second\.html, visible$')
        self.do('wait', 'tv.playState === 2')
        self.do('key', 'down')
        self.do('wait', 'codes.join() === "40"')

    def test_a_page_that_cannot_be_opened_changes_nothing(self):
        self.start(self.page())
        self.assert_fails('open', 'absent.html', status=1, reason='the page cannot be loaded: No such file')
        self.assert_fails('open', 'gopher://a.example/', status=1, reason='unsupported URL scheme')
        self.assertEqual(self.running(), [('first.html', True)])
        self.do('wait', 'document.title === "first"')

    def test_reload_loads_the_page_again(self):
        self.start(self.page(on_key='mark = true;'))
        self.do('key', 'red')
        self.do('wait', 'mark')
        self.do('reload')
        self.do('wait', 'typeof mark === "undefined" && tv.playState === 2')
        os.remove(os.path.join(self.folder, 'first.html'))
        self.assert_fails('reload', status=1, reason='No such file')

    def test_state_says_who_gets_which_keys(self):
        self.start(self.page())
        run = self.ctl('state')
        self.assertRegex(run.stdout, r'(?m)^page keys +red ')
        state = self.television.telixctl('state')
        self.assertEqual(sorted(state['keys'] + state['televisionKeys']), sorted(
            'red green yellow blue navigation vcr info numeric'.split()))
        self.assertFalse(set(state['keys']) & set(state['televisionKeys']))

    @unittest.skipIf(IS_NPAPI, 'there is no web process')
    def test_the_notice_after_a_crash_is_controlled_as_well(self):
        process = self.start(self.page())
        self.do('wait', 'tv.playState === 2')
        children = subprocess.run(['ps', '--ppid', str(process.pid), '-o', 'pid=,comm='], stdout=subprocess.PIPE,
                                  text=True, check=True).stdout
        web_process = next(int(line.split()[0]) for line in children.splitlines() if 'WebKitWeb' in line)
        os.kill(web_process, 9)
        self.assertTrue(self.messages.wait_for('telix-tv: the web process has crashed'))
        wait_for(lambda: self.ctl('wait', 'document.querySelector("h1").textContent === "The application has ended"',
                                  '--timeout=1').returncode == 0, 'no notice')
        self.do('screenshot', 'notice.png')
        image = PngImage(os.path.join(self.folder, 'notice.png'))
        self.assertNotEqual(image.colour(100, 100), GREEN)
        self.do('reload')
        self.do('wait', 'document.title === "first" && tv.playState === 2')
        self.do('key', 'red')
        self.do('wait', 'codes.join() === "403"')


if __name__ == '__main__':
    unittest.main()
