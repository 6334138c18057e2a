"""The base of the tests of the demonstration application: conditions on its pages, and steps of a viewer."""

import json
import os
import unittest

from television import PngImage, Television

ROOT = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
APPS = os.path.join(ROOT, 'apps')
DEMO = os.path.join(APPS, 'demo', 'index.html')
# A rendered page has many colours, because its text is antialiased; an empty page has one.
COLOURS_OF_A_PAGE = 50
KEYS = {'up': 38, 'down': 40, 'left': 37, 'right': 39, 'ok': 13, 'back': 461, 'info': 457, 'red': 403, 'green': 404,
        'yellow': 405, 'blue': 406, 'play': 415, 'pause': 19, 'stop': 413, 'rewind': 412, 'fast-forward': 417,
        **{str(digit): 48 + digit for digit in range(10)}}


def text(element):
    """Expression: the text of an element, empty while the element is hidden."""
    return f'document.getElementById("{element}").innerText.replace(/\\s+/g, " ").trim()'


def shows(element, words):
    return f'({is_visible(element)} && {text(element)}.indexOf({json.dumps(words)}) >= 0)'


def is_visible(element):
    return f'(document.getElementById("{element}").offsetWidth > 0)'


def is_hidden(element):
    return f'(document.getElementById("{element}").offsetWidth === 0)'


def media_state(words):
    return f'{text("media-state")} === {json.dumps(words)}'


class Note:
    """A step that records the value of an expression."""

    def __init__(self, expression):
        self.expression = expression


class Keys:
    """A step that presses several keys in one turn of the event loop, faster than any timeout of the application."""

    def __init__(self, *names):
        self.names = names


class Action:
    """What happens in one turn of the event loop: when the condition is true, values are recorded and keys pressed. So a
    busy machine cannot delay them until the page has changed again."""

    def __init__(self, condition='true'):
        self.condition = condition
        self.notes = []
        self.keys = ()

    def script(self):
        statements = [f'if (!({self.condition})) {{ return false; }}',
                      *(f'notes.push({expression});' for expression in self.notes),
                      *(f'pressKey({KEYS[name]});' for name in self.keys), 'return true;']
        return 'function () { ' + ' '.join(statements) + ' }'


def actions_of(parts):
    actions = [Action()]
    for part in parts:
        if isinstance(part, Note):
            if actions[-1].keys:
                actions.append(Action())
            actions[-1].notes.append(part.expression)
        elif isinstance(part, Keys) or part in KEYS:
            if actions[-1].keys:
                actions.append(Action())
            actions[-1].keys = part.names if isinstance(part, Keys) else (part,)
        else:
            actions.append(Action(part))
    return actions


def steps(*parts):
    """An expression for --wait-for that performs steps and is true after the last one: names of keys are pressed,
    conditions are waited for, and Notes are recorded in `notes`."""
    return '''(function () {
        window.notes = window.notes || [];
        window.stepsDone = window.stepsDone || 0;
        function pressKey(keyCode) {
            ['keydown', 'keyup'].forEach(function (type) {
                var event = document.createEvent('Event');
                event.initEvent(type, true, true);
                event.keyCode = keyCode;
                document.body.dispatchEvent(event);
            });
        }
        var steps = [%s];
        if (stepsDone < steps.length && steps[stepsDone]()) { stepsDone++; }
        return stepsDone === steps.length;
    }())''' % ', '.join(action.script() for action in actions_of(parts))


class Demonstration(unittest.TestCase):
    plugin = 'TELIX_PLUGIN'

    @classmethod
    def setUpClass(cls):
        cls.television = Television(os.environ['TELIX_TV'])
        cls.addClassCleanup(cls.television.close)

    def run_demo(self, *arguments, plugin=None, page=DEMO, environment=None):
        run = self.television.run('--plugin', os.environ[plugin or self.plugin], *arguments, page,
                                  environment=environment)
        self.assertEqual(run.status, 0, run)
        # Errors of scripts are printed with the name of their file.
        self.assertNotIn('.js:', run.errors, run)
        return run

    def text(self, element, *arguments, **options):
        return self.run_demo('--eval', f'document.getElementById("{element}").innerText', *arguments, **options).value

    def notes(self, *parts, **options):
        """Performs the steps; returns the recorded values."""
        return self.run_demo('--wait-for', steps(*parts), '--eval', 'notes', **options).value

    def screenshot(self, name, *arguments, **options):
        file_name = os.path.join(os.environ['TELIX_SCREENSHOTS'], f'demo-{name}.png')
        self.run_demo('--screenshot', file_name, *arguments, **options)
        picture = PngImage(file_name)
        self.assertEqual((picture.width, picture.height), (1280, 720))
        return picture
