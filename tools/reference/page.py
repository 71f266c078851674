"""A page about one exported name: its comment, sorted into the parts that a reader looks for."""
import dataclasses
import re

import headers
import sources

# Where a comment turns from what a function does to what it returns.
_RESULT = re.compile(
    r"(?:^|(?<=[.;:] )|(?<=\n))(?=(?:Returns?|Both return|They return|Fails|NULL with|NULL,|-1 with|-1,|-1:)\b|-1 with)")
# Where the comment of a section or a header speaks of what each of its functions returns.
_SHARED = re.compile(r"\b(?:fail with|[Rr]eturns?|[Cc]ommon codes)\b")
_PATH = re.compile(r"(?<![\w.<\"])/(?:etc|etc\.defaults|tmp|var|usr|sys|proc|dev)(?:/[\w.{}*-]+)+")


@dataclasses.dataclass
class Page:
    summary: str
    description: str
    result: str
    errors: list    # (code, explanation)
    files: list
    runs: list
    locks: list
    see_also: list


def sentence(text):
    """The first sentence of a text, in one line."""
    flat = re.sub(r"\s+", " ", text).strip()
    end = re.search(r"(?<!e\.g)[.;:](?= |$)", flat)
    return flat[:end.start()] if end else flat


def _summary(entry):
    text = sentence(entry.comment.text)
    first = text.split(" ")[0]
    if first[:1].isupper() and first[1:].islower():
        text = text[0].lower() + text[1:]
    return text


def split(entry):
    """What the comment says of what a function does, and of what it returns, which may be empty."""
    text = entry.comment.text
    found = _RESULT.search(text)
    if entry.returns == "void" or not found:
        return text, ""
    return text[:found.start()].strip(), text[found.start():].strip()


def _table(text):
    """The codes of a text, each with what is said of it: in a table, or in brackets after it."""
    errors = {}
    lines = text.split("\n")
    number = 0
    while number < len(lines):
        row = re.match(r"(\s{2,})(ERR_\w+(?:, ERR_\w+)*)(?:\s+|$)(.*)", lines[number])
        number += 1
        if not row:
            continue
        said = row.group(3)
        while number < len(lines) and re.match(r"\s{6,}\S", lines[number]) and "ERR_" not in lines[number][:12]:
            said += " " + lines[number].strip()
            number += 1
        for code in row.group(2).split(", "):
            errors.setdefault(code, said.strip())
    flat = re.sub(r"\s+", " ", text)
    for code, said in re.findall(r"\b(ERR_[A-Z0-9_]+)\b(?: \(([^()]*(?:\([^()]*\)[^()]*)*)\))?", flat):
        errors.setdefault(code, said)
    return errors


def without_tables(text):
    """The text without its tables of codes."""
    kept, in_table = [], False
    for line in text.split("\n"):
        if re.match(r"\s{2,}ERR_\w+", line):
            in_table = True
        elif not (in_table and re.match(r"\s{6,}\S", line)):
            in_table = False
            kept.append(line)
    return "\n".join(kept).strip()


def _list(entry, kind):
    """The items of a fixed line, of the function or of all functions of its header."""
    return [] if _only_releases(entry) else entry.comment.fixed.get(kind) or entry.family.intro.fixed.get(kind, [])


def _only_releases(entry):
    """Whether the comment is about another function, whose record this one releases."""
    return entry.returns == "void" and any(other.name in entry.group and other.returns != "void"
                                           for other in entry.family.names)


def _errors(entry, known):
    errors = {}
    if entry.kind == "function" and entry.returns != "void":
        errors = _table(entry.comment.text)
        for item in entry.comment.fixed.get("Errors", []):
            code, _, said = item.partition(" ")
            errors.setdefault(code, said.strip("()"))
        for shared in (entry.section, entry.family.intro):
            if entry.returns != "void" and _SHARED.search(shared.text):
                for code, said in _table(shared.text).items():
                    errors.setdefault(code, said)
    # Where the comment names a code alone, the header's own table explains it, else the code's remark or its name.
    family = _table(entry.family.intro.text) if entry.kind == "function" else {}
    return [(code, said or family.get(code) or known.get(code, ("", ""))[1] or
             code.removeprefix("ERR_").lower().replace("_", " ") + "; see RETURN VALUE")
            for code, said in errors.items() if code != "ERR_"]


def _files(entry):
    found = _list(entry, "Files") or ([] if _only_releases(entry) else _PATH.findall(entry.comment.text))
    return list(dict.fromkeys(path.rstrip(".") for path in found))


def _see_also(entry, names):
    wanted = [name for name in entry.group if name != entry.name]
    wanted += [name for name in re.findall(r"\b[A-Za-z]\w+\b", entry.comment.text) if name in names]
    siblings = [other.name for other in entry.family.names]
    at = siblings.index(entry.name)
    wanted += siblings[max(at - 1, 0):at] + siblings[at + 1:at + 2]
    return [name for name in dict.fromkeys(wanted) if name != entry.name][:12]


def _shared_result(entry):
    """What the section or the header says that its functions return."""
    for shared in (entry.section, entry.family.intro):
        text = without_tables(shared.text)
        for part in re.split(r"(?<=[.])\s+(?=[A-Z])", text):
            if re.search(r"\b[Rr]eturns?\b", part) and re.match(
                    r"(?:Unless|Each|All|Both|They|The functions|Functions|NULL|Raid)", part):
                return re.sub(r" with [A-Z].*", " with a code.", re.sub(r"\s+", " ", part))
        found = re.search(r"\bAll return .*", text, re.S)
        if found:
            return re.sub(r"\s+", " ", found.group())
        if text.rstrip().endswith("with") and "NULL with" in text:
            return "The list, or NULL with a code."
    return ""


def page_of(entry, names, known_codes):
    description, result = split(entry)
    if entry.returns != "void" and entry.kind == "function":
        if not result or result.startswith("Fails"):
            shared = _shared_result(entry)
            result = "\n".join(part for part in (shared, result or ("" if shared else entry.comment.text)) if part)
    return Page(_summary(entry), description or sentence(entry.comment.text) + ".", result,
                _errors(entry, known_codes), _files(entry), _list(entry, "Runs"), _list(entry, "Locks"),
                _see_also(entry, names))


def wanting(entry, page, names, known_codes):
    """What the page of a name lacks, or says wrongly, as a list of sentences."""
    lacks = []
    if not entry.comment.text:
        lacks.append("has no comment")
    if len(page.summary) < 8:
        lacks.append(f"its comment begins without a sentence: {page.summary!r}")
    if entry.kind == "function" and entry.returns != "void" and not re.search(
            r"\breturns?\b|\b(?:fails?|results?|code|text|NULL|number|length|[Aa]s|the same|one|whether|else|size|"
            r"index|copy|records?|row|ids?|path|bits|handlers?)\b|-?\b[0-2]\b", page.result, re.I):
        lacks.append(f"does not say what it returns ({entry.returns})")
    for code in re.findall(r"\bERR_[A-Z0-9_]+\b", entry.comment.text):
        if code not in known_codes and not code.endswith("_"):
            lacks.append(f"names a code that does not exist: {code}")
    for item in entry.comment.fixed.get("Errors", []):
        if item.split(" ")[0] not in known_codes:
            lacks.append(f"names a code that does not exist: {item}")
    for item in _list(entry, "Files") + _list(entry, "Runs"):
        if not item.startswith("/"):
            lacks.append(f"a file or program without its whole path: {item}")
    for path in sorted(sources.paths().get(entry.name, ())):
        if sources.unnamed(path, _list(entry, "Files") + _list(entry, "Runs")):
            lacks.append(f"uses {path}, which neither \"Files:\" nor \"Runs:\" names")
    for item in _list(entry, "Locks"):
        if item.split(" ")[0] not in {name for name, *_ in _lock_names()} | {"none"}:
            lacks.append(f"names a lock that does not exist: {item}")
    for name in re.findall(r"\b(?:TLIB|TAVO|Err|Bl|Sz|Psl|Psh|RAID|LVM|Disk|Partition)[A-Z]\w+\(", entry.comment.text):
        if name[:-1] not in names:
            lacks.append(f"names a function that does not exist: {name[:-1]}")
    return lacks


def _lock_names():
    for family in headers.families():
        if family.name == "lock":
            return [constant for constant in family.constants if constant[0].startswith("TAVO_LOCK_")]
    return []


def pages():
    """(entry, page) of every exported name, by family."""
    names, known = headers.names(), headers.codes()
    return [(entry, page_of(entry, names, known)) for family in headers.families() for entry in family.names]
