"""telixctl and telix-conformance as commands.

The environment names the programs (TELIXCTL, TELIX_CONFORMANCE, TELIX_TELEVISION), the libraries (TELIX_LIBRARY,
TELIX_EMPTY_LIBRARY, TELIX_FAULTY_LIBRARY) and a clip (TELIX_CLIP)."""

import contextlib
import json
import os
import queue
import shutil
import signal
import socket
import subprocess
import tempfile
import threading
import time
import unittest

LIMIT = 90  # seconds for each condition; reached only if a test fails


def run(*arguments, environment=None, limit=LIMIT):
    return subprocess.run([str(argument) for argument in arguments], env=environment, capture_output=True, text=True,
                          stdin=subprocess.DEVNULL, timeout=limit)


class Television:
    """A running television in a runtime folder, and the callbacks that it prints."""

    def __init__(self, environment, *media):
        self._process = subprocess.Popen(
            [os.environ['TELIX_TELEVISION'], os.environ['TELIX_LIBRARY'], *media], env=environment, text=True,
            stdin=subprocess.PIPE, stdout=subprocess.PIPE, stderr=subprocess.DEVNULL)
        self.pid = self._process.pid
        self._lines = queue.Queue()
        threading.Thread(target=self._read, daemon=True).start()
        self.wait_for('ready')

    def _read(self):
        for line in self._process.stdout:
            self._lines.put(line.rstrip('\n'))

    def wait_for(self, line):
        """Reads lines up to this one."""
        end = time.monotonic() + LIMIT
        seen = []
        while True:
            try:
                seen.append(self._lines.get(timeout=max(end - time.monotonic(), 0.01)))
            except queue.Empty:
                raise AssertionError(f'no "{line}" in {seen}') from None
            if seen[-1] == line:
                return

    def end(self):
        self._process.stdin.close()
        return self._process.wait(LIMIT)

    def kill(self):
        self._process.kill()
        self._process.wait()
        self._process.stdin.close()

    def __enter__(self):
        return self

    def __exit__(self, *exception):
        if self._process.poll() is None:
            self.kill()
        self._process.stdout.close()


class ToolTest(unittest.TestCase):
    def setUp(self):
        self.folder = tempfile.mkdtemp(prefix='telix-tools-')
        self.addCleanup(shutil.rmtree, self.folder)
        self.environment = {name: value for name, value in os.environ.items() if name != 'TELIX_SOCKET'}
        self.environment.update(XDG_RUNTIME_DIR=self.folder, LC_ALL='C.UTF-8')

    def television(self, *media):
        return Television(self.environment, *media)

    def ctl(self, *arguments, status=0, **environment):
        result = run(os.environ['TELIXCTL'], *arguments, environment={**self.environment, **environment})
        self.assertEqual(result.returncode, status, f'{arguments}: {result.stdout}{result.stderr}')
        if status == 0:
            self.assertEqual(result.stderr, '', arguments)
        else:
            self.assertNotEqual(result.stderr, '', arguments)
        return result.stdout if status == 0 else result.stderr

    def state(self, *arguments):
        return json.loads(self.ctl('--json', *arguments, 'state'))

    def wait_for_state(self, condition):
        end = time.monotonic() + LIMIT
        while not condition(state := self.state()):
            self.assertLess(time.monotonic(), end, state)
            time.sleep(0.05)
        return state


class Control(ToolTest):
    def test_shows_and_drives_a_television(self):
        with self.television() as television:
            television.wait_for('change 1')
            channels = self.ctl('channels')
            self.assertRegex(channels, r'(?m)^\*  1  Telix One +television +65281\.1\.101$')
            self.assertEqual(len(channels.splitlines()), 3)
            state = self.wait_for_state(lambda state: state['activeAudioPid'] and state['programmes']['next'])
            self.assertEqual(state['channel']['name'], 'Telix One')
            active = [each['pid'] for each in state['components'] if each['type'] == 'audio' and each['active']]
            self.assertEqual(active, [state['activeAudioPid']])
            text = self.ctl('state')
            self.assertRegex(text, r'(?m)^channel +1 Telix One$')
            self.assertRegex(text, r'(?m)^object +1 presenting, owns the tuner, 1280x720 at 0,0$')
            self.assertRegex(text, rf'(?m)^audio +MPEG1_L2 deu PID {active[0]}, active, playing$')
            self.assertRegex(text, r'(?m)^picture +frame \d+, 720x576, shown 1280x720 at 0,0$')
            self.assertRegex(text, r'(?m)^tuner +/.+/test-multiplex-1\.ts, \d+ bytes kept, selected$')
            self.assertRegex(text, r'(?m)^stream event +id 77 tag 42 offer$')
            self.assertRegex(text, r'(?m)^listeners +channelChange channelError fullScreen ratingChange ratingError '
                                   r'lowMemory drmMessageResult$')
            self.assertEqual(self.ctl('channel', 2), '2 Telix Two\n')
            television.wait_for('change 2')

            for arguments, event in (
                    (['channel-error', 3], 'error 3'),
                    (['rating', 12, '--region', 'FRA'], 'rating'),
                    (['rating-error', '--content-id=c', '--drm-system=d'], 'rating-error c d'),
                    (['stream-event', '--id', '0x4d', '--tag', 42, '--data', 'Hi'], 'stream-event offer 4869 trigger'),
                    (['stream-event', '--name', 'offer', '--hex', '00', '--status', 'error'],
                     'stream-event offer 00 error'),
                    (['full-screen', 'on'], 'full-screen'),
                    (['low-memory', '--free', 99], 'low-memory'),
                    (['drm-result', 2, '--id', 'x', '--message', 'no'], 'drm x no 2')):
                self.ctl(*arguments)
                television.wait_for(event)
            state = self.state()
            self.assertTrue(state['picture']['fullScreen'])
            self.assertEqual(state['freeMemory'], 99)

            self.assertIn('there are 3 channels', self.ctl('channel', 9, status=1))
            self.assertIn('no listener is registered', self.ctl('stream-event', '--id', 1, status=1))
            self.assertIn('no player has media', self.ctl('player-message', 'play-end', status=1))
            refused = run(os.environ['TELIXCTL'], '--json', 'channel', '9', environment=self.environment)
            self.assertEqual(refused.returncode, 1)
            self.assertEqual(json.loads(refused.stdout)['ok'], False)
            self.assertEqual(television.end(), 0)
        self.assertEqual(os.listdir(self.folder), [])  # the television has removed its socket

    def test_lists_and_signals_applications(self):
        with self.television() as television:
            television.wait_for('change 1')
            end = time.monotonic() + LIMIT
            while 'signalling known' not in (listed := self.ctl('applications')):
                self.assertLess(time.monotonic(), end, listed)
                time.sleep(0.05)
            self.assertRegex(listed, r'(?m)^channel +1 Telix One, signalling known$')
            self.assertRegex(listed, r'(?m)^7e11\.1 +AUTOSTART http://127\.0\.0\.1/apps/demo/index\.html, '
                                     r'Demonstration, priority 10$')
            self.assertRegex(listed, r'(?m)^7e11\.2 +PRESENT .*, service-bound$')
            self.ctl('signal', 'http://a.example/', '--control-code=present', '--service-bound=on')
            self.assertRegex(self.ctl('applications'), r'(?m)PRESENT http://a\.example/.*, service-bound$')
            self.ctl('signal')
            self.assertNotIn('a.example', self.ctl('applications'))
            self.assertIn('absolute URL', self.ctl('signal', 'a.html', status=1))
            self.assertIn('control-code', self.ctl('signal', 'http://a/', '--control-code=go', status=2))

    def test_acts_on_the_player(self):
        with self.television('file://' + os.environ['TELIX_CLIP']) as television:
            television.wait_for('player-message 2')
            player = self.state()['players'][0]
            self.assertTrue(player['url'].endswith('.mp4'))
            self.assertGreater(player['duration'], 0)
            self.assertRegex(self.ctl('state'), r'(?m)^player +1 playing file:///.*\.mp4, \d+ of \d+ ms, speed 1, ')
            self.ctl('buffered', '--amount', 3)
            self.assertEqual(self.state()['players'][0]['buffered'], 3)
            self.ctl('buffered')
            self.assertNotEqual(self.state()['players'][0]['buffered'], 3)
            self.ctl('player-message', 'err-net-disconnected')
            television.wait_for(f'player-message {0xFF00}')
            self.ctl('player-message', '0xF003')
            television.wait_for(f'player-message {0xF003}')
            self.assertIn('neither a known name nor a number', self.ctl('player-message', 'stop it', status=1))
            self.ctl('rights-error', 1, '--content-id', 'c', '--drm-system', 'd', '--rights-issuer-url', 'u')
            television.wait_for('rights-error 1 c d u')

    def test_finds_the_television_that_is_meant(self):
        self.assertIn('no television is running', self.ctl('state', status=1))
        self.assertIn('no television is running', self.ctl('list', status=1))
        self.assertIn('telix-1.sock: cannot connect to a television: No such file', self.ctl('--pid', 1, 'state', status=1))
        with self.television() as first, self.television() as second:
            first.wait_for('change 1')
            second.wait_for('change 1')
            both = self.ctl('state', status=1)
            self.assertIn('several televisions', both)
            self.assertIn(str(first.pid), both)
            self.assertEqual(self.ctl('list').split()[::2], [str(pid) for pid in sorted((first.pid, second.pid))])
            socket_of_second = f'{self.folder}/telix-{second.pid}.sock'
            self.ctl('--pid', second.pid, 'channel', 2)
            second.wait_for('change 2')
            self.ctl('channel', 3, TELIX_SOCKET=socket_of_second)
            second.wait_for('change 3')
            self.ctl('channel', 1, '--socket', socket_of_second)
            second.wait_for('change 1')
            self.assertEqual(self.state('--pid', str(first.pid))['channel']['number'], 1)
            first.kill()  # its socket file stays
            self.assertIn(f'telix-{first.pid}.sock', os.listdir(self.folder))
            self.assertEqual(self.state()['channel']['number'], 1)
            self.assertNotIn(f'telix-{first.pid}.sock', os.listdir(self.folder))

    def test_a_television_listens_on_the_socket_that_is_named(self):
        path = os.path.join(self.folder, 'own.sock')
        environment = {**self.environment, 'TELIX_SOCKET': path}
        with Television(environment) as television:
            television.wait_for('change 1')
            self.ctl('channel', 2, TELIX_SOCKET=path)
            television.wait_for('change 2')
            with Television(environment) as second:  # has none
                second.wait_for('change 1')
                second.end()
            self.assertEqual(self.state('--socket', path)['channel']['number'], 2)
            self.assertIn('no television is running', self.ctl('list', status=1))
            television.kill()  # its socket file stays
        with Television(environment) as television:
            television.wait_for('change 1')
            self.assertEqual(self.state('--socket', path)['channel']['number'], 1)
            self.assertEqual(television.end(), 0)
        self.assertFalse(os.path.exists(path))

    def test_a_file_that_is_not_a_socket_stays(self):
        path = os.path.join(self.folder, 'notes.txt')
        with open(path, 'w', encoding='utf-8') as file:
            file.write('notes')
        with Television({**self.environment, 'TELIX_SOCKET': path}) as television:
            television.wait_for('change 1')
            self.assertEqual(television.end(), 0)
        with open(path, encoding='utf-8') as file:
            self.assertEqual(file.read(), 'notes')

    def test_tells_when_nothing_sensible_answers(self):
        path = os.path.join(self.folder, 'other.sock')
        with contextlib.closing(socket.socket(socket.AF_UNIX)) as server:
            server.bind(path)
            server.listen()

            def respond():
                for response in (b'hello\n', b'[1]\n', b''):
                    connection = server.accept()[0]
                    connection.recv(4096)
                    connection.sendall(response)
                    connection.close()

            thread = threading.Thread(target=respond, daemon=True)
            thread.start()
            for _ in range(2):
                self.assertEqual(self.ctl('--socket', path, 'state', status=1),
                                 f'telixctl: {path}: the response is not that of a television\n')
            self.assertIn(f'{path}: the television has closed the connection', self.ctl('--socket', path, 'state', status=1))
            thread.join(LIMIT)
        self.assertIn('too long', self.ctl('--socket', '/' + 'x' * 200, 'state', status=1))
        self.assertIn('/dev/null: XDG_RUNTIME_DIR is not a folder', self.ctl('state', status=1, XDG_RUNTIME_DIR='/dev/null'))

    def test_works_without_a_socket(self):
        folder = os.path.join(self.folder, 'x' * 100)  # too long for a socket
        os.mkdir(folder)
        for runtime in (folder, '/dev/null'):
            with Television({**self.environment, 'XDG_RUNTIME_DIR': runtime}) as television:
                television.wait_for('change 1')
                self.assertEqual(television.end(), 0)
        self.assertEqual(os.listdir(folder), [])


class CommandLine(ToolTest):
    def test_refuses_bad_usage_with_2(self):
        for arguments in ([], ['--loud'], ['explode'], ['state', 'now'], ['state', '--loud'], ['channel'],
                          ['channel', 'one'], ['channel', '0'], ['channel', '1.5'], ['channel', '-1'],
                          ['channel', '1', '2'], ['full-screen', 'maybe'], ['rating', '19'],
                          ['stream-event', '--status', 'fine'],
                          ['stream-event', '--tag', '256'], ['stream-event', '--id'], ['--pid', 'x', 'state'],
                          ['--pid', '0', 'state'], ['--pid', '1', '--socket', 'x', 'state'], ['list', 'all'],
                          ['check-config', 'a', 'b'], ['']):
            with self.subTest(arguments=arguments):
                self.assertRegex(self.ctl(*arguments, status=2), r'^telixctl: .+\n$')
        for arguments, message in (
                ([], 'no command is given (see telixctl --help)'),
                (['explode'], '"explode": unknown command (see telixctl --help)'),
                (['channel'], 'channel: NUMBER is missing'),
                (['channel', '0'], 'channel: NUMBER: "0" is not a whole number from 1 to 4294967295'),
                (['state', 'now'], 'state: unexpected argument "now"'),
                (['full-screen', 'maybe'], 'full-screen: on|off: "maybe" is not on or off'),
                (['stream-event', '--status', 'fine'], 'stream-event: --status: "fine" is not trigger or error'),
                (['--pid', 'x', 'state'], '--pid: "x" is not a whole number from 1 to 2147483647')):
            with self.subTest(arguments=arguments):
                self.assertEqual(self.ctl(*arguments, status=2), f'telixctl: {message}\n')

    def test_help_tells_every_command(self):
        text = self.ctl('--help')
        for command in ('channels', 'state', 'channel NUMBER', 'channel-error', 'rating AGE', 'rating-error',
                        'stream-event', 'full-screen on|off', 'drm-result', 'rights-error', 'low-memory', 'buffered',
                        'player-message', 'list', 'check-config', '--socket', '--pid', 'Exit status'):
            self.assertIn(command, text)
        rights = self.ctl('rights-error', '--help')
        for part in ('rights-error STATE', '--rights-issuer-url=URL', 'Where rights can be acquired (default: empty)',
                     'Error state as pages see it'):
            self.assertIn(part, rights)
        self.assertIn('check-config [FILE]', self.ctl('check-config', '--help'))
        self.assertRegex(self.ctl('--version'), r'^telixctl \d')

    def test_checks_configuration_files(self):
        path = os.path.join(self.folder, 'tv.conf')

        def check(text, *arguments, **options):
            with open(path, 'w', encoding='utf-8') as file:
                file.write(text)
            return self.ctl('check-config', *arguments, **options)

        self.assertEqual(f'{path}: no errors\n', check('[viewer]\ncountry=FRA\n', path))
        self.assertEqual(check('[viewer]\n\ncountry=France\n', path, status=2),
                         f'telixctl: {path}:3: country: "France" is not an ISO code of three letters\n')
        self.assertIn(f'{path}:1: ', check('nonsense', TELIX_CONFIG=path, status=2))
        self.assertIn('no errors', check('', TELIX_CONFIG=path))
        self.assertIn('the defaults apply', self.ctl('check-config', TELIX_CONFIG='', XDG_CONFIG_HOME=self.folder))
        missing = os.path.join(self.folder, 'missing.conf')
        self.assertEqual(self.ctl('check-config', missing, status=2),
                         f'telixctl: {missing}: No such file or directory\n')


class Conformance(ToolTest):
    def check(self, *arguments, limit=240):
        return run(os.environ['TELIX_CONFORMANCE'], *arguments, environment=self.environment, limit=limit)

    def test_our_own_library_passes_everything(self):
        result = self.check('--media', 'file://' + os.environ['TELIX_CLIP'], os.path.dirname(os.environ['TELIX_LIBRARY']))
        lines = result.stdout.splitlines()
        self.assertEqual([line for line in lines[:-1] if not line.startswith('ok ')], [], result.stderr)
        self.assertEqual(result.returncode, 0, result.stdout)
        self.assertEqual(sum('  has TELIX_JS_' in line for line in lines), 120)
        self.assertEqual(lines[-1], f'{len(lines) - 1} ok, 0 failed, 0 skipped')

    def test_a_library_without_functions_fails_without_a_crash(self):
        result = self.check(os.environ['TELIX_EMPTY_LIBRARY'])
        self.assertEqual(result.returncode, 1)
        lines = result.stdout.splitlines()
        failed = [line for line in lines if line.startswith('FAIL')]
        self.assertEqual(len(failed), 120)
        self.assertTrue(all('it is missing' in line for line in failed))
        self.assertTrue(any(line.startswith('skip') and 'the library has no TELIX_JS_' in line for line in lines))
        self.assertRegex(lines[-1], r'^\d+ ok, 120 failed, \d+ skipped$')

    def test_faults_are_found_and_named(self):
        result = self.check('--wait', 5, os.environ['TELIX_FAULTY_LIBRARY'])
        self.assertEqual(result.returncode, 1)
        output = result.stdout
        for fault in (
                r'FAIL  has TELIX_JS_AV_Play: it is missing',
                r'FAIL  TELIX_JS_APP_Config_GetPreferredAudioLanguage .*: .* returns the same block twice',
                r'FAIL  TELIX_JS_APP_Config_GetCountryId .*: it is "Germany"',
                r'FAIL  TELIX_JS_APP_GetFreeMem .*: it refuses, but changes its output',
                r'FAIL  a key set .*: the granted mask is not written',
                r'FAIL  the capabilities are an XML document.*: ',
                r'FAIL  the channel list .*: a handle is listed twice',
                r'FAIL  TELIX_JS_CM_GetSid refuses unknown handles.*: handle 0 is accepted',
                r'FAIL  the rating schemes .*: the process ended by a signal: Aborted',
                r'FAIL  objects have distinct handles: two have the same',
                r'FAIL  players have distinct handles: no progress within \d+ seconds',
                r'FAIL  no result is reported after the last agent has unregistered: one is reported',
                r'ok    TELIX_JS_APP_GetKeySetValue returns a number',
                r'ok    each DRM message has its own id',
                r'skip  low memory .*: the library has no TELIX_JS_APP_RegisterLowMemory'):
            self.assertRegex(output, f'(?m)^{fault}')

    def test_refuses_what_is_no_library_with_2(self):
        text = os.path.join(self.folder, 'libtelix.so')
        with open(text, 'w', encoding='utf-8') as file:
            file.write('not a library')
        library = os.environ['TELIX_EMPTY_LIBRARY']
        for arguments in ([], [text], [self.folder], [self.folder + '/missing.so'], [library, library],
                          ['--loud', library], ['--wait', '0', library], ['--wait', 'long', library],
                          ['--wait', '601', library]):
            with self.subTest(arguments=arguments):
                result = self.check(*arguments)
                self.assertEqual(result.returncode, 2)
                self.assertRegex(result.stderr, r'^telix-conformance: .+\n$')
                self.assertEqual(result.stdout, '')
        self.assertIn('Exit status', self.check('--help').stdout)


def give_up(*_):
    raise TimeoutError('not done in time')


if __name__ == '__main__':
    signal.signal(signal.SIGALRM, give_up)
    signal.alarm(270)  # less than CTest's limit, which would leave televisions behind
    unittest.main(verbosity=2)
