"""String hashes: the library's own kind of map, for calls under their C names. Other modules return dictionaries."""
from __future__ import annotations

from collections.abc import Iterator, Mapping, MutableMapping
from typing import Any

from ._core import ask, c_names, call, one_call, string
from ._owned import Block, filled
from .lists import StringList

__all__ = ["StringHash"]
__getattr__, __dir__ = c_names("hash", globals())


class StringHash(Block, MutableMapping[str, str]):
    """A map of texts in the library's memory, which this object frees. `cell` and `pointer` as of a StringList."""

    _allocates, _frees, _type = "PshTLIBSzHashAlloc", "TLIBSzHashFree", "TLIBSZHASH"

    def __init__(self, pairs: Mapping[str, str] | None = None, size: int = 512):
        super().__init__(size)
        self.update(pairs or {})

    def __getitem__(self, key: str) -> str:
        with one_call:
            value = string(ask("SzTLIBSzHashGetValue", self.pointer, key))
        if value is None:
            raise KeyError(key)
        return value

    def __setitem__(self, key: str, value: str) -> None:
        call("TLIBSzHashSetValue", self.open_cell, key, value)

    def __delitem__(self, key: str) -> None:
        with one_call:
            self[key]
            ask("SzTLIBSzHashRemoveKey", self.pointer, key)

    def __len__(self) -> int:
        with one_call:
            return int(self.pointer.nPair) if self.open else 0

    def __iter__(self) -> Iterator[str]:
        with one_call, StringList() as keys:
            call("TLIBSzHashEnumKey", self.pointer, keys.cell)
            return iter(list(keys))

    def __repr__(self) -> str:
        return f"StringHash({dict(self)!r})" if self.open else "<closed StringHash>"


def taken(function: str, *arguments: Any, place: int | None = None) -> dict[str, str]:
    """The pairs that a function adds to a hash; `place` is where it takes the hash among its arguments."""
    with StringHash() as into:
        filled(into, function, arguments, place)
        return dict(into)
