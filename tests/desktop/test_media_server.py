#!/usr/bin/env python3
"""Tests of the media server: as a module and as a command."""

import http.client
import json
import os
import signal
import socket
import ssl
import subprocess
import sys
import tempfile
import threading
import time
import unittest
import unittest.mock

PROGRAM = os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', '..', 'tools', 'media_server.py')
TIMEOUT = 60  # seconds after which a test gives up

sys.dont_write_bytecode = True
sys.path.insert(0, os.path.dirname(PROGRAM))
import media_server

CONTENT = bytes(range(256)) * 40
TYPES = {'clip.mp4': 'video/mp4', 'tune.mp3': 'audio/mpeg', 'tune.aac': 'audio/aac', 'tune.wav': 'audio/wav',
         'list.m3u8': 'application/vnd.apple.mpegurl', 'part.ts': 'video/mp2t', 'list.asx': 'video/x-ms-asf',
         'page.html': 'text/html', 'page.xhtml': 'application/vnd.hbbtv.xhtml+xml',
         'page.hbbtv': 'application/vnd.hbbtv.xhtml+xml', 'page.cehtml': 'application/ce-html+xml',
         'unheard.of': 'application/octet-stream'}


def wait_until(condition):
    end = time.monotonic() + TIMEOUT
    while not condition():
        if time.monotonic() > end:
            raise AssertionError('timeout')
        time.sleep(0.01)


def handler_threads():
    return [thread for thread in threading.enumerate() if 'process_request_thread' in thread.name]


class Clock:
    """In the place of the module `time`: sleeping takes no time and counts."""

    def __init__(self):
        self.now = 1000.0

    def monotonic(self):
        return self.now

    def sleep(self, seconds):
        self.now += seconds


class Folder(unittest.TestCase):
    def setUp(self):
        self._folder = tempfile.TemporaryDirectory()
        self.addCleanup(self._folder.cleanup)
        self.root = os.path.join(self._folder.name, 'root')
        self.media = os.path.join(self._folder.name, 'media')
        for folder in (self.root, self.media, os.path.join(self.root, 'app')):
            os.mkdir(folder)
        for name in TYPES:
            with open(os.path.join(self.media, name), 'wb') as out:
                out.write(CONTENT)
        for name in ('secret', 'root/app/index.html'):
            with open(os.path.join(self._folder.name, name), 'w', encoding='utf-8') as out:
                out.write(name)
        os.symlink(os.path.join(self._folder.name, 'secret'), os.path.join(self.media, 'link'))


class Responses(Folder):
    def setUp(self):
        super().setUp()
        self.server = media_server.MediaServer({'/': self.root, 'media': self.media})
        self.addCleanup(self.server.close)
        self.connection = http.client.HTTPConnection(self.server.url.split('//')[1], timeout=TIMEOUT)
        self.addCleanup(self.connection.close)

    def get(self, path, method='GET', **headers):
        """Status, headers and body."""
        self.connection.request(method, path, headers={name.replace('_', '-'): value
                                                       for name, value in headers.items()})
        response = self.connection.getresponse()
        return response.status, response.headers, response.read()

    def test_serves_files_with_their_types(self):
        for name, kind in TYPES.items():
            status, headers, body = self.get('/media/' + name)
            self.assertEqual((status, headers['Content-Type'], body), (200, kind, CONTENT), name)
            self.assertEqual(headers['Accept-Ranges'], 'bytes')

    def test_answers_for_the_head_alone(self):
        status, headers, body = self.get('/media/clip.mp4', 'HEAD')
        self.assertEqual((status, headers['Content-Length'], body), (200, str(len(CONTENT)), b''))
        self.assertEqual(self.get('/media/nothing', 'HEAD')[0], 404)

    def test_gives_the_bytes_that_are_asked_for(self):
        size = len(CONTENT)
        for asked, begin, end in (('0-0', 0, 0), ('5-9', 5, 9), ('100-', 100, size - 1), ('-7', size - 7, size - 1),
                                  (f'9-{size * 2}', 9, size - 1), (f'-{size * 2}', 0, size - 1)):
            status, headers, body = self.get('/media/clip.mp4', Range=f'bytes={asked}')
            self.assertEqual((status, headers['Content-Range']), (206, f'bytes {begin}-{end}/{size}'), asked)
            self.assertEqual(body, CONTENT[begin:end + 1], asked)

    def test_refuses_bytes_that_are_not_there(self):
        for asked in (f'{len(CONTENT)}-', '-0'):
            status, headers, _ = self.get('/media/clip.mp4', Range=f'bytes={asked}')
            self.assertEqual((status, headers['Content-Range']), (416, f'bytes */{len(CONTENT)}'), asked)

    def test_gives_the_whole_where_a_range_means_nothing(self):
        for asked in ('bytes=9-5', 'bytes=-', 'bytes=a-b', 'bytes=1-2,4-5', 'lines=1-2', 'bytes'):
            self.assertEqual(self.get('/media/clip.mp4', Range=asked)[0], 200, asked)
        self.assertEqual(self.get('/media/clip.mp4', Range='bytes=1-2', If_Range='"x"')[0], 200)

    def test_does_as_the_address_wants(self):
        status, headers, body = self.get('/media/clip.mp4?ranges=no', Range='bytes=1-2')
        self.assertEqual((status, headers['Accept-Ranges'], body), (200, 'none', CONTENT))
        self.assertEqual(self.get('/media/clip.mp4?status=503')[0], 503)
        clock = Clock()
        with unittest.mock.patch.object(media_server, 'time', clock):
            self.assertEqual(self.get(f'/media/clip.mp4?rate={len(CONTENT) * 2}')[2], CONTENT)
        self.assertAlmostEqual(clock.now, 1000.5, places=3)
        with self.assertRaises(http.client.IncompleteRead):
            self.get('/media/clip.mp4?cut=100')
        self.connection.close()
        for query in ('rate=0', 'rate=fast', 'ranges=maybe', 'status=99', 'status=', 'cut=-1', 'trickle=x'):
            self.assertEqual(self.get('/media/clip.mp4?' + query)[0], 400, query)

    def test_redirects_and_sets_cookies(self):
        status, headers, body = self.get('/media/clip.mp4?redirect=http://x/y%3Fz')
        self.assertEqual((status, headers['Location'], body), (302, 'http://x/y?z', b''))
        status, headers, body = self.get('/media/clip.mp4?cookie=a%3Db')
        self.assertEqual((status, headers['Set-Cookie'], body), (200, 'a=b', CONTENT))
        self.assertIsNone(self.get('/media/clip.mp4')[1]['Set-Cookie'])
        for query in ('redirect=', 'cookie=a%0d%0ab'):
            self.assertEqual(self.get('/media/clip.mp4?' + query)[0], 400, query)

    def test_requires_headers(self):
        path = '/media/clip.mp4?require=Referer:http://x/&require=Cookie:a%3Db'
        self.assertEqual(self.get(path)[0], 403)
        self.assertEqual(self.get(path, Referer='http://x/')[0], 403)
        self.assertEqual(self.get(path, Referer='http://x/y', Cookie='c=d; a=b')[2], CONTENT)
        for query in ('require=', 'require=Cookie', 'require=:a'):
            self.assertEqual(self.get('/media/clip.mp4?' + query)[0], 400, query)

    def test_records_requests(self):
        log = os.path.join(self._folder.name, 'log')
        with media_server.MediaServer({'media': self.media}, log=log) as server:
            connection = http.client.HTTPConnection(server.url.split('//')[1], timeout=TIMEOUT)
            connection.request('GET', '/media/clip.mp4?x', headers={'Range': 'bytes=1-2'})
            connection.getresponse().read()
            connection.close()
        with open(log, encoding='utf-8') as lines:
            records = [json.loads(line) for line in lines]
        self.assertEqual([(each['method'], each['path'], each['headers']['Range']) for each in records],
                         [('GET', '/media/clip.mp4?x', 'bytes=1-2')])

    def test_trickles_until_it_is_released(self):
        self.connection.request('GET', '/media/clip.mp4?trickle=5000')
        response = self.connection.getresponse()
        body = response.read(5002)  # so some bytes follow one by one
        self.server.release()
        self.assertEqual(body + response.read(), CONTENT)
        self.assertEqual(self.get('/media/clip.mp4?trickle=0')[2], CONTENT)  # released for good

    def test_does_not_trickle_a_range_after_the_offset(self):
        with unittest.mock.patch.object(media_server.Server, 'is_released', side_effect=AssertionError):
            self.assertEqual(self.get('/media/clip.mp4?trickle=5000', Range='bytes=5001-')[2], CONTENT[5001:])

    def test_takes_the_longest_prefix_and_the_index_of_a_folder(self):
        self.assertEqual(self.get('/app/')[2], b'root/app/index.html')
        status, headers, _ = self.get('/app?x=1')
        self.assertEqual((status, headers['Location']), (301, '/app/?x=1'))
        for path in ('/media', '/media/', '/', '/mediaclip.mp4', '/media/clip.mp4/'):
            self.assertEqual(self.get(path)[0], 404, path)

    def test_stays_in_its_folders(self):
        for path in ('/media/../secret', '/../secret', '/media/%2e%2e/secret', '/media/..%2fsecret', '/media/link',
                     '/media/%00', '//secret'):
            self.assertEqual(self.get(path)[0], 404, path)

    def test_makes_no_noise_when_a_client_leaves(self):
        errors = sys.stderr
        with tempfile.TemporaryFile('w+') as heard:
            sys.stderr = heard
            try:
                host, port = self.server.url.split('//')[1].split(':')
                for _ in range(3):
                    with socket.create_connection((host, int(port)), timeout=TIMEOUT) as client:
                        client.sendall(b'GET /media/clip.mp4?rate=2000 HTTP/1.1\r\nHost: x\r\n\r\n')
                        client.recv(100)
                        # Reset, not closed: the server's next write fails.
                        client.setsockopt(socket.SOL_SOCKET, socket.SO_LINGER, b'\1\0\0\0\0\0\0\0')
                wait_until(lambda: not handler_threads())
                self.assertEqual(self.get('/media/clip.mp4')[0], 200)
            finally:
                sys.stderr = errors
            heard.seek(0)
            self.assertEqual(heard.read(), '')


class Secure(Folder):
    def test_serves_https_with_a_certificate(self):
        certificate = os.path.join(self._folder.name, 'certificate.pem')
        subprocess.run(['openssl', 'req', '-x509', '-newkey', 'rsa:2048', '-nodes', '-subj', '/CN=127.0.0.1', '-addext',
                        'subjectAltName=IP:127.0.0.1', '-keyout', certificate, '-out', certificate + '.public'],
                       check=True, capture_output=True, timeout=TIMEOUT)
        with open(certificate + '.public', encoding='utf-8') as source, open(certificate, 'a', encoding='utf-8') as out:
            out.write(source.read())
        with media_server.MediaServer({'media': self.media}, certificate=certificate) as server:
            self.assertRegex(server.url, '^https://')
            for trusted, expected in ((certificate + '.public', CONTENT), (None, None)):
                connection = http.client.HTTPSConnection(server.url.split('//')[1], timeout=TIMEOUT,
                                                         context=ssl.create_default_context(cafile=trusted))
                if expected is None:
                    self.assertRaises(ssl.SSLError, connection.request, 'GET', '/media/clip.mp4')
                else:
                    connection.request('GET', '/media/clip.mp4')
                    self.assertEqual(connection.getresponse().read(), expected)
                connection.close()


class Command(Folder):
    def start(self, *arguments, **options):
        process = subprocess.Popen([sys.executable, '-B', PROGRAM, *arguments], stdout=subprocess.PIPE,
                                   stderr=subprocess.PIPE, text=True, **options)
        self.addCleanup(process.stderr.close)
        self.addCleanup(process.stdout.close)
        self.addCleanup(process.wait)
        self.addCleanup(process.kill)
        return process

    def test_names_its_address_and_ends_when_it_is_told(self):
        announced = os.path.join(self.root, 'url')
        for number in (signal.SIGTERM, signal.SIGINT):
            process = self.start('--announce', announced, f'media={self.media}')
            url = process.stdout.readline().strip()
            self.assertRegex(url, r'^http://127\.0\.0\.1:[0-9]+$')
            with open(announced, encoding='utf-8') as file:
                self.assertEqual(file.read().strip(), url)
            connection = http.client.HTTPConnection(url.split('//')[1], timeout=TIMEOUT)
            connection.request('GET', '/media/clip.mp4')
            self.assertEqual(connection.getresponse().read(), CONTENT)
            connection.request('GET', '/media/clip.mp4?trickle=100')
            response = connection.getresponse()
            body = response.read(101)
            process.send_signal(signal.SIGUSR1)
            self.assertEqual(body + response.read(), CONTENT)
            connection.close()
            process.send_signal(number)
            self.assertEqual(process.wait(TIMEOUT), 0)
            self.assertEqual(process.stderr.read(), '')
            self.assertFalse(os.path.exists(announced))

    def test_ends_with_its_parent(self):
        script = '"$@" & echo $!; read line'
        with subprocess.Popen(['sh', '-c', script, 'sh', sys.executable, '-B', PROGRAM, '--until-parent-ends',
                               f'={self.media}'], stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True) as parent:
            lines = [parent.stdout.readline(), parent.stdout.readline()]
            address = next(line for line in lines if line.startswith('http')).strip().split('//')[1]
            host, port = address.split(':')
            socket.create_connection((host, int(port)), timeout=TIMEOUT).close()
            parent.stdin.close()
            # The pipe ends with the last process that holds it.
            self.assertEqual(parent.stdout.read(), '')
        with self.assertRaises(OSError):
            socket.create_connection((host, int(port)), timeout=TIMEOUT).close()

    def test_refuses_arguments_that_make_no_sense(self):
        with socket.socket() as taken:
            taken.bind(('127.0.0.1', 0))
            taken.listen()
            for arguments in ((), ('x',), ('a=/nowhere',), (f'a={self.media}', f'/a/={self.media}'),
                              ('--port', '70000', f'a={self.media}'), ('--port', 'x', f'a={self.media}'),
                              ('--port', str(taken.getsockname()[1]), f'a={self.media}'),
                              ('--announce', '/nowhere/x', f'a={self.media}'),
                              ('--certificate', '/nowhere/x', f'a={self.media}'), ('--unheard-of', f'a={self.media}')):
                process = self.start(*arguments)
                self.assertEqual(process.wait(TIMEOUT), 2, arguments)
                self.assertNotEqual(process.stderr.read(), '', arguments)


if __name__ == '__main__':
    unittest.main()
