"""The video where the page puts its object, in the stacking order of the page: on the video plane or painted by the page."""

import contextlib
import glob
import signal
import unittest

from telix_tv import BLACK, BLUE, GREEN, PLUGIN
from television import RUN_TIMEOUT, Lines, has_opengl, wait_for
from test_screen import VideoPlanePages

GREY = (128, 128, 128)
PLACE = 'left: 320px; top: 180px; width: 640px; height: 360px'
IN_PAGE = "(getComputedStyle(tv).backgroundImage !== 'none')"


def mixed(upper, lower):
    """The colour of `upper` at half opacity over `lower`."""
    return tuple((a + b) // 2 for a, b in zip(upper, lower))


class VideoInPage(VideoPlanePages):
    """The window has 640x360 pixels, so that one of its pixels shows 2x2 pixels of the page. An object at PLACE is at 160, 90
    in it and has 320x180 pixels."""

    @contextlib.contextmanager
    def running(self, page, *arguments):
        with self.television.start('--plugin', PLUGIN, '--size', '640x360', *arguments, page) as process:
            yield process
            process.send_signal(signal.SIGTERM)
            process.communicate(timeout=RUN_TIMEOUT)

    def wait_for_colours(self, expected):
        """Waits until all points of the display, by their places in the window, have these colours, or nearly."""
        def actual():
            screen = self.television.screen()
            return {point: screen.colour(*point) for point in expected}

        def is_shown():
            return all(abs(a - b) <= 2 for point, colour in actual().items() for a, b in zip(colour, expected[point]))
        wait_for(is_shown, lambda: f'{actual()}, expected {expected}')

    def quadrants(self, left=160, top=90, width=320, height=180, colours=None):
        """The centres of the quadrants of a picture at that place in the window, with their colours."""
        points = [(left + x * width // 4, top + y * height // 4) for y in (1, 3) for x in (1, 3)]
        return dict(zip(points, colours or self.PATTERN))

    def around(self, colour, left=160, top=90, width=320, height=180):
        """Points just outside of a picture."""
        return {point: colour for point in ((left - 2, top), (left, top - 2), (left + width + 1, top), (left, top + height + 1))}

    def assert_shown(self, page, expected):
        with self.running(page):
            self.wait_for_colours(expected)

    def on_grey(self, style=PLACE, before='', after='', **options):
        """A page with an opaque background; `before` and `after` the object are further elements."""
        return self.page(style, '<style>body { background: rgb(128, 128, 128) } div { position: absolute }</style>' + after,
                         before=before, **options)

    # --- Where

    def test_an_opaque_body_lies_under_the_video(self):
        self.assert_shown(self.on_grey(), {**self.quadrants(), **self.around(GREY)})

    def test_a_screenshot_shows_it_as_well(self):
        picture = self.shown(self.on_grey(), '--wait-for', IN_PAGE, size='128x72')
        self.assertEqual(self.quarters(picture, 32, 18, 64, 36), self.PATTERN)
        self.assertEqual(picture.colour(10, 10), GREY)

    def test_the_video_lies_between_the_layers_of_the_page(self):
        layer = '<div style="left: {}px; top: 180px; width: 320px; height: 360px; background: {}"></div>'
        page = self.on_grey(before=layer.format(160, 'rgb(0, 128, 0)'), after=layer.format(640, 'rgba(0, 0, 0, 0.5)'))
        self.assert_shown(page, {
            **self.quadrants(colours=[self.RED, mixed(self.LIME, BLACK), BLUE, mixed(self.WHITE, BLACK)]),
            (100, 180): GREEN, (500, 60): GREY})

    def test_a_layer_with_a_greater_index_covers_it_wherever_it_is_in_the_document(self):
        page = self.on_grey(before='<div style="left: 320px; top: 180px; width: 640px; height: 180px; z-index: 1; '
                                   'background: rgb(0, 128, 0)"></div>')
        self.assert_shown(page, self.quadrants(colours=[GREEN, GREEN, BLUE, self.WHITE]))

    def test_a_small_thing_under_the_video_of_a_transparent_page_is_covered(self):
        page = self.page(PLACE, before='<div style="position: absolute; left: 470px; top: 260px; width: 20px; height: 20px; '
                                       'background: rgb(0, 128, 0)"></div>')
        self.assert_shown(page, {**self.quadrants(), **self.around(BLACK)})

    def test_it_follows_the_object(self):
        page = self.on_grey(script="onkeydown = function () { tv.style.left = '640px'; tv.style.width = '320px'; "
                                   "tv.style.height = '180px' }; setTimeout(onkeydown, 1000)")
        self.assert_shown(page, {**self.quadrants(320, 90, 160, 90), **self.around(GREY, 320, 90, 160, 90)})

    def test_a_frame_of_another_aspect_ratio_has_black_bars(self):
        self.assert_shown(self.on_grey(frame='4, 3, 1'), {
            **self.quadrants(200, 90, 240, 180), (170, 180): BLACK, (470, 180): BLACK, **self.around(GREY)})

    def test_a_frame_in_the_page_can_have_the_object(self):
        page = self.on_grey('left: 100px; top: 50px; width: 640px; height: 360px')
        outer = self.write('<body style="margin: 0; background: rgb(0, 128, 0)"><iframe src="page.html" style="position: '
                           'absolute; left: 210px; top: 120px; width: 840px; height: 460px; border: 10px solid blue">'
                           '</iframe>', 'outer.html')
        self.assertTrue(page)
        self.assert_shown(outer, {**self.quadrants(), **self.around(GREY), (40, 40): GREEN, (106, 180): BLUE})

    def test_a_transparent_frame_on_an_opaque_page_can_have_it(self):
        self.page('left: 110px; top: 60px; width: 640px; height: 360px')
        outer = self.write('<body style="margin: 0; background: rgb(0, 128, 0)"><iframe src="page.html" style="position: '
                           'absolute; left: 210px; top: 120px; width: 840px; height: 460px; border: 0"></iframe>', 'outer.html')
        self.assert_shown(outer, {**self.quadrants(), **self.around(GREEN)})

    # --- How

    def test_it_fades_with_the_object(self):
        self.assert_shown(self.on_grey(PLACE + '; opacity: 0.5'),
                          self.quadrants(colours=[mixed(colour, GREY) for colour in self.PATTERN]))

    def test_it_fades_over_a_transparent_page_as_well(self):
        page = self.page(PLACE, script="setTimeout(function () { tv.style.opacity = '0.5' }, 1000)")
        self.assert_shown(page, self.quadrants(colours=[mixed(colour, BLACK) for colour in self.PATTERN]))

    def test_it_is_clipped_like_the_object(self):
        page = self.on_grey(PLACE + '; border-radius: 180px')
        self.assert_shown(page, {**self.quadrants(), (164, 94): GREY, (475, 265): GREY})
        page = self.page(PLACE + '; clip: rect(0, 640px, 180px, 0)')
        self.assert_shown(page, self.quadrants(colours=[self.RED, self.LIME, BLACK, BLACK]))

    def test_it_is_scaled_and_turned_like_the_object(self):
        self.assert_shown(self.on_grey(PLACE + '; -webkit-transform: rotate(180deg)'),
                          self.quadrants(colours=self.PATTERN[::-1]))
        self.assert_shown(self.page(PLACE + '; -webkit-transform: scale(0.5)'),
                          {**self.quadrants(240, 135, 160, 90), **self.around(BLACK, 240, 135, 160, 90)})

    def test_a_hidden_object_shows_nothing(self):
        for change in ("visibility = 'hidden'", "display = 'none'", "opacity = '0'"):
            for page, colour in ((self.on_grey, GREY), (self.page, BLACK)):
                with self.subTest(change, page=page.__name__), \
                        self.running(page(PLACE, script='onkeydown = null; setInterval(function () { '
                                                        f'if (window.isEnough) {{ tv.style.{change} }} }}, 50); '
                                                        'setTimeout(function () { isEnough = true }, 1500)')):
                    self.wait_for_colours(self.quadrants(colours=4 * [colour]))

    def test_a_removed_object_shows_nothing(self):
        page = self.on_grey(script='setTimeout(function () { tv.parentNode.removeChild(tv) }, 1500)',
                            after='<style>body { background: rgb(0, 128, 0) !important }</style>')
        self.assert_shown(page, self.quadrants(colours=4 * [GREEN]))

    def test_one_of_two_objects_at_the_same_place_is_known(self):
        objects = ''.join(f'<object id="{name}" type="video/broadcast" style="position: absolute; {PLACE}; {style}"></object>'
                          for name, style in (('first', 'opacity: 0.5'), ('second', 'visibility: hidden')))
        for name, colours in (('first', [mixed(colour, GREY) for colour in self.PATTERN]), ('second', 4 * [GREY]),
                              ('tv', self.PATTERN)):
            page = self.on_grey(before=objects, script=f'setTimeout(function () {{ {name}.setChannelByTriplet(16, 9, 1) }}, 500)')
            with self.subTest(name):
                self.assert_shown(page, self.quadrants(colours=colours))

    def test_full_screen_lies_behind_the_page(self):
        page = self.page(PLACE, '<div style="position: absolute; left: 0; top: 0; width: 640px; height: 360px; '
                                'background: rgb(0, 128, 0)"></div>',
                         script='setTimeout(function () { tv.setFullScreen(true) }, 500)')
        self.assert_shown(page, self.quadrants(0, 0, 640, 360, [GREEN, *self.PATTERN[1:]]))

    def test_full_screen_ends_in_an_opaque_page(self):
        page = self.on_grey(script='tv.setFullScreen(true); setTimeout(function () { tv.setFullScreen(false) }, 500)')
        self.assert_shown(page, {**self.quadrants(), **self.around(GREY)})

    def test_a_hidden_application_leaves_the_video(self):
        page = self.on_grey(script='setTimeout(hideHbbTVApplication, 1000)')
        self.assert_shown(page, {**self.quadrants(), **self.around(BLACK)})

    def test_a_page_that_paints_it_shows_one_frame_after_the_other(self):
        page = self.on_grey(script='frame = 1; setInterval(function () { frame = 3 - frame; '
                                   'tv.setChannelByTriplet(16, 9, frame); }, 500)')
        with self.running(page):
            for _ in range(3):
                self.wait_for_colours(self.quadrants())
                self.wait_for_colours(self.quadrants(colours=[tuple(255 - part for part in colour)
                                                              for colour in self.PATTERN]))

    def test_without_a_frame_the_object_is_black(self):
        page = self.on_grey(script='setTimeout(function () { tv.setChannelByTriplet(16, 9, 0) }, 1000)')
        self.assert_shown(page, {**self.quadrants(colours=4 * [BLACK]), **self.around(GREY)})

    def test_what_the_page_takes_away_is_gone(self):
        banner = '<div id="banner" style="position: absolute; left: 0; top: 0; width: 1280px; height: 360px; background: blue">' \
                 '</div>'
        script = 'setTimeout(function () { banner.style.display = "none" }, 2000)'
        for page, content, colour in ((self.page, 'content', BLACK), (self.on_grey, 'after', GREY)):
            with self.subTest(colour), self.running(page(PLACE, script=script, **{content: banner})):
                self.wait_for_colours({**self.quadrants(colours=[BLUE, BLUE, *self.PATTERN[2:]]), (20, 20): BLUE})
                self.wait_for_colours({**self.quadrants(), (20, 20): colour})

    # --- Which way

    def test_the_usual_page_leaves_the_video_to_the_plane(self):
        above = ''.join(f'<div style="position: absolute; z-index: {index}; left: {100 * index}px; top: 300px; width: 500px; '
                        'height: 300px; background: rgba(0, 0, 0, 0.5)">A <b>banner</b></div>' for index in (1, 2, 3))
        page = self.page('left: 0; top: 0; width: 1280px; height: 720px', above + '<p style="position: absolute">text</p>',
                         script='changes = 0; setInterval(function () { document.body.title = ++changes; }, 20)')
        run = self.run_tv(page, '--wait-for-picture', '--wait-for', 'changes > 60', '--eval', IN_PAGE)
        self.assertIs(run.value, False, run)

    def test_what_lies_under_the_object_decides(self):
        for content, is_in_page in (
                ('', False),
                ('<div style="position: absolute; left: 970px; top: 0; width: 90px; height: 700px; background: blue">', False),
                ('<div style="position: absolute; left: 950px; top: 0; width: 90px; height: 700px; background: blue; '
                 'z-index: -1">', True),
                ('<p style="position: absolute; left: 400px; top: 300px; z-index: -1">text</p>', True),
                ('<style>html { background: url(x.png) }</style>', True),
                ('<style>#tv { border-radius: 1px }</style>', True)):
            page = self.page(PLACE, content, script='ticks = 0; setInterval(function () { ticks += 1; }, 20)')
            with self.subTest(content):
                run = self.run_tv(page, '--wait-for-picture', '--wait-for', IN_PAGE if is_in_page else 'ticks > 60', '--eval',
                                  IN_PAGE)
                self.assertIs(run.value, is_in_page, run)

    def test_the_page_does_not_see_how(self):
        page = self.on_grey()
        run = self.run_tv(page, '--wait-for', IN_PAGE, '--eval',
                          "[tv.childNodes.length, tv.getAttribute('style').indexOf('canvas'), tv.attributes.length, "
                          "'telixBridgeObserver' in window, document.querySelectorAll('canvas').length]")
        self.assertEqual(run.value, [0, -1, 3, False, 0], run)

    @unittest.skipIf(glob.glob('/dev/dri/renderD*'), 'the engine uses OpenGL from the start')
    def test_opengl_begins_with_the_first_transparent_page(self):
        page = self.on_grey(script="onkeydown = function () { document.body.style.background = 'transparent' }")
        with self.running(page) as process:
            self.wait_for_colours({**self.quadrants(), **self.around(GREY)})
            self.assertFalse(has_opengl(process))
            self.television.press_key('Return')
            self.wait_for_colours({**self.quadrants(), **self.around(BLACK)})
            wait_for(lambda: has_opengl(process), 'no OpenGL under a transparent page')

    def test_a_change_of_the_way_shows_no_wrong_frame(self):
        # The background of the page changes as soon as the video is shown the other way.
        page = self.page(PLACE, '<style>div { position: absolute }</style>', script=f'''changes = 0;
            setInterval(function () {{
                var inPage = {IN_PAGE};
                if (inPage === (document.body.style.background !== '')) {{
                    document.body.style.background = inPage ? '' : 'rgb(128, 128, 128)';
                    changes += 1;
                    console.log('change ' + changes);
                }}
            }}, 200)''')
        expected = self.quadrants()
        wrong, around = [], []

        def watch():
            screen = self.television.screen()
            wrong.extend((point, screen.colour(*point)) for point, colour in expected.items()
                         if any(abs(a - b) > 2 for a, b in zip(screen.colour(*point), colour)))
            around.append(screen.colour(20, 20))
            return lines.wait_for('change 9', timeout=0) and min(around.count(GREY), around.count(BLACK)) > 10

        with self.television.start('--plugin', PLUGIN, '--size', '640x360', page) as process:
            lines = Lines(process.stderr)
            self.wait_for_colours(expected)
            self.assertTrue(lines.wait_for('change 1'), lines.lines)
            wait_for(watch, lambda: f'{around}, {lines.lines}')
            process.send_signal(signal.SIGTERM)
            process.wait(RUN_TIMEOUT)
        self.assertEqual(wrong, [])


if __name__ == '__main__':
    unittest.main()
