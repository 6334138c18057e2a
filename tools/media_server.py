#!/usr/bin/env python3
"""Serves folders over HTTP or HTTPS on the loopback interface, as a broadcaster's server does: with byte ranges, and on
request slowly, without ranges or with an error. For ./run.sh, the demonstration and the tests.

The query of a URL controls the response:
  ?rate=BYTES      sends this many bytes a second
  ?trickle=BYTES   after this many bytes of the file, sends two bytes a second, until the server receives SIGUSR1
  ?ranges=no       does not accept byte ranges
  ?status=NUMBER   responds with this status
  ?cut=BYTES       closes the connection after this many bytes of the body
  ?redirect=URL    responds with a redirection to URL
  ?cookie=VALUE    adds a header Set-Cookie with VALUE
  ?require=NAME:TEXT   responds with status 403 unless the request has a header NAME with TEXT in it; may be repeated

In a playlist (.asx), whose clips need absolute URLs, @FOLDER@ stands for the URL of the folder that it is in."""

import argparse
import contextlib
import http.server
import io
import json
import mimetypes
import os
import re
import signal
import ssl
import sys
import threading
import time
import urllib.parse

# These extensions have the same type on every machine, whatever its own list of types says.
CONTENT_TYPES = {
    '.aac': 'audio/aac',
    '.asx': 'video/x-ms-asf',
    '.cehtml': 'application/ce-html+xml',
    '.css': 'text/css',
    '.hbbtv': 'application/vnd.hbbtv.xhtml+xml',
    '.html': 'text/html',
    '.js': 'application/javascript',
    '.json': 'application/json',
    '.m3u8': 'application/vnd.apple.mpegurl',
    '.mp3': 'audio/mpeg',
    '.mp4': 'video/mp4',
    '.png': 'image/png',
    '.svg': 'image/svg+xml',
    '.ts': 'video/mp2t',
    '.wav': 'audio/wav',
    '.xhtml': 'application/vnd.hbbtv.xhtml+xml',
    '.xml': 'application/xml',
}
CHUNK = 64 * 1024
CHUNK_INTERVAL = 0.05  # seconds between two chunks of a response with a rate
TRICKLE_INTERVAL = 0.5  # seconds between two bytes of a trickling response: often enough for the client's timeout
IDLE_TIMEOUT = 60  # seconds after which a connection without a request is closed


class BadRequest(Exception):
    """An invalid request; the message goes to the client."""


def content_type(file):
    extension = os.path.splitext(file)[1].lower()
    return CONTENT_TYPES.get(extension) or mimetypes.guess_type(file)[0] or 'application/octet-stream'


def parse_range(header, size):
    """First and last byte that a Range header requests; None for the whole file; () if the file has no such bytes."""
    # A server may ignore a header with several ranges or of an unknown form, and send the whole file.
    match = re.fullmatch(r'bytes=(\d*)-(\d*)', header.replace(' ', ''))
    if not match or match[0] == 'bytes=-':
        return None
    first, last = match.groups()
    if not first:
        begin, end = max(0, size - int(last)), size - 1
    else:
        begin, end = int(first), min(int(last or size), size - 1)
        if last and int(last) < begin:
            return None
    return (begin, end) if begin <= end else ()


class ResponseOptions:
    """The options in the query of a URL."""

    def __init__(self, query):
        pairs = urllib.parse.parse_qsl(query, keep_blank_values=True)
        values = dict(pairs)
        self.required = [self._requirement(value) for name, value in pairs if name == 'require']
        self.rate = self._number(values, 'rate', 1)
        self.cut = self._number(values, 'cut', 0)
        self.trickle = self._number(values, 'trickle', 0)
        self.status = self._number(values, 'status', 200, 599)
        self.redirect = self._header(values, 'redirect')
        self.cookie = self._header(values, 'cookie')
        ranges = values.get('ranges', 'yes')
        if ranges not in ('yes', 'no'):
            raise BadRequest('ranges: must be yes or no')
        self.ranges = ranges == 'yes'

    def has_required(self, headers):
        return all(text in headers.get(name, '') for name, text in self.required)

    @staticmethod
    def _requirement(value):
        name, _, text = value.partition(':')
        if not name or not text:
            raise BadRequest('require: must be of the form NAME:TEXT')
        return name, text

    @staticmethod
    def _header(values, name):
        value = values.get(name)
        if value is not None and not re.fullmatch(r'[\x20-\x7e]+', value):
            raise BadRequest(f'{name}: must be printable ASCII')
        return value

    @staticmethod
    def _number(values, name, minimum, maximum=None):
        if name not in values:
            return None
        if not re.fullmatch(r'[0-9]{1,12}', values[name]):
            raise BadRequest(f'{name}: must be a number')
        number = int(values[name])
        if number < minimum or (maximum is not None and number > maximum):
            raise BadRequest(f'{name}: out of range')
        return number


class Handler(http.server.BaseHTTPRequestHandler):
    protocol_version = 'HTTP/1.1'
    server_version = 'media_server'
    timeout = IDLE_TIMEOUT

    def do_GET(self):
        self._respond(True)

    def do_HEAD(self):
        self._respond(False)

    def _respond(self, with_body):
        self.server.record(self.command, self.path, self.headers)
        self._cookie = None
        path, _, query = self.path.partition('?')
        try:
            options = ResponseOptions(query)
            file = self.server.find_file(path)
        except BadRequest as error:
            self._refuse(400, str(error), with_body)
            return
        self._cookie = options.cookie
        if not options.has_required(self.headers):
            self._refuse(403, 'a header is missing', with_body)
        elif options.redirect is not None:
            self._redirect(302, options.redirect)
        elif options.status is not None and options.status != 200:
            self._refuse(options.status, 'status as requested', with_body)
        elif file is None:
            self._refuse(404, 'no such file', with_body)
        elif os.path.isdir(file):
            self._redirect(301, path + '/' + ('?' + query if query else ''))
        else:
            try:
                with open(file, 'rb') as source:
                    self._send(self._expanded(source, file, path), file, options, with_body)
            except OSError as error:
                if isinstance(error, (ConnectionError, TimeoutError)):
                    raise
                self._refuse(404, 'cannot read the file', with_body)

    def _expanded(self, source, file, path):
        """What to send: a playlist with the URL of its folder, any other file as it is."""
        if not file.lower().endswith('.asx'):
            return source
        folder = self.server.url + path.rpartition("/")[0]
        return io.BytesIO(source.read().replace(b'@FOLDER@', folder.encode()))

    def _send(self, source, file, options, with_body):
        size = source.seek(0, os.SEEK_END)
        byte_range = None
        # Responses have no validator, so the condition of an If-Range header never holds.
        if options.ranges and 'Range' in self.headers and 'If-Range' not in self.headers:
            byte_range = parse_range(self.headers['Range'], size)
        if byte_range == ():
            self._refuse(416, 'the file has no such bytes', with_body, {'Content-Range': f'bytes */{size}'})
            return
        begin, end = byte_range or (0, size - 1)
        self.send_response(206 if byte_range else 200)
        self.send_header('Content-Type', content_type(file))
        self.send_header('Content-Length', str(end - begin + 1))
        self.send_header('Accept-Ranges', 'bytes' if options.ranges else 'none')
        if byte_range:
            self.send_header('Content-Range', f'bytes {begin}-{end}/{size}')
        self.end_headers()
        if with_body:
            source.seek(begin)
            self._copy(source, end - begin + 1, options)

    def _copy(self, source, length, options):
        limit = length if options.cut is None else min(length, options.cut)
        sent = 0
        # A range that begins after the offset of the trickle is sent at full speed.
        if options.trickle is not None and source.tell() <= options.trickle:
            sent = self._copy_bytes(source, min(limit, options.trickle - source.tell()), options.rate)
            while sent < limit and not self.server.is_released(TRICKLE_INTERVAL) and self._copy_bytes(source, 1, None):
                sent += 1
        sent += self._copy_bytes(source, limit - sent, options.rate)
        if sent < length:
            self.close_connection = True

    def _copy_bytes(self, source, count, rate):
        """Returns how many bytes were sent: fewer if the file has become shorter."""
        due = time.monotonic()
        chunk = CHUNK if rate is None else max(1, int(rate * CHUNK_INTERVAL))
        sent = 0
        while sent < count and (data := source.read(min(chunk, count - sent))):
            self.wfile.write(data)
            sent += len(data)
            if rate is not None:
                due += len(data) / rate
                time.sleep(max(0, due - time.monotonic()))
        return sent

    def end_headers(self):
        if self._cookie is not None:
            self.send_header('Set-Cookie', self._cookie)
        super().end_headers()

    def _redirect(self, status, location):
        self.send_response(status)
        self.send_header('Location', location)
        self.send_header('Content-Length', '0')
        self.end_headers()

    def _refuse(self, status, reason, with_body, headers=None):
        body = f'{reason}\n'.encode() if status not in (204, 304) else b''
        self.send_response(status)
        for name, value in (headers or {}).items():
            self.send_header(name, value)
        if body:
            self.send_header('Content-Type', 'text/plain; charset=utf-8')
            self.send_header('Content-Length', str(len(body)))
        self.end_headers()
        if with_body:
            self.wfile.write(body)

    def log_message(self, *_):
        pass


class Server(http.server.ThreadingHTTPServer):
    daemon_threads = True
    block_on_close = False

    def __init__(self, folders, port, certificate, log):
        self._log = log
        self._log_lock = threading.Lock()
        self._folders = sorted(folders.items(), key=lambda each: len(each[0]), reverse=True)
        self._released = threading.Event()
        super().__init__(('127.0.0.1', port), Handler)
        if certificate:
            context = ssl.SSLContext(ssl.PROTOCOL_TLS_SERVER)
            context.load_cert_chain(certificate)
            # The handshake is left to the thread of the connection.
            self.socket = context.wrap_socket(self.socket, server_side=True, do_handshake_on_connect=False)
        self.url = f'{"https" if certificate else "http"}://127.0.0.1:{self.server_address[1]}'

    def record(self, method, path, headers):
        """Adds a line to the log, before the response is sent."""
        if self._log:
            line = json.dumps({'method': method, 'path': path, 'headers': dict(headers.items())})
            with self._log_lock, open(self._log, 'a', encoding='utf-8') as out:
                out.write(line + '\n')

    def release(self):
        self._released.set()

    def is_released(self, timeout):
        """Waits this many seconds at most."""
        return self._released.wait(timeout)

    def find_file(self, path):
        """The file or folder of a URL's path; None if there is none. A folder with a slash is its index."""
        names = urllib.parse.unquote(path).split('/')
        if any(name in ('.', '..') or '\0' in name for name in names):
            return None
        name = '/'.join(name for name in names if name)
        for prefix, folder in self._folders:
            if prefix and name != prefix and not name.startswith(prefix + '/'):
                continue
            file = os.path.realpath(os.path.join(folder, name[len(prefix):].lstrip('/')))
            # Neither .. nor a symbolic link leads out of the folder.
            if file != folder and not file.startswith(folder.rstrip('/') + '/'):
                return None
            if os.path.isdir(file) and path.endswith('/'):
                file = os.path.join(file, 'index.html')
            elif os.path.isfile(file) and path.endswith('/'):
                return None
            if not os.path.exists(file) or (os.path.isdir(file) and
                                            not os.path.isfile(os.path.join(file, 'index.html'))):
                return None
            return file
        return None

    def handle_error(self, request, client_address):
        # A client that refuses the certificate ends the connection as well.
        if not isinstance(sys.exc_info()[1], (ConnectionError, TimeoutError, ssl.SSLError)):
            super().handle_error(request, client_address)


class MediaServer:
    """A server on a thread of its own. `folders` maps a prefix of the path to a folder; the longest prefix wins.
    Port 0: any free one. `certificate`: a file (PEM) with the certificate and its key, for HTTPS. `log`: a file that
    gets a line of JSON for each request, with its method, path and headers. Raises OSError if the port is not
    available or a file cannot be read."""

    def __init__(self, folders, port=0, certificate=None, log=None):
        self._server = Server({prefix.strip('/'): os.path.realpath(folder) for prefix, folder in folders.items()},
                              port, certificate, log)
        self.url = self._server.url
        self._thread = threading.Thread(target=self._server.serve_forever, args=(0.1,), daemon=True)
        self._thread.start()

    def release(self):
        """Ends the trickling of all responses, now and later."""
        self._server.release()

    def close(self):
        """Accepts no more connections. Responses in progress end with the process at the latest."""
        self._server.shutdown()
        self._thread.join()
        self._server.server_close()

    def __enter__(self):
        return self

    def __exit__(self, *exception):
        self.close()


def read_arguments():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument('folders', nargs='+', metavar='PREFIX=FOLDER',
                        help='serves FOLDER under /PREFIX; an empty PREFIX is the root')
    parser.add_argument('--port', type=int, default=0, help='port to listen on (default: 0, any free one)')
    parser.add_argument('--announce', metavar='FILE', help='writes the base URL to FILE, and removes FILE at the end')
    parser.add_argument('--certificate', metavar='FILE', help='serves HTTPS with the certificate and key in FILE (PEM)')
    parser.add_argument('--log', metavar='FILE', help='appends each request to FILE, as a line of JSON')
    parser.add_argument('--until-parent-ends', action='store_true', help='exits with the process that started it')
    arguments = parser.parse_args()
    if not 0 <= arguments.port <= 65535:
        parser.error(f'--port: {arguments.port}: not a port number')
    folders = {}
    for each in arguments.folders:
        prefix, mark, folder = each.partition('=')
        prefix = prefix.strip('/')
        if not mark:
            parser.error(f'{each}: not of the form PREFIX=FOLDER')
        if not os.path.isdir(folder):
            parser.error(f'{folder}: not a folder')
        if prefix in folders:
            parser.error(f'/{prefix}: given twice')
        folders[prefix] = folder
    arguments.folders = folders
    return parser, arguments


@contextlib.contextmanager
def announced(file, url):
    """A file with the URL, as long as the context lasts. It appears at once with its whole content."""
    if not file:
        yield
        return
    unfinished = f'{file}.{os.getpid()}'
    with open(unfinished, 'w', encoding='utf-8') as out:
        out.write(url + '\n')
    os.replace(unfinished, file)
    try:
        yield
    finally:
        with contextlib.suppress(OSError):
            os.remove(file)


def main():
    parent = os.getppid()
    parser, arguments = read_arguments()
    ended = threading.Event()
    for number in (signal.SIGINT, signal.SIGTERM):
        signal.signal(number, lambda *_: ended.set())
    try:
        with MediaServer(arguments.folders, arguments.port, arguments.certificate,
                         arguments.log) as server, announced(arguments.announce, server.url):
            signal.signal(signal.SIGUSR1, lambda *_: server.release())
            with contextlib.suppress(BrokenPipeError):
                print(server.url, flush=True)
            while not ended.wait(0.2):
                if arguments.until_parent_ends and os.getppid() != parent:
                    break
    except (OSError, OverflowError) as error:
        parser.error(str(error))


if __name__ == '__main__':
    main()
