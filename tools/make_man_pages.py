#!/usr/bin/env python3
"""Makes the man pages (docs/man/NAME.SECTION) from docs/man/NAME.SECTION.in.

What a program's own --help says stands in its page once more by these lines of the source:
  @OPTIONS@    the options
  @COMMANDS@   the commands with their arguments and options
  @NOTES@      the paragraphs before the first list and after the last one, but for the exit status
  @EXIT@       the exit status"""

import argparse
import os
import re
import subprocess
import sys

FOLDER = os.path.join(os.path.dirname(os.path.dirname(os.path.abspath(__file__))), 'docs', 'man')
TITLE = re.compile(r'[A-Z][A-Za-z ]*:$')
ENTRY = re.compile(r'( {2,8})(\S+(?: \S+)*)(?: {2,}| (?=[A-Z]\S* [a-z]))(\S.*)$')
CONTINUATION = re.compile(r' {12,}(\S.*)$')
# What differs from one build to another: the folder of a file; the machine and the engine's version in the user agent.
FOLDER_NAME = re.compile(r'(?<=\s)/(?:[^\s/]+/)+')
MACHINE = re.compile(r'\(X11; Linux [^)]*\)')
ENGINE_VERSION = re.compile(r'\b(AppleWebKit|Safari|Version)/[\d.]+')


class Help:
    """A help text: its lists as (indent, term, meaning) by title, and its paragraphs."""

    def __init__(self, text):
        self.lists = {}
        self.paragraphs = []
        for block in text.split('\n\n'):
            lines = [line for line in block.splitlines() if line.strip()]
            if lines and lines[0].startswith('Usage:'):
                continue
            if lines and TITLE.match(lines[0]):
                self.lists[lines[0].rstrip(':')] = self.entries(lines[1:])
            elif lines:
                self.paragraphs.append(lines)

    @staticmethod
    def entries(lines):
        entries = []
        for line in lines:
            entry, continuation = ENTRY.match(line), CONTINUATION.match(line)
            if entry:
                entries.append([len(entry[1]), entry[2], entry[3]])
            elif continuation and entries:
                entries[-1][2] += ' ' + continuation[1]
            else:
                raise ValueError(f'line of a help text not understood: {line}')
        return entries

    def options(self):
        titles = [title for title in self.lists if title.endswith('Options') and title != 'Help Options']
        return [entry for title in [*titles, 'Help Options'] for entry in self.lists.get(title, [])]

    def exit_status(self):
        """Pairs of a number and its meaning."""
        for lines in self.paragraphs:
            text = ' '.join(lines)
            if text.startswith('Exit status: '):
                items = re.split(r'[;,] (?=\d )', text.removeprefix('Exit status: ').rstrip('.'))
                return [item.split(' ', 1) for item in items]
        raise ValueError('the help text says no exit status')

    def notes(self):
        return [lines for lines in self.paragraphs if not lines[0].startswith('Exit status: ')]


def escaped(text):
    text = text.replace('\\', '\\e').replace('-', '\\-')
    return '\\&' + text if text.startswith(('.', "'")) else text


def italic(text):
    return f'\\fI{escaped(text)}\\fR'


def bold(text):
    return f'\\fB{escaped(text)}\\fR'


def option_term(term):
    """`-s, --socket=FILE` and `--size <WxH>` with what is typed in bold and what is replaced in italics."""
    forms = []
    for form in term.split(', '):
        name, equals, value = re.fullmatch(r'(-[\w-]+)(?:(=| )<?([^>]*)>?)?', form).groups()
        forms.append(bold(name) + (escaped(equals) + italic(value) if equals else ''))
    return ', '.join(forms)


def command_term(term):
    name, *arguments = term.split(' ')
    return ' '.join([bold(name), *(italic(argument) for argument in arguments)])


def item(term, meaning):
    return ['.TP', term, escaped(meaning)]


def option_lines(text):
    return [line for _, term, meaning in text.options() for line in item(option_term(term), meaning)]


def command_lines(text):
    lines = []
    inside = False
    for indent, term, meaning in text.lists['Commands']:
        if (indent > 2) != inside:
            lines.append('.RE' if inside else '.RS')
            inside = not inside
        if inside:
            lines += item(option_term(term) if term.startswith('-') else italic(term), meaning)
        else:
            lines += item(command_term(term), meaning)
    return lines + (['.RE'] if inside else [])


def note_lines(text):
    lines = []
    for paragraph in text.notes():
        lines.append('.PP')
        for line in paragraph:
            number = re.match(r'  (\d+\.) (.*)', line)
            lines += ['.IP ' + number[1] + ' 4', escaped(number[2])] if number else [escaped(line.strip())]
            if number and line is not paragraph[-1] and not paragraph[paragraph.index(line) + 1].startswith('  '):
                lines.append('.PP')
    return lines


def exit_lines(text):
    return [line for number, meaning in text.exit_status() for line in item(bold(number), meaning[0].upper() + meaning[1:])]


PARTS = {'@OPTIONS@': option_lines, '@COMMANDS@': command_lines, '@NOTES@': note_lines, '@EXIT@': exit_lines}


def read_help(program):
    if not program:
        raise ValueError('its program is not given')
    environment = {**os.environ, 'LC_ALL': 'C.UTF-8'}
    text = subprocess.run([program, '--help'], env=environment, stdout=subprocess.PIPE, check=True, text=True,
                          timeout=60).stdout
    text = MACHINE.sub('(X11; Linux)', FOLDER_NAME.sub('', text))
    return Help(ENGINE_VERSION.sub(r'\1/VERSION', text))


def make_page(source, program):
    """The text of a page; `program` is null for a page without one."""
    text = None
    lines = ['.\\" Made by tools/make_man_pages.py from the .in file and the help of the program.']
    for line in source.splitlines():
        if line in PARTS:
            text = text or read_help(program)
            lines += PARTS[line](text)
        else:
            lines.append(line)
    return '\n'.join(lines) + '\n'


def main():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument('programs', nargs='+', metavar='PROGRAM', help='the built programs')
    parser.add_argument('--folder', default=FOLDER, metavar='FOLDER', help='where the pages are (default: docs/man)')
    parser.add_argument('--check', action='store_true', help='write nothing; stale pages are errors')
    arguments = parser.parse_args()

    programs = {os.path.basename(program): program for program in arguments.programs}
    stale = False
    for name in sorted(os.listdir(arguments.folder)):
        if not name.endswith('.in'):
            continue
        path = os.path.join(arguments.folder, name)
        with open(path, encoding='utf-8') as file:
            source = file.read()
        try:
            page = make_page(source, programs.get(name.split('.')[0]))
        except (OSError, subprocess.SubprocessError, ValueError) as error:
            print(f'make_man_pages.py: {name}: {error}', file=sys.stderr)
            sys.exit(2)
        path = path.removesuffix('.in')
        current = ''
        if os.path.exists(path):
            with open(path, encoding='utf-8') as file:
                current = file.read()
        if arguments.check and page != current:
            print(f'make_man_pages.py: {os.path.basename(path)}: stale, run tools/make_man_pages.py', file=sys.stderr)
            stale = True
        elif not arguments.check:
            with open(path, 'w', encoding='utf-8') as file:
                file.write(page)
    sys.exit(1 if stale else 0)


if __name__ == '__main__':
    main()
