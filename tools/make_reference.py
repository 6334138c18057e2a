#!/usr/bin/env python3
"""Makes the reference for authors of pages (docs/api/*.md) and its TypeScript declarations (docs/api/telix.d.ts).

Names, kinds, constants and types come from the tables of the wrappers (the output of telix_script_tables), the prose from
docs/api/names.toml. A name without prose, prose without a name, and a type that the table contradicts are errors: one line
each, and status 1."""

import argparse
import json
import os
import re
import subprocess
import sys
import tomllib

FOLDER = os.path.join(os.path.dirname(os.path.dirname(os.path.abspath(__file__))), 'docs', 'api')
QUIRKS = os.path.join(os.path.dirname(FOLDER), 'compatibility.md')
# Types of the page that the declarations use.
PAGE_TYPES = {'Document', 'KeyboardEvent', 'StreamEvent'}
PRIMITIVE_TYPES = {'boolean', 'number', 'string', 'void'}
# Members of the page's own interface of `object` elements that have another type there.
ELEMENT_MEMBERS = ('data', 'height', 'width')

ABOUT = """# Reference for authors of pages

<!-- Made by tools/make_reference.py from names.toml and the tables of the plug-in. -->

The objects of the plug-in, as scripts see them. A page embeds seven of them with `object` elements, whose type selects the
object; case does not matter. The other objects come from properties and methods of these.

| Type of the element | Object | Page |
|---|---|---|
{rows}

[telix.d.ts](telix.d.ts) declares all of them in TypeScript, in the namespace `telix`. An editor that knows the language then
completes and checks plain scripts too: put `// @ts-check` into the first line of the script, and name the type where the
element is looked up.

    /** @type {{telix.VideoBroadcast}} */
    var video = /** @type {{any}} */ (document.getElementById('video'));

## Rules for all objects

* A call with arguments of wrong types throws. A write of a wrong type leaves the value as it was.
* A handler property takes a function or `null` (quirk 4).
* A value that the set does not know is `null`, 0 or false, as the tables say; `null` is also what an empty string reads as
  (quirks 3 and 35).
* Numbers are integers of 32 bits unless a fraction makes sense. An argument beyond the range takes the nearest bound
  (quirk 5).
* Collections have `length`, `item(index)` and the notation `list[index]`.
* Numbers after the word quirk are those of [compatibility.md](../compatibility.md), which names what differs from the
  standards.

## What is missing

Each object names the members of OIPF DAE 1.1 and HbbTV 1.1.1 that it lacks, optional parts of the standards such as recording
and time shift left out. `oipfObjectFactory` is the browser's, as in `telix-tv`. There are no objects of the types
`application/oipfCodManager`, `application/oipfDownloadManager`, `application/oipfGatewayInfo`, `application/oipfIMS`,
`application/oipfMDTF`, `application/oipfRecordingScheduler`, `application/oipfRemoteManagement`,
`application/oipfSearchManager` and `application/oipfStatusView`.
"""

STREAM_EVENT = """/** The event of a subscription to a stream event. */
interface StreamEvent extends Event {
    /** Name of the event. */
    readonly name: string;
    /** Payload as hexadecimal digits. */
    readonly data: string;
    /** Payload as a string; without a payload the property is missing. */
    readonly text?: string;
    /** `trigger` or `error`. */
    readonly status: string;
}
"""


def split_arguments(text):
    """The arguments of a signature; commas in the arguments of a handler do not separate them."""
    parts, depth, part = [], 0, ''
    for letter in text:
        depth += (letter == '(') - (letter == ')')
        if letter == ',' and depth == 0:
            parts.append(part.strip())
            part = ''
        else:
            part += letter
    return parts + [part.strip()] if part.strip() else parts


def parse_signature(text):
    """Types of the arguments and of the result of `(a: A, b?: B): R`, or None."""
    match = re.fullmatch(r'\((.*)\): ([^()]+)', text)
    if not match:
        return None
    return [part.partition(': ')[2] for part in split_arguments(match[1])], match[2]


def base_type(text):
    """The type of the tables for a type of TypeScript."""
    parts = [part for part in re.split(r' \| (?![^()]*\) =>)', text) if part not in ('null', 'undefined')]
    return parts[0] if len(parts) == 1 and parts[0] in PRIMITIVE_TYPES else 'object'


def is_nullable(text):
    return text.endswith(' | null')


class Reference:
    """Prose and tables, and the faults between them."""

    def __init__(self, pages, tables, quirks):
        self.pages = pages
        self.tables = {table['class']: table for table in tables}
        self.quirks = quirks
        self.faults = []
        self.objects = [each for page in pages for each in page['object']]
        self.types = {each['name'] for each in self.objects} | PAGE_TYPES
        self.check()

    def check(self):
        described = [each['class'] for each in self.objects]
        for name in sorted(set(self.tables) - set(described)):
            self.faults.append(f'{name}: no prose')
        for each in self.objects:
            if each['class'] not in self.tables or described.count(each['class']) > 1:
                self.faults.append(f'{each["class"]}: no such class, or twice')
            else:
                self.check_object(each, self.tables[each['class']])
        for page in self.pages:
            self.check_quirks(page['title'], page['about'])
        self.check_quirks('README.md', ABOUT)

    def check_object(self, described, table):
        members = {member['name']: member for member in table['members']}
        for name in members.keys() - described['members'].keys():
            self.faults.append(f'{described["name"]}.{name}: no prose')
        for name in described['members'].keys() - members.keys():
            self.faults.append(f'{described["name"]}.{name}: no such member')
        for name in members.keys() & set(described.get('missing', [])):
            self.faults.append(f'{described["name"]}.{name}: listed as missing')
        for name in members.keys() & described['members'].keys():
            self.check_member(f'{described["name"]}.{name}', members[name], described['members'][name])
        for prose in [described['about'], *described.get('events', {}).values()]:
            self.check_quirks(described['name'], prose)

    def check_member(self, where, member, text):
        is_constant = isinstance(text, str)
        *types, prose = [text] if is_constant else text
        self.check_quirks(where, prose)
        if is_constant != (member['kind'] == 'constant') or (not is_constant and not types):
            self.faults.append(f'{where}: a {member["kind"]} is described as something else')
            return
        for each in types:
            for name in re.findall(r'\b[A-Z]\w*', each):
                if name not in self.types:
                    self.faults.append(f'{where}: unknown type {name}')
        if member['kind'] == 'property':
            self.check_property(where, member, types)
        elif member['kind'] == 'method':
            self.check_method(where, member, types)

    def check_property(self, where, member, types):
        if len(types) != 1 or parse_signature(types[0]):
            self.faults.append(f'{where}: a property has one type')
            return
        self.check_result(where, member['result'], types[0])
        for written in member['arguments']:
            if written != base_type(types[0]):
                self.faults.append(f'{where}: written as {written}, described as {types[0]}')

    def check_method(self, where, member, types):
        signatures = [parse_signature(each) for each in types]
        if None in signatures:
            self.faults.append(f'{where}: a method has signatures')
        elif member['result'] != 'unstated':
            arguments, result = signatures[0]
            self.check_result(where, member['result'], result)
            if len(signatures) > 1 or [base_type(each) for each in arguments] != member['arguments']:
                self.faults.append(f'{where}: takes {member["arguments"]}, described as {types}')

    def check_result(self, where, result, described):
        """Strings and objects are null where there is none; numbers and flags never are."""
        if result == 'unstated':
            return
        if base_type(described) != result or is_nullable(described) != (result in ('string', 'object')):
            self.faults.append(f'{where}: gives {result}, described as {described}')

    def check_quirks(self, where, prose):
        for numbers in re.findall(r'quirks? (\d+(?:(?:, | and )\d+)*)', prose):
            for number in map(int, re.findall(r'\d+', numbers)):
                if number not in self.quirks:
                    self.faults.append(f'{where}: no quirk {number}')

    # ---- Markdown

    def markdown(self):
        """The files of the reference by name."""
        files = {f'{page["file"]}.md': self.page_text(page) for page in self.pages}
        rows = [f'| {self.mime_types(described)} | `{described["name"]}` | [{page["title"]}]({page["file"]}.md) |'
                for page in self.pages for described in page['object']
                if self.tables[described['class']]['mimeTypes']]
        files['README.md'] = ABOUT.format(rows='\n'.join(rows))
        return files

    def mime_types(self, described):
        return ', '.join(f'`{each}`' for each in self.tables[described['class']]['mimeTypes'])

    def page_text(self, page):
        lines = [f'# {page["title"]}', '', '<!-- Made by tools/make_reference.py from names.toml and the tables of the '
                 'plug-in. -->', '', page['about'].strip(), '']
        lines += [f'    {line}'.rstrip() for line in page['example'].strip('\n').splitlines()]
        for described in page['object']:
            lines += self.object_lines(described)
        return '\n'.join(lines) + '\n'

    def object_lines(self, described):
        table = self.tables[described['class']]
        lines = ['', f'## {described["name"]}', '', described['about'].strip()]
        if table['mimeTypes']:
            lines.append(f'Types of the element: {self.mime_types(described)}.')
        if table['isArray']:
            lines.append('Items are also read as `list[index]`.')
        for kind, title, columns in (('property', 'Property', 'Type | Access | Meaning'),
                                     ('method', 'Method', 'Meaning'), ('constant', 'Constant', 'Value | Meaning')):
            rows = [self.row(member, described['members'][member['name']]) for member in table['members']
                    if member['kind'] == kind]
            if rows:
                lines += ['', f'| {title} | {columns} |', '|---' * (columns.count('|') + 2) + '|', *rows]
        if 'events' in described:
            lines += ['', '| DOM event | Meaning |', '|---|---|']
            lines += [f'| `{name}` | {prose} |' for name, prose in described['events'].items()]
        if described.get('missing'):
            lines += ['', 'Missing: ' + ', '.join(f'`{name}`' for name in described['missing']) + '.']
        return lines

    @staticmethod
    def row(member, text):
        if member['kind'] == 'constant':
            return f'| `{member["name"]}` | {member["value"]} | {text} |'
        *types, prose = [each.replace('|', '\\|') for each in text]
        if member['kind'] == 'method':
            forms = '<br>'.join(f'`{member["name"]}{each}`' for each in types)
            return f'| {forms} | {prose} |'
        access = 'read, write' if member['writable'] else 'read'
        return f'| `{member["name"]}` | `{types[0]}` | {access} | {prose} |'

    # ---- TypeScript

    def declarations(self):
        blocks = [self.interface(described) for described in self.objects]
        body = '\n'.join(blocks + [STREAM_EVENT]).rstrip('\n')
        indented = '\n'.join(f'    {line}'.rstrip() for line in body.splitlines())
        return ('// The objects of the plug-in. Made by tools/make_reference.py from names.toml and the tables of the '
                f'plug-in.\ndeclare namespace telix {{\n{indented}\n}}\n')

    def interface(self, described):
        table = self.tables[described['class']]
        parent = ''
        if table['mimeTypes']:
            own = [f"'{name}'" for name in ELEMENT_MEMBERS if name in described['members']]
            parent = f' extends Omit<HTMLObjectElement, {" | ".join(own)}>' if own else ' extends HTMLObjectElement'
        lines = [f'/** {" ".join(described["about"].split())} */', f'interface {described["name"]}{parent} {{']
        for member in table['members']:
            lines += [f'    {line}' for line in self.member_lines(member, described['members'][member['name']])]
        if table['isArray']:
            item = parse_signature(described['members']['item'][0])[1].removesuffix(' | null')
            lines.append(f'    readonly [index: number]: {item} | undefined;')
        return '\n'.join(lines + ['}']) + '\n'

    @staticmethod
    def member_lines(member, text):
        if member['kind'] == 'constant':
            return [f'/** {text} */', f'readonly {member["name"]}: {member["value"]};']
        *types, prose = text
        if member['kind'] == 'method':
            return [f'/** {prose} */', *(f'{member["name"]}{each};' for each in types)]
        return [f'/** {prose} */', f'{"" if member["writable"] else "readonly "}{member["name"]}: {types[0]};']

    def examples(self):
        """The examples of all pages, as one script."""
        return '\n'.join(f'(function () {{\n{page["example"].strip()}\n}}());' for page in self.pages) + '\n'


def read_quirks(path):
    with open(path, encoding='utf-8') as file:
        return {int(row[1]) for row in re.finditer(r'^\| (\d+) \|', file.read(), re.MULTILINE)}


def stale_files(files, folder):
    """The files of the folder that are not as they would be made."""
    stale = []
    for name, text in files.items():
        try:
            with open(os.path.join(folder, name), encoding='utf-8') as file:
                current = file.read()
        except FileNotFoundError:
            current = None
        if current != text:
            stale.append(f'{name}: stale, run tools/make_reference.py')
    made = {name for name in os.listdir(folder) if name.endswith(('.md', '.d.ts'))}
    return stale + [f'{name}: made from nothing' for name in sorted(made - files.keys())]


def fail(reason):
    print(f'make_reference.py: {reason}', file=sys.stderr)
    sys.exit(2)


def main():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument('tables', metavar='PROGRAM', help='telix_script_tables in the build folder')
    parser.add_argument('--names', default=os.path.join(FOLDER, 'names.toml'), metavar='FILE', help='the prose')
    parser.add_argument('--folder', default=FOLDER, metavar='FOLDER', help='where the files are (default: docs/api)')
    parser.add_argument('--check', action='store_true', help='write nothing; stale files are errors')
    parser.add_argument('--examples', metavar='FILE', help='also write the examples to FILE, as one script')
    arguments = parser.parse_args()

    try:
        tables = json.loads(subprocess.run([arguments.tables], stdout=subprocess.PIPE, check=True).stdout)
        with open(arguments.names, 'rb') as file:
            pages = tomllib.load(file)['page']
    except (OSError, subprocess.SubprocessError, ValueError) as error:
        fail(f'{arguments.tables}, {arguments.names}: {error}')
    reference = Reference(pages, tables, read_quirks(QUIRKS))
    faults = reference.faults
    if not faults:
        files = {**reference.markdown(), 'telix.d.ts': reference.declarations()}
        if arguments.check:
            faults = stale_files(files, arguments.folder)
        else:
            for name, text in files.items():
                with open(os.path.join(arguments.folder, name), 'w', encoding='utf-8') as file:
                    file.write(text)
        if arguments.examples:
            with open(arguments.examples, 'w', encoding='utf-8') as file:
                file.write(reference.examples())
    for fault in sorted(faults):
        print(f'make_reference.py: {fault}', file=sys.stderr)
    sys.exit(1 if faults else 0)


if __name__ == '__main__':
    main()
