"""Settings files with sections, such as Samba's."""
from __future__ import annotations

from collections.abc import Mapping

from ._core import below_one, c_names, call, wraps
from .hashes import StringHash, taken
from .lists import taken as taken_list
from .settings import Path

__getattr__, __dir__ = c_names("section", globals())


@wraps("TLIBFileEnumSection")
def names(path: Path) -> list[str]:
    return taken_list("TLIBFileEnumSection", path)


@wraps("TLIBFileGetSection")
def get(path: Path, section: str) -> dict[str, str]:
    """The pairs of a section; none where there is no such section."""
    return taken("TLIBFileGetSection", path, section)


@wraps("ErrTLIBFileAddSection")
def add(path: Path, section: str, pairs: Mapping[str, str]) -> None:
    with StringHash(pairs) as given:
        call("ErrTLIBFileAddSection", path, section, given.pointer, None)


@wraps("ErrTLIBFileSetSection")
def set(path: Path, section: str, pairs: Mapping[str, str], new_name: str | None = None) -> None:
    """Replaces a section that exists."""
    with StringHash(pairs) as given:
        call("ErrTLIBFileSetSection", path, section, new_name, given.pointer, 1, None, fails=below_one)


@wraps("ErrTLIBFileRemoveSection")
def remove(path: Path, section: str) -> None:
    call("ErrTLIBFileRemoveSection", path, section, fails=below_one)
