"""Options, messages and exit statuses of telix-tv, and the choice of the plug-in."""

import os
import shutil
import signal
import subprocess
import unittest

from telix_tv import BLACK, BLUE, GREEN, IS_NPAPI, KEY_CODES, PLUGIN, TelixTv, shipped
from television import RUN_TIMEOUT, Lines, PngImage, wait_for

FOREIGN_PLUGIN = os.environ['TELIX_FOREIGN_PLUGIN']
DEFAULT_PLUGIN = os.environ['TELIX_DESKTOP_PLUGIN']


class CommandLine(TelixTv):
    def test_help_names_every_option(self):
        run = self.television.run('--help', environment={'DISPLAY': ''})
        self.assertEqual((run.status, run.errors), (0, ''), run)
        for option in ('size', 'fullscreen', 'plugin', 'screenshot', 'wait-for', 'wait-for-picture', 'timeout', 'eval',
                       'keys', 'user-agent', 'inspect', 'inspector-server', 'engine', 'signal', 'on', 'ait', 'strict', 'help',
                       'version', 'automation', 'profile', 'ignore-certificate-errors'):
            self.assertIn(f'--{option}', run.output)

    def test_help_names_every_key(self):
        words = self.television.run('--help').output.replace('.', ',').split()
        for name in KEY_CODES:
            self.assertIn(f'{name},', words)

    def test_version(self):
        run = self.television.run('--version', environment={'DISPLAY': ''})
        self.assertEqual((run.status, run.errors), (0, ''), run)
        versions = r'QtWebKit 5\.212[.0-9]*, Qt 5\.[0-9.]+' if IS_NPAPI else r'WebKitGTK 2\.[0-9.]+, GTK 3\.[0-9.]+'
        self.assertRegex(run.output, rf'^telix-tv 1\.25 \({versions}\)\n$')

    def test_an_unknown_engine_is_refused(self):
        self.assert_refused(self.run_tv('--engine', 'paper', shipped('first.html')), 'engine', '"paper"')

    def launch(self, **environment):
        """Starts the engine webkit, of which there is the program that the test has written."""
        # The programs of the engines are beside the one that starts them.
        launcher = shutil.copy(os.path.join(os.path.dirname(DEFAULT_PLUGIN), 'telix-tv'), self.folder)
        return subprocess.run([launcher, '--engine', 'webkit', shipped('first.html')], capture_output=True, text=True,
                              timeout=RUN_TIMEOUT, check=False, env={**os.environ, **environment})

    def test_an_engine_that_is_not_built_is_refused(self):
        run = self.launch()
        self.assertEqual((run.returncode, run.stderr), (2, 'telix-tv: --engine: the engine "webkit" is not built\n'))

    def test_large_blocks_of_memory_are_always_returned_unless_the_user_wants_otherwise(self):
        os.chmod(self.write('#!/bin/sh\necho "$MALLOC_MMAP_THRESHOLD_"', 'telix-tv-webkit'), 0o755)
        self.assertEqual(self.launch().stdout, '131072\n')
        self.assertEqual(self.launch(MALLOC_MMAP_THRESHOLD_='65536').stdout, '65536\n')

    @unittest.skipUnless(IS_NPAPI, 'of the other engine')
    def test_webdriver_and_profiles_are_refused(self):
        for option in (('--automation',), ('--profile', self.folder)):
            self.assert_refused(self.run_tv(*option), f'{option[0]}: only the engine webkit has it')

    @unittest.skipIf(IS_NPAPI, 'of the other engine')
    def test_automation_opens_no_page_and_performs_no_steps(self):
        self.assert_refused(self.run_tv('--automation', shipped('first.html')), '--automation: expected no page')
        for steps in (('--keys', 'red'), ('--wait-for', '1'), ('--wait-for-picture',), ('--eval', '1'),
                      ('--screenshot', 'page.png')):
            self.assert_refused(self.run_tv('--automation', *steps), '--automation: excludes --keys, ')

    def test_a_bad_inspector_server_is_refused(self):
        for server in ('', '127.0.0.1', '127.0.0.1:', ':', 'a:b:c'):
            self.assert_refused(self.run_tv(f'--inspector-server={server}', shipped('first.html')),
                                'inspector-server', f'"{server}"')

    def test_an_unknown_option_is_refused(self):
        self.assert_refused(self.run_tv('--colour', shipped('first.html')), 'colour')

    def test_an_option_without_its_value_is_refused(self):
        self.assert_refused(self.run_tv(shipped('first.html'), '--eval'), 'eval')

    def test_two_pages_are_refused(self):
        self.assert_refused(self.run_tv(shipped('first.html'), shipped('second.html')), 'page')

    def test_a_bad_size_is_refused(self):
        for size in ('1280', '0x720', '1280x0', '-1x-1', '1280x720x1', '99999x1', 'x', ''):
            self.assert_refused(self.run_tv(f'--size={size}', shipped('first.html')), 'size', f'"{size}"')

    def test_a_bad_timeout_is_refused(self):
        for timeout in ('0', '-1', 'soon', 'nan', 'inf', ''):
            self.assert_refused(self.run_tv(f'--timeout={timeout}', shipped('first.html')), 'timeout', f'"{timeout}"')

    def test_an_unknown_key_is_refused(self):
        for keys, unknown in (('purple', 'purple'), ('red,purple', 'purple'), ('', ''), ('red,', ''), ('Red', 'Red')):
            self.assert_refused(self.run_tv(f'--keys={keys}', shipped('first.html')), 'key', f'"{unknown}"')

    def test_an_empty_expression_or_file_name_is_refused(self):
        for option in ('--wait-for', '--eval', '--screenshot', '--record', '--plugin', '--user-agent'):
            self.assert_refused(self.run_tv(f'{option}=', shipped('first.html')), option)

    def test_no_display_is_refused(self):
        run = self.run_tv(shipped('first.html'), environment={'DISPLAY': ''})
        self.assert_refused(run, 'display')

    @unittest.skipUnless(IS_NPAPI, 'Qt only')
    def test_a_qt_that_does_not_run_on_glib_is_refused(self):
        run = self.run_tv(shipped('first.html'), environment={'QT_NO_GLIB': '1'})
        self.assert_refused(run, 'GLib')

    def test_a_user_agent_of_several_lines_is_refused(self):
        self.assert_refused(self.run_tv('--user-agent', 'one\r\nCookie: two', shipped('first.html')), 'user agent')

    def test_the_size_is_that_of_the_window(self):
        for size in ((1280, 720), (333, 444)):
            file_name = os.path.join(self.folder, 'picture.png')
            run = self.run_tv('--size', f'{size[0]}x{size[1]}', '--screenshot', file_name, shipped('first.html'))
            self.assertEqual(run.status, 0, run)
            picture = PngImage(file_name)
            self.assertEqual((picture.width, picture.height), size)

    def test_the_page_has_its_size_in_every_window(self):
        page = self.write('<body style="margin: 0"><div id="box" style="width: 33.3%; height: 7px; font-size: 17px">'
                          '<span id="text">How wide this is depends on the letters</span></div>')
        layout = ('[innerWidth, innerHeight, document.documentElement.clientWidth, box.getBoundingClientRect(),'
                  ' text.getBoundingClientRect()]')
        original = self.value(page, '--eval', layout)
        self.assertEqual(original[:3], [1280, 720, 1280])
        for options in (('--size', '640x360'), ('--size', '1111x333'), ('--size', '1x1'), ('--fullscreen',)):
            self.assertEqual(self.value(page, *options, '--eval', layout), original, options)

    def test_the_full_screen_shows_the_same_page_larger(self):
        file_name = os.path.join(self.folder, 'picture.png')
        page = self.write('<body style="margin: 0; background: rgb(0, 0, 255)">'
                          '<div style="width: 640px; height: 360px; background: rgb(0, 128, 0)">')
        run = self.run_tv(page, '--fullscreen', '--screenshot', file_name)
        self.assertEqual(run.status, 0, run)
        picture = PngImage(file_name)
        self.assertEqual((picture.width, picture.height), (1920, 1080))
        # WebKitGTK scales the picture of the page, which blends the pixels at the edges of the square.
        gap = 0 if os.environ.get('TELIX_ENGINE') == 'npapi' else 2
        right, below = 960 + gap, 540 + gap
        self.assertEqual([picture.colour(x, y) for x, y in ((0, 0), (959 - gap, 539 - gap), (right, 539 - gap),
                                                            (959 - gap, below), (1919, 1079))],
                         [GREEN, GREEN, BLUE, BLUE, BLUE])

    def test_a_window_of_another_shape_keeps_the_shape_of_the_page(self):
        wide = self.screenshot(shipped('first.html'), size='256x90')
        self.assertEqual([wide.colour(x, 45) for x in (0, 47, 48, 207, 208, 255)],
                         [BLACK, BLACK, GREEN, GREEN, BLACK, BLACK])
        high = self.screenshot(shipped('first.html'), size='160x120')
        self.assertEqual([high.colour(80, y) for y in (0, 14, 15, 104, 105, 119)],
                         [BLACK, BLACK, GREEN, GREEN, BLACK, BLACK])

    def test_the_mouse_points_at_what_is_shown_there(self):
        page = self.write('<script>onmousemove = function (event) { console.log(event.clientX + " " + event.clientY); };'
                          'onload = function () { console.log("ready"); }</script>')
        with self.television.start('--plugin', PLUGIN, '--fullscreen', page) as process:
            messages = Lines(process.stderr)
            self.assertTrue(messages.wait_for('ready'))

            # The first movements may come before the window is mapped, and movements may be compressed.
            def moves_to_target():
                self.television.move_pointer(300, 600)
                self.television.move_pointer(1500, 750)
                return messages.wait_for(' 1000 500', timeout=1)
            wait_for(moves_to_target, lambda: messages.lines)
            process.terminate()
            process.wait(timeout=RUN_TIMEOUT)

    def test_the_inspector_opens_beside_the_page(self):
        self.assertEqual(self.value(shipped('first.html'), '--inspect', '--eval', 'document.title'), 'first')

    def test_the_inspector_follows_the_application_on_top_to_the_last(self):
        for keys, title in (('green', 'second'), ('green,back', 'first')):
            self.assertEqual(self.value(shipped('first.html'), '--inspect', '--keys', keys, '--eval', 'document.title'),
                             title)
        file_name = os.path.join(self.folder, 'picture.png')
        run = self.run_tv(shipped('first.html'), '--inspect', '--keys', 'back', '--screenshot', file_name)
        self.assertEqual(run.status, 0, run)

    def test_termination_ends_the_program_and_removes_its_folder(self):
        page = self.write('<script>console.log("ready")</script>')
        with self.television.start('--plugin', PLUGIN, page) as process:
            self.assertIn('ready', process.stderr.readline())
            self.assertNotEqual(self.television.leftovers(), [])
            process.send_signal(signal.SIGTERM)
            process.communicate(timeout=60)
        self.assertEqual(process.returncode, 128 + signal.SIGTERM)
        self.assertEqual(self.television.leftovers(), [])

    def test_keys_alone_leave_the_window_open(self):
        page = self.write('<script>onkeydown = function (event) { console.log("key " + event.keyCode); }</script>')
        with self.television.start('--plugin', PLUGIN, '--keys', 'red', page) as process:
            self.assertIn('key 403', process.stderr.readline())
            self.assertIsNone(process.poll())
            process.send_signal(signal.SIGINT)
            process.communicate(timeout=60)
        self.assertEqual(process.returncode, 128 + signal.SIGINT)


class Plugins(TelixTv):
    def run_with(self, plugin, *arguments):
        return self.television.run('--plugin', plugin, *arguments, shipped('plugin.html'))

    def test_a_missing_plug_in_is_refused(self):
        self.assert_refused(self.run_with(os.path.join(self.folder, 'missing.so')), 'missing.so', 'No such file')

    def test_a_folder_is_refused(self):
        self.assert_refused(self.run_with(self.folder), self.folder)

    def test_a_file_that_is_no_library_is_refused(self):
        self.assert_refused(self.run_with(self.write('text', 'text.so')), 'text.so')

    def test_a_library_that_is_no_plug_in_is_refused(self):
        with open('/proc/self/maps', encoding='utf-8') as maps:
            c_library = next(line.split()[-1] for line in maps if '/libc.so' in line)
        self.assert_refused(self.run_with(c_library), 'NP_Initialize')

    def test_only_the_given_plug_in_is_seen(self):
        # The foreign plug-in is in the same folder.
        shutil.copy(FOREIGN_PLUGIN, os.path.join(self.folder, 'npforeign.so'))
        plugin = shutil.copy(PLUGIN, os.path.join(self.folder, 'npown.so'))
        run = self.television.run('--plugin', plugin, shipped('first.html'), '--eval',
                                  '[navigator.plugins.length, navigator.plugins[0].name]')
        self.assertEqual(run.value, [1, 'TELIX Scriptable Plugin'], run)

    def test_an_object_of_any_size_harms_nothing(self):
        page = self.write('<object id="object" type="video/broadcast" width="40000" height="40000"></object>')
        run = self.run_tv(page, '--screenshot', os.path.join(self.folder, 'picture.png'), '--eval', 'object.offsetWidth > 4000')
        self.assertEqual((run.status, run.value), (0, True), run)

    def test_the_environment_adds_no_plug_ins(self):
        shutil.copy(FOREIGN_PLUGIN, os.path.join(self.folder, 'npforeign.so'))
        run = self.run_tv(shipped('first.html'), '--eval', 'navigator.plugins.length',
                          environment={'QTWEBKIT_PLUGIN_PATH': self.folder, 'MOZ_PLUGIN_PATH': self.folder})
        self.assertEqual(run.value, 1, run)

    def test_another_plug_in_is_seen_when_it_is_the_given_one(self):
        run = self.television.run('--plugin', FOREIGN_PLUGIN, shipped('first.html'), '--eval',
                                  '[navigator.plugins.length, navigator.plugins[0].name]')
        self.assertEqual(run.value, [1, 'Foreign Plug-in'], run)

    def test_the_desktop_plug_in_is_the_default(self):
        run = self.television.run(shipped('first.html'), '--eval', 'navigator.plugins[0].name')
        self.assertEqual(run.value, 'TELIX Scriptable Plugin', run)

    def test_a_file_name_relative_to_the_current_folder_will_do(self):
        run = self.television.run('--plugin', os.path.relpath(PLUGIN), shipped('first.html'), '--eval',
                                  'navigator.plugins.length')
        self.assertEqual(run.value, 1, run)


if __name__ == '__main__':
    unittest.main()
