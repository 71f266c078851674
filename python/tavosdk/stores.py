"""The account stores: key and value files. Hold the lock "user" or "group" around every use of the account stores."""
from __future__ import annotations

import os
from collections.abc import Iterator
from typing import Any

from ._core import Error, NotFoundError, c_names, call, ffi, lib, wraps
from .settings import Path

__getattr__, __dir__ = c_names("bdb", globals())


class Store:
    """A store that is open, until its block ends. Keys and values are bytes."""

    @wraps("TAVOBDbOpen")
    def __init__(self, path: Path, flags: int = os.O_RDONLY):
        self._handle: Any = None
        self._handle = call("TAVOBDbOpen", path, flags, 0)

    @wraps("TAVOBDbClose")
    def close(self) -> None:
        handle, self._handle = self._handle, None
        if handle is not None:
            call("TAVOBDbClose", handle)

    def __enter__(self) -> Store:
        return self

    def __exit__(self, *_: object) -> None:
        self.close()

    def __del__(self) -> None:
        handle, self._handle = getattr(self, "_handle", None), None
        if handle is not None:
            lib.TAVOBDbClose(handle)

    @property
    def handle(self) -> Any:
        if self._handle is None:
            raise ValueError("the store was closed")
        return self._handle

    def __getitem__(self, key: bytes) -> bytes:
        value, size = ffi.new("void **"), ffi.new("int *")
        try:
            call("TAVOBDbGet", self.handle, key, len(key), value, size)
        except NotFoundError:
            raise KeyError(key) from None
        return _taken(value, size)

    def __setitem__(self, key: bytes, value: bytes) -> None:
        call("TAVOBDbSet", self.handle, key, len(key), value, len(value))

    def __delitem__(self, key: bytes) -> None:
        try:
            call("TAVOBDbDelete", self.handle, key, len(key))
        except NotFoundError:
            raise KeyError(key) from None

    @wraps("TAVOBDbCursorGet")
    def items(self) -> Iterator[tuple[bytes, bytes]]:
        """All pairs in the order of their keys. A store has one cursor: one walk at a time, and no changes meanwhile."""
        call("TAVOBDbCursorSetType", self.handle, lib.TAVO_BDB_CURSOR_FIRST)
        while True:
            key, value = ffi.new("void **"), ffi.new("void **")
            sizes = ffi.new("int[2]")
            try:
                call("TAVOBDbCursorGet", self.handle, 0, key, sizes, value, sizes + 1)
            except Error as error:
                if error.name == "ERR_DB_END":
                    return
                raise
            yield _taken(key, sizes), _taken(value, sizes + 1)
            call("TAVOBDbCursorSetType", self.handle, lib.TAVO_BDB_CURSOR_NEXT)


def _taken(block: Any, size: Any) -> bytes:
    try:
        return bytes(ffi.buffer(block[0], size[0]))
    finally:
        lib.TAVOBDbFree(block[0])
