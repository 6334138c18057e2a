"""Pages in telix-tv: how they are loaded, what they print, and how the command line drives them."""

import os
import signal
import unittest
import urllib.parse

from telix_tv import GREEN, PLUGIN, TelixTv, running_server, server, shipped
from television import PngImage

# HbbTV 1.1.1: capabilities, vendor, model, software version, hardware version, reserved.
AGENT_TOKEN = r'HbbTV/1\.1\.1 \([^;()]*;[^;()]*;[^;()]*;[^;()]*;[^;()]*;[^;()]*\)'


class Pages(TelixTv):
    def test_a_file_and_an_address_of_a_file_are_loaded(self):
        self.assertEqual(self.value(shipped('first.html'), '--eval', 'document.title'), 'first')
        self.assertEqual(self.value('file://' + shipped('first.html') + '?a#b', '--eval', 'location.search'), '?a')

    def test_a_file_name_may_hold_anything(self):
        page = self.write('<title>odd</title>', 'a b#c?d%20ü.html')
        self.assertEqual(self.value(page, '--eval', 'document.title'), 'odd')

    def test_a_page_of_a_server_is_loaded(self):
        with server() as url:
            self.assertEqual(self.value(url + '/page', '--eval', 'document.title'), 'served')
            self.assertEqual(self.value(url + '/elsewhere', '--eval', 'location.pathname'), '/page')

    def test_a_missing_file_is_refused(self):
        self.assert_refused(self.run_tv(shipped('missing.html')), 'missing.html', 'No such file')

    def test_a_folder_is_refused(self):
        self.assert_refused(self.run_tv(self.folder), self.folder)

    def test_a_file_that_is_no_page_is_refused(self):
        page = self.write(bytes(range(256)), 'page.bin')
        self.assert_refused(self.run_tv(page), 'page.bin')

    def test_an_error_of_the_server_is_refused(self):
        with server() as url:
            self.assert_refused(self.run_tv(url + '/error'), '/error', '404')

    def test_a_server_that_is_not_there_is_refused(self):
        self.assert_refused(self.run_tv('http://127.0.0.1:1/'), '127.0.0.1')

    def test_a_server_that_does_not_answer_is_refused(self):
        with server() as url:
            self.assert_refused(self.run_tv(url + '/silence'), '/silence', 'not respond')

    def test_an_unknown_kind_of_address_is_refused(self):
        self.assert_refused(self.run_tv('nowhere://page'), 'nowhere')

    def test_a_page_that_never_finishes_loading_is_refused_in_time(self):
        with server() as url:
            page = self.write(f'<img src="{url}/silence">')
            self.assert_refused(self.run_tv(page, '--timeout', '1', '--eval', '1'), 'page.html', 'within 1 s')

    def test_a_page_that_is_only_looked_at_may_load_as_long_as_it_likes(self):
        with server() as url:
            page = self.write(f'<img src="{url}/silence"><script>setTimeout(function () {{ console.log("on"); }}, 1500)'
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
        self.assertIn("telix-tv: cannot load file://" + self.folder + '/missing.html', run.errors)

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

    def test_console_messages_outside_of_functions_have_the_place_that_the_engine_knows(self):
        page = self.write('<script>console.log("one")</script>')
        run = self.run_tv(page, '--eval', '1')
        place = page if os.environ.get('TELIX_ENGINE') == 'npapi' else 'page'
        self.assertEqual(run.errors, f'{place}: one\n', run)

    def test_console_messages_of_a_served_page_come_with_its_address(self):
        with server() as url:
            run = self.run_tv(url + '/page', '--eval', '1')
            self.assertRegex(run.errors, rf'^{url}/page:[0-9]+: served\n$')

    def test_console_messages_may_have_any_length(self):
        page = self.write('<script>function say(text) { console.log(text); } say(new Array(1000001).join("x"));</script>')
        run = self.run_tv(page, '--eval', '1')
        self.assertTrue(run.errors == f'{page}:1: {"x" * 1000000}\n', (run.status, len(run.errors), run.errors[:200]))

    def test_debug_prints_as_the_console_does(self):
        page = self.write('<script>\nfunction say(text) { debug(text); }\nsay("one");\n</script>')
        self.assertEqual(self.run_tv(page, '--eval', '1').errors, f'{page}:2: one\n')

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
        run, error = self.run_to_timeout(shipped('first.html'), '--wait-for', 'document.title === "x"', '--eval', '1',
                                         error='telix-tv: --wait-for document.title === "x": not true within {} s\n')
        self.assertEqual(run.status, 1, run)
        self.assertEqual(run.errors, error)
        self.assertNotIn('1', run.output.splitlines())

    def test_what_throws_is_not_yet_true_and_the_end_says_what_was_thrown(self):
        run, error = self.run_to_timeout(shipped('first.html'), '--wait-for', 'nothing.there',
                                         error='within {} s (ReferenceError: Can\'t find variable: nothing)')
        self.assertEqual(run.status, 1, run)
        self.assertIn(error, run.errors)

    def test_waiting_in_vain_leaves_a_screenshot(self):
        file_name = os.path.join(self.folder, 'picture.png')
        run, _ = self.run_to_timeout(shipped('first.html'), '--size', '64x36', '--wait-for', 'false',
                                     '--screenshot', file_name, error='--wait-for false: not true within {} s')
        self.assertEqual(run.status, 1, run)
        self.assertEqual(PngImage(file_name).colours(), {bytes(GREEN)})

    def test_keys_then_waiting_then_value_then_screenshot(self):
        page = self.write('<style>html { background: rgb(0, 0, 255) }</style><script>steps = [];'
                          'onload = function () { steps.push("load"); };'
                          'onkeydown = function () { steps.push("key"); }</script>')
        file_name = os.path.join(self.folder, 'picture.png')
        self.assertEqual(self.value(
            page, '--size', '64x36', '--screenshot', file_name,
            '--eval', 'document.documentElement.style.background = "rgb(0, 128, 0)", steps.push("eval"), steps',
            '--wait-for', 'steps.push("wait")', '--keys', 'red,down'), ['load', 'key', 'key', 'wait', 'eval'])
        self.assertEqual(PngImage(file_name).colours(), {bytes(GREEN)})

    def test_nothing_is_left_behind(self):
        self.value(shipped('first.html'), '--eval', '1')
        self.assertEqual(self.television.leftovers(), [])

    def test_listeners_of_a_page_that_ends_may_remove_its_frames(self):
        for listener in ('window', 'frames[0]', 'frames[1]'):
            page = self.write('<iframe></iframe><iframe></iframe><iframe></iframe><script>onload = function () {'
                              f'{listener}.addEventListener("unload", function () {{'
                              'while (frames.length > 0) { frames[0].frameElement.remove(); }'
                              'console.log("removed"); }); };</script>')
            run = self.run_tv(page, '--eval', 'frames.length')
            self.assertEqual(run.status, 0, run)
            self.assertEqual(run.value, 3)
            self.assertIn('removed', run.errors)


class Documents(TelixTv):
    """HbbTV documents."""

    TYPE = 'application/vnd.hbbtv.xhtml+xml'
    # Only in XHTML do element names keep their case and does <div/> end the element.
    DOCUMENT = ('<?xml version="1.0" encoding="utf-8"?>\n'
                '<!DOCTYPE html PUBLIC "-//HbbTV//1.1.1//EN" "http://www.hbbtv.org/dtd/HbbTV-1.1.1.dtd">\n'
                '<html xmlns="http://www.w3.org/1999/xhtml"><head><title>tele\u00e9</title></head>'
                '<body><div id="empty"/><p>text</p></body></html>').encode()
    FACTS = '[document.title, document.body.tagName, document.getElementById("empty").childNodes.length, ' \
            'document.contentType, document.createElement("i").tagName]'
    XHTML = ['tele\u00e9', 'body', 0, 'application/xhtml+xml', 'i']

    def test_a_television_document_of_a_server_is_xhtml(self):
        with running_server(self.DOCUMENT) as running:
            for kind in (self.TYPE, self.TYPE + ';charset=utf-8', 'Application/VND.HbbTV.XHTML+XML ; charset="utf-8"',
                         'application/ce-html+xml', 'Application/CE-HTML+XML; charset=utf-8', 'application/xhtml+xml'):
                self.assertEqual(self.value(f'{running.url}/as/{urllib.parse.quote(kind)}', '--eval', self.FACTS),
                                 self.XHTML, kind)

    def test_the_character_set_that_the_server_names_stays(self):
        document = self.DOCUMENT.replace(b' encoding="utf-8"', b'').decode().encode('latin-1')
        with running_server(document) as running:
            kind = urllib.parse.quote(self.TYPE + ';charset=iso-8859-1')
            self.assertEqual(self.value(f'{running.url}/as/{kind}', '--eval', self.FACTS), self.XHTML)

    def test_other_types_stay_what_they_are(self):
        with running_server(self.DOCUMENT) as running:
            self.assertEqual(self.value(f'{running.url}/as/text/html', '--eval', self.FACTS),
                             ['tele\u00e9', 'BODY', 1, 'text/html', 'I'])

    def test_a_television_document_that_is_far_from_the_first_packet_is_whole(self):
        comment = b'<!-- ' + 64 * b'x' + b' -->\n'
        long_document = self.DOCUMENT.replace(b'<p>', 20000 * comment + b'<p>')
        with running_server(long_document) as running:
            self.assertEqual(self.value(f'{running.url}/as/{self.TYPE}', '--eval',
                                        'document.querySelector("p").textContent'), 'text')

    def test_a_television_document_is_found_behind_a_redirection_in_a_frame_and_as_an_application(self):
        with running_server(self.DOCUMENT, redirection='/as/' + self.TYPE) as running:
            self.assertEqual(self.value(running.url + '/elsewhere', '--eval', self.FACTS), self.XHTML)
            frame = self.write(f'<iframe src="{running.url}/as/{self.TYPE}"></iframe><script>onload = function () {{'
                               ' loaded = true; }</script>')
            run = self.run_tv(frame, '--eval', 'loaded')
            self.assertEqual((run.status, run.errors), (0, ''), run)
            page = self.write(f'<script>onload = function () {{ createHbbTVApplication("{running.url}/as/{self.TYPE}");'
                              ' }</script>')
            self.assertEqual(self.value(page, '--wait-for', 'document.getElementById("empty")', '--eval', self.FACTS),
                             self.XHTML)

    def test_a_television_document_that_is_not_well_formed_says_so(self):
        with running_server(self.DOCUMENT.replace(b'</p>', b'')) as running:
            self.assertIn('error', self.value(f'{running.url}/as/{self.TYPE}', '--eval',
                                              'document.documentElement.textContent'))

    def test_files_are_xhtml_by_their_names(self):
        for name in ('page.xhtml', 'page.hbbtv', 'PAGE.HBBTV', 'page.cehtml', 'PAGE.CEHTML'):
            page = self.write(self.DOCUMENT, name)
            self.assertEqual(self.value(page, '--eval', self.FACTS), self.XHTML, name)

    def test_servers_and_pages_are_told_that_this_is_a_television(self):
        with running_server() as running:
            agent = self.value(running.url + '/page', '--eval', 'navigator.userAgent')
        self.assertRegex(agent, f' {AGENT_TOKEN}$')
        self.assertEqual(agent.count('HbbTV'), 1)
        self.assertEqual(set(running.agents), {agent})

    def test_the_user_agent_of_the_command_line_replaces_all_of_it(self):
        with running_server() as running:
            self.assertEqual(self.value(running.url + '/page', '--user-agent', 'My set/2 (a; b)', '--eval',
                                        'navigator.userAgent'), 'My set/2 (a; b)')
        self.assertEqual(set(running.agents), {'My set/2 (a; b)'})


if __name__ == '__main__':
    unittest.main()
