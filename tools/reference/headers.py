"""The public headers as data: every declaration of include/, with the comment above it as it is written there.

Everything that describes the library to others is made from this one reading: the manual pages, the HTML pages, the
declarations and docstrings of the Python module.
"""
import dataclasses
import functools
import pathlib
import re

from pycparser import c_ast, c_generator, c_parser

TREE = pathlib.Path(__file__).resolve().parents[2]

# Lines that a comment may hold for the indexes, each a list that ends with the line or goes on in deeper lines.
FIXED_LINES = ("Files", "Runs", "Errors", "Locks")

# What the headers take from the system's headers.
_SYSTEM_TYPES = "".join(f"typedef {old} {new}; " for old, new in (
    ("signed char", "int8_t"), ("unsigned char", "uint8_t"), ("short", "int16_t"), ("unsigned short", "uint16_t"),
    ("int", "int32_t"), ("unsigned int", "uint32_t"), ("long long", "int64_t"), ("unsigned long long", "uint64_t"),
    ("int", "pid_t"), ("unsigned long", "size_t"), ("struct FILE", "FILE")))


@dataclasses.dataclass
class Comment:
    text: str                                   # without the marks and without the fixed lines
    fixed: dict = dataclasses.field(default_factory=dict)  # "Files" and so on: lists of items


@dataclasses.dataclass
class Name:
    """An exported name, function or datum."""
    name: str
    kind: str                # "function" or "datum"
    prototype: str           # as C, without the semicolon
    returns: str             # the type; of a datum its own
    parameters: list         # names, in order; "..." for a variable list
    comment: Comment
    section: Comment         # the comment above a whole part of the header
    line: int
    group: list = dataclasses.field(default_factory=list)  # the names that one comment describes
    family: "Family" = None

    def declaration(self, width=72):
        """The declaration in lines of that width."""
        text = self.prototype + ";"
        if len(text) <= width or "(" not in text:
            return [text]
        head, _, rest = text.partition("(")
        lines, current = [], head + "("
        for part in rest.split(", "):
            part += "" if part.endswith(";") else ","
            if len(current) + len(part) > width:
                lines.append(current.rstrip())
                current = "    " + part + " "
            else:
                current += part + " "
        return lines + [current.rstrip()]


@dataclasses.dataclass
class Record:
    """A type that a header describes, as it is written there."""
    name: str
    code: str
    comment: Comment


@dataclasses.dataclass
class Family:
    name: str                # "user" for tavo_user.h
    header: str
    title: str               # the first line of the header
    intro: Comment
    names: list
    records: list
    declarations: list       # of pycparser, types too
    constants: list          # (name, value or None, remark) of enums and #defines
    strings: set             # the #defines among them that are texts
    code: str                # the header without comments and preprocessor lines


def families():
    """All families, in the order of their names."""
    return sorted(in_order(), key=lambda family: family.name)


def in_order():
    """All families, each after those whose types it uses."""
    return _read(TREE / "include")


@functools.cache
def _read(folder):
    result = []
    known = {}
    for header in _in_order(folder):
        result.append(_read_header(header, known))
    return result


def _in_order(folder):
    """Headers after those that they include."""
    done, order = set(), []

    def visit(path):
        if path in done:
            return
        done.add(path)
        for name in re.findall(r'^#include "(.+)"', path.read_text(), re.M):
            visit(folder / name)
        order.append(path)

    for path in sorted(folder.glob("tavo_*.h")):
        visit(path)
    return order


def _read_header(path, known):
    source = path.read_text()
    comments = {}  # line of the end -> (line of the beginning, raw text)
    for found in re.finditer(r"/\*.*?\*/", source, re.S):
        begins = source.count("\n", 0, found.start()) + 1
        comments[begins + found.group().count("\n")] = (begins, found.group())
    lines = _without_comments(source).split("\n")
    constants, strings = _macros(source)
    code = _plain_code(lines)
    # All on the first line, which is a comment in every header: the line numbers stay those of the header.
    text = (_SYSTEM_TYPES + " ".join(known.values())).replace("\n", " ") + code
    tree = c_parser.CParser().parse(text, path.name)
    own = [node for node in tree.ext if node.coord.line > 1]
    for node in own:
        if isinstance(node, c_ast.Typedef):
            known[node.name] = c_generator.CGenerator().visit(node) + ";"
        elif isinstance(node, c_ast.Decl) and node.name is None and isinstance(node.type, c_ast.Struct) \
                and node.type.decls:
            known["struct " + node.type.name] = c_generator.CGenerator().visit(node) + ";"
    title, intro = _intro(comments)
    family = Family(path.stem.removeprefix("tavo_"), path.name, title, intro, [], _records(source), own, constants,
                    strings, code)
    constants += _enumerators(own, source.split("\n"))
    _collect_names(family, source.split("\n"), lines, comments, own)
    return family


def _without_comments(source):
    """The same lines, the comments blank."""
    return re.sub(r"/\*.*?\*/", lambda found: "\n" * found.group().count("\n"), source, flags=re.S)


def _plain_code(lines):
    """C99 that a parser without a preprocessor understands, line by line."""
    text = "\n".join("" if line.lstrip().startswith("#") else line for line in lines)
    text = re.sub(r"\\\n", " \n", text)
    text = re.sub(r"\b(TAVO_BEGIN_DECLS|TAVO_END_DECLS|TAVO_API|__extension__)\b", "", text)
    return re.sub(r"__attribute__\s*\(\(.*?\)\)+", "", text)


def _macros(source):
    constants, strings = [], set()
    for name, value, remark in re.findall(
            r'^#define (TAVO_\w+) +("[^"]*"|[0-9]\w*)[ \t]*(?:/\* *(.*?) *\*/)?', source, re.M):
        constants.append((name, value.rstrip("u"), remark))
        if value.startswith('"'):
            strings.add(name)
    return constants, strings


_RECORD = re.compile(
    r"^(?:typedef struct[^;{]*\{.*?^\} (\w+);|struct (\w+) \{.*?^\};|typedef \w+ \(\*(\w+)\)[^;]*;)", re.M | re.S)


def _records(source):
    found = []
    for record in _RECORD.finditer(source):
        above = re.search(r"/\*(?:(?!\*/).)*\*/\n\Z", source[:record.start()], re.S)
        comment = read_comment(above.group().strip()) if above else Comment("")
        found.append(Record(next(filter(None, record.groups())), record.group(), comment))
    return found


def _enumerators(nodes, lines):
    found = []
    for node in nodes:
        enum = getattr(node, "type", None)
        enum = getattr(enum, "type", enum) if not isinstance(enum, c_ast.Enum) else enum
        if not isinstance(enum, c_ast.Enum) or not enum.values:
            continue
        for entry in enum.values.enumerators:
            line = next((text for text in lines if re.match(rf"\s*(enum {{.*)?\b{entry.name}\b", text)), "")
            remark = re.search(rf"\b{entry.name}\b.*?/\* *(.*?) *\*/", line)
            value = c_generator.CGenerator().visit(entry.value) if entry.value else None
            found.append((entry.name, value, remark.group(1) if remark else ""))
    return found


def _strip_marks(raw):
    """The lines of a comment without the marks of C; the indentation after them stays."""
    body = raw[2:-2]
    lines = [re.sub(r"^\s*\* ?", "", line).rstrip() if number else line.lstrip()
             for number, line in enumerate(body.split("\n"))]
    while lines and not lines[0].strip():
        lines.pop(0)
    while lines and not lines[-1].strip():
        lines.pop()
    return [line.rstrip() for line in lines]


def read_comment(raw):
    """The text of a comment, and its fixed lines by their names."""
    text, fixed, current = [], {}, None
    for line in _strip_marks(raw):
        named = re.match(rf"({'|'.join(FIXED_LINES)}): (.+)", line)
        if named:
            current = named.group(1)
            fixed[current] = named.group(2)
        elif current and line.startswith("  "):
            fixed[current] += " " + line.strip()
        else:
            current = None
            text.append(line)
    items = {name: [item.strip() for item in re.split(r",\s+(?![^(]*\))", value.rstrip("."))]
             for name, value in fixed.items()}
    return Comment("\n".join(text).strip("\n"), items)


def _intro(comments):
    raw = comments[min(comments)][1]
    comment = read_comment(raw)
    title, _, rest = comment.text.partition("\n")
    # A header's first sentence may take two lines.
    while not title.rstrip().endswith((".", ":")) and rest and not rest.startswith("\n"):
        more, _, rest = rest.partition("\n")
        title += " " + more
    comment.text = rest.strip("\n")
    return title.strip(), comment


def _collect_names(family, source_lines, lines, comments, nodes):
    sections = _sections(source_lines, comments)
    current, described, last_line = None, [], 0
    for node in nodes:
        if not isinstance(node, c_ast.Decl) or node.name is None:
            continue
        first = node.coord.line
        # The declaration begins where TAVO_API is; pycparser names the line of the declared word.
        while "TAVO_API" not in source_lines[first - 1]:
            first -= 1
        blank_between = any(not source_lines[number - 1].strip() for number in range(last_line + 1, first))
        if first - 1 in comments:
            current, described = read_comment(comments[first - 1][1]), []
        elif blank_between or last_line == 0:
            current, described = Comment(""), []
        last_line = node.coord.line
        while ";" not in lines[last_line - 1]:
            last_line += 1
        prototype = _prototype(lines, first, last_line)
        returns = re.match(rf"(?:extern )?(.*?)\s*\b{node.name}\b", prototype).group(1)
        function = isinstance(node.type, c_ast.FuncDecl)
        parameters = []
        for parameter in node.type.args.params if function and node.type.args else []:
            if isinstance(parameter, c_ast.EllipsisParam):
                parameters.append("...")
            elif parameter.name:
                parameters.append(parameter.name)
        remark = re.search(r"/\* *(.*?) *\*/", source_lines[last_line - 1])
        comment = current
        if remark and not current.text:
            comment = Comment(remark.group(1))
        entry = Name(node.name, "function" if function else "datum", prototype, returns, parameters,
                     comment, sections(first), first, described, family)
        described.append(entry.name)
        family.names.append(entry)


def _sections(source_lines, comments):
    """Finds the comment that heads the part of the header in which a line is: one that a blank line follows."""
    headings = {}
    for end in sorted(comments)[1:]:
        begin, raw = comments[end]
        if source_lines[begin - 1].startswith("/*") and not source_lines[end].strip() and "clang-format" not in raw:
            comment = read_comment(raw)
            comment.text = re.sub(r"^--- *| *---$", "", comment.text)
            headings[end] = comment

    def section(line):
        before = [end for end in headings if end < line]
        return headings[max(before)] if before else Comment("")

    return section


def _prototype(lines, first, last):
    text = " ".join(line.strip() for line in lines[first - 1:last])
    text = re.sub(r"\bTAVO_API\b ?", "", text)
    return re.sub(r"\s+", " ", text).strip().rstrip(";")


def names():
    """Every exported name by itself."""
    return {entry.name: entry for family in families() for entry in family.names}


def records():
    """Every type that the headers describe."""
    return {record.name: record for family in families() for record in family.records}


def records_of(entry):
    """The types in the declarations that one comment describes, each before those that it is made of."""
    known = records()
    text = " ".join(other.prototype for other in entry.family.names if other.name in (entry.group or [entry.name]))
    found, waiting = [], re.findall(r"\w+", text)
    while waiting:
        name = waiting.pop(0)
        if name in known and known[name] not in found:
            found.append(known[name])
            waiting += re.findall(r"\w+", re.sub(r"/\*.*?\*/", "", known[name].code, flags=re.S))
    return found


def map_names():
    """What the version script lets out of the library."""
    script = re.sub(r"/\*.*?\*/", "", (TREE / "lib/tavosdk.map").read_text(), flags=re.S)
    return set(re.findall(r"(\w+);", script.partition("global:")[2].partition("local:")[0]))


def codes():
    """The error codes: name to (value, remark)."""
    found = {}
    for family in families():
        for name, value, remark in family.constants:
            if name.startswith("ERR_"):
                found[name] = (value, remark)
    return found
