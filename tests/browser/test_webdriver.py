"""telix-tv under WebKitWebDriver: keys, elements, scripts, screenshots, certificates and the windows of its applications."""

import os
import socket
import unittest

from selenium.common.exceptions import NoSuchWindowException
from selenium.webdriver.common.by import By
from selenium.webdriver.common.keys import Keys

from selenium_tv import DrivenTv, press
from telix_tv import GREEN, KEY_CODES, server, shipped
from television import PngImage, wait_for
from test_media_requests import CLIPS, PLAYER, PLAYING, TUNE, MediaServer, certificate_of

DESKTOP_PLUGIN = os.environ['TELIX_DESKTOP_PLUGIN']
# The keys of WebDriver that are keys of the remote control.
REMOTE_KEYS = {
    'left': Keys.ARROW_LEFT, 'up': Keys.ARROW_UP, 'right': Keys.ARROW_RIGHT, 'down': Keys.ARROW_DOWN, 'ok': Keys.ENTER,
    'back': Keys.BACKSPACE, 'red': Keys.F1, 'green': Keys.F2, 'yellow': Keys.F3, 'blue': Keys.F4, 'play': Keys.F5,
    'pause': Keys.F6, 'stop': Keys.F7, 'rewind': Keys.F8, 'fast-forward': Keys.F9, 'info': Keys.F10,
    **{str(digit): str(digit) for digit in range(10)},
}
RECORDER = '''<title>recorder</title><style>body { margin: 0; background: rgb(0, 128, 0) }</style>
    <button onclick="clicks++">press</button><p class="words">Good evening</p>
    <script>
        codes = []; names = []; clicks = 0;
        onkeydown = function (event) { codes.push(event.keyCode); names.push([event.key, event.code]); };
        onkeyup = function (event) { codes.push(-event.keyCode); };
    </script>'''


class Session(DrivenTv):
    def url(self, content):
        return 'file://' + self.write(content)

    def test_it_names_the_television(self):
        with self.session() as session:
            self.assertEqual(session.capabilities['browserName'], 'telix-tv')
            self.assertRegex(session.capabilities['browserVersion'], r'^1\.25(\.0)?$')

    def test_elements_and_scripts(self):
        with self.session() as session:
            session.get(self.url(RECORDER))
            self.assertEqual(session.title, 'recorder')
            self.assertEqual(session.find_element(By.CSS_SELECTOR, 'p.words').text, 'Good evening')
            self.assertEqual(session.execute_script('return [innerWidth, innerHeight, arguments[0] * 2]', 21),
                             [1280, 720, 42])
            self.assertEqual(session.execute_async_script('setTimeout(arguments[0], 1, "later")'), 'later')
            self.assertEqual(session.execute_script('return navigator.plugins[0].name'), 'TELIX Scriptable Plugin')
            self.assertIn('HbbTV/1.1.1', session.execute_script('return navigator.userAgent'))

    def test_a_click_in_a_window_of_another_size(self):
        with self.session('--size', '400x300') as session:
            session.get(self.url(RECORDER))
            session.find_element(By.TAG_NAME, 'button').click()
            self.assertEqual(session.execute_script('return clicks'), 1)

    def test_every_key_of_the_remote_control(self):
        with self.session() as session:
            session.get(self.url(RECORDER))
            for name, key in REMOTE_KEYS.items():
                # What a key does is done when the command returns.
                press(session, key)
                code = KEY_CODES[name]
                self.assertEqual(session.execute_script('return codes.splice(0)'), [code, -code], name)

    def test_keys_have_names(self):
        with self.session() as session:
            session.get(self.url(RECORDER))
            press(session, *(REMOTE_KEYS[name] for name in ('left', 'red', 'back', '5')))
            self.assertEqual(session.execute_script('return names'), [
                ['ArrowLeft', 'ArrowLeft'], ['ColorF0Red', ''], ['GoBack', 'BrowserBack'], ['5', 'Digit5']])

    def test_keys_in_a_row_keep_their_order(self):
        with self.session() as session:
            session.get(self.url(RECORDER))
            names = ['red', 'down', '5', 'blue', 'ok', 'back', 'left', 'green']
            press(session, *(REMOTE_KEYS[name] for name in names))
            presses = session.execute_script('return codes.filter(function (code) { return code > 0; })')
            self.assertEqual(presses, [KEY_CODES[name] for name in names])

    def test_keys_go_to_the_frame_with_the_focus(self):
        with self.session() as session:
            session.get(self.url(f"<script>codes = [];</script><iframe srcdoc='{RECORDER}'></iframe>"))
            session.switch_to.frame(0)
            session.find_element(By.TAG_NAME, 'button').click()
            press(session, Keys.F1, Keys.ARROW_UP)
            self.assertEqual(session.execute_script('return codes'), [403, -403, 38, -38])

    def test_keys_sent_to_an_element(self):
        with self.session() as session:
            session.get(self.url('<input id="name">'))
            element = session.find_element(By.ID, 'name')
            element.send_keys('407')
            self.assertEqual(element.get_property('value'), '407')

    def test_a_screenshot_is_that_of_the_page(self):
        file_name = os.path.join(self.folder, 'page.png')
        with self.session('--size', '400x300') as session:
            session.get(self.url('<style>body { margin: 0; background: rgb(0, 128, 0) }</style>'))

            def colours():
                # Of what the engine has painted last, which may be older than the document.
                self.assertTrue(session.save_screenshot(file_name))
                picture = PngImage(file_name)
                self.assertEqual((picture.width, picture.height), (1280, 720))
                return [picture.colour(*point) for point in ((0, 0), (1279, 719))]

            wait_for(lambda: colours() == [GREEN, GREEN], 'the page is not in the screenshot')

    def test_a_page_that_cannot_be_loaded(self):
        with self.session() as session:
            session.get(self.url('<title>before</title>'))
            self.write('<title>after</title>', 'after.html')
            with socket.socket() as closed:
                closed.bind(('127.0.0.1', 0))
                session.get(f'http://127.0.0.1:{closed.getsockname()[1]}/')
            session.get('file://' + os.path.join(self.folder, 'after.html'))
            self.assertEqual(session.title, 'after')

    def test_quit_ends_the_television_and_leaves_nothing(self):
        with self.session() as session:
            session.get(self.url(RECORDER))
            self.assertNotEqual(self.television.leftovers(), [])
        wait_for(lambda: self.television.leftovers() == [], self.television.leftovers)


    def test_sessions_of_a_driver_follow_each_other(self):
        with self.driver() as service:
            for name in ('first', 'second'):
                with self.session_of(service) as session:
                    session.get('file://' + shipped(name + '.html'))
                    self.assertEqual(session.title, name)

    def test_the_television_ends_with_its_driver(self):
        with self.driver() as service:
            session = self.start_session(service)
            session.get(self.url(RECORDER))
            self.assertNotEqual(self.television.leftovers(), [])
            service.process.kill()
            wait_for(lambda: self.television.leftovers() == [], self.television.leftovers)

    def test_a_profile_keeps_what_the_session_has_stored(self):
        profile = os.path.join(self.folder, 'profile')
        with self.driver() as service, server() as url:
            for value in ('', '1', '2'):
                with self.session_of(service, '--profile', profile) as session:
                    session.get(url + '/page')
                    self.assertEqual(session.execute_script('return localStorage.value || ""'), value)
                    session.execute_script('localStorage.value = Number(localStorage.value || 0) + 1')


class RemoteControl(DrivenTv):
    """Keys and the key set of the desktop's platform library."""

    page = '''<object id="tv" type="video/broadcast"></object>
        <script>
            codes = [];
            onkeydown = function (event) { codes.push(event.keyCode); };
            onload = function () { tv.bindToCurrentChannel(); };
        </script>'''

    def wait_for_channel(self, session, name):
        def channel():
            return session.execute_script('return tv.currentChannel && tv.currentChannel.name')
        wait_for(lambda: channel() == name, channel)

    def test_keys_outside_of_the_key_set_are_the_television_s(self):
        # The key set of the tests has the red key and the navigation keys.
        with self.session(plugin=DESKTOP_PLUGIN) as session:
            session.get('file://' + self.write(self.page))
            self.wait_for_channel(session, 'Telix One')
            for keys, name in (('2', 'Telix Two'), (Keys.F11, 'Telix Three'), (Keys.F12, 'Telix Two')):
                press(session, keys)
                self.wait_for_channel(session, name)
            press(session, Keys.F1, Keys.F2, Keys.ARROW_DOWN)
            self.assertEqual(session.execute_script('return codes'), [403, 40])

    def test_exit_ends_the_applications(self):
        with self.session(plugin=DESKTOP_PLUGIN) as session:
            session.get('file://' + self.write(self.page))
            press(session, Keys.END)
            wait_for(lambda: session.current_url == 'about:blank', lambda: session.current_url)
            session.switch_to.new_window('window')
            session.get('file://' + shipped('first.html'))
            self.assertEqual((session.title, session.execute_script('return document.visibilityState')),
                             ('first', 'visible'))


class Certificates(DrivenTv):
    def test_page_and_media_of_a_session_that_accepts_any(self):
        _, both = certificate_of(self.folder)
        with MediaServer({'': self.folder, 'clips': CLIPS}, certificate=both) as running:
            self.write(PLAYER.format(url=running.url + TUNE, kind='audio/mpeg', image='data:,'))
            with self.session(plugin=DESKTOP_PLUGIN, accepts_any_certificate=True) as session:
                session.get(running.url + '/page.html')
                wait_for(lambda: PLAYING in session.execute_script('return states'),
                         lambda: session.execute_script('return states'))
            with self.session(plugin=DESKTOP_PLUGIN) as session:
                session.get(running.url + '/page.html')
                self.assertEqual(session.execute_script('return typeof states'), 'undefined')


class Windows(DrivenTv):
    def test_each_application_is_a_window(self):
        with self.session() as session:
            session.get('file://' + shipped('first.html'))
            first = session.current_window_handle
            press(session, REMOTE_KEYS['green'])
            handles = wait_for(lambda: len(session.window_handles) == 2 and session.window_handles, 'no application')
            second = next(handle for handle in handles if handle != first)
            self.assertEqual(session.title, 'first')
            session.switch_to.window(second)
            wait_for(lambda: session.title == 'second', lambda: session.title)
            session.close()
            wait_for(lambda: session.window_handles == [first], lambda: session.window_handles)
            with self.assertRaises(NoSuchWindowException):
                session.title  # pylint: disable=pointless-statement
            session.switch_to.window(first)
            self.assertEqual(session.title, 'first')

    def test_a_new_window_is_an_application_above_the_others(self):
        with self.session() as session:
            session.get('file://' + shipped('first.html'))
            first = session.current_window_handle
            session.switch_to.new_window('window')
            session.get('file://' + self.write(RECORDER))
            self.assertEqual(len(session.window_handles), 2)
            self.assertEqual(session.execute_script('return document.visibilityState'), 'visible')
            session.switch_to.window(first)
            self.assertEqual(session.execute_script('return document.visibilityState'), 'hidden')

    def test_closing_the_last_one_ends_the_television(self):
        with self.session() as session:
            session.get('file://' + shipped('first.html'))
            session.close()
            wait_for(lambda: self.television.leftovers() == [], self.television.leftovers)


if __name__ == '__main__':
    unittest.main()
