"""Who calls whom in a linked library that has the C++ runtime inside."""
import collections
import pathlib
import re
import subprocess
import sys

TREE = pathlib.Path(__file__).resolve().parents[3]
_BEGINS = re.compile(r"^([0-9a-f]+) <(.+)>:$")
_TARGET = re.compile(r"<([^>+-]+?)(?:\+0x([0-9a-f]+))?>$")


def exported():
    script = (TREE / "lib/tavosdk.map").read_text()
    return set(re.findall(r"(\w+);", script.partition("global:")[2].partition("local:")[0]))


def _sizes(library):
    table = subprocess.run(["nm", "-S", "--defined-only", library], capture_output=True, text=True, check=True).stdout
    return {words[3]: int(words[1], 16) for words in map(str.split, table.splitlines()) if len(words) == 4}


def calls_of(objdump, library):
    """For each function the ones that it jumps to, or whose address it takes."""
    sizes = _sizes(library)

    def owner(name, offset):
        # What the compiler moved out of a function is still the function, and a slot is what it leads to. Code after the
        # end of a function belongs to one whose name the linker has dropped.
        plain = name.removesuffix("@plt").removesuffix(".cold")
        return plain if offset < sizes.get(name, offset + 1) else f"what follows {plain}"

    calls = collections.defaultdict(set)
    name, start = None, 0
    dump = subprocess.Popen([objdump, "-d", "--no-show-raw-insn", library], stdout=subprocess.PIPE, text=True)
    for line in dump.stdout:
        line = line.rstrip()
        if begins := _BEGINS.match(line):
            name, start = begins.group(2), int(begins.group(1), 16)
        elif name and (target := _TARGET.search(line)):
            here = owner(name, int(line.partition(":")[0], 16) - start)
            called = owner(target.group(1), int(target.group(2) or "0", 16))
            if called != here:
                calls[here].add(called)
    if dump.wait() != 0 or not calls:
        sys.exit(f"{objdump} cannot read {library}")
    return calls


def way(calls, start, ends, stops=lambda function: False):
    """The calls that lead from a function to one of `ends`, past every one that `stops`; None when there are none."""
    came_from, left = {start: None}, [start]
    while left:
        at = left.pop()
        if stops(at):
            continue
        for called in calls.get(at, ()):
            if called in ends:
                found = [called]
                while at:
                    found.insert(0, at)
                    at = came_from[at]
                return found
            if called not in came_from:
                came_from[called] = at
                left.append(called)
    return None


def readable(names):
    return subprocess.run(["c++filt"], input="\n".join(names), capture_output=True, text=True, check=True).stdout
