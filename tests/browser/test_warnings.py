"""What the window warns of: one line on the console, at the first time in a page."""

import os
import unittest

from telix_tv import PLUGIN
from television import wait_for
from test_signalled import XML_AIT, XML_AIT_TYPE, Television, page

BROADCAST = '<object id="tv" type="video/broadcast"></object>'
NO_ID = 'the object of type video/broadcast has no id, so it gets no events'


class Warned(Television):
    """Base class: the desktop television."""

    def warnings(self, *arguments, plugin=None):
        """The warnings of a run that ends with success: pairs of the page's file or URL and the text."""
        run = self.run_desktop(*arguments) if plugin is None else self.television.run('--plugin', plugin, *arguments)
        self.assertEqual(run.status, 0, run)
        return self.parse(run.errors.splitlines())

    @staticmethod
    def parse(lines):
        mark = 'telix: '
        pairs = [line.partition(mark) for line in lines if line.startswith(mark) or ': ' + mark in line]
        return [(place[:-len(': ')], text) for place, _, text in pairs]

    def loaded(self, content, *options, name='page.html'):
        """The arguments of a run that ends when the page has said so: it sets `done`."""
        return (*options, '--wait-for', 'window.done', '--eval', '0', self.write(content, name))


class Objects(Warned):
    DONE = '<script>onload = function () { setTimeout(function () { done = true; }, 0); };</script>'

    def test_an_object_that_gets_no_events(self):
        arguments = self.loaded('<object type="video/broadcast"></object><object type="Video/Broadcast"></object>' +
                                self.DONE)
        self.assertEqual(self.warnings('--strict', *arguments), [(arguments[-1], NO_ID)])
        # The window gives it an id.
        self.assertEqual(self.warnings(*arguments), [])

    def test_an_object_that_script_makes(self):
        arguments = self.loaded('''<body><script>onload = function () {
            var tv = document.createElement('object');
            tv.setAttribute('type', 'video/broadcast');
            document.body.appendChild(tv);
            setTimeout(function () { done = true; }, 0); };</script>''')
        self.assertEqual(self.warnings('--strict', *arguments), [(arguments[-1], NO_ID)])

    def test_objects_that_need_no_id(self):
        types = ('application/oipfApplicationManager', 'application/oipfConfiguration', 'application/oipfCapabilities',
                 'application/oipfParentalControlManager')
        objects = ''.join(f'<object type="{each}"></object>' for each in types) + BROADCAST
        self.assertEqual(self.warnings(*self.loaded(objects + self.DONE, '--strict')), [])

    def test_a_type_that_nobody_has(self):
        arguments = self.loaded('''<object type="application/oipfSearchManager"></object>
            <embed type="application/x-unknown; version=2">
            <object type="image/png" data="none.png"></object><object></object>''' + self.DONE)
        self.assertEqual(sorted(self.warnings(*arguments)),
                         [(arguments[-1], f'unknown object type application/{name}')
                          for name in ('oipfsearchmanager', 'x-unknown')])

    def test_each_document_gets_the_line(self):
        self.write('<object type="application/x-unknown"></object>' + self.DONE, 'second.html')
        arguments = self.loaded('''<object type="application/x-unknown"></object><script>
            onload = function () { setTimeout(function () { location.replace('second.html'); }, 0); };</script>''')
        places = [place for place, text in self.warnings(*arguments)]
        self.assertEqual([os.path.basename(place) for place in places], ['page.html', 'second.html'])

    def test_a_hundred_lines_at_most(self):
        arguments = self.loaded('''<body><script>onload = function () {
            for (var i = 0; i < 300; i++) {
                var element = document.createElement('object');
                element.setAttribute('type', 'application/x-' + i);
                document.body.appendChild(element);
            }
            setTimeout(function () { done = true; }, 0); };</script>''')
        self.assertEqual(len(self.warnings(*arguments)), 100)

    def test_a_method_that_refuses_its_arguments(self):
        arguments = self.loaded(BROADCAST + '''<script>
            refused = 0;
            function refuse(call) { try { call(); } catch (error) { refused++; } }
            onload = function () {
                for (var i = 0; i < 2; i++) {
                    refuse(function () { tv.setChannel('ARD', false); });
                    refuse(function () { tv.createChannelObject(null); });
                }
                tv.bindToCurrentChannel();
                done = refused === 4;
            };</script>''')
        found = self.warnings(*arguments)
        self.assertEqual(found, [
            (arguments[-1], f'{call}: the method refuses these arguments')
            for call in ('setChannel(string, boolean)', 'createChannelObject(null)')])

    def test_a_stream_event_whose_script_fails(self):
        own = self.write(BROADCAST + '''<script>onload = function () {
            tv.bindToCurrentChannel();
            tv.addEventListener('StreamEvent', function (event) { console.log('event ' + event.text); }, false);
            tv.addStreamEventListener('', 'offer', '6', '1f');
            console.log('ready'); };</script>''')
        with self.running('--strict', own) as messages:
            self.assertTrue(messages.wait_for('ready'))
            for data in ('say "hello"', 'say "it"', 'plain'):
                self.television.telixctl('stream-event', '--name', 'offer', '--data', data)
            self.assertTrue(messages.wait_for('event plain'))
            # The window's lines and those of the page come from two processes.
            self.assertTrue(messages.wait_for('so the event is lost'))
            self.assertEqual(self.parse(messages.lines), [
                (own, 'the script that dispatches StreamEvent offer has failed, so the event is lost')])
        with self.running(own) as messages:
            self.assertTrue(messages.wait_for('ready'))
            self.television.telixctl('stream-event', '--name', 'offer', '--data', 'say "hello"')
            self.assertTrue(messages.wait_for('event say "hello"'))
            self.assertEqual(self.parse(messages.lines), [])

    def test_an_application_that_is_not_created(self):
        self.documents['/page.html'] = page('page', '''onload = function () {
            createHbbTVApplication('missing.html'); createHbbTVApplication('missing.html'); done = true; }''')
        url = self.url + 'page.html'
        self.assertEqual(self.warnings('--wait-for', 'window.done', '--eval', '0', url),
                         [(url, f'no application is created: {self.url}missing.html: HTTP status 404')])


class Keys(Warned):
    PAGE = '''<script>codes = []; onkeydown = function (event) { codes.push(event.keyCode); };</script>'''

    def test_a_key_that_the_page_has_not_asked_for(self):
        own = self.write(self.PAGE)
        run = self.run_desktop('--keys', '7,red,7,channel-up,volume-down,play', '--eval', 'codes', own)
        self.assertEqual((run.status, run.value), (0, [403]), run)
        self.assertEqual(self.parse(run.errors.splitlines()),
                         [(own, f'the page does not get the key {key}, which is not in its key set')
                          for key in ('7', 'play')])

    def test_without_a_page_there_is_nobody_to_warn(self):
        with self.running('--keys', '7,ok,2,ok') as messages:
            wait_for(lambda: self.television.leftovers() and self.channel() == 'Telix Two', 'another channel')
            self.assertEqual(self.parse(messages.lines), [])

    def channel(self):
        try:
            return (self.television.telixctl('state')['channel'] or {}).get('name')
        except AssertionError:
            return ''

    def test_a_platform_without_a_key_set(self):
        own = self.write(self.PAGE)
        self.assertEqual(self.warnings('--keys', '7,play', '--eval', 'codes', own, plugin=PLUGIN), [])


class Signalling(Warned):
    def test_an_entry_of_the_channel(self):
        self.url = 'http://127.0.0.1/two words/'
        line = 'telix: skipped in the AIT of channel {}: application 7e11.{}: the URL has invalid characters'
        with self.running(signals=True) as messages:
            for application in (1, 2):
                self.assertTrue(messages.wait_for(line.format(1, application)), messages.lines)
            # No line on the way back; then that of another channel.
            for channel in (3, 1):
                self.television.telixctl('channel', channel)
                wait_for(lambda: bool(self.television.telixctl('applications')['skipped']) == (channel == 1), 'no AIT')
            self.television.telixctl('channel', 2)
            self.assertTrue(messages.wait_for(line.format(2, 1)), messages.lines)
            found = self.parse(messages.lines)
        self.assertEqual(len(found), len(set(found)), found)
        self.assertEqual({place for place, _ in found}, {''})

    def test_an_entry_of_a_document(self):
        self.documents['/page.html'] = page('portal')
        one = XML_AIT.format(base=self.url, page='page.html')
        begin, end = one.index('<Application>'), one.index('</ApplicationList>')
        bad = one[begin:end].replace('<appId>1<', '<appId>2<').replace('<versionMajor>1<', '<versionMajor>9<')
        self.documents['/list'] = XML_AIT_TYPE, one[:end] + bad + one[end:]
        found = self.warnings(self.url + 'list', '--eval', 'document.title')
        self.assertEqual(found, [('', f'skipped in the AIT of {self.url}list: application 11.2: '
                                      'the set does not support the profile or version')])


if __name__ == '__main__':
    unittest.main()
