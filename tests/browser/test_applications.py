"""Keys of the remote control and the stack of applications in telix-tv."""

import os
import unittest

from telix_tv import BLACK, BLUE, GREEN, KEY_CODES, TelixTv, server, shipped


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

    def test_events_have_the_names_of_keys(self):
        page = self.write('''<script>var seen = [];
            ['keydown', 'keypress', 'keyup'].forEach(function (type) {
                addEventListener(type, function (event) { seen.push([type, event.key, event.code]); }, false);
            });</script>''')
        names = {'left': ('ArrowLeft', 'ArrowLeft'), 'ok': ('Enter', 'Enter'), '7': ('7', 'Digit7'),
                 'red': ('ColorF0Red', ''), 'back': ('GoBack', 'BrowserBack'), 'play': ('MediaPlay', ''),
                 'stop': ('MediaStop', 'MediaStop'), 'info': ('Info', '')}
        for key, expected in names.items():
            seen = self.value(page, '--keys', key, '--eval', 'seen')
            # Engines send no keypress for the arrow keys.
            kinds = ['keydown', 'keyup'] if key == 'left' else ['keydown', 'keypress', 'keyup']
            self.assertEqual([kind for kind, _, _ in seen], kinds, key)
            self.assertEqual({tuple(event[1:]) for event in seen}, {expected}, key)

    def test_a_key_waits_for_the_page_that_the_key_before_it_opened(self):
        self.write(self.RECORDER, 'next.html')
        page = self.write('<script>onkeydown = function () { location.href = "next.html"; }</script>')
        self.assertEqual([e[1] for e in self.value(page, '--keys', 'red,green', '--wait-for', 'seen.length',
                                                   '--eval', 'seen')], [404, 404, 404])

    def test_without_an_application_keys_are_the_television_s(self):
        run = self.run_tv(shipped('first.html'), '--keys', 'back,red,2,volume-down', '--eval', '1')
        self.assertEqual(run.status, 1, run)
        self.assertIn('no application', run.errors)


class Applications(TelixTv):
    TITLE = ('--eval', 'document.title')

    def test_a_new_application_covers_the_old_one(self):
        self.assertEqual(self.value(shipped('first.html'), '--keys', 'green', *self.TITLE), 'second')
        self.assertEqual(self.screenshot(shipped('first.html'), '--keys', 'green').colours(), {bytes(BLUE)})

    def test_an_application_that_ends_brings_back_the_one_beneath(self):
        self.assertEqual(self.value(shipped('first.html'), '--keys', 'green,back', *self.TITLE), 'first')
        self.assertEqual(self.screenshot(shipped('first.html'), '--keys', 'green,back').colours(), {bytes(GREEN)})

    def test_applications_form_a_stack(self):
        for keys, title in (('green,green', 'first'), ('green,green,green', 'second'),
                            ('green,green,green,back', 'first'), ('green,green,green,back,back', 'second'),
                            ('green,green,green,back,back,back', 'first')):
            with self.subTest(keys):
                self.assertEqual(self.value(shipped('first.html'), '--keys', keys, *self.TITLE), title)

    def hand_over(self):
        """A page that starts another one with a key and ends itself in the same script."""
        return self.write(f'''<title>before</title><script>onkeydown = function () {{
            createHbbTVApplication('file://{shipped("second.html")}');
            destroyHbbTVApplication(); }}</script>''')

    def test_an_application_hands_over_to_the_one_that_it_has_opened(self):
        self.assertEqual(self.value(self.hand_over(), '--keys', 'red', *self.TITLE), 'second')
        self.assertEqual(self.screenshot(self.hand_over(), '--keys', 'red').colours(), {bytes(BLUE)})

    def test_after_a_hand_over_nothing_is_beneath(self):
        run = self.run_tv(self.hand_over(), '--keys', 'red,back', *self.TITLE)
        self.assertEqual(run.status, 1, run)
        self.assertIn('no application', run.errors)

    def test_a_page_that_opens_itself_stops_at_sixteen_applications(self):
        page = self.write('''<object id="manager" type="application/oipfApplicationManager"></object>
            <script>onload = function () {
                var owner = manager.getOwnerApplication(document);
                var create = function () { return owner.createApplication(location.href, false); };
                console.log("opened");
                document.title = create() === null ? "last" : "covered";
                for (var i = 0; document.title === "last" && i < 100; i++) { create(); } }</script>''')
        run = self.run_tv(page, '--wait-for', 'document.title === "last"', '--eval', '1')
        self.assertEqual(run.status, 0, run)
        self.assertEqual(run.errors.count('opened'), 16, run)
        self.assertEqual(run.errors.count('16 applications'), 1, run)

    def test_after_the_last_application_the_screen_is_empty(self):
        self.assertEqual(self.screenshot(shipped('first.html'), '--keys', 'back').colours(), {bytes(BLACK)})

    def test_without_an_application_there_is_nothing_to_evaluate(self):
        run = self.run_tv(shipped('first.html'), '--keys', 'back', '--eval', '1')
        self.assertEqual(run.status, 1, run)
        self.assertIn('no application', run.errors)

    def test_a_hidden_application_paints_nothing(self):
        self.assertEqual(self.screenshot(shipped('first.html'), '--keys', 'yellow').colours(), {bytes(BLACK)})

    def test_a_hidden_application_still_has_the_keys_and_can_show_itself(self):
        self.assertEqual(self.screenshot(shipped('first.html'), '--keys', 'yellow,blue').colours(), {bytes(GREEN)})

    def test_an_application_beneath_stays_hidden_when_it_comes_back(self):
        self.assertEqual(self.screenshot(shipped('first.html'), '--keys', 'yellow,green').colours(), {bytes(BLUE)})
        self.assertEqual(self.screenshot(shipped('first.html'), '--keys', 'yellow,green,back').colours(), {bytes(BLACK)})

    def test_a_page_knows_whether_it_is_on_the_screen(self):
        page = self.write(f'''<script>seen = [document.hidden];
            // The last one ends itself.
            var steps = [hideHbbTVApplication, showHbbTVApplication, function () {{
                createHbbTVApplication('file://{shipped("closing.html")}'); }}];
            // An engine may report a change later, so each step waits for the one before.
            onload = function () {{ setTimeout(steps.shift(), 0); }};
            document.addEventListener('visibilitychange', function () {{
                seen.push(document.hidden);
                if (steps.length > 0) {{ setTimeout(steps.shift(), 0); }} }}, false);</script>''')
        self.assertEqual(self.value(page, '--wait-for', 'seen.length === 5', '--eval', 'seen'),
                         [False, True, False, True, False])

    def test_an_application_of_a_server_opens_if_the_server_has_it(self):
        with server() as url:
            page = self.write(f'''<script>opened = ['page', 'elsewhere', 'error'].map(function (path) {{
                return createHbbTVApplication('{url}/' + path); }});
                console.log('opened ' + opened);</script>''')
            run = self.run_tv(page, '--wait-for', 'document.title === "served"', '--eval', '1')
            self.assertEqual(run.status, 0, run)
            self.assertIn('opened true,true,false\n', run.errors)

    def test_a_server_that_does_not_answer_gives_no_application(self):
        with server() as url:
            page = self.write(f'<script>opened = createHbbTVApplication("{url}/silence")</script>')
            self.assertEqual(self.value(page, '--eval', 'opened'), False)

    def test_an_application_whose_file_turns_out_to_be_no_page_leaves_the_stack(self):
        self.write(bytes(range(256)), 'page.bin')
        page = self.write('<title>beneath</title><script>opened = createHbbTVApplication("page.bin")</script>')
        run = self.run_tv(page, '--wait-for', 'opened', '--eval', 'document.title')
        self.assertEqual((run.status, run.value), (0, 'beneath'), run)
        self.assertIn('page.bin', run.errors)


if __name__ == '__main__':
    unittest.main()
