"""The mutants of a C++ source: small faults, each of which a test should notice. tools/mutate.py runs them.

All mutants of a source are compiled into it at once, each behind a condition that tests/mutation/Mutant.h has the
environment decide, so a build serves them all. What stands in a macro, in a header or in a declaration of its own, such as that
of a lock, is left as it is."""

import dataclasses
import difflib
import re

from clang import cindex
from clang.cindex import CursorKind, TypeKind

OPERATORS = {
    '<': ('less', '<='), '<=': ('lessOrEqual', '<'), '>': ('greater', '>='), '>=': ('greaterOrEqual', '>'),
    '==': ('equal', '!='), '!=': ('notEqual', '=='), '+': ('plus', '-'), '-': ('minus', '+'), '*': ('times', '/'),
    '/': ('dividedBy', '*'), '%': ('modulo', '*'), '&': ('bitAnd', '|'), '|': ('bitOr', '&'),
    '<<': ('shiftLeft', '>>'), '>>': ('shiftRight', '<<'),
}
EQUALITY = ('==', '!=')  # also as functions of a class
STATEMENTS = (CursorKind.CALL_EXPR, CursorKind.BINARY_OPERATOR, CursorKind.COMPOUND_ASSIGNMENT_OPERATOR,
              CursorKind.UNARY_OPERATOR, CursorKind.CXX_DELETE_EXPR, CursorKind.UNEXPOSED_EXPR,
              CursorKind.BREAK_STMT, CursorKind.CONTINUE_STMT)
NUMBERS = (CursorKind.INTEGER_LITERAL, CursorKind.FLOATING_LITERAL)
LOOPS = (CursorKind.WHILE_STMT, CursorKind.FOR_STMT, CursorKind.DO_STMT)
FIXED = (CursorKind.ENUM_DECL, CursorKind.STATIC_ASSERT, CursorKind.PARM_DECL, CursorKind.FIELD_DECL)
BLOCKS = (CursorKind.COMPOUND_STMT, CursorKind.CASE_STMT, CursorKind.DEFAULT_STMT)
LOG = re.compile(r'PLUGIN_LOG|GST_(DEBUG|INFO|LOG|WARNING|ERROR)|g_(debug|message|warning)')
NOTHING = ('', '{}', 'nullptr', 'false', '0')  # results that a mutant without a result equals


@dataclasses.dataclass
class Mutant:
    """One fault: the characters from `start` to `end` of the source become `text`, as a person would write it. `edits` are
    the same behind the condition: (start, end, text) with `{}` for the mutant's number; the first and the last enclose what
    may hold other mutants."""
    kind: str
    start: int
    end: int
    text: str
    edits: list
    relaxes: bool = False  # replaces a constexpr, which other code may depend on
    number: int = 0
    path: str = ''
    line: int = 0

    def diff(self, source):
        mutated = source[:self.start] + self.text + source[self.end:]
        lines = difflib.unified_diff(source.splitlines(), mutated.splitlines(), self.path, self.path, n=1, lineterm='')
        return '\n'.join(lines)


def enclosed(kind, start, end, source, before, after, text):
    return Mutant(kind, start, end, text(source[start:end]), [(start, start, before), (end, end, after)])


class Finder:
    """Collects the mutants of one parsed source."""

    def __init__(self, unit, source):
        self.source = source
        self.mutants = []
        self._file = unit.spelling
        # Offsets of the library are of bytes.
        data = source.encode()
        self._characters = None if len(data) == len(source) else self._character_offsets(data)
        self._macros = [self._span(cursor) for cursor in unit.cursor.get_children()
                        if cursor.kind == CursorKind.MACRO_INSTANTIATION and self._is_here(cursor)]
        for cursor in unit.cursor.get_children():
            if self._is_here(cursor) and not cursor.kind.is_preprocessing():
                self._visit(cursor, None, None)

    @staticmethod
    def _character_offsets(data):
        offsets = []
        for index, character in enumerate(data.decode()):
            offsets.extend([index] * len(character.encode()))
        return offsets + [len(data.decode())]

    def _is_here(self, cursor):
        return cursor.location.file is not None and cursor.location.file.name == self._file

    def _span(self, cursor):
        start, end = cursor.extent.start.offset, cursor.extent.end.offset
        return (self._characters[start], self._characters[end]) if self._characters else (start, end)

    def _text(self, cursor):
        start, end = self._span(cursor)
        return self.source[start:end]

    def _in_macro(self, start, end):
        return any(start < macro_end and end > macro_start for macro_start, macro_end in self._macros
                   if not (start <= macro_start and macro_end <= end and (start, end) != (macro_start, macro_end)))

    def _add(self, mutant):
        if mutant and mutant.start < mutant.end and not self._in_macro(mutant.start, mutant.end):
            mutant.line = self.source.count('\n', 0, mutant.start) + 1
            mutant.path = self._file
            self.mutants.append(mutant)

    def _visit(self, cursor, parent, constant):
        """`constant`: the constexpr variable that the cursor is in."""
        if cursor.kind in FIXED:
            return
        if cursor.kind == CursorKind.VAR_DECL and self._text(cursor).startswith('constexpr ', self._constexpr_at(cursor)):
            constant = cursor
        for mutant in self._mutants_of(cursor, parent):
            if constant and mutant:
                self._relax(mutant, constant)
            self._add(mutant)
        children = list(cursor.get_children())
        if cursor.kind == CursorKind.CASE_STMT:
            children = children[1:]
        for child in children:
            self._visit(child, cursor, constant)

    def _constexpr_at(self, cursor):
        return len('static ') if self._text(cursor).startswith('static ') else 0

    def _relax(self, mutant, constant):
        start = self._span(constant)[0] + self._constexpr_at(constant)
        mutant.edits.append((start, start + len('constexpr'), 'const'))
        mutant.relaxes = True

    def _mutants_of(self, cursor, parent):
        kind = cursor.kind
        if parent is not None and parent.kind in BLOCKS:
            yield self._dropped(cursor)
        if kind == CursorKind.IF_STMT or kind == CursorKind.CONDITIONAL_OPERATOR or kind in LOOPS:
            yield from self._decided(cursor)
        if kind == CursorKind.BINARY_OPERATOR:
            yield from self._operator_mutants(cursor, *cursor.get_children())
        elif kind == CursorKind.CALL_EXPR and cursor.spelling in ('operator==', 'operator!='):
            operands = list(cursor.get_arguments())
            if len(operands) == 2:
                yield from self._operator_mutants(cursor, *operands)
        elif kind == CursorKind.UNARY_OPERATOR and self._text(cursor).startswith('!'):
            start, end = self._span(cursor)
            yield enclosed('drop negation', start, end, self.source, '(::telix_mutation::isOn({}) != (', '))',
                           lambda text: text[1:])
        elif kind == CursorKind.RETURN_STMT:
            yield self._returned(cursor)
        elif kind in NUMBERS or kind == CursorKind.CHARACTER_LITERAL:
            yield self._number(cursor)
        elif kind == CursorKind.CXX_BOOL_LITERAL_EXPR:
            yield self._boolean(cursor)
        elif kind == CursorKind.STRING_LITERAL:
            yield self._string(cursor)

    def _dropped(self, cursor):
        """A statement that is skipped."""
        empty_return = cursor.kind == CursorKind.RETURN_STMT and not list(cursor.get_children())
        if cursor.kind not in STATEMENTS and not empty_return:
            return None
        start, end = self._span(cursor)
        if LOG.match(self.source, start):
            return None
        rest = self.source[end:]
        semicolon = len(rest) - len(rest.lstrip())
        if not rest[semicolon:].startswith(';'):
            return None
        return Mutant('drop statement', start, end + semicolon + 1, '',
                      [(start, start, 'if (!::telix_mutation::isOn({})) ')])

    def _condition_of(self, cursor):
        """The condition of an if, a loop or an operator, None if it has none or declares a variable."""
        children = list(cursor.get_children())
        if cursor.kind == CursorKind.CONDITIONAL_OPERATOR:
            return children[0]
        if cursor.kind == CursorKind.DO_STMT:
            return children[1]
        if cursor.kind == CursorKind.FOR_STMT:
            return self._condition_of_for(cursor, children)
        if any(child.kind in (CursorKind.VAR_DECL, CursorKind.DECL_STMT) for child in children[:1]):
            return None
        return children[0] if children[0].kind.is_expression() else None

    def _condition_of_for(self, cursor, children):
        start, end = self._span(children[-1])
        head = children[:-1]
        for child in head:
            child_start, child_end = self._span(child)
            before = self.source[self._span(cursor)[0]:child_start].rstrip()
            after = self.source[child_end:start].lstrip()
            if child.kind.is_expression() and before.endswith(';') and after.startswith(';'):
                return child
        return None

    def _decided(self, cursor):
        """A condition that always has one result, and an else that is skipped. A loop only ends, it does not go on for ever."""
        condition = self._condition_of(cursor)
        if condition is not None:
            start, end = self._span(condition)
            yield enclosed('condition is false', start, end, self.source, '(!::telix_mutation::isOn({}) && (', '))',
                           lambda text: 'false')
            if cursor.kind not in LOOPS:
                yield enclosed('condition is true', start, end, self.source, '(::telix_mutation::isOn({}) || (', '))',
                               lambda text: 'true')
        elif cursor.kind == CursorKind.IF_STMT:
            yield self._declared(cursor)
        if cursor.kind == CursorKind.IF_STMT:
            yield self._else(cursor)

    def _declared(self, cursor):
        """The variable that an if declares counts as false."""
        first = next(cursor.get_children())
        declaration = next(first.get_children()) if first.kind == CursorKind.DECL_STMT else first
        start, end = self._span(declaration)
        if declaration.kind != CursorKind.VAR_DECL or not self.source[end:].lstrip().startswith(')'):
            return None
        name = declaration.spelling
        return Mutant('condition is false', start, end, f'{self.source[start:end]}; false',
                      [(start, start, ''), (end, end, f'; !::telix_mutation::isOn({{}}) && {name}')])

    def _else(self, cursor):
        children = list(cursor.get_children())
        if len(children) < 3 or not children[-2].kind.is_statement():
            return None
        start, end = self._span(children[-2])[1], self._span(children[-1])[0]
        if self.source[start:end].strip() != 'else':
            return None  # a comment or a macro between them
        start += self.source[start:end].index('else')
        return Mutant('drop else', start, self._span(children[-1])[1], '', [(end, end, 'if (!::telix_mutation::isOn({})) ')])

    def _operator_mutants(self, cursor, left, right):
        end, start = self._span(left)[1], self._span(right)[0]
        between = self.source[end:start]
        operator = between.strip()
        if operator in ('&&', '||'):
            for operand in (left, right):
                yield self._operand(operand, operator)
        elif operator in OPERATORS and (cursor.kind == CursorKind.BINARY_OPERATOR or operator in EQUALITY):
            yield self._swapped(cursor, (left, right), operator, end + between.index(operator))

    def _operand(self, operand, operator):
        """An operand that does not count."""
        start, end = self._span(operand)
        if operator == '&&':
            return enclosed('operand is true', start, end, self.source, '(::telix_mutation::isOn({}) || (', '))',
                            lambda text: 'true')
        return enclosed('operand is false', start, end, self.source, '(!::telix_mutation::isOn({}) && (', '))',
                        lambda text: 'false')

    def _swapped(self, cursor, sides, operator, position):
        function, replacement = OPERATORS[operator]
        start, end = self._span(cursor)
        after = position + len(operator)
        pointers = [side.type.get_canonical().kind == TypeKind.POINTER for side in sides]
        if self._in_macro(start, end) or (operator == '-' and all(pointers)):
            return None
        mutant = Mutant(f'{operator} becomes {replacement}', start, end,
                        self.source[start:position] + replacement + self.source[after:end],
                        [(start, start, f'::telix_mutation::{function}({{}}, '), (end, end, ')')])
        mutant.edits.insert(1, (position, after, ','))
        return mutant

    def _returned(self, cursor):
        """A result that is the default of its type."""
        children = list(cursor.get_children())
        start, end = self._span(cursor)
        if not children or self._text(children[0]) in NOTHING or children[0].type.kind == TypeKind.VOID:
            return None
        constant = children[0].referenced
        if constant is not None and constant.kind == CursorKind.ENUM_CONSTANT_DECL and constant.enum_value == 0:
            return None
        return Mutant('return nothing', start, end, 'return {}',
                      [(start, start, 'if (::telix_mutation::isOn({})) {{ return {{}}; }} ')])

    def _number(self, cursor):
        start, end = self._span(cursor)
        before, after = '(', ' + ::telix_mutation::isOn({}))'
        if cursor.kind == CursorKind.CHARACTER_LITERAL:
            before = 'char('  # no integer where a character is appended or printed
        return enclosed('add 1', start, end, self.source, before, after, lambda text: f'({text} + 1)')

    def _boolean(self, cursor):
        start, end = self._span(cursor)
        opposite = {'true': 'false', 'false': 'true'}.get(self.source[start:end])
        if not opposite:
            return None
        return enclosed(f'{opposite} instead', start, end, self.source, '(::telix_mutation::isOn({}) != ', ')',
                        lambda text: opposite)

    def _string(self, cursor):
        start, end = self._span(cursor)
        if self.source[start:end] == '""' or not self.source[start:end].startswith(('"', 'R"')):
            return None
        return enclosed('empty string', start, end, self.source, '(::telix_mutation::isOn({}) ? "" : ', ')',
                        lambda text: '""')


def find(path, source, arguments):
    """The mutants of a source, in its order. `arguments` are those of its compiler that clang knows. ValueError if it cannot
    be parsed."""
    unit = cindex.Index.create().parse(path, args=arguments, unsaved_files=[(path, source)],
                                       options=cindex.TranslationUnit.PARSE_DETAILED_PROCESSING_RECORD)
    errors = [each for each in unit.diagnostics if each.severity >= cindex.Diagnostic.Error]
    if errors:
        raise ValueError(f'line {errors[0].location.line}: {errors[0].spelling}')
    mutants, seen = [], set()
    for mutant in Finder(unit, source).mutants:
        identity = (mutant.start, mutant.end, mutant.text)  # templates and implicit conversions are seen twice
        if identity not in seen:
            seen.add(identity)
            mutants.append(mutant)
    return mutants


def with_mutants(source, mutants):
    """The source with those mutants in it, on the lines that they had."""
    edits = set()
    for mutant in mutants:
        size = mutant.end - mutant.start
        for start, end, text in mutant.edits:
            replaces = start != end
            opens = start == mutant.start
            # At one place: what ends there from inside out, then what begins there from outside in.
            order = (1, -size, mutant.number) if replaces or opens else (0, size, -mutant.number)
            if replaces:
                order = (2, 0, 0)
            edits.add((start, order, end, text.format(mutant.number)))
    result, position = [], 0
    for start, _, end, text in sorted(edits):
        result.append(source[position:start] + text)
        position = max(position, end)
    return ''.join(result) + source[position:]
