#!/usr/bin/env python3
"""Serves folders over HTTP on this machine alone, as a broadcaster's server would: with byte ranges, and on request
slow, without ranges or with an error. For ./run.sh, the demonstration and the tests.

What a response is like may be asked for in the address: ?rate=BYTES sends so many bytes a second, ?ranges=no refuses
byte ranges, ?status=NUMBER answers with that status, ?cut=BYTES closes the connection after so many bytes of the body.

In a playlist (.asx), whose clips need whole addresses, @FOLDER@ stands for the address of the folder that it is in."""

import argparse
import contextlib
import http.server
import io
import mimetypes
import os
import re
import signal
import sys
import threading
import time
import urllib.parse

# Only these names decide: the machine's own list of types changes nothing for them.
CONTENT_TYPES = {
    '.aac': 'audio/aac',
    '.asx': 'video/x-ms-asf',
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
PACE = 0.05  # seconds from one piece of a slow response to the next
IDLE_LIMIT = 60  # seconds that a connection may stay open without a request


class BadRequest(Exception):
    """A request that makes no sense; the text goes to the client."""


def content_type(file):
    extension = os.path.splitext(file)[1].lower()
    return CONTENT_TYPES.get(extension) or mimetypes.guess_type(file)[0] or 'application/octet-stream'


def range_of(header, size):
    """First and last byte that a Range header asks for; None for the whole file; () if the file has no such bytes."""
    # A header that is not understood, or with several ranges, may be answered with the whole.
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


class Wishes:
    """How the address wants the response to be."""

    def __init__(self, query):
        values = dict(urllib.parse.parse_qsl(query, keep_blank_values=True))
        self.rate = self._number(values, 'rate', 1)
        self.cut = self._number(values, 'cut', 0)
        self.status = self._number(values, 'status', 200, 599)
        ranges = values.get('ranges', 'yes')
        if ranges not in ('yes', 'no'):
            raise BadRequest('ranges is yes or no')
        self.ranges = ranges == 'yes'

    @staticmethod
    def _number(values, name, least, most=None):
        if name not in values:
            return None
        if not re.fullmatch(r'[0-9]{1,12}', values[name]):
            raise BadRequest(f'{name} is a number')
        number = int(values[name])
        if number < least or (most is not None and number > most):
            raise BadRequest(f'{name} is out of range')
        return number


class Handler(http.server.BaseHTTPRequestHandler):
    protocol_version = 'HTTP/1.1'
    server_version = 'media_server'
    timeout = IDLE_LIMIT

    def do_GET(self):
        self._answer(True)

    def do_HEAD(self):
        self._answer(False)

    def _answer(self, with_body):
        path, _, query = self.path.partition('?')
        try:
            wishes = Wishes(query)
            file = self.server.file_of(path)
        except BadRequest as error:
            self._refuse(400, str(error), with_body)
            return
        if wishes.status is not None and wishes.status != 200:
            self._refuse(wishes.status, 'as asked for', with_body)
        elif file is None:
            self._refuse(404, 'there is no such file', with_body)
        elif os.path.isdir(file):
            self._redirect(path, query)
        else:
            try:
                with open(file, 'rb') as source:
                    self._send(self._filled_in(source, file, path), file, wishes, with_body)
            except OSError as error:
                if isinstance(error, (ConnectionError, TimeoutError)):
                    raise
                self._refuse(404, 'the file cannot be read', with_body)

    def _filled_in(self, source, file, path):
        """What is to be sent: a playlist with the address of its folder."""
        if not file.lower().endswith('.asx'):
            return source
        folder = f'http://127.0.0.1:{self.server.server_address[1]}{path.rpartition("/")[0]}'
        return io.BytesIO(source.read().replace(b'@FOLDER@', folder.encode()))

    def _send(self, source, file, wishes, with_body):
        size = source.seek(0, os.SEEK_END)
        asked = None
        # No response names its version, so a condition on one never holds.
        if wishes.ranges and 'Range' in self.headers and 'If-Range' not in self.headers:
            asked = range_of(self.headers['Range'], size)
        if asked == ():
            self._refuse(416, 'the file has no such bytes', with_body, {'Content-Range': f'bytes */{size}'})
            return
        begin, end = asked or (0, size - 1)
        self.send_response(206 if asked else 200)
        self.send_header('Content-Type', content_type(file))
        self.send_header('Content-Length', str(end - begin + 1))
        self.send_header('Accept-Ranges', 'bytes' if wishes.ranges else 'none')
        if asked:
            self.send_header('Content-Range', f'bytes {begin}-{end}/{size}')
        self.end_headers()
        if with_body:
            source.seek(begin)
            self._copy(source, end - begin + 1, wishes)

    def _copy(self, source, length, wishes):
        due = time.monotonic()
        chunk = CHUNK if wishes.rate is None else max(1, int(wishes.rate * PACE))
        limit = length if wishes.cut is None else min(length, wishes.cut)
        sent = 0
        while sent < limit:
            data = source.read(min(chunk, limit - sent))
            if not data:
                break  # the file has become shorter
            self.wfile.write(data)
            sent += len(data)
            if wishes.rate is not None:
                due += len(data) / wishes.rate
                time.sleep(max(0, due - time.monotonic()))
        if sent < length:
            self.close_connection = True

    def _redirect(self, path, query):
        self.send_response(301)
        self.send_header('Location', path + '/' + ('?' + query if query else ''))
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

    def __init__(self, folders, port):
        self._folders = sorted(folders.items(), key=lambda each: len(each[0]), reverse=True)
        super().__init__(('127.0.0.1', port), Handler)

    def file_of(self, path):
        """The file or folder behind the path of an address, None if there is none; the index of a folder for itself."""
        names = urllib.parse.unquote(path).split('/')
        if any(name in ('.', '..') or '\0' in name for name in names):
            return None
        asked = '/'.join(name for name in names if name)
        for prefix, folder in self._folders:
            if prefix and asked != prefix and not asked.startswith(prefix + '/'):
                continue
            file = os.path.realpath(os.path.join(folder, asked[len(prefix):].lstrip('/')))
            # A link does not lead out of the folder either.
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
        if not isinstance(sys.exc_info()[1], (ConnectionError, TimeoutError)):
            super().handle_error(request, client_address)


class MediaServer:
    """A server on a thread of its own. `folders` is folder by prefix of the path; the longest prefix that fits is
    taken. Port 0: any free one. OSError if the port cannot be had."""

    def __init__(self, folders, port=0):
        self._server = Server({prefix.strip('/'): os.path.realpath(folder) for prefix, folder in folders.items()},
                              port)
        self.address = f'http://127.0.0.1:{self._server.server_address[1]}'
        self._thread = threading.Thread(target=self._server.serve_forever, args=(0.1,), daemon=True)
        self._thread.start()

    def close(self):
        """Takes no more connections. Responses under way end with the process at the latest."""
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
    parser.add_argument('--port', type=int, default=0, help='port to listen at; 0, which is the default: a free one')
    parser.add_argument('--announce', metavar='FILE', help='writes the base address to FILE, and removes FILE at the end')
    parser.add_argument('--until-parent-ends', action='store_true', help='ends with the process that started it')
    arguments = parser.parse_args()
    if not 0 <= arguments.port <= 65535:
        parser.error(f'{arguments.port} is no port')
    folders = {}
    for each in arguments.folders:
        prefix, mark, folder = each.partition('=')
        prefix = prefix.strip('/')
        if not mark:
            parser.error(f"'{each}' is not PREFIX=FOLDER")
        if not os.path.isdir(folder):
            parser.error(f"'{folder}' is no folder")
        if prefix in folders:
            parser.error(f"'/{prefix}' is given twice")
        folders[prefix] = folder
    arguments.folders = folders
    return parser, arguments


@contextlib.contextmanager
def announced(file, address):
    """Names the address in a file as long as the context lasts. Who sees the file finds all of the address in it."""
    if not file:
        yield
        return
    unfinished = f'{file}.{os.getpid()}'
    with open(unfinished, 'w', encoding='utf-8') as out:
        out.write(address + '\n')
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
        with MediaServer(arguments.folders, arguments.port) as server, announced(arguments.announce, server.address):
            with contextlib.suppress(BrokenPipeError):
                print(server.address, flush=True)
            while not ended.wait(0.2):
                if arguments.until_parent_ends and os.getppid() != parent:
                    break
    except (OSError, OverflowError) as error:
        parser.error(str(error))


if __name__ == '__main__':
    main()
