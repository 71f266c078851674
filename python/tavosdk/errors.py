"""Error codes and the record of the last failure."""
from __future__ import annotations

from ._core import _CODES, Error, LockError, NotFoundError, c_names, lib, text

__all__ = ["CODES", "Error", "LockError", "NotFoundError", "name_of"]
__getattr__, __dir__ = c_names("error", globals())

#: The names of all codes.
CODES: dict[int, str] = dict(_CODES)


def name_of(code: int) -> str:
    """The text of a code in the library's own table; "" for a code without one."""
    slot, rest = divmod(code, 0x100)
    return text(lib.rgszErrMsg[slot]) if not rest and 0 <= slot < lib.errNum else ""

