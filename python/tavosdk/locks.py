"""The locks by which all programs of the appliance take turns at its shared files."""
from __future__ import annotations

import contextlib
from collections.abc import Iterator

from ._core import c_names, call, lib, wraps

__getattr__, __dir__ = c_names("lock", globals())

_WAYS = ("SHARED", "EXCLUSIVE", "NONBLOCKING")

#: The names of the locks, in the order in which a request takes them, with their bits.
LOCKS: dict[str, int] = dict(sorted(
    ((name.removeprefix("TAVO_LOCK_").lower(), getattr(lib, name)) for name in dir(lib)
     if name.startswith("TAVO_LOCK_") and name.removeprefix("TAVO_LOCK_") not in _WAYS), key=lambda pair: int(pair[1])))


@contextlib.contextmanager
@wraps("ErrTLIBFileLock", "ErrTLIBFileUnlock")
def hold(*names: str, shared: bool = False, timeout: int | None = 5) -> Iterator[None]:
    """Holds the named locks ("user", "group", "tavoinfo", ...), all or none of them; LockError when one is not free within
    timeout seconds. None waits without end."""
    unknown = [name for name in names if name not in LOCKS]
    if unknown or not names:
        raise ValueError(f"no such lock: {', '.join(unknown)}" if unknown else "no lock was named")
    mask = sum(LOCKS[name] for name in set(names))
    way = lib.TAVO_LOCK_SHARED if shared else lib.TAVO_LOCK_EXCLUSIVE
    call("ErrTLIBFileLock", mask | way | (0 if timeout is None else lib.TAVO_LOCK_NONBLOCKING), timeout or 0)
    try:
        yield
    finally:
        call("ErrTLIBFileUnlock", mask)


def held() -> dict[str, int]:
    """The locks that this process holds, and how many times each."""
    rows = {row.fLockBit: row.nRef for row in lib.rgslckList}
    return {name: rows[bit] for name, bit in LOCKS.items() if rows.get(bit)}
