"""Signalled applications and the channel that is on, in the window with the desktop platform library."""

import contextlib
import http.server
import os
import threading
import unittest
import urllib.parse

from telix_tv import TelixTv, shipped
from television import Lines, PngImage, wait_for
from patterns import has_bars, is_striped

DESKTOP_PLUGIN = os.environ['TELIX_DESKTOP_PLUGIN']
TITLE = ('--eval', 'document.title')
XML_AIT_TYPE = 'application/vnd.dvb.ait+xml'
XML_AIT = '''<?xml version="1.0" encoding="UTF-8"?>
<ServiceDiscovery xmlns="urn:dvb:mhp:2009" xmlns:xsi="http://www.w3.org/2001/XMLSchema-instance">
<ApplicationDiscovery DomainName="example"><ApplicationList><Application>
  <appName Language="eng">Portal</appName>
  <applicationIdentifier><orgId>17</orgId><appId>1</appId></applicationIdentifier>
  <applicationDescriptor xsi:type="HbbTVApplicationDescriptor">
    <type><OtherApp>application/vnd.hbbtv.xhtml+xml</OtherApp></type>
    <controlCode>AUTOSTART</controlCode><visibility>VISIBLE_ALL</visibility><serviceBound>false</serviceBound>
    <priority>1</priority><version>01</version>
    <mhpVersion><profile>0</profile><versionMajor>1</versionMajor><versionMinor>1</versionMinor>
      <versionMicro>1</versionMicro></mhpVersion>
  </applicationDescriptor>
  <applicationTransport xsi:type="HTTPTransportType"><URLBase>{base}</URLBase></applicationTransport>
  <applicationLocation>{page}</applicationLocation>
</Application></ApplicationList></ApplicationDiscovery></ServiceDiscovery>'''


class Handler(http.server.BaseHTTPRequestHandler):
    """Serves the server's documents, by path: content type and text."""

    def do_GET(self):  # pylint: disable=invalid-name
        document = self.server.documents.get(urllib.parse.urlsplit(self.path).path)
        kind, text = document or ('text/html', '<title>error page</title>')
        self.send_response(200 if document else 404)
        self.send_header('Content-Type', kind)
        self.send_header('Content-Length', str(len(text.encode())))
        self.end_headers()
        with contextlib.suppress(ConnectionError):
            self.wfile.write(text.encode())

    def log_message(self, *_):
        pass


def page(title, script=''):
    return 'text/html', f'<title>{title}</title><script>{script}</script>'


class Television(TelixTv):
    """Base class: the television on the test multiplex."""

    def setUp(self):
        super().setUp()
        self.documents = {}
        server = http.server.ThreadingHTTPServer(('127.0.0.1', 0), Handler)
        server.documents = self.documents
        thread = threading.Thread(target=server.serve_forever)
        thread.start()
        self.addCleanup(thread.join)
        self.addCleanup(server.server_close)
        self.addCleanup(server.shutdown)
        self.url = f'http://127.0.0.1:{server.server_port}/'
        with open(shipped('signalled/launcher.html'), encoding='utf-8') as file:
            self.launcher = 'text/html', file.read()

    def run_desktop(self, *arguments, signals=False):
        """Runs the window to its end. `signals`: the test multiplex signals demo/index.html and media/index.html."""
        return self.television.run('--plugin', DESKTOP_PLUGIN, *arguments,
                                   environment={'TELIX_APPLICATIONS': self.url} if signals else None)

    def desktop_value(self, *arguments, signals=False):
        run = self.run_desktop(*arguments, signals=signals)
        self.assertEqual(run.status, 0, run)
        return run.value

    @contextlib.contextmanager
    def running(self, *arguments, signals=False):
        with self.television.start('--plugin', DESKTOP_PLUGIN, *arguments,
                                   environment={'TELIX_APPLICATIONS': self.url} if signals else None) as process:
            messages = Lines(process.stderr)
            yield messages
            self.assertIsNone(process.poll(), messages.lines)
            process.terminate()
            process.wait()


class Signalled(Television):
    def signal_demonstration(self):
        self.documents.update({'/demo/index.html': self.launcher,
                               '/media/index.html': page('media', 'seen = location.search + location.hash')})

    def test_what_the_channel_starts_is_bound_to_it(self):
        self.signal_demonstration()
        value = self.desktop_value('--wait-for', 'document.title === "launcher" && tv.playState === 2', '--eval',
                                   'tv.currentChannel.name', signals=True)
        self.assertEqual(value, 'Telix One')

    def test_the_red_button_opens_its_portal(self):
        self.signal_demonstration()
        self.assertEqual(self.desktop_value('--keys', 'red', *TITLE, signals=True), 'portal')
        self.assertEqual(self.desktop_value('--keys', 'red,back', *TITLE, signals=True), 'launcher')

    def test_an_application_starts_another_one_of_the_channel_by_its_id(self):
        self.signal_demonstration()
        self.assertEqual(self.desktop_value('--keys', 'green', '--wait-for', 'document.title === "media"', '--eval',
                                            'seen', signals=True), '?from=launcher#top')

    def test_an_application_that_is_not_signalled_is_not_created(self):
        self.documents['/demo/index.html'] = page(
            'demo', 'onload = function () { created = ["7e11.2", "7e11.9", "1.1"].map(function (id) {'
                    'return createHbbTVApplication("dvb://current.ait/" + id); }); }')
        self.assertEqual(self.desktop_value('--wait-for', 'window.created', '--eval', 'created', signals=True),
                         [False, False, False])

    def test_another_channel_ends_a_service_bound_application_and_starts_its_own(self):
        self.signal_demonstration()
        with self.running(signals=True):
            self.wait_for_running('demo')
            self.television.telixctl('channel', 3)
            self.wait_for_running(None)
            self.television.telixctl('channel', 2)
            self.wait_for_running('demo')

    def wait_for_running(self, name):
        """Waits until the red button of the launcher is on the screen, or nothing is."""
        red = (255, 0, 0)
        wait_for(lambda: (self.television.screen().colour(1200, 640) == red) == (name is not None),
                 f'expected {name}')

    def test_exit_ends_the_application_and_text_starts_it_again(self):
        self.signal_demonstration()
        run = self.run_desktop('--keys', 'exit', *TITLE, signals=True)
        self.assertEqual(run.status, 1, run)
        self.assertIn('no application', run.errors)
        for key in ('text', 'red'):
            self.assertEqual(self.desktop_value('--keys', f'exit,{key}', '--wait-for', 'document.title === "launcher"',
                                                *TITLE, signals=True), 'launcher')

    def test_an_application_that_ends_itself_leaves_the_channel(self):
        self.signal_demonstration()
        run = self.run_desktop('--keys', 'blue', *TITLE, signals=True)
        self.assertEqual(run.status, 1, run)
        self.assertIn('no application', run.errors)

    def test_an_application_that_cannot_be_loaded_gives_way_to_the_next(self):
        self.signal_demonstration()
        missing = self.url + 'missing.html'
        with self.running(signals=True) as messages:
            self.wait_for_running('demo')
            self.television.telixctl('signal', missing)
            self.television.telixctl('signal', missing, '--control-code', 'kill')
            self.wait_for_running('demo')
            # The demonstration ends on the third channel, and on the way back the one with the higher priority fails.
            self.television.telixctl('channel', 3)
            self.wait_for_running(None)
            self.television.telixctl('signal', missing, '--on', 1)
            self.television.telixctl('channel', 1)
            self.assertTrue(messages.wait_for(f'telix-tv: cannot load {missing}: HTTP status 404'))
            self.wait_for_running('demo')

    def test_a_page_on_the_command_line_is_not_replaced(self):
        self.signal_demonstration()
        own = self.write('<title>own</title>')
        self.assertEqual(self.desktop_value('--wait-for-picture', *TITLE, own, signals=True), 'own')

    def test_telixctl_starts_and_kills(self):
        self.documents['/page.html'] = self.launcher
        with self.running():
            wait_for(lambda: is_striped(self.television.screen()), 'no picture')
            self.television.telixctl('signal', self.url + 'page.html')
            self.wait_for_running('page')
            self.television.telixctl('signal', self.url + 'page.html', '--control-code', 'kill')
            self.wait_for_running(None)


class Options(Television):
    def test_signal_starts_a_page_with_the_channel(self):
        self.documents['/page.html'] = self.launcher
        ready = ('--wait-for', 'document.title === "launcher" && tv.playState === 2', '--eval', 'tv.currentChannel.name')
        self.assertEqual(self.desktop_value('--signal', self.url + 'page.html', *ready), 'Telix One')
        self.assertEqual(self.desktop_value('--signal', self.url + 'page.html', '--on', '2', *ready), 'Telix Two')

    def test_signal_takes_a_file(self):
        self.assertEqual(self.desktop_value('--signal', self.write('<title>file</title>'), *TITLE), 'file')

    def test_a_signalled_page_is_listed(self):
        file_name = self.write('<title>file</title>')
        with self.running('--signal', file_name, '--on', '3'):
            wait_for(lambda: self.television.leftovers() and self.applications(), 'no application')
            self.assertEqual([(each['url'], each['controlCode']) for each in self.applications()],
                             [(f'file://{file_name}', 'AUTOSTART')])

    def applications(self):
        with contextlib.suppress(AssertionError):
            return self.television.telixctl('applications')['applications']
        return []

    def test_ait_starts_the_application_of_a_document(self):
        self.documents['/page.html'] = page('portal')
        self.documents['/list'] = XML_AIT_TYPE, XML_AIT.format(base=self.url, page='page.html')
        self.assertEqual(self.desktop_value('--ait', self.url + 'list', *TITLE), 'portal')
        file_name = self.write(XML_AIT.format(base=self.url, page='page.html'), 'list.xml')
        self.assertEqual(self.desktop_value('--ait', file_name, *TITLE), 'portal')
        # By content type and by name also without the option.
        self.assertEqual(self.desktop_value(self.url + 'list', *TITLE), 'portal')
        self.assertEqual(self.desktop_value(self.write(XML_AIT.format(base=self.url, page='page.html'), 'list.aitx'),
                                            *TITLE), 'portal')

    def test_a_page_creates_the_application_of_a_document(self):
        self.documents['/page.html'] = page('portal')
        self.documents['/list'] = XML_AIT_TYPE, XML_AIT.format(base=self.url, page='page.html')
        self.documents['/first.html'] = page('first', 'onload = function () { createHbbTVApplication("list"); }')
        self.assertEqual(self.desktop_value(self.url + 'first.html', '--wait-for', 'document.title === "portal"', *TITLE),
                         'portal')

    def test_bad_documents_are_refused(self):
        bad = self.write('<html></html>', 'bad.aitx')
        dead = self.write(XML_AIT.format(base=self.url, page='page.html'), 'dead.aitx')
        for arguments, reason in ((('--ait', bad), 'bad.aitx'), (('--ait', dead), 'HTTP status 404'),
                                  (('--ait', self.folder), 'not a file'), ((bad,), 'bad.aitx'),
                                  (('--signal', self.url + 'none'), 'HTTP status 404')):
            self.assert_refused(self.run_desktop(*arguments), reason)

    def test_bad_options_are_refused(self):
        own = self.write('<title>own</title>')
        for arguments, reason in ((('--ait', own, own), 'one page'), (('--on', '2', own), '--signal'),
                                  (('--signal', own, '--on', '0'), '"0"'), (('--signal', own, '--on', 'two'), '"two"'),
                                  (('--ait=',), '--ait'), (('--signal=',), '--signal')):
            self.assert_refused(self.run_desktop(*arguments), reason)

    def test_a_channel_that_is_not_there_is_reported(self):
        with self.running('--signal', self.write('x'), '--on', '9') as messages:
            self.assertTrue(messages.wait_for('telix-tv: no channel 9, there are 3'))


class Strict(Television):
    PAGE = '''<object type="video/broadcast"></object><script>
        events = 0;
        tv = document.querySelector('object');
        tv.addEventListener('PlayStateChange', function () { events++; }, false);
        onload = function () { tv.bindToCurrentChannel(); };</script>'''

    def test_an_object_without_an_id_gets_events(self):
        self.assertGreater(self.desktop_value(self.write(self.PAGE), '--wait-for', 'events && tv.playState === 2', '--eval',
                                              'events'), 0)

    def test_strictly_it_gets_none(self):
        self.assertEqual(self.desktop_value('--strict', self.write(self.PAGE), '--wait-for', 'tv.playState === 2',
                                            '--eval', '[events, tv.id]'), [0, ''])

    def test_an_id_of_the_page_stays(self):
        own = self.write(self.PAGE.replace('<object', '<object id="own"'))
        self.assertEqual(self.desktop_value(own, '--wait-for', 'events', '--eval', 'tv.id'), 'own')

    def test_strictly_a_url_with_a_quote_is_not_created(self):
        own = self.write('''<object id="manager" type="application/oipfApplicationManager"></object><script>
            onload = function () {
                var application = manager.getOwnerApplication(document);
                created = application.createApplication('data:text/html,<title>it\\'s</title>', false) !== null;
                console.log('created ' + created);
            };</script>''')
        self.assertIn('created true', self.run_desktop(own, '--wait-for', 'document.title === "it\'s"', *TITLE).errors)
        self.assertIn('created false', self.run_desktop('--strict', own, '--wait-for', 'created === false', *TITLE).errors)


class RunningChannel(Television):
    OBJECT = '<object id="tv" type="video/broadcast" style="position: absolute; left: 0; top: 0"></object>'

    def wait_for_pattern(self, pattern):
        wait_for(lambda: pattern(self.television.screen()), f'no {pattern.__name__}')

    def test_the_channel_is_there_without_a_page(self):
        with self.running():
            self.wait_for_pattern(is_striped)

    def test_the_channel_shows_through_a_page_without_objects(self):
        own = self.write('<body style="background: transparent"><div style="position: absolute; left: 0; top: 0; '
                         'width: 100px; height: 100px; background: rgb(0, 128, 0)"></div>')
        with self.running(own):
            self.wait_for_pattern(is_striped)
            self.television.wait_for_colour((50, 50), (0, 128, 0))

    def test_the_channel_shows_through_such_a_page_as_soon_as_it_is_transparent(self):
        for change in ("document.body.style.background = 'transparent'", "document.body.className = 'clear'",
                       "document.styleSheets[0].deleteRule(0)"):
            own = self.write('<style>body { background: rgb(0, 128, 0) } .clear { background: transparent }</style><body>'
                             f'<script>onkeydown = function () {{ {change} }}</script>')
            with self.subTest(change), self.running(own):
                self.television.wait_for_colour((50, 50), (0, 128, 0))
                self.television.press_key('Return')
                self.wait_for_pattern(is_striped)

    def test_television_keys_change_the_channel_and_say_so(self):
        for keys in ('2', 'channel-up', 'channel-down,channel-down'):
            with self.running('--keys', keys):
                self.wait_for_pattern(has_bars)
                # The box of the display, and the grey bar beneath.
                wait_for(lambda: max(self.television.screen().colour(1225, 60)) < 80, 'no on-screen display')
                wait_for(lambda: min(self.television.screen().colour(1225, 60)) > 90, 'the on-screen display stays')

    def test_a_screenshot_has_the_on_screen_display(self):
        # The picture would be a bar of red, of blue, of magenta or of cyan.
        picture = self.screenshot_of('--keys', 'volume-down')
        self.assertLess(max(picture.colour(1225, 60)), 80)

    def screenshot_of(self, *arguments):
        file_name = os.path.join(self.folder, 'picture.png')
        run = self.run_desktop('--wait-for-picture', '--screenshot', file_name, *arguments)
        self.assertEqual(run.status, 0, run)
        return PngImage(file_name)

    def test_a_page_without_a_video_object_gets_no_digits_and_the_channel_changes(self):
        own = self.write('<body style="background: transparent"><script>codes = [];'
                         'onkeydown = function (event) { codes.push(event.keyCode); }</script>')
        with self.running(own, '--keys', 'red,2'):
            self.wait_for_pattern(has_bars)
        self.assertEqual(self.desktop_value(own, '--keys', 'red,2', '--eval', 'codes'), [403])

    def test_a_stopped_object_switches_the_channel_off_and_a_released_one_on(self):
        script = '''<script>onload = function () { tv.bindToCurrentChannel(); };
            onkeydown = function (event) { if (event.keyCode === VK_RED) { tv.stop(); } else { tv.release(); } };
            </script>'''
        own = self.write('<body style="background: transparent">' + self.OBJECT + script)
        for keys, pattern in (('red', lambda screen: screen.colour(30, 300) == (0, 0, 0)), ('red,down', is_striped)):
            with self.running(own, '--keys', keys):
                self.wait_for_pattern(pattern)

    def test_the_channel_comes_back_after_media(self):
        clip = os.path.join(os.environ['TELIX_CLIPS'], 'clip.mp4')
        own = self.write(f'''<body style="background: transparent"><object id="video" type="video/mp4"
            data="file://{clip}" style="position: absolute; left: 0; top: 0; width: 1280px; height: 720px"></object><script>
            onload = function () {{
                video.onPlayStateChange = function () {{
                    if (video.playState === 1) {{ video.stop(); console.log('stopped'); }}
                }};
                video.play(1);
            }};</script>''')
        with self.running(own, '--keys', '2') as messages:
            self.assertTrue(messages.wait_for('stopped'))
            self.wait_for_pattern(has_bars)


if __name__ == '__main__':
    unittest.main()
