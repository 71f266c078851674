"""The library's sources as far as they show what a page must name: the programs and files in the file of each function."""
import functools
import re

import headers

_PATH = re.compile(r'"(/(?:etc|etc\.defaults|tmp|var|usr|sys|proc|sbin|bin)/[^"\s%]*)')


@functools.cache
def paths():
    """Exported function to the absolute paths that the texts of its own file begin with."""
    found = {}
    for source in sorted((headers.TREE / "lib").rglob("*.cpp")):
        text = re.sub(r"//[^\n]*", "", source.read_text())
        for name in re.findall(r'extern "C"[^;{]*?\b(\w+)\(', text):
            found[name] = set(_PATH.findall(text))
    return found


def unnamed(path, items):
    """Whether none of the items names the path, a folder that holds it, or a file below it."""
    path = path.rstrip("/.")
    items = [re.sub(r"mdN.*", "md", item.split(" ")[0].split("*")[0]).rstrip("/.") for item in items]
    return not any(path.startswith(item) or item.startswith(path) for item in items)
