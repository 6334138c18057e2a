"""The demonstration application, driven by the remote control as a viewer would."""

import os
import unittest

from television import Picture, Television

DEMO = os.path.join(os.path.abspath(__file__).rsplit('/tests/', 1)[0], 'apps', 'demo', 'index.html')
# A page that is drawn has many colours, for its letters are smoothed; an empty one has a single one.
COLOURS_OF_A_PAGE = 50


class Demo(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.television = Television(os.environ['TELIX_TV'])
        cls.addClassCleanup(cls.television.close)

    def run_demo(self, *arguments, plugin='TELIX_PLUGIN'):
        run = self.television.run('--plugin', os.environ[plugin], *arguments, DEMO)
        self.assertEqual(run.status, 0, run)
        # Messages of its scripts carry the name of the file.
        self.assertNotIn('/apps/demo/', run.errors, run)
        return run

    def text(self, element, *arguments, **options):
        return self.run_demo('--eval', f'document.getElementById("{element}").innerText', *arguments, **options).value

    def screenshot(self, name, *arguments, **options):
        file_name = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'demo-{name}.png')
        self.run_demo('--screenshot', file_name, *arguments, **options)
        picture = Picture(file_name)
        self.assertEqual((picture.width, picture.height), (1280, 720))
        return picture

    def test_it_draws_a_page(self):
        self.assertGreater(len(self.screenshot('start').colours()), COLOURS_OF_A_PAGE)

    def test_it_shows_what_its_application_offers(self):
        text = self.text('panel')
        for name in ('onKeyPress', 'onKeyUp', 'onKeyDown', 'onApplicationShown', 'onApplicationHidden',
                     'createApplication', 'destroyApplication', 'show', 'hide'):
            self.assertIn(name, text)
        self.assertEqual(text.count('null'), 5)
        self.assertEqual(text.count('function'), 4)

    def test_the_focus_moves_with_the_arrow_keys_and_goes_round(self):
        focused = ('--eval', 'document.querySelector(".focused").innerText')
        for keys, title in (('down', 'Manager'), ('down,down,down', 'Plug-in'), ('up', 'Remote control'),
                            ('up,down', 'Application'), ('down,down,back', 'Application')):
            with self.subTest(keys):
                self.assertEqual(self.run_demo('--keys', keys, *focused).value, title)

    def test_yellow_sets_and_clears_the_handlers(self):
        self.assertEqual(self.text('panel', '--keys', 'down').count('null'), 4)
        self.assertEqual(self.text('panel', '--keys', 'down,yellow').count('function'), 5)
        self.assertEqual(self.text('panel', '--keys', 'down,yellow,yellow').count('null'), 4)
        self.assertEqual(self.text('panel', '--keys', 'yellow').count('function'), 9)
        self.assertEqual(self.text('panel', '--keys', 'yellow,yellow').count('function'), 9)

    def test_ok_on_the_manager_sets_the_handlers_as_well(self):
        self.assertEqual(self.text('panel', '--keys', 'down,ok').count('function'), 5)

    def test_ok_on_the_application_gets_another_one(self):
        self.assertEqual(self.text('panel', '--keys', 'yellow,ok').count('null'), 5)

    def test_the_device_page_shows_what_the_platform_says(self):
        text = self.text('panel', '--keys', 'down,down,down,down', plugin='TELIX_DEVICE_PLUGIN')
        for words in ('Country\tDEU', 'Audio language\tdeu', 'Subtitle language\teng', 'Free memory\t123456',
                      'Key mask in force\t0x1f', 'HD user interface\tyes', '2 and 1', 'Capability profiles\t2'):
            self.assertIn(words, text)
        self.assertGreater(len(self.screenshot('device', '--keys', 'down,down,down,down',
                                               plugin='TELIX_DEVICE_PLUGIN').colours()), COLOURS_OF_A_PAGE)

    def test_ok_on_the_device_sets_the_key_mask(self):
        for keys, mask in (('ok', '0x11f'), ('ok,ok', '0x1f')):
            with self.subTest(keys):
                self.assertIn(f'Key mask in force\t{mask}', self.text('panel', '--keys', f'down,down,down,down,{keys}',
                                                                     plugin='TELIX_DEVICE_PLUGIN'))

    def test_a_drm_message_comes_back_turned_round(self):
        text = self.text('panel', '--keys', 'up,up,ok', '--wait-for',
                         'document.getElementById("panel").innerText.indexOf("tes ,olleH") > 0',
                         plugin='TELIX_DEVICE_PLUGIN')
        self.assertIn('Id\tmessage 1', text)
        self.assertIn('Code\t0', text)

    def test_without_a_platform_library_the_device_is_not_known(self):
        text = self.text('panel', '--keys', 'down,down,down,down')
        self.assertIn('Country\tnot known', text)
        self.assertIn('HD user interface\tno', text)

    def test_green_opens_the_second_application(self):
        title = ('--eval', 'document.title')
        self.assertEqual(self.run_demo('--keys', 'green', *title).value, 'A second application')
        self.assertEqual(self.run_demo('--keys', 'down,down,ok', *title).value, 'A second application')
        self.assertIn('gave an application', self.text('state', '--keys', 'green'))
        self.assertGreater(len(self.screenshot('second', '--keys', 'green').colours()), COLOURS_OF_A_PAGE)

    def test_the_second_application_ends_itself(self):
        for key in ('back', 'ok'):
            self.assertIn('createApplication("second.html", true) gives an application', self.text('log', '--keys', f'green,{key}'))

    def test_blue_opens_it_and_takes_it_away_again(self):
        self.assertIn('destroyApplication() brings this page back', self.text(
            'log', '--keys', 'blue', '--wait-for', 'document.title !== "A second application"'))

    def test_a_preview_that_the_viewer_has_closed_takes_nothing_else_away(self):
        waited = '(window.start = window.start || Date.now()) + 4000 < Date.now()'
        self.assertIn('telix', self.run_demo('--keys', 'blue,back', '--wait-for', waited, '--eval',
                                             'document.body.innerText').value)

    def test_red_hides_the_page_and_brings_it_back(self):
        self.assertEqual(len(self.screenshot('hidden', '--keys', 'red').colours()), 1)
        self.assertGreater(len(self.screenshot('shown', '--keys', 'red,red').colours()), COLOURS_OF_A_PAGE)

    def test_the_plug_in_is_named(self):
        text = self.text('panel', '--keys', 'down,down,down')
        self.screenshot('plugin', '--keys', 'down,down,down')
        self.assertIn('TELIX Scriptable Plugin', text)
        self.assertIn('15', text)

    def test_keys_are_named(self):
        self.assertIn('403', self.text('panel', '--keys', 'up,red'))
        self.assertIn('VK_FAST_FWD', self.text('panel', '--keys', 'up,fast-forward'))

    def test_everything_lies_within_the_safe_area(self):
        outside = '''(function () {
            return Array.prototype.filter.call(document.querySelectorAll('.screen > *, .small'), function (element) {
                var box = element.getBoundingClientRect();
                return box.width > 0 && (box.left < 64 || box.right > 1216 || box.top < 36 || box.bottom > 684);
            }).map(function (element) { return element.className || element.tagName; });
        }())'''
        self.assertEqual(self.run_demo('--eval', outside).value, [])

    def test_nothing_is_cut_off(self):
        cut = '''Array.prototype.filter.call(document.querySelectorAll('.menu, .panel, .log, .small'), function (element) {
            return element.scrollHeight > element.clientHeight || element.scrollWidth > element.clientWidth;
        }).map(function (element) { return element.className; })'''
        for keys in ('back', 'yellow,yellow', 'green', 'green,back', 'down,down', 'down,down,down', 'up,fast-forward',
                     'ok,ok,ok,ok'):
            with self.subTest(keys):
                self.assertEqual(self.run_demo('--keys', keys, '--eval', cut).value, [])

    def test_the_text_of_the_second_application_ends_above_its_legend(self):
        distance = '''document.querySelector('.small .legend').getBoundingClientRect().top -
            document.getElementById('state').getBoundingClientRect().bottom'''
        self.assertGreaterEqual(self.run_demo('--keys', 'green', '--eval', distance).value, 0)

    def test_without_the_plug_in_it_says_so(self):
        text = self.run_demo('--eval', 'document.body.innerText', plugin='TELIX_STRANGER').value
        self.assertIn('The plug-in is missing', text)
        self.assertNotIn('Remote control', text)
        self.screenshot('missing', plugin='TELIX_STRANGER')


if __name__ == '__main__':
    unittest.main()
