"""telix-tv by its own: options, messages, exit statuses, keys, applications, picture."""

import contextlib
import http.server
import os
import shutil
import signal
import threading
import unittest
import urllib.parse

from television import Picture, Television, temporary_folder

PAGES = os.path.join(os.path.dirname(os.path.abspath(__file__)), 'pages')
PLUGIN = os.environ['TELIX_PLUGIN']
STRANGER = os.environ['TELIX_STRANGER']
BLACK, GREEN, BLUE = (0, 0, 0), (0, 128, 0), (0, 0, 255)
# What HbbTV 1.1.1 has a set say of itself: options, maker, model, software, hardware, one field that is kept free.
AGENT_TOKEN = r'HbbTV/1\.1\.1 \([^;()]*;[^;()]*;[^;()]*;[^;()]*;[^;()]*;[^;()]*\)'

# Every key of the remote control with the code that a page sees.
KEY_CODES = {
    'left': 37, 'up': 38, 'right': 39, 'down': 40, 'ok': 13, 'back': 461,
    'red': 403, 'green': 404, 'yellow': 405, 'blue': 406,
    'play': 415, 'pause': 19, 'stop': 413, 'rewind': 412, 'fast-forward': 417, 'info': 457,
    '0': 48, '1': 49, '2': 50, '3': 51, '4': 52, '5': 53, '6': 54, '7': 55, '8': 56, '9': 57,
}


def shipped(name):
    return os.path.join(PAGES, name)


class TelixTv(unittest.TestCase):
    """Base of all: a display for the class and a folder for the test."""

    @classmethod
    def setUpClass(cls):
        cls.television = Television(os.environ['TELIX_TV'])
        cls.addClassCleanup(cls.television.close)

    def setUp(self):
        stack = contextlib.ExitStack()
        self.addCleanup(stack.close)
        self.folder = stack.enter_context(temporary_folder())

    def write(self, content, name='page.html'):
        path = os.path.join(self.folder, name)
        with open(path, 'wb') as file:
            file.write(content if isinstance(content, bytes) else content.encode())
        return path

    def run_tv(self, *arguments, environment=None):
        return self.television.run('--plugin', PLUGIN, *arguments, environment=environment)

    def value(self, *arguments):
        run = self.run_tv(*arguments)
        self.assertEqual(run.status, 0, run)
        return run.value

    def picture(self, *arguments, size='64x36'):
        """A screenshot: small, for it is read pixel by pixel. At 64x36 one pixel of it shows 20x20 of the page."""
        file_name = os.path.join(self.folder, 'picture.png')
        run = self.run_tv('--size', size, '--screenshot', file_name, *arguments)
        self.assertEqual(run.status, 0, run)
        return Picture(file_name)

    def assert_refused(self, run, *fragments):
        """One line that says why, and status 2."""
        self.assertEqual(run.status, 2, run)
        self.assertEqual(len(run.errors.splitlines()), 1, run)
        self.assertTrue(run.errors.startswith('telix-tv: '), run)
        for fragment in fragments:
            self.assertIn(fragment, run.errors)


class CommandLine(TelixTv):
    def test_help_names_every_option(self):
        run = self.television.run('--help', environment={'DISPLAY': ''})
        self.assertEqual((run.status, run.errors), (0, ''), run)
        for option in ('size', 'fullscreen', 'plugin', 'screenshot', 'wait-for', 'wait-for-picture', 'timeout', 'eval',
                       'keys', 'user-agent', 'inspect', 'help', 'version'):
            self.assertIn(f'--{option}', run.output)

    def test_help_names_every_key(self):
        words = self.television.run('--help').output.replace('.', ',').split()
        for name in KEY_CODES:
            self.assertIn(f'{name},', words)

    def test_version(self):
        run = self.television.run('--version', environment={'DISPLAY': ''})
        self.assertEqual((run.status, run.errors), (0, ''), run)
        self.assertRegex(run.output, r'^telix-tv 1\.25 \(QtWebKit 5\.212[.0-9]*, Qt 5\.[0-9.]+\)\n$')

    def test_an_unknown_option_is_refused(self):
        self.assert_refused(self.run_tv('--colour', shipped('first.html')), 'colour')

    def test_an_option_without_its_value_is_refused(self):
        self.assert_refused(self.run_tv(shipped('first.html'), '--eval'), 'eval')

    def test_no_page_is_refused(self):
        self.assert_refused(self.run_tv(), 'page')

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
        for option in ('--wait-for', '--eval', '--screenshot', '--plugin', '--user-agent'):
            self.assert_refused(self.run_tv(f'{option}=', shipped('first.html')), option)

    def test_no_display_is_refused(self):
        run = self.run_tv(shipped('first.html'), environment={'DISPLAY': ''})
        self.assert_refused(run, 'display')

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
            picture = Picture(file_name)
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
        picture = Picture(file_name)
        self.assertEqual((picture.width, picture.height), (1920, 1080))
        self.assertEqual([picture.colour(x, y) for x, y in ((0, 0), (959, 539), (960, 539), (959, 540), (1919, 1079))],
                         [GREEN, GREEN, BLUE, BLUE, BLUE])

    def test_a_window_of_another_shape_keeps_the_shape_of_the_page(self):
        wide = self.picture(shipped('first.html'), size='256x90')
        self.assertEqual([wide.colour(x, 45) for x in (0, 47, 48, 207, 208, 255)],
                         [BLACK, BLACK, GREEN, GREEN, BLACK, BLACK])
        high = self.picture(shipped('first.html'), size='160x120')
        self.assertEqual([high.colour(80, y) for y in (0, 14, 15, 104, 105, 119)],
                         [BLACK, BLACK, GREEN, GREEN, BLACK, BLACK])

    def test_the_mouse_points_at_what_is_shown_there(self):
        page = self.write('<script>onmousemove = function (event) { console.log(event.clientX + " " + event.clientY); };'
                          'onload = function () { console.log("ready"); }</script>')
        with self.television.start('--plugin', PLUGIN, '--fullscreen', page) as process:
            self.assertIn('ready', process.stderr.readline())
            # The window may not be on the screen yet when the first movement comes.
            while True:
                self.television.point_at(300, 600)
                self.television.point_at(1500, 750)
                if any(process.stderr.readline().endswith(' 1000 500\n') for _ in range(2)):
                    break
            process.send_signal(signal.SIGTERM)
            process.communicate(timeout=60)

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


class Server(http.server.BaseHTTPRequestHandler):
    """A page at /page, an error at /error, no answer in time at /silence, and at /as/TYPE, with any type, what the server's
    `document` holds. Keeps what its clients say that they are."""

    def do_GET(self):  # pylint: disable=invalid-name
        self.server.agents.append(self.headers['User-Agent'])
        if self.path.startswith('/as/'):
            self.send_response(200)
            self.send_header('Content-Type', urllib.parse.unquote(self.path[len('/as/'):]))
            self.end_headers()
            self.wfile.write(self.server.document)
            return
        if self.path == '/silence':
            self.server.over.wait()
            return
        if self.path == '/elsewhere':
            self.send_response(302)
            self.send_header('Location', self.server.elsewhere)
            self.end_headers()
            return
        self.send_response(200 if self.path == '/page' else 404)
        self.send_header('Content-Type', 'text/html')
        self.end_headers()
        self.wfile.write(b'<title>served</title><script>console.log("served")</script>')

    def log_message(self, *_):
        pass


@contextlib.contextmanager
def running_server(document=b'', elsewhere='/page'):
    with http.server.ThreadingHTTPServer(('127.0.0.1', 0), Server) as running:
        running.over = threading.Event()
        running.agents = []
        running.document = document
        running.elsewhere = elsewhere
        running.address = f'http://127.0.0.1:{running.server_port}'
        thread = threading.Thread(target=running.serve_forever)
        thread.start()
        try:
            yield running
        finally:
            running.over.set()
            running.shutdown()
            thread.join()


@contextlib.contextmanager
def server():
    with running_server() as running:
        yield running.address


class Pages(TelixTv):
    def test_a_file_and_an_address_of_a_file_are_loaded(self):
        self.assertEqual(self.value(shipped('first.html'), '--eval', 'document.title'), 'first')
        self.assertEqual(self.value('file://' + shipped('first.html') + '?a#b', '--eval', 'location.search'), '?a')

    def test_a_file_name_may_hold_anything(self):
        page = self.write('<title>odd</title>', 'a b#c?d%20ü.html')
        self.assertEqual(self.value(page, '--eval', 'document.title'), 'odd')

    def test_a_page_of_a_server_is_loaded(self):
        with server() as address:
            self.assertEqual(self.value(address + '/page', '--eval', 'document.title'), 'served')
            self.assertEqual(self.value(address + '/elsewhere', '--eval', 'location.pathname'), '/page')

    def test_a_missing_file_is_refused(self):
        self.assert_refused(self.run_tv(shipped('missing.html')), 'missing.html', 'no such file')

    def test_a_folder_is_refused(self):
        self.assert_refused(self.run_tv(self.folder), self.folder)

    def test_a_file_that_is_no_page_is_refused(self):
        page = self.write(bytes(range(256)), 'page.bin')
        self.assert_refused(self.run_tv(page), 'page.bin')

    def test_an_error_of_the_server_is_refused(self):
        with server() as address:
            self.assert_refused(self.run_tv(address + '/error'), '/error', '404')

    def test_a_server_that_is_not_there_is_refused(self):
        self.assert_refused(self.run_tv('http://127.0.0.1:1/'), '127.0.0.1')

    def test_a_server_that_does_not_answer_is_refused(self):
        with server() as address:
            self.assert_refused(self.run_tv(address + '/silence'), '/silence', 'not answer')

    def test_an_unknown_kind_of_address_is_refused(self):
        self.assert_refused(self.run_tv('nowhere://page'), 'nowhere')

    def test_a_page_that_never_finishes_loading_is_refused_in_time(self):
        with server() as address:
            page = self.write(f'<img src="{address}/silence">')
            self.assert_refused(self.run_tv(page, '--timeout', '1', '--eval', '1'), 'page.html', 'within 1 s')

    def test_a_page_that_is_only_looked_at_may_load_as_long_as_it_likes(self):
        with server() as address:
            page = self.write(f'<img src="{address}/silence"><script>setTimeout(function () {{ console.log("on"); }}, 1500)'
                              '</script>')
            with self.television.start('--plugin', PLUGIN, '--timeout', '0.1', page) as process:
                self.assertIn('on', process.stderr.readline())
                self.assertIsNone(process.poll())
                process.send_signal(signal.SIGTERM)
                process.communicate(timeout=60)

    def test_an_address_that_a_loaded_page_fails_to_go_to_leaves_the_page(self):
        page = self.write('<title>stays</title><script>onload = function () { location.href = "missing.html"; }</script>')
        run = self.run_tv(page, '--wait-for', '(window.count = (window.count || 0) + 1) > 20',
                          '--eval', 'document.title')
        self.assertEqual(run.status, 0, run)
        self.assertEqual(run.value, 'stays')
        self.assertIn("telix-tv: can't load file://" + self.folder + '/missing.html', run.errors)

    def test_a_page_that_moves_on_at_once_is_followed(self):
        page = self.write(f'<script>location.href = "file://{shipped("first.html")}"</script>')
        self.assertEqual(self.value(page, '--wait-for', 'document.title === "first"', '--eval', 'document.title'),
                         'first')

    def test_console_messages_come_as_file_line_text(self):
        page = self.write('<script>\n\nfunction say(text) { console.log(text); }\nsay("one");\n</script>\n'
                          '<script>\nmissing();\n</script>')
        run = self.run_tv(page, '--eval', '1')
        self.assertEqual(run.errors.splitlines(), [
            f'{page}:3: one', f"{page}:7: ReferenceError: Can't find variable: missing"], run)

    def test_console_messages_of_a_served_page_come_with_its_address(self):
        with server() as address:
            run = self.run_tv(address + '/page', '--eval', '1')
            self.assertRegex(run.errors, rf'^{address}/page:[0-9]+: served\n$')

    def test_questions_are_printed_and_answered_with_no(self):
        page = self.write('<script>alert("a"); answers = [confirm("b"), prompt("c", "d")];</script>')
        run = self.run_tv(page, '--eval', 'answers')
        self.assertEqual(run.value, [False, None], run)
        self.assertEqual(len(run.errors.splitlines()), 3, run)

    def test_values_are_printed_as_json(self):
        for expression, value in (('1 + 1', 2), ('"ü\\n\\u2028"', 'ü\n\u2028'), ('[1, "a", null, true]',
                                  [1, 'a', None, True]), ('{ a: { b: 1.5 } }', {'a': {'b': 1.5}}),
                                  ('undefined', None), ('NaN', None), ('document.title // comment', 'first')):
            with self.subTest(expression):
                self.assertEqual(self.value(shipped('first.html'), '--eval', expression), value)

    def test_the_value_is_the_last_line_even_when_the_plug_in_has_something_to_say(self):
        run = self.run_tv(shipped('plugin.html'), '--eval', '"last"', environment={'LOG_MODULE': '1'})
        self.assertEqual(run.status, 0, run)
        self.assertEqual(run.output.splitlines()[-1], '"last"')
        self.assertIn('PLUGIN >>>', run.output)

    def test_an_expression_that_throws_has_no_value(self):
        for expression in ('nothing.there', 'syntax error', '(function () { throw 5; })()'):
            run = self.run_tv(shipped('first.html'), '--eval', expression)
            self.assertEqual(run.status, 1, run)
            self.assertEqual(len(run.errors.splitlines()), 1, run)
            self.assertIn(expression, run.errors)

    def test_what_becomes_true_is_waited_for(self):
        page = self.write('<script>setTimeout(function () { late = { value: 5 }; }, 300)</script>')
        self.assertEqual(self.value(page, '--wait-for', 'late.value === 5', '--eval', 'late.value'), 5)

    def test_what_never_becomes_true_ends_in_time(self):
        run = self.run_tv(shipped('first.html'), '--timeout', '3', '--wait-for', 'document.title === "x"',
                          '--eval', '1')
        self.assertEqual(run.status, 1, run)
        self.assertEqual(run.errors, 'telix-tv: not true within 3 s: document.title === "x"\n')
        self.assertNotIn('1', run.output.splitlines())

    def test_what_throws_is_not_yet_true_and_the_end_says_what_was_thrown(self):
        run = self.run_tv(shipped('first.html'), '--timeout', '3', '--wait-for', 'nothing.there')
        self.assertEqual(run.status, 1, run)
        self.assertIn("ReferenceError: Can't find variable: nothing", run.errors)

    def test_waiting_in_vain_leaves_a_screenshot(self):
        file_name = os.path.join(self.folder, 'picture.png')
        run = self.run_tv(shipped('first.html'), '--size', '64x36', '--timeout', '3', '--wait-for', 'false',
                          '--screenshot', file_name)
        self.assertEqual(run.status, 1, run)
        self.assertEqual(Picture(file_name).colours(), {bytes(GREEN)})

    def test_keys_then_waiting_then_value_then_screenshot(self):
        page = self.write('<style>html { background: rgb(0, 0, 255) }</style><script>steps = [];'
                          'onload = function () { steps.push("load"); };'
                          'onkeydown = function () { steps.push("key"); }</script>')
        file_name = os.path.join(self.folder, 'picture.png')
        self.assertEqual(self.value(
            page, '--size', '64x36', '--screenshot', file_name,
            '--eval', 'document.documentElement.style.background = "rgb(0, 128, 0)", steps.push("eval"), steps',
            '--wait-for', 'steps.push("wait")', '--keys', 'red,down'), ['load', 'key', 'key', 'wait', 'eval'])
        self.assertEqual(Picture(file_name).colours(), {bytes(GREEN)})

    def test_nothing_is_left_behind(self):
        self.value(shipped('first.html'), '--eval', '1')
        self.assertEqual(self.television.leftovers(), [])


class Documents(TelixTv):
    """Pages as television services send them."""

    TYPE = 'application/vnd.hbbtv.xhtml+xml'
    # Names keep their case in XHTML alone, and an element that is closed at once holds nothing of what follows.
    DOCUMENT = ('<?xml version="1.0" encoding="utf-8"?>\n'
                '<!DOCTYPE html PUBLIC "-//HbbTV//1.1.1//EN" "http://www.hbbtv.org/dtd/HbbTV-1.1.1.dtd">\n'
                '<html xmlns="http://www.w3.org/1999/xhtml"><head><title>tele\u00e9</title></head>'
                '<body><div id="empty"/><p>text</p></body></html>').encode()
    FACTS = '[document.title, document.body.tagName, document.getElementById("empty").childNodes.length]'
    XHTML = ['tele\u00e9', 'body', 0]

    def test_a_television_document_of_a_server_is_xhtml(self):
        with running_server(self.DOCUMENT) as running:
            for kind in (self.TYPE, self.TYPE + ';charset=utf-8', 'Application/VND.HbbTV.XHTML+XML ; charset="utf-8"',
                         'application/xhtml+xml'):
                self.assertEqual(self.value(f'{running.address}/as/{urllib.parse.quote(kind)}', '--eval', self.FACTS),
                                 self.XHTML, kind)

    def test_the_character_set_that_the_server_names_stays(self):
        document = self.DOCUMENT.replace(b' encoding="utf-8"', b'').decode().encode('latin-1')
        with running_server(document) as running:
            kind = urllib.parse.quote(self.TYPE + ';charset=iso-8859-1')
            self.assertEqual(self.value(f'{running.address}/as/{kind}', '--eval', self.FACTS), self.XHTML)

    def test_other_types_stay_what_they_are(self):
        with running_server(self.DOCUMENT) as running:
            self.assertEqual(self.value(f'{running.address}/as/text/html', '--eval', self.FACTS), ['tele\u00e9', 'BODY', 1])

    def test_a_television_document_that_is_far_from_the_first_packet_is_whole(self):
        filling = b'<!-- ' + 64 * b'x' + b' -->\n'
        long = self.DOCUMENT.replace(b'<p>', 20000 * filling + b'<p>')
        with running_server(long) as running:
            self.assertEqual(self.value(f'{running.address}/as/{self.TYPE}', '--eval',
                                        'document.querySelector("p").textContent'), 'text')

    def test_a_television_document_is_found_behind_a_redirection_in_a_frame_and_as_an_application(self):
        with running_server(self.DOCUMENT, elsewhere='/as/' + self.TYPE) as running:
            self.assertEqual(self.value(running.address + '/elsewhere', '--eval', self.FACTS), self.XHTML)
            frame = self.write(f'<iframe src="{running.address}/as/{self.TYPE}"></iframe><script>onload = function () {{'
                               ' loaded = true; }</script>')
            run = self.run_tv(frame, '--eval', 'loaded')
            self.assertEqual((run.status, run.errors), (0, ''), run)
            page = self.write(f'<script>onload = function () {{ createHbbTVApplication("{running.address}/as/{self.TYPE}");'
                              ' }</script>')
            self.assertEqual(self.value(page, '--wait-for', 'document.getElementById("empty")', '--eval', self.FACTS),
                             self.XHTML)

    def test_a_television_document_that_is_not_well_formed_says_so(self):
        with running_server(self.DOCUMENT.replace(b'</p>', b'')) as running:
            self.assertIn('error', self.value(f'{running.address}/as/{self.TYPE}', '--eval',
                                              'document.documentElement.textContent'))

    def test_files_are_xhtml_by_their_names(self):
        for name in ('page.xhtml', 'page.hbbtv', 'PAGE.HBBTV'):
            page = self.write(self.DOCUMENT, name)
            self.assertEqual(self.value(page, '--eval', self.FACTS), self.XHTML, name)

    def test_servers_and_pages_are_told_that_this_is_a_television(self):
        with running_server() as running:
            agent = self.value(running.address + '/page', '--eval', 'navigator.userAgent')
        self.assertRegex(agent, f' {AGENT_TOKEN}$')
        self.assertEqual(agent.count('HbbTV'), 1)
        self.assertEqual(set(running.agents), {agent})

    def test_the_user_agent_of_the_command_line_replaces_all_of_it(self):
        with running_server() as running:
            self.assertEqual(self.value(running.address + '/page', '--user-agent', 'My set/2 (a; b)', '--eval',
                                        'navigator.userAgent'), 'My set/2 (a; b)')
        self.assertEqual(set(running.agents), {'My set/2 (a; b)'})


class Plugins(TelixTv):
    def run_with(self, plugin, *arguments):
        return self.television.run('--plugin', plugin, *arguments, shipped('plugin.html'))

    def test_a_missing_plug_in_is_refused(self):
        self.assert_refused(self.run_with(os.path.join(self.folder, 'missing.so')), 'missing.so', 'no such file')

    def test_a_folder_is_refused(self):
        self.assert_refused(self.run_with(self.folder), self.folder)

    def test_a_file_that_is_no_library_is_refused(self):
        self.assert_refused(self.run_with(self.write('text', 'text.so')), 'text.so')

    def test_a_library_that_is_no_plug_in_is_refused(self):
        with open('/proc/self/maps', encoding='utf-8') as maps:
            c_library = next(line.split()[-1] for line in maps if '/libc.so' in line)
        self.assert_refused(self.run_with(c_library), 'NP_Initialize')

    def test_only_the_given_plug_in_is_seen(self):
        shutil.copy(STRANGER, os.path.join(self.folder, 'npstranger.so'))
        plugin = shutil.copy(PLUGIN, os.path.join(self.folder, 'npown.so'))
        run = self.television.run('--plugin', plugin, shipped('first.html'), '--eval',
                                  '[navigator.plugins.length, navigator.plugins[0].name]')
        self.assertEqual(run.value, [1, 'TELIX Scriptable Plugin'], run)

    def test_the_environment_adds_no_plug_ins(self):
        shutil.copy(STRANGER, os.path.join(self.folder, 'npstranger.so'))
        run = self.run_tv(shipped('first.html'), '--eval', 'navigator.plugins.length',
                          environment={'QTWEBKIT_PLUGIN_PATH': self.folder, 'MOZ_PLUGIN_PATH': self.folder})
        self.assertEqual(run.value, 1, run)

    def test_another_plug_in_is_seen_when_it_is_the_given_one(self):
        run = self.television.run('--plugin', STRANGER, shipped('first.html'), '--eval',
                                  '[navigator.plugins.length, navigator.plugins[0].name]')
        self.assertEqual(run.value, [1, 'Stranger'], run)

    def test_the_desktop_plug_in_is_the_default(self):
        run = self.television.run(shipped('first.html'), '--eval', 'navigator.plugins[0].name')
        self.assertEqual(run.value, 'TELIX Scriptable Plugin', run)

    def test_a_file_name_relative_to_the_current_folder_will_do(self):
        run = self.television.run('--plugin', os.path.relpath(PLUGIN), shipped('first.html'), '--eval',
                                  'navigator.plugins.length')
        self.assertEqual(run.value, 1, run)


class Keys(TelixTv):
    RECORDER = '''<input id="field"><script>
        var seen = [], prevented = [];
        ['keydown', 'keypress', 'keyup'].forEach(function (type) {
            document.addEventListener(type, function (event) {
                seen.push([type, event.keyCode, event.target.id || event.target.nodeName]);
                if (prevented.indexOf(event.keyCode) >= 0) { event.preventDefault(); }
            }, false);
        });
        </script>'''

    def seen(self, keys, prepare='0'):
        return self.value(self.write(self.RECORDER), '--wait-for', 'true', '--keys', keys, '--eval', f'{prepare}, seen')

    def test_every_key_arrives_with_its_code(self):
        seen = self.seen(','.join(KEY_CODES))
        self.assertEqual([code for kind, code, _ in seen if kind == 'keydown'], list(KEY_CODES.values()))
        self.assertEqual([code for kind, code, _ in seen if kind == 'keyup'], list(KEY_CODES.values()))

    def test_a_key_goes_down_then_up_before_the_next(self):
        self.assertEqual(self.seen('red,left,back'), [
            ['keydown', 403, 'BODY'], ['keypress', 403, 'BODY'], ['keyup', 403, 'BODY'],
            ['keydown', 37, 'BODY'], ['keyup', 37, 'BODY'],
            ['keydown', 461, 'BODY'], ['keypress', 461, 'BODY'], ['keyup', 461, 'BODY']])

    def with_script(self, script, keys, expression):
        return self.value(self.write(self.RECORDER + f'<script>{script}</script>'), '--keys', keys, '--eval', expression)

    def test_a_prevented_keydown_has_no_keypress(self):
        self.assertEqual(self.with_script('prevented = [403, 53]', 'red,5', 'seen.map(function (e) { return e[0]; })'),
                         ['keydown', 'keyup', 'keydown', 'keyup'])

    def test_keys_go_to_the_element_with_the_focus(self):
        seen = self.with_script('field.focus()', 'red,5,back', 'seen')
        self.assertEqual({target for _, _, target in seen}, {'field'})

    def test_digits_are_typed_unless_prevented(self):
        self.assertEqual(self.with_script('field.focus(); prevented = [54]', '5,6,7', 'field.value'), '57')

    def test_ok_presses_a_button(self):
        self.assertEqual(self.value(self.write(
            '<button autofocus onclick="pressed = (window.pressed || 0) + 1">x</button><script>onload = function () {'
            'document.querySelector("button").focus(); }</script>'), '--keys', 'ok,ok', '--eval', 'pressed'), 2)

    def test_keys_go_to_the_frame_with_the_focus(self):
        self.write(self.RECORDER, 'inner.html')
        page = self.write('<iframe src="inner.html"></iframe><script>onload = function () { frames[0].focus(); }</script>')
        self.assertEqual([e[1] for e in self.value(page, '--keys', 'blue', '--eval', 'frames[0].seen')],
                         [406, 406, 406])

    def test_events_are_key_events_with_which_and_without_modifiers(self):
        page = self.write('''<script>addEventListener('keydown', function (event) {
            seen = [event instanceof KeyboardEvent, event.which, event.bubbles, event.cancelable, event.ctrlKey,
                    event.altKey, event.shiftKey, event.metaKey];
            }, false)</script>''')
        for key in ('green', 'left'):
            self.assertEqual(self.value(page, '--keys', key, '--eval', 'seen'),
                             [True, KEY_CODES[key], True, True, False, False, False, False])

    def test_a_key_waits_for_the_page_that_the_key_before_it_opened(self):
        self.write(self.RECORDER, 'next.html')
        page = self.write('<script>onkeydown = function () { location.href = "next.html"; }</script>')
        self.assertEqual([e[1] for e in self.value(page, '--keys', 'red,green', '--wait-for', 'seen.length',
                                                   '--eval', 'seen')], [404, 404, 404])

    def test_keys_that_no_application_is_there_for_end_in_time(self):
        run = self.run_tv(shipped('first.html'), '--keys', 'back,red', '--timeout', '1')
        self.assertEqual(run.status, 1, run)
        self.assertIn('number 2', run.errors)


class Applications(TelixTv):
    TITLE = ('--eval', 'document.title')

    def test_a_new_application_covers_the_old_one(self):
        self.assertEqual(self.value(shipped('first.html'), '--keys', 'green', *self.TITLE), 'second')
        self.assertEqual(self.picture(shipped('first.html'), '--keys', 'green').colours(), {bytes(BLUE)})

    def test_an_application_that_ends_brings_back_the_one_beneath(self):
        self.assertEqual(self.value(shipped('first.html'), '--keys', 'green,back', *self.TITLE), 'first')
        self.assertEqual(self.picture(shipped('first.html'), '--keys', 'green,back').colours(), {bytes(GREEN)})

    def test_applications_form_a_stack(self):
        for keys, title in (('green,green', 'first'), ('green,green,green', 'second'),
                            ('green,green,green,back', 'first'), ('green,green,green,back,back', 'second'),
                            ('green,green,green,back,back,back', 'first')):
            with self.subTest(keys):
                self.assertEqual(self.value(shipped('first.html'), '--keys', keys, *self.TITLE), title)

    def test_an_application_beneath_ends_the_one_that_it_has_opened(self):
        page = self.write(f'''<title>beneath</title><script>onload = function () {{
            created = createHbbTVApplication('file://{shipped("second.html")}');
            setTimeout(function () {{ destroyHbbTVApplication(); ended = true; }}, 200); }}</script>''')
        self.assertEqual(self.value(page, '--wait-for', 'ended', '--eval', '[created, document.title]'),
                         [True, 'beneath'])

    def test_after_the_last_application_the_screen_is_empty(self):
        self.assertEqual(self.picture(shipped('first.html'), '--keys', 'back').colours(), {bytes(BLACK)})

    def test_without_an_application_there_is_nothing_to_evaluate(self):
        run = self.run_tv(shipped('first.html'), '--keys', 'back', '--eval', '1')
        self.assertEqual(run.status, 1, run)
        self.assertIn('no application', run.errors)

    def test_a_hidden_application_paints_nothing(self):
        self.assertEqual(self.picture(shipped('first.html'), '--keys', 'yellow').colours(), {bytes(BLACK)})

    def test_a_hidden_application_still_has_the_keys_and_can_show_itself(self):
        self.assertEqual(self.picture(shipped('first.html'), '--keys', 'yellow,blue').colours(), {bytes(GREEN)})

    def test_an_application_beneath_stays_hidden_when_it_comes_back(self):
        self.assertEqual(self.picture(shipped('first.html'), '--keys', 'yellow,green').colours(), {bytes(BLUE)})
        self.assertEqual(self.picture(shipped('first.html'), '--keys', 'yellow,green,back').colours(), {bytes(BLACK)})

    def test_a_page_knows_whether_it_is_on_the_screen(self):
        page = self.write(f'''<script>seen = [document.hidden];
            document.addEventListener('visibilitychange', function () {{ seen.push(document.hidden); }}, false);
            onload = function () {{
                hideHbbTVApplication(); showHbbTVApplication();
                createHbbTVApplication('file://{shipped("second.html")}'); destroyHbbTVApplication(); }}</script>''')
        self.assertEqual(self.value(page, '--eval', 'seen'), [False, True, False, True, False])

    def test_an_application_of_a_server_opens_if_the_server_has_it(self):
        with server() as address:
            page = self.write(f'''<script>opened = ['page', 'elsewhere', 'error'].map(function (path) {{
                var created = createHbbTVApplication('{address}/' + path);
                if (created) {{ destroyHbbTVApplication(); }}
                return created; }})</script>''')
            self.assertEqual(self.value(page, '--eval', 'opened'), [True, True, False])

    def test_a_server_that_does_not_answer_gives_no_application(self):
        with server() as address:
            page = self.write(f'<script>opened = createHbbTVApplication("{address}/silence")</script>')
            self.assertEqual(self.value(page, '--eval', 'opened'), False)

    def test_an_application_whose_file_turns_out_to_be_no_page_leaves_the_stack(self):
        self.write(bytes(range(256)), 'page.bin')
        page = self.write('<title>beneath</title><script>opened = createHbbTVApplication("page.bin")</script>')
        run = self.run_tv(page, '--wait-for', 'opened', '--eval', 'document.title')
        self.assertEqual((run.status, run.value), (0, 'beneath'), run)
        self.assertIn('page.bin', run.errors)


class Screen(TelixTv):
    def test_the_screen_is_black_where_the_page_is_transparent(self):
        page = self.write('<body style="margin: 0; background: transparent">'
                          '<div style="width: 640px; height: 720px; background: rgb(0, 0, 255)">')
        picture = self.picture(page)
        self.assertEqual([picture.colour(x, 18) for x in (0, 31, 32, 63)], [BLUE, BLUE, BLACK, BLACK])

    def test_half_transparent_colours_mix_with_what_lies_beneath(self):
        page = self.write('<body style="background: rgba(0, 0, 255, 0.5)">')
        red, green, blue = self.picture(page).colour(5, 5)
        self.assertEqual((red, green), (0, 0))
        self.assertIn(blue, (127, 128))

    def test_an_object_of_the_plug_in_is_transparent(self):
        for element in ('<object type="application/oipfapplicationmanager" style="{}"></object>',
                        '<object type="Application/OIPFApplicationManager" style="{}"></object>',
                        '<embed type="application/oipfapplicationmanager" style="{}">'):
            style = 'display: block; opacity: 1; width: 1280px; height: 720px'
            page = self.write('<body style="margin: 0; background: transparent">' + element.format(style))
            self.assertEqual(self.picture(page).colours(), {bytes(BLACK)}, element)

    def test_an_object_of_the_plug_in_is_transparent_in_an_xml_page_as_well(self):
        page = self.write('<html xmlns="http://www.w3.org/1999/xhtml"><body style="margin: 0">'
                          '<object type="Application/OIPFApplicationManager" style="width: 1280px; height: 720px"/>'
                          '</body></html>', 'page.xhtml')
        self.assertEqual(self.picture(page).colours(), {bytes(BLACK)})

    def test_there_are_no_scroll_bars(self):
        page = self.write('<body style="margin: 0; background: rgb(0, 0, 255)"><div style="width: 1999px; height: 1999px">')
        self.assertEqual(self.picture(page).colours(), {bytes(BLUE)})

    def test_a_screenshot_that_cannot_be_written_is_refused(self):
        run = self.run_tv(shipped('first.html'), '--screenshot', os.path.join(self.folder, 'missing', 'picture.png'))
        self.assert_refused(run, 'picture.png')

    def test_layers_of_their_own_are_enlarged_and_reduced_like_the_page(self):
        page = self.write('<body style="margin: 0; background: transparent"><div style="width: 320px; height: 180px;'
                          ' background: rgb(0, 0, 255); -webkit-transform: translate3d(640px, 360px, 0)">')
        picture = self.picture(page)
        self.assertEqual([picture.colour(x, y) for x, y in ((33, 19), (46, 25), (30, 19), (49, 19), (33, 16), (33, 28))],
                         [BLUE, BLUE, BLACK, BLACK, BLACK, BLACK])

    def test_a_change_of_the_page_is_painted_wherever_it_is(self):
        page = self.write('''<body style="margin: 0; background: rgb(0, 0, 255)">
            <div id="box" style="position: absolute; left: 1200px; top: 640px; width: 80px; height: 80px"></div>
            <script>setTimeout(function () { box.style.background = 'rgb(0, 128, 0)'; }, 200);
            setTimeout(function () { changed = true; }, 400); onload = function () { console.log('ready'); };</script>''')
        # What the window's pixels are, not what painting all of it anew would give.
        for options, place in ((('--fullscreen',), (1860, 1020)), (('--size', '320x180'), (310, 170))):
            with self.television.start('--plugin', PLUGIN, *options, page) as process:
                self.assertIn('ready', process.stderr.readline())
                self.assertTrue(self.television.shows(place, GREEN), options)
                self.assertTrue(self.television.shows((place[0] // 2, place[1] // 2), BLUE), options)
                process.send_signal(signal.SIGTERM)
                process.communicate(timeout=60)


class PictureBeneath(TelixTv):
    """The picture of a platform library that shows a pattern of four quarters."""

    RED, LIME, WHITE = (255, 0, 0), (0, 255, 0), (255, 255, 255)
    PATTERN = [RED, LIME, BLUE, WHITE]

    def page(self, style='left: 0; top: 0; width: 1280px; height: 720px', content='', shape='16, 9, 1', script=''):
        return self.write('<body style="margin: 0"><object id="tv" type="video/broadcast" style="position: absolute; '
                          f'{style}"></object>{content}<script>onload = function () {{ tv.offsetWidth;'
                          f'tv.setChannelByTriplet({shape}); {script} }}</script>')

    def shown(self, page, *arguments, **options):
        picture = self.picture(page, '--wait-for-picture', *arguments, **options)
        self.assertNotIn(bytes((0x12, 0x34, 0x56)), picture.colours(), 'what lies behind the lines of the frame is shown')
        return picture

    def quarters(self, picture, left, top, width, height):
        """The colours in the middle of the quarters of a rectangle."""
        return [picture.colour(left + x * width // 4, top + y * height // 4) for y in (1, 3) for x in (1, 3)]

    def test_the_picture_fills_the_page(self):
        picture = self.shown(self.page(), size='128x72')
        self.assertEqual(self.quarters(picture, 0, 0, 128, 72), self.PATTERN)
        self.assertEqual([picture.colour(x, y) for x, y in ((0, 0), (127, 0), (0, 71), (127, 71))], self.PATTERN)

    def test_every_pixel_is_where_it_belongs(self):
        picture = self.shown(self.page('left: 0; top: 0; width: 64px; height: 36px'), size='1280x720')
        for x, y, colour in ((0, 0, self.RED), (31, 17, self.RED), (32, 17, self.LIME), (63, 0, self.LIME),
                             (31, 18, BLUE), (0, 35, BLUE), (32, 18, self.WHITE), (63, 35, self.WHITE),
                             (64, 0, BLACK), (0, 36, BLACK)):
            self.assertEqual(picture.colour(x, y), colour, (x, y))

    def test_the_picture_stands_where_the_element_is_in_every_window(self):
        page = self.page('left: 640px; top: 180px; width: 320px; height: 180px')
        for size, left, top, width, height in (('320x180', 160, 45, 80, 45), ('64x36', 32, 9, 16, 9),
                                               ('320x220', 160, 65, 80, 45), ('400x180', 200, 45, 80, 45)):
            picture = self.shown(page, size=size)
            self.assertEqual(self.quarters(picture, left, top, width, height), self.PATTERN, size)
            inside = {(left, top), (left + width - 1, top), (left, top + height - 1), (left + width - 1, top + height - 1)}
            outside = {(left - 1, top), (left, top - 1), (left + width, top), (left, top + height)}
            self.assertNotIn(BLACK, {picture.colour(*place) for place in inside}, size)
            self.assertEqual({picture.colour(*place) for place in outside}, {BLACK}, size)

    def test_full_screen_fills_the_page_wherever_the_element_is(self):
        page = self.page('left: 900px; top: 500px; width: 32px; height: 18px', script='tv.setFullScreen(true)')
        self.assertEqual(self.quarters(self.shown(page), 0, 0, 64, 36), self.PATTERN)

    def test_a_picture_that_leaves_the_full_screen_is_back_at_its_place(self):
        page = self.page('left: 640px; top: 360px; width: 640px; height: 360px',
                         script='tv.setFullScreen(true); setTimeout(function () { tv.setFullScreen(false); }, 100);'
                                'setTimeout(function () { isBack = true; }, 300)')
        picture = self.shown(page, '--wait-for', 'window.isBack')
        self.assertEqual(self.quarters(picture, 32, 18, 32, 18), self.PATTERN)
        self.assertEqual(picture.colour(10, 10), BLACK)

    def test_the_shape_of_the_frame_is_kept_with_black_bars(self):
        narrow = self.shown(self.page(shape='4, 3, 1'))
        self.assertEqual(self.quarters(narrow, 8, 0, 48, 36), self.PATTERN)
        self.assertEqual([narrow.colour(x, 20) for x in (0, 7, 56, 63)], 4 * [BLACK])
        self.assertNotIn(BLACK, [narrow.colour(x, 20) for x in (8, 55)])
        wide = self.shown(self.page(shape='32, 9, 1'))
        self.assertEqual(self.quarters(wide, 0, 9, 64, 18), self.PATTERN)
        self.assertEqual([wide.colour(20, y) for y in (0, 8, 27, 35)], 4 * [BLACK])

    def test_a_frame_without_a_shape_has_that_of_its_pixels(self):
        self.assertEqual(self.quarters(self.shown(self.page(shape='0, 0, 1')), 0, 0, 64, 36), self.PATTERN)

    def test_the_page_lies_above_the_picture(self):
        page = self.page(content='<div style="position: absolute; left: 0; top: 0; width: 640px; height: 360px; background: '
                                 'rgb(0, 128, 0)"></div><div style="position: absolute; left: 640px; top: 360px; '
                                 'width: 640px; height: 360px; background: rgba(0, 0, 0, 0.5)"></div>')
        upper_left, upper_right, lower_left, lower_right = self.quarters(self.shown(page), 0, 0, 64, 36)
        self.assertEqual([upper_left, upper_right, lower_left], [GREEN, self.LIME, BLUE])
        self.assertTrue(all(value in (127, 128) for value in lower_right), lower_right)

    def test_a_page_with_a_background_hides_the_picture(self):
        picture = self.shown(self.page(content='<style>body { background: rgb(0, 128, 0) }</style>'))
        self.assertEqual(picture.colours(), {bytes(GREEN)})

    def test_the_newest_frame_is_shown(self):
        page = self.page(script='setTimeout(function () { tv.setChannelByTriplet(16, 9, 2); }, 100);'
                                'setTimeout(function () { isNew = true; }, 300)')
        picture = self.shown(page, '--wait-for', 'window.isNew')
        self.assertEqual(self.quarters(picture, 0, 0, 64, 36),
                         [tuple(255 - value for value in colour) for colour in self.PATTERN])

    def test_without_a_picture_the_screen_is_black(self):
        page = self.page(script='setTimeout(function () { tv.setChannelByTriplet(16, 9, 0); }, 100);'
                                'setTimeout(function () { isGone = true; }, 300)')
        self.assertEqual(self.picture(page, '--wait-for', 'window.isGone').colours(), {bytes(BLACK)})

    def test_the_picture_is_there_without_an_application_and_beneath_a_hidden_one(self):
        for command in ('destroyHbbTVApplication', 'hideHbbTVApplication'):
            page = self.page(script=f'onkeydown = {command}')
            self.assertEqual(self.quarters(self.shown(page, '--keys', 'red'), 0, 0, 64, 36), self.PATTERN, command)

    def test_a_picture_that_never_comes_ends_in_time_with_a_screenshot(self):
        file_name = os.path.join(self.folder, 'picture.png')
        run = self.run_tv(self.page(shape='16, 9, 0'), '--size', '64x36', '--wait-for-picture', '--timeout', '3',
                          '--screenshot', file_name)
        self.assertEqual(run.status, 1, run)
        self.assertIn('telix-tv: there is no picture within 3 s\n', run.errors)
        self.assertEqual(Picture(file_name).colours(), {bytes(BLACK)})

    def test_waiting_for_the_picture_alone_ends_the_program(self):
        run = self.run_tv(self.page(), '--wait-for-picture')
        self.assertEqual(run.status, 0, run)

    def test_a_page_that_ends_has_its_objects_until_its_last_listener(self):
        for frame in ('page.html', 'outer.html'):
            page = self.page(script='addEventListener("unload", function () { document.body.style.margin = "9px"; '
                                    'tv.style.left = "9px"; document.body.offsetWidth; tv.release(); }, false)')
            self.write('<iframe src="page.html"></iframe>', 'outer.html')
            run = self.run_tv(os.path.join(os.path.dirname(page), frame), '--wait-for-picture',
                              environment={'LOG_MODULE': '6'})
            self.assertEqual(run.status, 0, run)
            # The page's own and the end of the object.
            self.assertEqual(run.output.count('TELIX_JS_VB_Release is called'), 2, run)

    def test_wake_ups_without_end_leave_the_page_its_time_and_end_with_the_window(self):
        page = self.page(shape='16, 9, 3', script='ticks = 0; setInterval(function () { ticks += 1; }, 10)')
        file_name = os.path.join(self.folder, 'picture.png')
        run = self.run_tv(page, '--size', '64x36', '--wait-for', 'window.ticks > 30', '--screenshot', file_name)
        self.assertEqual(run.status, 0, run)
        self.assertEqual(self.quarters(Picture(file_name), 0, 0, 64, 36), self.PATTERN)
        self.assertEqual([line for line in run.errors.splitlines() if line.startswith('picture: ')],
                         ['picture: no wake-up any more', 'picture: 0 frames still out'])


if __name__ == '__main__':
    unittest.main()
