"""Requests of media: with the user agent, the cookies, the Referer and the trust of the page's browser."""

import contextlib
import json
import os
import subprocess
import sys
import unittest
import urllib.parse

from telix_tv import IS_NPAPI, TelixTv
from television import Television

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', '..', 'tools'))
from media_server import MediaServer  # noqa: E402 (found by the line above)

DESKTOP_PLUGIN = os.environ['TELIX_DESKTOP_PLUGIN']
CLIPS = os.environ['TELIX_CLIPS']
TUNE, CLIP, SECOND = '/clips/tune.mp3', '/clips/clip.mp4', '/clips/second.mp4'
PLAYER = '''<img src="{image}"><object id="media" type="{kind}" data="{url}"></object><script>
    states = [];
    onload = function () {{
        media.onPlayStateChange = function () {{ states.push(media.playState); }};
        media.play(1);
    }};</script>'''
PLAYING, FINISHED, ERROR = 1, 5, 6
COMPARED = ('User-Agent', 'Referer', 'Cookie')


def query(path, *options, **values):
    """The path with a query; options may be repeated names of the server."""
    pairs = [*options, *values.items()]
    return path + ('?' + urllib.parse.urlencode(pairs, quote_via=urllib.parse.quote) if pairs else '')


def media(url, *options, **values):
    """The same for media, unescaped: the plug-in escapes its URL."""
    return urllib.parse.unquote(query(url, *options, **values))


def require(name, text):
    return 'require', f'{name}:{text}'


class Requests(TelixTv):
    """Base class: a server with pages and clips, which records what it is asked for. It is two sites by two names."""

    def setUp(self):
        super().setUp()
        self.serve()

    def serve(self, certificate=None):
        self.log = os.path.join(self.folder, 'log')
        server = MediaServer({'': self.folder, 'clips': CLIPS}, certificate=certificate, log=self.log)
        self.addCleanup(server.close)
        self.url = server.url
        self.other = server.url.replace('127.0.0.1', 'localhost')

    def write_player(self, url, kind='audio/mpeg', image='data:,', name='page.html'):
        self.write(PLAYER.format(url=url, kind=kind, image=image), name)

    def play(self, page='/page.html', *arguments, television=None):
        """Loads a player; returns the value of --eval when its media plays or has failed."""
        run = (television or self.television).run(
            '--plugin', DESKTOP_PLUGIN, '--wait-for',
            f'window.states && [{PLAYING}, {ERROR}].some(function (each) {{ return states.indexOf(each) >= 0; }})',
            *(arguments or ('--eval', f'[states.indexOf({PLAYING}) >= 0, media.error]')),
            urllib.parse.urljoin(self.url, page))
        self.assertEqual(run.status, 0, run)
        return run.value

    def clear_log(self):
        with contextlib.suppress(FileNotFoundError):
            os.remove(self.log)

    def requests(self, path):
        """The requests of a path, without those that the engine makes of it."""
        with open(self.log, encoding='utf-8') as lines:
            records = [json.loads(line) for line in lines]
        return [each['headers'] for each in records
                if each['path'].split('?')[0] == path and 'Accept-Language' not in each['headers']]

    def assert_played(self, value):
        self.assertTrue(value[0], value)


class Identity(Requests):
    def test_a_server_for_the_page_alone_plays(self):
        self.write_player(media(self.url + TUNE, require('User-Agent', 'HbbTV/1.1.1 (;Telix;'), require('Cookie', 'session=abc'),
                                require('Referer', self.url + '/page.html')))
        self.assert_played(self.play(query('/page.html', cookie='session=abc; HttpOnly; Path=/')))
        self.assertTrue(self.requests(TUNE))

    def test_a_server_for_others_does_not(self):
        for name, text in (('User-Agent', 'Elsewhere'), ('Cookie', 'session=abc'), ('Referer', self.url + '/other.html')):
            self.write_player(media(self.url + TUNE, require(name, text)))
            self.assertEqual(self.play(), [False, 1], name)

    def test_the_user_agent_of_the_option(self):
        self.write_player(media(self.url + TUNE, require('User-Agent', 'Own/1 HbbTV')))
        self.assert_played(self.play('/page.html', '--user-agent', 'Own/1 HbbTV', '--eval',
                                     f'[states.indexOf({PLAYING}) >= 0]'))

    def test_playlists_and_segments(self):
        page = query('/page.html', cookie='session=abc; HttpOnly; Path=/')
        self.write_player(self.url + '/clips/hls/index.m3u8', 'application/vnd.apple.mpegurl')
        self.play(page, '--wait-for', f'states.indexOf({FINISHED}) >= 0', '--eval', '0')
        with open(self.log, encoding='utf-8') as lines:
            paths = {json.loads(line)['path'] for line in lines}
        segments = [path for path in paths if path.endswith('.ts')]
        self.assertEqual(len(segments), 3, paths)
        for path in ('/clips/hls/index.m3u8', *segments):
            self.assertTrue(self.requests(path), path)
            for headers in self.requests(path):
                self.assertIn('HbbTV/1.1.1', headers['User-Agent'], path)
                self.assertEqual((headers.get('Cookie'), headers.get('Referer')), ('session=abc', self.url + page), path)

    def test_the_referer_is_the_page_on_top(self):
        self.write_player(self.url + TUNE, name='second.html')
        self.write('<script>onload = function () { createHbbTVApplication("second.html"); }</script>')
        self.assert_played(self.play())
        self.assertEqual({each.get('Referer') for each in self.requests(TUNE)}, {self.url + '/second.html'})


class Cookies(Requests):
    def test_cookies_of_media_are_those_of_the_page(self):
        self.write_player(media(self.url + TUNE, cookie='ticket=7; Path=/'))
        self.assertEqual(self.play('/page.html', '--wait-for', 'document.cookie', '--eval', 'document.cookie'), 'ticket=7')

    def test_the_next_media_has_a_cookie_that_the_page_does_not_see(self):
        self.write_player(media(self.url + TUNE, cookie='ticket=7; Path=/; HttpOnly'))
        self.write_player(media(self.url + TUNE, require('Cookie', 'ticket=7')), name='next.html')
        value = self.play('/page.html', '--wait-for', self.after_media('next.html', 'window.states && states.length > 1'),
                          '--eval', f'[states.indexOf({ERROR}), document.cookie]')
        self.assertEqual(value, [-1, ''])

    @staticmethod
    def after_media(following, condition):
        """Goes from the first page to the following one when its media plays; true if the condition is there."""
        return f'''(function () {{
            if (!/page[.]html$/.test(location.pathname)) {{ return {condition}; }}
            if (states.indexOf({PLAYING}) >= 0) {{ location.replace('{following}'); }}
            return false;
        }}())'''

    def test_media_deletes_a_cookie(self):
        self.write_player(media(self.url + TUNE, cookie='session=; Path=/; Max-Age=0'))
        self.assertEqual(self.play(query('/page.html', cookie='session=abc; Path=/'), '--wait-for', 'document.cookie === ""',
                                   '--eval', 'document.cookie'), '')

    def test_requests_are_those_of_the_page_on_its_own_and_on_other_sites(self):
        cookies = ('plain=1; Path=/', 'strict=1; Path=/; SameSite=Strict', 'lax=1; Path=/; SameSite=Lax',
                   'hidden=1; Path=/; HttpOnly', 'deep=1; Path=/clips', 'secure=1; Path=/; Secure')
        for host in (self.url, self.other):
            with self.subTest(host):
                self.write_player(media(host + CLIP, redirect=host + SECOND), 'video/mp4', host + '/clips/none.png')
                self.clear_log()
                self.assert_played(self.play(self.visit(cookies)))
                with open(self.log, encoding='utf-8') as lines:
                    image = [json.loads(line)['headers'] for line in lines if '/none.png' in line][-1]
                for path in (CLIP, SECOND):
                    self.assertTrue(self.requests(path))
                    for headers in self.requests(path):
                        for name in COMPARED:
                            self.assertEqual(self.sorted_cookies(headers.get(name)), self.sorted_cookies(image.get(name)),
                                             (path, name))
                if host == self.url:
                    self.assertIn('hidden=1', image['Cookie'])

    def visit(self, cookies):
        """The URL of a page that sets cookies for both hosts, on one after the other, and goes to the player."""
        steps = [query(f'{host}/step{number}.html', cookie=cookie)
                 for number, (host, cookie) in enumerate((host, cookie) for host in (self.other, self.url)
                                                         for cookie in cookies)]
        for number, following in enumerate([*steps[1:], self.url + '/page.html']):
            self.write(f'<script>onload = function () {{ location.replace({json.dumps(following)}); }}</script>',
                       f'step{number}.html')
        return steps[0]

    @staticmethod
    def sorted_cookies(header):
        return sorted((header or '').split('; '))

    def test_a_redirection_takes_no_cookies_to_another_host(self):
        self.write_player(media(self.url + CLIP, require('Cookie', 'session=abc'), redirect=self.other + SECOND), 'video/mp4')
        self.assert_played(self.play(query('/page.html', cookie='session=abc; Path=/')))
        self.assertTrue(self.requests(SECOND))
        for headers in self.requests(SECOND):
            self.assertNotIn('Cookie', headers)

    def test_another_site_sets_no_cookies(self):
        self.write_player(media(self.other + TUNE, cookie='foreign=1; Path=/'))
        self.write('<title>other</title>', 'other.html')
        value = self.play('/page.html', '--wait-for',
                          self.after_media(f'{self.other}/other.html', 'document.title === "other"'),
                          '--eval', 'document.cookie')
        # The NPAPI engine lets every site set cookies.
        self.assertEqual(value, 'foreign=1' if IS_NPAPI else '')


def certificate_of(folder):
    """A certificate of 127.0.0.1 that nobody has signed: its file, and the file with its key, too."""
    certificate, key = os.path.join(folder, 'certificate.pem'), os.path.join(folder, 'key.pem')
    subprocess.run(['openssl', 'req', '-x509', '-newkey', 'rsa:2048', '-nodes', '-subj', '/CN=127.0.0.1', '-addext',
                    'subjectAltName=IP:127.0.0.1', '-keyout', key, '-out', certificate], check=True,
                   stderr=subprocess.DEVNULL)
    both = os.path.join(folder, 'both.pem')
    with open(both, 'w', encoding='utf-8') as out:
        for name in (certificate, key):
            with open(name, encoding='utf-8') as part:
                out.write(part.read())
    return certificate, both


class Trust(Requests):
    def setUp(self):
        super().setUp()
        self.certificate, both = certificate_of(self.folder)
        self.serve(both)
        self.write_player(self.url + TUNE)

    def test_media_of_an_unknown_certificate_does_not_play(self):
        file_name = self.write(PLAYER.format(url=self.url + TUNE, kind='audio/mpeg', image='data:,'), 'local.html')
        run = self.television.run('--plugin', DESKTOP_PLUGIN, '--wait-for', f'states.indexOf({ERROR}) >= 0', '--eval',
                                  'media.error', file_name)
        self.assertEqual((run.status, run.value), (0, 1), run)
        self.assertFalse(os.path.exists(self.log))

    def test_a_certificate_that_the_system_trusts_is_one_for_page_and_media(self):
        self.assert_played(self.play(television=self.trusting_television()))
        self.assertTrue(self.requests(TUNE))

    def trusting_television(self):
        """One that sees the certificate as the system's only authority, in a mount namespace of its own."""
        namespace = ['unshare', '--user', '--map-root-user', '--mount']
        if subprocess.run([*namespace, 'true'], stderr=subprocess.DEVNULL, check=False).returncode != 0:
            self.skipTest('the system has no user namespaces')
        trusted = os.path.join(self.folder, 'trusted')
        os.mkdir(trusted)
        digest = subprocess.run(['openssl', 'x509', '-hash', '-noout', '-in', self.certificate], check=True,
                                capture_output=True, text=True).stdout.strip()
        for name in ('ca-certificates.crt', digest + '.0'):
            with open(self.certificate, 'rb') as source, open(os.path.join(trusted, name), 'wb') as copy:
                copy.write(source.read())
        script = self.write(f"""#!/bin/sh
            exec {' '.join(namespace)} sh -c 'mount --bind "$0" /etc/ssl/certs && exec "$@"' \\
                '{trusted}' '{os.environ['TELIX_TV']}' "$@"
            """, 'trusting')
        os.chmod(script, 0o700)
        television = Television(script)
        self.addCleanup(television.close)
        return television


if __name__ == '__main__':
    unittest.main()
