"""Settings files: lines of key and value. Every change is a safe rewrite of the file."""
from __future__ import annotations

import os
from collections.abc import Iterator, Mapping, MutableMapping
from typing import Any

from ._core import Error, NotFoundError, below_one, c_names, call, text_of, wraps
from .hashes import StringHash
from .lists import taken as taken_list

__getattr__, __dir__ = c_names("file", globals())

#: The switches of the appliance, and what its model can do (never written).
SYSTEM, FACTORY = "/etc/tavoinfo.conf", "/etc.defaults/tavoinfo.conf"

Path = str | os.PathLike[str]


@wraps("TLIBFileGetKeyValue")
def get(path: Path, key: str, default: str | None = None) -> str | None:
    """The value of the key; default where no line sets it."""
    try:
        return text_of("TLIBFileGetKeyValue", path, key, room=256, after=(0,), fails=below_one)
    except NotFoundError as error:
        if error.name != "ERR_KEY_NOT_FOUND":
            raise
        return default


@wraps("TLIBFileSetKeyValue")
def set(path: Path, key: str, value: str, line: str | None = None) -> None:
    """line: how a line is written, such as '%s="%s"' and a newline; '%s=%s' when it is not given."""
    call("TLIBFileSetKeyValue", path, key, value, line)


@wraps("TLIBFileSetKeys")
def update(path: Path, pairs: Mapping[str, str], line: str | None = None) -> None:
    """Sets many keys in one rewrite. line: as for set."""
    with StringHash(pairs) as given:
        call("TLIBFileSetKeys", path, given.pointer, line)


@wraps("TLIBFileRemoveKey")
def remove(path: Path, key: str) -> None:
    call("TLIBFileRemoveKey", path, key, fails=below_one)


@wraps("TLIBFileGetKeys")
def read(path: Path, separators: str = "=") -> dict[str, str]:
    """All pairs; of a repeated key the last line counts."""
    with StringHash() as into:
        call("TLIBFileGetKeys", path, None, into.cell, separators)
        return dict(into)


@wraps("TLIBFileReadLines")
def lines(path: Path) -> list[str]:
    return taken_list("TLIBFileReadLines", path)


@wraps("TAVOINFOSetKeyValue")
def set_system(key: str, value: str) -> None:
    """Sets a switch of the appliance, under the lock of its file."""
    call("TAVOINFOSetKeyValue", key, value)


class File(MutableMapping[str, str]):
    """A settings file as a map. Nothing is kept: each look reads the file, each change rewrites it. Values are quoted
    where all values of the file are."""

    def __init__(self, path: Path):
        self.path = os.fspath(path)

    def __getitem__(self, key: str) -> str:
        value = get(self.path, key)
        if value is None:
            raise KeyError(key)
        return value

    def __setitem__(self, key: str, value: str) -> None:
        set(self.path, key, value, self._line())

    def __delitem__(self, key: str) -> None:
        try:
            remove(self.path, key)
        except NotFoundError:
            raise KeyError(key) from None

    def update(self, *pairs: Any, **more: str) -> None:
        """As a dictionary's, in one rewrite."""
        update(self.path, dict(*pairs, **more), self._line())

    def _line(self) -> str | None:
        try:
            settings = [line for line in lines(self.path) if "=" in line and line.lstrip()[0] not in "#;"]
        except Error:  # a file that is not there yet
            return None
        return '%s="%s"\n' if settings and all('="' in line for line in settings) else None

    def __iter__(self) -> Iterator[str]:
        return iter(read(self.path))

    def __len__(self) -> int:
        return len(read(self.path))

    def __repr__(self) -> str:
        return f"File({self.path!r})"
