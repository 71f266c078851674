"""Local user accounts. Changing needs root; the functions take the locks that they need."""
from __future__ import annotations

import contextlib
import dataclasses
import datetime
from collections.abc import Iterable
from typing import Any

from ._core import Error, Texts, ask, c_names, call, ffi, lib, quietly, text, wraps
from ._owned import record
from .lists import taken

__getattr__, __dir__ = c_names("user", globals())

_EPOCH = datetime.date(1970, 1, 1)


@dataclasses.dataclass
class User:
    name: str
    uid: int = -1                   #: -1 when passed in: choose one, or keep it
    gid: int = -1                   #: primary group; -1 when passed in: 100
    description: str = ""
    home: str = ""
    shell: str = ""
    mail: str = ""
    expires: datetime.date | None = None  #: the last valid day
    may_change_password: bool = True
    privilege: int = 0
    hash: str = ""                  #: of the password, as the shadow file has it
    domain: bool = False

    @property
    def expired(self) -> bool:
        return bool(ask("TAVOUserIsExpired", _days(self.expires)))


def _days(day: datetime.date | None) -> int:
    return -1 if day is None else (day - _EPOCH).days


def _from_c(user: Any) -> User:
    return User(text(user.szName), user.nUid, user.nGid, text(user.szDesc), text(user.szHome), text(user.szShell),
                text(user.szMail), None if user.nExpired < 0 else _EPOCH + datetime.timedelta(user.nExpired),
                not user.fCannotChgPasswd, user.nPrivilege, text(user.szPasswd), user.nKind == lib.TAVO_USER_KIND_DOMAIN)


@wraps("TAVOUserGet")
def get(name: str) -> User:
    """The account of this name, in any case of letters; NotFoundError when there is none."""
    with record("TAVOUSER", "TAVOUserFree") as cell:
        call("TAVOUserGet", name, cell)
        return _from_c(cell[0])


@wraps("TAVOUserGetByUID")
def get_by_uid(uid: int) -> User:
    with record("TAVOUSER", "TAVOUserFree") as cell:
        call("TAVOUserGetByUID", uid, cell)
        return _from_c(cell[0])


@wraps("TAVOUserEnum", "TAVOUserEnumByPrefix", "TAVOUserEnumBySubstr")
def names(prefix: str = "", containing: str = "") -> list[str]:
    """The names of the local accounts, those of the system left out."""
    if prefix and containing:
        return [name for name in names(prefix) if name in set(names(containing=containing))]
    if containing:
        return taken("TAVOUserEnumBySubstr", lib.TAVO_USER_LOCAL, containing, place=0)
    return taken("TAVOUserEnumByPrefix", lib.TAVO_USER_LOCAL, prefix, place=0)


def all() -> list[User]:
    """The accounts of `names`."""
    return [get(name) for name in names()]


def _fill(cell: Any, user: User, password: str) -> None:
    call("TAVOUserAlloc", cell, user.name, password, user.uid, user.gid, user.description, user.home, user.shell,
         _days(user.expires), not user.may_change_password, user.mail, user.privilege)


def _set(old: str | None, user: User, password: str) -> None:
    with record("TAVOUSER", "TAVOUserFree") as cell:
        _fill(cell, user, password)
        # The library skips an entry that it refuses, returns 0, and leaves the code.
        result, error = quietly("TAVOUserSetOne", old, cell[0])
        if error is not None and (result < 0 or error.name in _REFUSED):
            raise error


_REFUSED = {"ERR_INVALID_USERNAME", "ERR_USER_EXISTS", "ERR_NO_SUCH_USER", "ERR_TOO_MANY_USERS", "ERR_FORMAT_ERROR",
            "ERR_BAD_PARAMETERS"}


@wraps("TAVOUserSetOne", "TAVOUserSet")
def add(user: User, password: str) -> User:
    """Adds the account and returns it as it is stored."""
    _set(None, user, password)
    return get(user.name)


@wraps("TAVOUserSet")
def add_many(accounts: Iterable[tuple[User, str]]) -> list[User]:
    """Adds accounts with their passwords in one batch, which takes the locks and rewrites the files once. Returns the added
    ones as they are stored: the library skips an entry that it refuses, and the system log says why."""
    with contextlib.ExitStack() as records:
        cells: list[Any] = []
        new: dict[str, None] = {}
        for user, password in accounts:
            cells.append(records.enter_context(record("TAVOUSER", "TAVOUserFree")))
            _fill(cells[-1], user, password)
            if not exists(user.name):
                new[user.name] = None
        old_names, users = ffi.new("char *[]", len(cells)), ffi.new("TAVOUSER *[]", [cell[0] for cell in cells])
        call("TAVOUserSet", old_names, users, len(cells))
    return [get(name) for name in new if exists(name)]


@wraps("TAVOUserSetOne")
def change(name: str, user: User, password: str | None = None) -> User:
    """Makes the account what `user` says, also under a new name. Without a password it keeps its own."""
    _set(name, user, get(name).hash if password is None else password)
    return get(user.name)


@wraps("TAVOUserDelete")
def delete(*names: str) -> None:
    """Deletes accounts with all that belongs to them. Names that do not exist are skipped."""
    given = Texts(names)
    result, error = quietly("TAVOUserDelete", given.array, len(given))
    if error is not None and (result < 0 or error.name == "ERR_USER_DB_DELETE"):
        raise error


@wraps("TAVOUserLockSet")
def lock(name: str) -> None:
    """Lets no password fit any more, for logins and for Samba, until `unlock`. Open sessions stay."""
    call("TAVOUserLockSet", name, 1)


@wraps("TAVOUserLockSet")
def unlock(name: str) -> None:
    call("TAVOUserLockSet", name, 0)


@wraps("TAVOUserAgingSet")
def set_password_age(name: str, minimum: int = -1, maximum: int = -1, warning: int = -1) -> None:
    """Sets how many days a password must be kept, may be used, and is warned about before; -1 leaves a number as it is."""
    call("TAVOUserAgingSet", name, minimum, maximum, warning)


@wraps("BlTLIBIsUserName")
def is_name(name: str) -> bool:
    return bool(ask("BlTLIBIsUserName", name))


def exists(name: str) -> bool:
    try:
        get(name)
    except Error as error:
        if error.name in ("ERR_NO_SUCH_USER", "ERR_INVALID_USERNAME"):
            return False
        raise
    return True
