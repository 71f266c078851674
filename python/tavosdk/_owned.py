"""Memory that the library returns and the caller frees: blocks that an object owns, records that a call fills in."""
from __future__ import annotations

import contextlib
from collections.abc import Iterator
from typing import Any, TypeVar

from ._core import call, ffi, lib, one_call

Owner = TypeVar("Owner", bound="Block")


class Block:
    """A block of the library's memory, freed when this object is closed or dies. `cell` is for functions that may move the
    block, `pointer` for the others: use it under the lock of calls, so that no other thread moves or closes it."""

    _allocates, _frees, _type = "", "", ""

    def __init__(self, size: int):
        self.cell = ffi.new(f"{self._type} **", call(self._allocates, size))

    @property
    def open(self) -> bool:
        return getattr(self, "cell", None) is not None and self.cell[0] != ffi.NULL

    @property
    def pointer(self) -> Any:
        return self.open_cell[0]

    @property
    def open_cell(self) -> Any:
        if not self.open:
            raise ValueError(f"the {type(self).__name__} was closed")
        return self.cell

    def close(self) -> None:
        with one_call:
            self.__del__()

    # Without the lock: no other thread uses an object that dies, and one that ends with the interpreter may keep it.
    def __del__(self) -> None:
        if self.open:
            getattr(lib, self._frees)(self.cell[0])
            self.cell[0] = ffi.NULL

    def __enter__(self: Owner) -> Owner:
        return self

    def __exit__(self, *_: object) -> None:
        self.close()


def filled(block: Block, function: str, arguments: tuple[Any, ...], place: int | None) -> None:
    """Calls a function that adds to the block; `place` is where it takes the block among its arguments."""
    given = list(arguments)
    given.insert(len(given) if place is None else place, block.cell)
    call(function, *given)


@contextlib.contextmanager
def record(kind: str, frees: str) -> Iterator[Any]:
    """A cell in which a function leaves a record, which is freed when the block ends."""
    cell = ffi.new(f"{kind} **")
    try:
        yield cell
    finally:
        getattr(lib, frees)(cell[0])


def chain(node: Any) -> Iterator[Any]:
    """The nodes of a linked list."""
    while node != ffi.NULL:
        yield node
        node = node.pNext
