"""A virtual display and telix-tv on it, for the tests."""

import contextlib
import ctypes
import json
import os
import shutil
import signal
import struct
import subprocess
import tempfile
import time
import zlib

# Seconds that a run of telix-tv, and a whole test program, may last before they are taken for hung. CTest's own limit
# is longer: it would leave display and browser behind.
RUN_LIMIT = 120
PROGRAM_LIMIT = 270

# The display as its user has it: the mouse, and what is on the screen. The library comes with Qt.
X11 = ctypes.CDLL('libX11.so.6')
X11.XOpenDisplay.restype = ctypes.c_void_p
X11.XDefaultRootWindow.restype = ctypes.c_ulong
X11.XDefaultRootWindow.argtypes = X11.XCloseDisplay.argtypes = X11.XDestroyImage.argtypes = [ctypes.c_void_p]
X11.XSync.argtypes = [ctypes.c_void_p, ctypes.c_int]
X11.XWarpPointer.argtypes = [ctypes.c_void_p, ctypes.c_ulong, ctypes.c_ulong] + 2 * [ctypes.c_int] + \
    2 * [ctypes.c_uint] + 2 * [ctypes.c_int]
X11.XGetImage.argtypes = [ctypes.c_void_p, ctypes.c_ulong] + 2 * [ctypes.c_int] + 2 * [ctypes.c_uint] + \
    [ctypes.c_ulong, ctypes.c_int]
X11.XGetImage.restype = ctypes.c_void_p
ZPIXMAP = 2


class XImage(ctypes.Structure):  # pylint: disable=too-few-public-methods
    """The beginning of Xlib's record."""
    _fields_ = [*((name, ctypes.c_int) for name in ('width', 'height', 'xoffset', 'format')),
                ('data', ctypes.c_void_p),
                *((name, ctypes.c_int) for name in ('byte_order', 'bitmap_unit', 'bitmap_bit_order', 'bitmap_pad',
                                                    'depth', 'bytes_per_line', 'bits_per_pixel'))]


class Screen:
    """What a display shows at one moment, with the interface of Picture."""

    def __init__(self, display, width, height):
        address = X11.XGetImage(display, X11.XDefaultRootWindow(display), 0, 0, width, height, ctypes.c_ulong(-1),
                                ZPIXMAP)
        image = XImage.from_address(address)
        self.width, self.height, self._length = width, height, image.bytes_per_line
        self._step = image.bits_per_pixel // 8
        self._data = ctypes.string_at(image.data, image.bytes_per_line * height)
        X11.XDestroyImage(address)

    def colour(self, x, y):
        start = y * self._length + x * self._step
        blue, green, red = self._data[start:start + 3]
        return red, green, blue


def give_up(*_):
    raise TimeoutError(f'not done within {PROGRAM_LIMIT} s')


signal.signal(signal.SIGALRM, give_up)
signal.alarm(PROGRAM_LIMIT)


class Television:
    """A virtual display. Several may exist at a time, in one process or in many: each asks the X server for a free
    number."""

    def __init__(self, browser, width=1920, height=1080):
        self._browser = browser
        self._connection = None
        self._size = width, height
        self._folder = tempfile.mkdtemp(prefix='telix-tv-test-')
        receiver, sender = os.pipe()
        self._server = subprocess.Popen(
            ['Xvfb', '-displayfd', str(sender), '-screen', '0', f'{width}x{height}x24', '-nolisten', 'tcp'],
            pass_fds=[sender], stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        os.close(sender)
        with os.fdopen(receiver) as answer:
            number = answer.readline().strip()
        if not number:
            self.close()
            raise RuntimeError('Xvfb did not start')
        # A developer's own settings of Qt, of the engine and of the plug-in change nothing.
        self.environment = {name: value for name, value in os.environ.items()
                            if not name.startswith(('QT', 'PLUGIN_')) and name != 'LOG_MODULE'}
        self.environment.update(DISPLAY=f':{number}', XDG_RUNTIME_DIR=self._folder, TMPDIR=self._folder,
                                LC_ALL='C.UTF-8')

    def close(self):
        if self._connection:
            X11.XCloseDisplay(self._connection)
        self._server.terminate()
        self._server.wait()
        shutil.rmtree(self._folder)

    def __enter__(self):
        return self

    def __exit__(self, *exception):
        self.close()

    def leftovers(self):
        """What runs of telix-tv have left in the folder for temporary files."""
        return os.listdir(self._folder)

    def telixctl(self, *arguments):
        """What telixctl answers to a command that the running television does."""
        run = subprocess.run([os.environ['TELIXCTL'], '--json', *map(str, arguments)], env=self.environment,
                             stdin=subprocess.DEVNULL, capture_output=True, text=True, timeout=RUN_LIMIT, check=False)
        if run.returncode != 0:
            raise AssertionError(f'{arguments}: {run.stderr}')
        return json.loads(run.stdout)

    def point_at(self, x, y):
        """Moves the mouse."""
        display = self._display()
        X11.XWarpPointer(display, 0, X11.XDefaultRootWindow(display), 0, 0, 0, 0, x, y)
        X11.XSync(display, 0)

    def shows(self, place, colour):
        """Whether the screen has that colour there now or within ten seconds."""
        end = time.monotonic() + 10
        while self.screen().colour(*place) != colour:
            if time.monotonic() > end:
                return False
            time.sleep(0.02)
        return True

    def screen(self):
        """What is on the screen now."""
        return Screen(self._display(), *self._size)

    def _display(self):
        if not self._connection:
            self._connection = X11.XOpenDisplay(self.environment['DISPLAY'].encode())
        return self._connection

    def start(self, *arguments, environment=None):
        return subprocess.Popen([self._browser, *map(str, arguments)],
                                env={**self.environment, **(environment or {})},
                                stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True)

    def run(self, *arguments, environment=None):
        """Runs telix-tv to its end."""
        with self.start(*arguments, environment=environment) as process:
            try:
                output, errors = process.communicate(timeout=RUN_LIMIT)
            except subprocess.TimeoutExpired:
                process.kill()
                output, errors = process.communicate()
                raise RuntimeError(f'telix-tv did not end within {RUN_LIMIT} s\n{output}{errors}') from None
        return Run(process.returncode, output, errors)


class Run:
    """How a run of telix-tv ended."""

    def __init__(self, status, output, errors):
        self.status = status
        self.output = output
        self.errors = errors

    @property
    def value(self):
        """The value of --eval: the last line on standard output."""
        return json.loads(self.output.rstrip('\n').split('\n')[-1])

    def __str__(self):
        how = f'signal {signal.Signals(-self.status).name}' if self.status < 0 else f'status {self.status}'
        return f'telix-tv ended with {how}\n--- standard output\n{self.output}--- standard error\n{self.errors}'


class Picture:
    """A PNG file as telix-tv writes it: eight bits a channel, red, green, blue and perhaps alpha, not interlaced."""

    def __init__(self, file_name):
        with open(file_name, 'rb') as file:
            content = file.read()
        data = b''
        position = 8
        while position < len(content):
            length, kind = struct.unpack_from('>I4s', content, position)
            chunk = content[position + 8:position + 8 + length]
            position += 12 + length
            if kind == b'IHDR':
                self.width, self.height, depth, colour_type, _, _, interlaced = struct.unpack('>IIBBBBB', chunk)
                if depth != 8 or colour_type not in (2, 6) or interlaced:
                    raise ValueError(f'{file_name} has an unexpected format')
                self._channels = 3 if colour_type == 2 else 4
            elif kind == b'IDAT':
                data += chunk
        self._rows = self._unfilter(zlib.decompress(data))

    def _unfilter(self, data):
        step, length = self._channels, self._channels * self.width
        rows, above = [], bytearray(length)
        for start in range(0, len(data), length + 1):
            kind, row = data[start], bytearray(data[start + 1:start + 1 + length])
            if kind:
                for i in range(length):
                    left = row[i - step] if i >= step else 0
                    corner = above[i - step] if i >= step else 0
                    row[i] = (row[i] + self._prediction(kind, left, above[i], corner)) & 255
            rows.append(row)
            above = row
        return rows

    @staticmethod
    def _prediction(kind, left, up, corner):
        if kind == 1:
            return left
        if kind == 2:
            return up
        if kind == 3:
            return (left + up) // 2
        estimate = left + up - corner
        return min((left, up, corner), key=lambda value: abs(estimate - value))

    def colour(self, x, y):
        start = x * self._channels
        return tuple(self._rows[y][start:start + 3])

    def colours(self):
        step = self._channels
        return {bytes(row[i:i + 3]) for row in self._rows for i in range(0, len(row), step)}


@contextlib.contextmanager
def temporary_folder():
    folder = tempfile.mkdtemp(prefix='telix-tv-test-')
    try:
        yield folder
    finally:
        shutil.rmtree(folder)
