#!/usr/bin/env python3
"""Expands the public header for Doxygen, which cannot read between the lines.

The header says each thing once: a family of functions shares a comment, the functions of every
record are described in the head of their section, and so is the parameter that all operations
have. Doxygen wants a comment at each declaration, so this filter writes them out:

  - the head of a section becomes a group;
  - a declaration without a comment of its own gets that of its family, without the parameters
    that it does not have;
  - a row "<kind>_list_new   makes an empty list;" in the head of a section describes every
    function whose name fits, and a row "quickkey   key of the file" in the comment of a record
    describes the getter of that field;
  - a point "- error_message receives ..." in the head of a section describes that parameter
    wherever it is not described.
"""
import re
import sys

TOKEN = re.compile(
    r'(?P<comment>/\*.*?\*/)|(?P<directive>#(?:\\\n|[^\n])*)|(?P<gap>\n\s*\n)|(?P<space>\s+)'
    r'|(?P<linkage>extern "C" \{|\})|(?P<statement>(?:\{(?:/\*.*?\*/|[^{}])*\}|/\*.*?\*/|[^{};])+;)', re.S)
ROW = re.compile(r' {2,3}(\S(?:.*?\S)?) {2,}(\S.*)')
POINT = re.compile(r' *- (\w+) (receives .*)')
PARAMETER = re.compile(r'@param (\w+)')


def body(comment):
    """The lines of a comment without its decoration."""
    text = re.sub(r'^/\*\*?<?|\*/$', '', comment)
    return [re.sub(r'^\s*\* ?', '', line).rstrip() for line in text.strip().split('\n')]


def is_more(line, indent):
    """Whether a line goes on with what stands above it, which began at that indent."""
    return bool(line.strip()) and len(line) - len(line.lstrip()) > indent


def blocks(lines, start):
    """The (match, whole text) of each block that begins with a match and goes on indented."""
    found = []
    indent = None
    for line in lines:
        match = start.match(line)
        if match:
            indent = len(line) - len(line.lstrip())
            found.append([match, match[2]])
        elif indent is not None and is_more(line, indent):
            found[-1][1] += ' ' + line.strip()
        else:
            indent = None
    return [(match, text.rstrip(';.') + '.') for match, text in found]


def escaped(text):
    return re.sub(r'([\\<>*])', r'\\\1', text).replace('"%"', "percent sign")


def documentation(lines):
    """Lines as Doxygen takes them: rows become points of a list."""
    out = []
    in_row = False
    for line in lines:
        row = ROW.match(line) if not line.lstrip().startswith(('-', '@')) else None
        if row:
            out.append('- ' + escaped(row[1]) + ': ' + escaped(row[2]))
        elif in_row and is_more(line, 3):
            out.append('  ' + escaped(line.strip()))
        else:
            out.append(escaped(line))
        in_row = bool(row) or (in_row and is_more(line, 3))
    return '/**\n' + '\n'.join(' * ' + line for line in out) + '\n */\n'


def without_foreign_parameters(lines, parameters):
    """A family's comment as it concerns a function with these parameters."""
    kept = []
    foreign = False
    for line in lines:
        match = PARAMETER.match(line)
        if match:
            foreign = match[1] not in parameters
        elif not is_more(line, 0):
            foreign = False
        if not foreign:
            kept.append(line)
    return kept


class Section:
    """The head of a section: its title, and what it says about the declarations in it."""

    def __init__(self, lines):
        lines = lines[1:-1]  # the rules above and below
        title = re.match(r'[^.:]*', lines[0])[0].strip()
        rest = lines[0][len(title):].lstrip('.: ')
        self.lines = ([rest[0].upper() + rest[1:]] if rest else []) + lines[1:]
        self.title = title
        self.patterns = []
        for match, text in blocks(self.lines, ROW):
            if '<' in match[1]:
                name = re.sub(r'<(\w+)>', r'(\\w+)', match[1])
                self.patterns.append((re.compile(name + '$'), text))
        self.parameters = {match[1]: text for match, text in blocks(self.lines, POINT)}

    def opening(self):
        name = re.sub(r'\W+', '_', self.title.lower())
        return documentation(['@defgroup %s %s' % (name, self.title), ''] + self.lines) + '/** @{ */\n'

    def describes(self, name):
        return [text for pattern, text in self.patterns if pattern.match(name)]


class Expander:
    def __init__(self):
        self.out = []
        self.section = None
        self.family = []  # the comment in force
        self.record = None  # the opaque record whose functions follow
        self.fields = {}
        self.pending = None  # a declaration that may yet get a comment behind it

    def comment(self, text):
        if text.startswith('/**<'):
            self.flush(body(text))
            return
        self.flush()
        if text.startswith('/* ---'):
            if self.section:
                self.out.append('/** @} */\n')
            self.section = Section(body(text))
            self.out.append(self.section.opening())
            self.family = []
        elif text.startswith('/**') and '@file' in text:
            self.out.append(documentation(body(text)))
        elif text.startswith('/**'):
            self.family = body(text)
            self.record = None

    def gap(self):
        if not self.record:
            self.flush()
            self.family = []

    def statement(self, text):
        self.flush()
        self.pending = text

    def flush(self, behind=None):
        """Writes the declaration that was read last, now that all its comments are known."""
        text, self.pending = self.pending, None
        if text is None:
            return
        opaque = re.match(r'typedef struct (\w+) \1;', text)
        if opaque:
            self.record = opaque[1]
            self.fields = {match[1]: row for match, row in blocks(self.family, ROW)}
        function = re.search(r'(\w+)\(([^()]*)\)(?: QM_PRINTF_LIKE.*)?;$', text, re.S)
        if behind:
            self.out.append(documentation(behind + [''] + self.family))
        elif function and 'QM_API' in text and '(*' not in text:
            self.out.append(documentation(self.of_function(function[1], function[2])))
        elif self.family:
            self.out.append(documentation(self.family))
        self.out.append(text + '\n')

    def of_function(self, name, arguments):
        parameters = re.findall(r'(\w+)\s*(?:,|$)', arguments)
        described = self.section.describes(name) if self.section else []
        if described:
            return self.of_pattern(name, described[0])
        lines = without_foreign_parameters(self.family, parameters)
        mentioned = [match[1] for match in map(PARAMETER.match, lines) if match]
        for parameter in parameters:
            if mentioned and parameter not in mentioned and parameter in self.section.parameters:
                lines = lines + ['@param %s %s' % (parameter, self.section.parameters[parameter])]
        return lines

    def of_pattern(self, name, text):
        text = text[0].upper() + text[1:]
        getter = self.record and re.match(self.record + r'_get_(\w+)$', name)
        if not getter:
            return [text]
        field = self.fields.get(getter[1])
        return [field[0].upper() + field[1:], '', text] if field else []

    def expand(self, header):
        position = 0
        while position < len(header):
            match = TOKEN.match(header, position)
            if not match:
                sys.exit('cannot read the header at: ' + header[position:position + 60])
            position = match.end()
            if match['comment']:
                self.comment(match['comment'])
            elif match['gap']:
                self.gap()
            elif match['statement']:
                self.statement(match['statement'])
            elif match['directive'] or match['linkage']:
                self.flush()
                if match['directive'] and self.family:
                    self.out.append(documentation(self.family))
                self.out.append(match[0] + '\n')
        self.flush()
        return ''.join(self.out) + '/** @} */\n'


with open(sys.argv[1], encoding='utf-8') as file:
    print(Expander().expand(file.read()))
