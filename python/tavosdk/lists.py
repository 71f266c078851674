"""String lists: the library's own kind of list, for calls under their C names. Other modules return Python lists."""
from __future__ import annotations

from collections.abc import Iterable, Iterator, MutableSequence
from typing import Any

from ._core import c_names, call, lib, one_call, quietly, text, wraps
from ._owned import Block, filled

__all__ = ["StringList"]
__getattr__, __dir__ = c_names("list", globals())


class StringList(Block, MutableSequence[str]):
    """A list of texts in the library's memory, which this object frees. `cell` is for functions that may move it
    (TLIBSZLIST **), `pointer` for the others. A closed list is empty and refuses changes."""

    _allocates, _frees, _type = "PslTLIBSzListAlloc", "TLIBSzListFree", "TLIBSZLIST"

    def __init__(self, items: Iterable[str] = (), size: int = 512):
        super().__init__(size)
        self.extend(items)

    def __len__(self) -> int:
        with one_call:
            return int(self.pointer.nItem) if self.open else 0

    def _index(self, index: int) -> int:
        place = index + len(self) if index < 0 else index
        if not 0 <= place < len(self):
            raise IndexError("list index out of range")
        return place

    def __getitem__(self, index: Any) -> Any:
        if isinstance(index, slice):
            return [self[place] for place in range(*index.indices(len(self)))]
        with one_call:
            place = self._index(index)
            return text(lib.SzTLIBSzListGet(self.pointer, place))

    def __setitem__(self, index: Any, value: Any) -> None:
        call("TLIBSzListSet", self.open_cell, self._index(index), value)

    def __delitem__(self, index: Any) -> None:
        with one_call:
            place = self._index(index)
            lib.SzTLIBSzListRemove(self.pointer, place)

    @wraps("TLIBSzListInsert")
    def insert(self, index: int, value: str) -> None:
        """Inserts before index; a sorted list has a place of its own for it."""
        count = len(self)
        index = max(index + count, 0) if index < 0 else min(index, count)
        call("TLIBSzListInsert", self.open_cell, index, value)

    @wraps("TLIBSzListSortItems")
    def sort(self, ignore_case: bool = False) -> None:
        with one_call:
            lib.TLIBSzListSortItems(self.pointer, lib.TLIB_SZLIST_CASESORTED if ignore_case else lib.TLIB_SZLIST_SORTED)

    @wraps("TLIBSzListFind", "TLIBSzListCaseFind")
    def find(self, value: str, ignore_case: bool = False) -> int:
        """The index of the text, -1 without one."""
        function = "TLIBSzListCaseFind" if ignore_case else "TLIBSzListFind"
        with one_call:
            found, error = quietly(function, self.pointer, value)
        if error:
            raise error
        return int(found)

    def __contains__(self, value: object) -> bool:
        return isinstance(value, str) and any(item == value for item in self)

    def __iter__(self) -> Iterator[str]:
        place = 0
        while True:
            try:
                item = self[place]
            except IndexError:
                return
            yield item
            place += 1

    def __eq__(self, other: object) -> bool:
        return isinstance(other, (list, StringList)) and list(self) == list(other)

    def __repr__(self) -> str:
        return f"StringList({list(self)!r})" if self.open else "<closed StringList>"


def taken(function: str, *arguments: Any, place: int | None = None) -> list[str]:
    """The texts that a function appends to a list; `place` is where it takes the list among its arguments."""
    with StringList() as into:
        filled(into, function, arguments, place)
        items = into.pointer.pszItem
        return [text(items[index]) for index in range(len(into))]
