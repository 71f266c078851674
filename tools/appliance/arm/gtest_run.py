"""Runs the cases of GoogleTest programs one after the other and knows of each what became of it, also of those that
abort, hang or use up the memory: the run goes on after them."""
import dataclasses
import re
import time
import xml.etree.ElementTree as xml

PASSED, FAILED, SKIPPED, CRASHED, TIMED_OUT, OUT_OF_MEMORY, MACHINE_DIED, NO_RESULT = (
    'passed', 'failed', 'skipped', 'crashed', 'timed out', 'out of memory', 'machine died', 'no result')
_BEGIN = re.compile(rb'^\[ RUN      \] (\S+)\r?$')
_END = rb'\[ +(OK|FAILED|SKIPPED) +\] '
_VERDICT = {b'OK': PASSED, b'FAILED': FAILED, b'SKIPPED': SKIPPED}


@dataclasses.dataclass
class Case:
    program: str
    name: str
    verdict: str = NO_RESULT
    detail: str = ''
    seconds: float = 0.0
    output: bytes = b''
    alone: bool = False  # failed among others and had a process and a root of its own then

    @property
    def bad(self):
        return self.verdict not in (PASSED, SKIPPED)


class Reader:
    """Follows the output of a test program and enters results into its cases."""

    def __init__(self, cases):
        self.cases = {case.name: case for case in cases}
        self.current = None
        self.since = 0.0  # the last beginning or end of a case
        self.rest, self.outside = b'', b''
        self.begun = 0
        self.spoilt = False  # a case has failed, and not as the first: what comes after it need not be its own fault

    def feed(self, data):
        *lines, self.rest = (self.rest + data).split(b'\n')
        for line in lines:
            self._line(line)

    def finish(self):
        if self.rest:
            self._line(self.rest)
            self.rest = b''

    def _line(self, line):
        begin = _BEGIN.match(line)
        if begin and begin[1].decode() in self.cases:
            self.current, self.since = self.cases[begin[1].decode()], time.monotonic()
            self.current.output = b''
            self.begun += 1
        elif self.current:
            # Output of a case without a final end of line precedes its result.
            end = re.search(_END + re.escape(self.current.name.encode()) + rb'(, where .*)?( \(\d+ ms\))?\r?$', line)
            if end:
                self.current.output += line[:end.start()]
                self.close(_VERDICT[end[1]])
            else:
                self.current.output += line + b'\n'
        else:
            self.outside += line + b'\n'

    def close(self, verdict, detail=''):
        self.current.verdict, self.current.detail = verdict, detail
        self.spoilt |= verdict == FAILED and self.begun > 1
        now = time.monotonic()
        self.current.seconds = now - self.since
        self.current, self.since = None, now


def listed(text):
    """The names of the cases in the answer to --gtest_list_tests; none when it is not a GoogleTest program."""
    suite, names = '', []
    for line in text.decode(errors='replace').splitlines():
        line = line.split('#')[0].rstrip()
        if re.match(r'^\S+\.$', line):
            suite = line
        elif suite and re.match(r'^  \S+$', line):
            names.append(suite + line.strip())
    return names


def junit(cases, path, seconds):
    """Writes the results in the form that build servers read."""
    root = xml.Element('testsuites', time=f'{seconds:.3f}')
    for program in dict.fromkeys(case.program for case in cases):
        mine = [case for case in cases if case.program == program]
        suite = xml.SubElement(
            root, 'testsuite', name=program, tests=str(len(mine)),
            failures=str(sum(case.verdict == FAILED for case in mine)),
            errors=str(sum(case.bad and case.verdict != FAILED for case in mine)),
            skipped=str(sum(case.verdict == SKIPPED for case in mine)),
            time=f'{sum(case.seconds for case in mine):.3f}')
        for case in mine:
            element = xml.SubElement(suite, 'testcase', classname=program, name=case.name, time=f'{case.seconds:.3f}')
            text = re.sub(r'[^\t\n\x20-\ud7ff\ue000-\ufffd]', '?', case.output.decode(errors='replace'))
            if case.verdict == SKIPPED:
                xml.SubElement(element, 'skipped').text = text
            elif case.bad:
                kind = 'failure' if case.verdict == FAILED else 'error'
                xml.SubElement(element, kind, type=case.verdict, message=case.detail or case.verdict).text = text
    tree = xml.ElementTree(root)
    xml.indent(tree)
    tree.write(path, encoding='utf-8', xml_declaration=True)
