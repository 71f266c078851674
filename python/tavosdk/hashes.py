"""String hashes: the library's own kind of map, for calls under their C names. Other modules return dictionaries."""
from __future__ import annotations

from collections.abc import Iterator, Mapping, MutableMapping
from typing import Any

from ._core import c_names, call, ffi, lib, string, to_c
from .lists import StringList

__all__ = ["StringHash"]
__getattr__, __dir__ = c_names("hash", globals())


class StringHash(MutableMapping[str, str]):
    """A map of texts in the library's memory, which this object frees. `cell` and `pointer` as of a StringList."""

    def __init__(self, pairs: Mapping[str, str] | None = None, size: int = 512):
        self.cell = ffi.new("TLIBSZHASH **", call("PshTLIBSzHashAlloc", size))
        self.update(pairs or {})

    @property
    def pointer(self) -> Any:
        if not self.open:
            raise ValueError("the hash was closed")
        return self.cell[0]

    @property
    def open(self) -> bool:
        return getattr(self, "cell", None) is not None and self.cell[0] != ffi.NULL

    def close(self) -> None:
        if self.open:
            lib.TLIBSzHashFree(self.cell[0])
            self.cell[0] = ffi.NULL

    __del__ = close

    def __enter__(self) -> StringHash:
        return self

    def __exit__(self, *_: object) -> None:
        self.close()

    def __getitem__(self, key: str) -> str:
        value = string(lib.SzTLIBSzHashGetValue(self.pointer, to_c(key)))
        if value is None:
            raise KeyError(key)
        return value

    def __setitem__(self, key: str, value: str) -> None:
        assert self.pointer is not None
        call("TLIBSzHashSetValue", self.cell, key, value)

    def __delitem__(self, key: str) -> None:
        self[key]
        lib.SzTLIBSzHashRemoveKey(self.pointer, to_c(key))

    def __len__(self) -> int:
        return self.pointer.nPair if self.open else 0

    def __iter__(self) -> Iterator[str]:
        with StringList() as keys:
            call("TLIBSzHashEnumKey", self.pointer, keys.cell)
            return iter(list(keys))

    def __repr__(self) -> str:
        return f"StringHash({dict(self)!r})" if self.open else "<closed StringHash>"


def taken(function: str, *arguments: Any, place: int | None = None) -> dict[str, str]:
    """The pairs that a function adds to a hash; `place` is where it takes the hash among its arguments."""
    with StringHash() as into:
        given = list(arguments)
        given.insert(len(given) if place is None else place, into.cell)
        call(function, *given)
        return dict(into)
