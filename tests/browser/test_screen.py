"""What the window of telix-tv shows: the page and, under it, the video plane."""

import os
import signal
import unittest

from telix_tv import BLACK, BLUE, GREEN, IS_NPAPI, PLUGIN, TelixTv, shipped
from television import RUN_TIMEOUT, PngImage


class Screen(TelixTv):
    def test_the_screen_is_black_where_the_page_is_transparent(self):
        page = self.write('<body style="margin: 0; background: transparent">'
                          '<div style="width: 640px; height: 720px; background: rgb(0, 0, 255)">')
        picture = self.screenshot(page)
        self.assertEqual([picture.colour(x, 18) for x in (0, 31, 32, 63)], [BLUE, BLUE, BLACK, BLACK])

    def test_half_transparent_colours_mix_with_what_lies_beneath(self):
        page = self.write('<body style="background: rgba(0, 0, 255, 0.5)">')
        red, green, blue = self.screenshot(page).colour(5, 5)
        self.assertEqual((red, green), (0, 0))
        self.assertIn(blue, (127, 128))

    def test_an_object_of_the_plug_in_is_transparent(self):
        for element in ('<object type="application/oipfapplicationmanager" style="{}"></object>',
                        '<object type="Application/OIPFApplicationManager" style="{}"></object>',
                        '<embed type="application/oipfapplicationmanager" style="{}">'):
            style = 'display: block; opacity: 1; width: 1280px; height: 720px'
            page = self.write('<body style="margin: 0; background: transparent">' + element.format(style))
            self.assertEqual(self.screenshot(page).colours(), {bytes(BLACK)}, element)

    def test_an_object_of_the_plug_in_is_transparent_in_an_xml_page_as_well(self):
        page = self.write('<html xmlns="http://www.w3.org/1999/xhtml"><body style="margin: 0">'
                          '<object type="Application/OIPFApplicationManager" style="width: 1280px; height: 720px"/>'
                          '</body></html>', 'page.xhtml')
        self.assertEqual(self.screenshot(page).colours(), {bytes(BLACK)})

    def test_there_are_no_scroll_bars(self):
        page = self.write('<body style="margin: 0; background: rgb(0, 0, 255)"><div style="width: 1999px; height: 1999px">')
        self.assertEqual(self.screenshot(page).colours(), {bytes(BLUE)})

    def test_a_screenshot_that_cannot_be_written_is_refused(self):
        run = self.run_tv(shipped('first.html'), '--screenshot', os.path.join(self.folder, 'missing', 'picture.png'))
        self.assert_refused(run, 'picture.png')

    def test_layers_of_their_own_are_enlarged_and_reduced_like_the_page(self):
        page = self.write('<body style="margin: 0; background: transparent"><div style="width: 320px; height: 180px;'
                          ' background: rgb(0, 0, 255); -webkit-transform: translate3d(640px, 360px, 0)">')
        picture = self.screenshot(page)
        self.assertEqual([picture.colour(x, y) for x, y in ((33, 19), (46, 25), (30, 19), (49, 19), (33, 16), (33, 28))],
                         [BLUE, BLUE, BLACK, BLACK, BLACK, BLACK])

    def test_a_change_of_the_page_is_painted_wherever_it_is(self):
        page = self.write('''<body style="margin: 0; background: rgb(0, 0, 255)">
            <div id="box" style="position: absolute; left: 1200px; top: 640px; width: 80px; height: 80px"></div>
            <script>setTimeout(function () { box.style.background = 'rgb(0, 128, 0)'; }, 200);
            onload = function () { console.log('ready'); };</script>''')
        # The pixels of the display, because a screenshot of telix-tv would repaint the whole window.
        for options, point in ((('--fullscreen',), (1860, 1020)), (('--size', '320x180'), (310, 170))):
            with self.subTest(options), self.television.start('--plugin', PLUGIN, *options, page) as process:
                self.assertIn('ready', process.stderr.readline())
                self.television.wait_for_colour(point, GREEN)
                self.television.wait_for_colour((point[0] // 2, point[1] // 2), BLUE)
                process.send_signal(signal.SIGTERM)
                process.communicate(timeout=RUN_TIMEOUT)


class VideoPlanePages(TelixTv):
    """Pages with the frame of platforms/picture.cpp: four quadrants of one colour each."""

    RED, LIME, WHITE = (255, 0, 0), (0, 255, 0), (255, 255, 255)
    PATTERN = [RED, LIME, BLUE, WHITE]
    PADDING = (0x12, 0x34, 0x56)  # of the frame's lines

    def page(self, style='left: 0; top: 0; width: 1280px; height: 720px', content='', frame='16, 9, 1', script='', before=''):
        """A page with a broadcast object, and with content before and after it. `frame`: aspect ratio and kind of the frame,
        see platforms/picture.cpp."""
        return self.write(f'<body style="margin: 0">{before}<object id="tv" type="video/broadcast" style="position: absolute; '
                          f'{style}"></object>{content}<script>onload = function () {{ tv.offsetWidth;'
                          f'tv.setChannelByTriplet({frame}); {script} }}</script>')

    def after_change(self, change, flag):
        """A script that runs `change` and sets the flag some turns of the event loop later, when the window has handled
        the wake-up."""
        return f'setTimeout(function () {{ {change}; setTimeout(function () {{ {flag} = true; }}, 100); }}, 100)'

    def shown(self, page, *arguments, **options):
        picture = self.screenshot(page, '--wait-for-picture', *arguments, **options)
        self.assertNotIn(bytes(self.PADDING), picture.colours(), 'the padding of the frame is shown')
        return picture

    def quarters(self, picture, left, top, width, height):
        """The colours in the centres of the quadrants of a rectangle."""
        return [picture.colour(left + x * width // 4, top + y * height // 4) for y in (1, 3) for x in (1, 3)]

    def run_with_wake_ups(self):
        page = self.page(frame='16, 9, 3', script='ticks = 0; setInterval(function () { ticks += 1; }, 10)')
        file_name = os.path.join(self.folder, 'picture.png')
        run = self.run_tv(page, '--size', '64x36', '--wait-for', 'window.ticks > 30', '--screenshot', file_name)
        self.assertEqual(run.status, 0, run)
        return run, PngImage(file_name)


class VideoPlane(VideoPlanePages):
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
                         script='tv.setFullScreen(true); ' + self.after_change('tv.setFullScreen(false)', 'isBack'))
        picture = self.shown(page, '--wait-for', 'window.isBack')
        self.assertEqual(self.quarters(picture, 32, 18, 32, 18), self.PATTERN)
        self.assertEqual(picture.colour(10, 10), BLACK)

    def test_the_shape_of_the_frame_is_kept_with_black_bars(self):
        narrow = self.shown(self.page(frame='4, 3, 1'))
        self.assertEqual(self.quarters(narrow, 8, 0, 48, 36), self.PATTERN)
        self.assertEqual([narrow.colour(x, 20) for x in (0, 7, 56, 63)], 4 * [BLACK])
        self.assertNotIn(BLACK, [narrow.colour(x, 20) for x in (8, 55)])
        wide = self.shown(self.page(frame='32, 9, 1'))
        self.assertEqual(self.quarters(wide, 0, 9, 64, 18), self.PATTERN)
        self.assertEqual([wide.colour(20, y) for y in (0, 8, 27, 35)], 4 * [BLACK])

    def test_a_frame_without_a_shape_has_that_of_its_pixels(self):
        self.assertEqual(self.quarters(self.shown(self.page(frame='0, 0, 1')), 0, 0, 64, 36), self.PATTERN)

    def test_the_page_lies_above_the_picture(self):
        page = self.page(content='<div style="position: absolute; left: 0; top: 0; width: 640px; height: 360px; background: '
                                 'rgb(0, 128, 0)"></div><div style="position: absolute; left: 640px; top: 360px; '
                                 'width: 640px; height: 360px; background: rgba(0, 0, 0, 0.5)"></div>')
        upper_left, upper_right, lower_left, lower_right = self.quarters(self.shown(page), 0, 0, 64, 36)
        self.assertEqual([upper_left, upper_right, lower_left], [GREEN, self.LIME, BLUE])
        self.assertTrue(all(value in (127, 128) for value in lower_right), lower_right)

    @unittest.skipUnless(IS_NPAPI, 'the other engine shows it, see test_video_in_page.py')
    def test_a_page_with_a_background_hides_the_picture(self):
        picture = self.shown(self.page(content='<style>body { background: rgb(0, 128, 0) }</style>'))
        self.assertEqual(picture.colours(), {bytes(GREEN)})

    def test_the_newest_frame_is_shown(self):
        page = self.page(script=self.after_change('tv.setChannelByTriplet(16, 9, 2)', 'isNew'))
        picture = self.shown(page, '--wait-for', 'window.isNew')
        self.assertEqual(self.quarters(picture, 0, 0, 64, 36),
                         [tuple(255 - value for value in colour) for colour in self.PATTERN])

    def test_without_a_picture_the_screen_is_black(self):
        page = self.page(script=self.after_change('tv.setChannelByTriplet(16, 9, 0)', 'isGone'))
        self.assertEqual(self.screenshot(page, '--wait-for', 'window.isGone').colours(), {bytes(BLACK)})

    def test_the_picture_is_there_without_an_application_and_beneath_a_hidden_one(self):
        for command in ('destroyHbbTVApplication', 'hideHbbTVApplication'):
            page = self.page(script=f'onkeydown = {command}')
            self.assertEqual(self.quarters(self.shown(page, '--keys', 'red'), 0, 0, 64, 36), self.PATTERN, command)

    def test_a_picture_that_never_comes_ends_in_time_with_a_screenshot(self):
        file_name = os.path.join(self.folder, 'picture.png')
        run, error = self.run_to_timeout(
            self.page(frame='16, 9, 0'), '--size', '64x36', '--wait-for-picture', '--screenshot', file_name,
            error='telix-tv: --wait-for-picture: no picture within {} s\n')
        self.assertEqual(run.status, 1, run)
        self.assertIn(error, run.errors)
        self.assertEqual(PngImage(file_name).colours(), {bytes(BLACK)})

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
            # Called by the page and by the teardown of the object.
            self.assertEqual(run.output.count('TELIX_JS_VB_Release is called'), 2, run)

    def test_wake_ups_without_end_leave_the_page_its_time(self):
        _, picture = self.run_with_wake_ups()
        self.assertEqual(self.quarters(picture, 0, 0, 64, 36), self.PATTERN)

    def test_the_display_shows_one_frame_after_the_other(self):
        page = self.page(script='frame = 1; setInterval(function () { frame = 3 - frame; '
                                'tv.setChannelByTriplet(16, 9, frame); }, 500)')
        # With each way of painting, where the window has several; the pixels of the display, not of a screenshot.
        for painting in ('cairo', 'gl'):
            with self.subTest(painting), self.television.start('--plugin', PLUGIN, '--size', '640x360', page,
                                                               environment={'TELIX_VIDEO': painting}) as process:
                for _ in range(2):
                    for point, colour in zip(((160, 90), (480, 90), (160, 270), (480, 270)), self.PATTERN):
                        self.television.wait_for_colour(point, colour)
                        self.television.wait_for_colour(point, tuple(255 - value for value in colour))
                process.send_signal(signal.SIGTERM)
                process.communicate(timeout=RUN_TIMEOUT)


class PlatformLibraryOfTheWindow(VideoPlanePages):
    """Only of a window that has the library in its own process."""

    def test_wake_ups_end_with_the_window(self):
        run, _ = self.run_with_wake_ups()
        self.assertEqual([line for line in run.errors.splitlines() if line.startswith('picture: ')],
                         ['picture: wake-up removed', 'picture: 0 frames not released'])


if __name__ == '__main__':
    unittest.main()
