"""A virtual X display with telix-tv, for the tests."""

import contextlib
import ctypes
import json
import os
import shutil
import signal
import subprocess
import sys
import tempfile
import threading
import time

# Timeouts in seconds. They only bound a hang, so they are long enough for a busy machine: for a condition, for
# telix-tv's automation, for a run of telix-tv, and for a test program. CTest's own timeout is longer than the last,
# because it would leave the X server and the browser running.
WAIT_TIMEOUT = 60
AUTOMATION_TIMEOUT = 240
RUN_TIMEOUT = 300
PROGRAM_TIMEOUT = 840
POLL_INTERVAL = 0.05

# For the mouse pointer, the keyboard, the contents of the screen and screenshots. The libraries are installed with Qt and
# GTK.
X11 = ctypes.CDLL('libX11.so.6')
XTEST = ctypes.CDLL('libXtst.so.6')
X11.XOpenDisplay.restype = ctypes.c_void_p
X11.XDefaultRootWindow.restype = ctypes.c_ulong
X11.XDefaultRootWindow.argtypes = X11.XCloseDisplay.argtypes = X11.XDestroyImage.argtypes = [ctypes.c_void_p]
X11.XSync.argtypes = [ctypes.c_void_p, ctypes.c_int]
X11.XWarpPointer.argtypes = [ctypes.c_void_p, ctypes.c_ulong, ctypes.c_ulong] + 2 * [ctypes.c_int] + \
    2 * [ctypes.c_uint] + 2 * [ctypes.c_int]
X11.XGetImage.argtypes = [ctypes.c_void_p, ctypes.c_ulong] + 2 * [ctypes.c_int] + 2 * [ctypes.c_uint] + \
    [ctypes.c_ulong, ctypes.c_int]
X11.XGetImage.restype = ctypes.c_void_p
X11.XStringToKeysym.restype = ctypes.c_ulong
X11.XStringToKeysym.argtypes = [ctypes.c_char_p]
X11.XKeysymToKeycode.restype = ctypes.c_ubyte
X11.XKeysymToKeycode.argtypes = [ctypes.c_void_p, ctypes.c_ulong]
XTEST.XTestFakeKeyEvent.argtypes = [ctypes.c_void_p, ctypes.c_uint, ctypes.c_int, ctypes.c_ulong]
ZPIXMAP = 2
CAIRO = ctypes.CDLL('libcairo.so.2')
CAIRO.cairo_image_surface_create_from_png.restype = ctypes.c_void_p
CAIRO.cairo_image_surface_get_data.restype = ctypes.c_void_p
CAIRO.cairo_status_to_string.restype = ctypes.c_char_p
for function in ('cairo_surface_status', 'cairo_surface_destroy', 'cairo_image_surface_get_data',
                 'cairo_image_surface_get_width', 'cairo_image_surface_get_height', 'cairo_image_surface_get_stride'):
    getattr(CAIRO, function).argtypes = [ctypes.c_void_p]


class XImage(ctypes.Structure):  # pylint: disable=too-few-public-methods
    """The first members of Xlib's structure."""
    _fields_ = [*((name, ctypes.c_int) for name in ('width', 'height', 'xoffset', 'format')),
                ('data', ctypes.c_void_p),
                *((name, ctypes.c_int) for name in ('byte_order', 'bitmap_unit', 'bitmap_bit_order', 'bitmap_pad',
                                                    'depth', 'bytes_per_line', 'bits_per_pixel'))]


class Picture:
    """Pixels of 32 bits, as X servers and cairo have them: blue, green, red, and what is no part of the colour."""

    def __init__(self, width, height, row_length, data):
        self.width, self.height = width, height
        self._row_length, self._data = row_length, data

    def colour(self, x, y):
        start = y * self._row_length + 4 * x
        blue, green, red = self._data[start:start + 3]
        return red, green, blue

    def colours(self):
        """The colours of all pixels, each as three bytes."""
        pixels = set()
        for start in range(0, self.height * self._row_length, self._row_length):
            pixels.update(memoryview(self._data)[start:start + 4 * self.width].cast('I'))
        return {pixel.to_bytes(4, sys.byteorder)[2::-1] for pixel in pixels}


class Screen(Picture):
    """The contents of a part of a display at one moment."""

    def __init__(self, display, width, height, left=0, top=0):
        pointer = X11.XGetImage(display, X11.XDefaultRootWindow(display), left, top, width, height, ctypes.c_ulong(-1),
                                ZPIXMAP)
        image = XImage.from_address(pointer)
        super().__init__(width, height, image.bytes_per_line,
                         ctypes.string_at(image.data, image.bytes_per_line * height))
        X11.XDestroyImage(pointer)


class PngImage(Picture):
    """A PNG file without transparency."""

    def __init__(self, file_name):
        surface = CAIRO.cairo_image_surface_create_from_png(os.fsencode(file_name))
        status = CAIRO.cairo_surface_status(surface)
        if status != 0:
            raise ValueError(f'{file_name}: {CAIRO.cairo_status_to_string(status).decode()}')
        height, row_length = CAIRO.cairo_image_surface_get_height(surface), CAIRO.cairo_image_surface_get_stride(surface)
        super().__init__(CAIRO.cairo_image_surface_get_width(surface), height, row_length,
                         ctypes.string_at(CAIRO.cairo_image_surface_get_data(surface), row_length * height))
        CAIRO.cairo_surface_destroy(surface)


def on_program_timeout(*_):
    raise TimeoutError(f'the test program did not end within {PROGRAM_TIMEOUT} s')


signal.signal(signal.SIGALRM, on_program_timeout)
signal.alarm(PROGRAM_TIMEOUT)


def wait_for(condition, message):
    """Polls until condition() is true and returns its value. `message` is the failure, or a function that returns it."""
    end = time.monotonic() + WAIT_TIMEOUT
    while True:
        value = condition()
        if value:
            return value
        if time.monotonic() > end:
            raise AssertionError(message() if callable(message) else message)
        time.sleep(POLL_INTERVAL)


class Lines:
    """The lines of a stream, read on a thread."""

    def __init__(self, stream):
        self.lines = []
        self._changed = threading.Condition()
        self._thread = threading.Thread(target=self._read, args=[stream], daemon=True)
        self._thread.start()

    def _read(self, stream):
        for line in stream:
            with self._changed:
                self.lines.append(line.rstrip('\n'))
                self._changed.notify_all()

    def wait_for(self, ending, timeout=WAIT_TIMEOUT):
        """Whether there is a line with this ending, waiting for it up to `timeout` seconds."""
        with self._changed:
            return self._changed.wait_for(lambda: any(line.endswith(ending) for line in self.lines), timeout)

    def until_end(self):
        """All lines, waiting for the end of the stream."""
        self._thread.join(WAIT_TIMEOUT)
        return self.lines


class Television:
    """A virtual X display. Several may exist at a time, in one process or in many: the X server chooses a free display
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
        # A developer's settings of Qt, the engine and the plug-in must not affect the tests.
        self.environment = {name: value for name, value in os.environ.items()
                            if not name.startswith(('QT', 'PLUGIN_')) and name != 'LOG_MODULE'}
        self.environment.update(DISPLAY=f':{number}', XDG_RUNTIME_DIR=self._folder, TMPDIR=self._folder,
                                LC_ALL='C.UTF-8')

    def close(self):
        if self._connection:
            X11.XCloseDisplay(self._connection)
        self._server.terminate()
        self._server.wait()
        shutil.rmtree(self._folder, ignore_errors=True)  # a television that ends meanwhile removes its socket

    def __enter__(self):
        return self

    def __exit__(self, *exception):
        self.close()

    def leftovers(self):
        """The files that telix-tv has not removed from the folder for temporary files."""
        return os.listdir(self._folder)

    def telixctl(self, *arguments):
        """Runs a telixctl command on the running television; returns its JSON output."""
        run = subprocess.run([os.environ['TELIXCTL'], '--json', *map(str, arguments)], env=self.environment,
                             stdin=subprocess.DEVNULL, capture_output=True, text=True, timeout=RUN_TIMEOUT, check=False)
        if run.returncode != 0:
            raise AssertionError(f'{arguments}: {run.stderr}')
        return json.loads(run.stdout)

    def move_pointer(self, x, y):
        """Moves the mouse pointer."""
        display = self._display()
        X11.XWarpPointer(display, 0, X11.XDefaultRootWindow(display), 0, 0, 0, 0, x, y)
        X11.XSync(display, 0)

    def press_key(self, name):
        """Presses and releases a key of the keyboard, by the name of its X keysym."""
        display = self._display()
        code = X11.XKeysymToKeycode(display, X11.XStringToKeysym(name.encode()))
        for is_press in (True, False):
            XTEST.XTestFakeKeyEvent(display, code, is_press, 0)
        X11.XSync(display, 0)

    def colour(self, x, y):
        """The colour of the screen at a point now."""
        return Screen(self._display(), 1, 1, x, y).colour(0, 0)

    def wait_for_colour(self, point, colour):
        """Waits until the screen has the colour at a point."""
        wait_for(lambda: self.colour(*point) == colour, lambda: f'{point} is {self.colour(*point)}, expected {colour}')

    def screen(self):
        """The contents of the screen now."""
        return Screen(self._display(), *self._size)

    def _display(self):
        if not self._connection:
            self._connection = X11.XOpenDisplay(self.environment['DISPLAY'].encode())
        return self._connection

    def start(self, *arguments, environment=None):
        """Starts telix-tv, without a timeout of its own unless the arguments have one."""
        return Process([self._browser, *map(str, arguments)], env={**self.environment, **(environment or {})},
                       stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True)

    def run(self, *arguments, environment=None):
        """Runs telix-tv until it exits. Of two --timeout options the last one, in `arguments`, counts."""
        with self.start('--timeout', AUTOMATION_TIMEOUT, *arguments, environment=environment) as process:
            try:
                output, errors = process.communicate(timeout=RUN_TIMEOUT)
            except subprocess.TimeoutExpired:
                process.kill()
                output, errors = process.communicate()
                raise RuntimeError(f'telix-tv did not exit within {RUN_TIMEOUT} s\n{output}{errors}') from None
        return Run(process.returncode, output, errors)

    def run_to_timeout(self, *arguments, error, environment=None):
        """Runs telix-tv until its --timeout, which is longer in each attempt, until it reports the error and not that
        the machine was too slow to get there. `error` has a place for the seconds."""
        for seconds in (3, 15, 60):
            run = self.run('--timeout', seconds, *arguments, environment=environment)
            if error.format(seconds) in run.errors:
                break
        return run, error.format(seconds)


class Process(subprocess.Popen):
    """A running telix-tv, killed if its with block fails."""

    def __exit__(self, kind, *details):
        if kind:
            self.kill()
        super().__exit__(kind, *details)


def web_processes(process):
    """The ids of the web processes of a telix-tv, also of one that is still being removed after its end."""
    # It fails if there are none.
    children = subprocess.run(['ps', '--ppid', str(process.pid), '-o', 'pid=,comm='], stdout=subprocess.PIPE, text=True,
                              check=False).stdout
    return [int(line.split()[0]) for line in children.splitlines() if 'WebKitWeb' in line]


def anonymous_kilobytes(pid):
    """The memory of a process that is not that of files."""
    with open(f'/proc/{pid}/status', encoding='ascii') as file:
        return next(int(line.split()[1]) for line in file if line.startswith('RssAnon:'))


def has_opengl(process):
    """Whether a web process of a telix-tv has loaded OpenGL."""
    def maps(pid):
        with open(f'/proc/{pid}/maps', encoding='utf-8') as file:
            return file.read()
    return any('libGLESv2' in maps(pid) for pid in web_processes(process))


class Run:
    """The exit status and the output of a run of telix-tv."""

    def __init__(self, status, output, errors):
        self.status = status
        self.output = output
        self.errors = errors

    @property
    def value(self):
        """The value of --eval: the last line on standard output."""
        return json.loads(self.output.rstrip('\n').split('\n')[-1])

    def __str__(self):
        cause = f'signal {signal.Signals(-self.status).name}' if self.status < 0 else f'status {self.status}'
        return f'telix-tv exited with {cause}\n--- standard output\n{self.output}--- standard error\n{self.errors}'


@contextlib.contextmanager
def temporary_folder():
    folder = tempfile.mkdtemp(prefix='telix-tv-test-')
    try:
        yield folder
    finally:
        shutil.rmtree(folder)
