"""Arrays: the md arrays that the appliance's disks are joined into."""
from __future__ import annotations

import dataclasses
import enum

from ._core import NotFoundError, c_names, call, ffi, lib, text, wraps

__getattr__, __dir__ = c_names("raid", globals())


class Level(enum.Enum):
    RAID_0 = 1
    RAID_1 = 2
    RAID_5 = 4
    RAID_6 = 8
    RAID_10 = 16
    LINEAR = 32


class Status(enum.Enum):
    NORMAL = 1
    DEGRADED = 2
    CRASHED = 3


class State(enum.Enum):
    ACTIVE = 1
    SPARE = 2
    FATAL = 4
    FAILED = 8


@dataclasses.dataclass(frozen=True)
class Member:
    path: str
    state: State


@dataclasses.dataclass(frozen=True)
class Array:
    path: str
    level: Level
    status: Status
    rebuilding: bool
    size: int           #: bytes
    slots: int          #: members that it is made for, without spares
    working: int
    failed: int
    members: list[Member]


def _from_c(record: ffi.CData) -> Array:
    members, member = [], record.pMembers
    while member != ffi.NULL:
        members.append(Member(text(member.szPath), State(member.nState)))
        member = member.pNext
    return Array(text(record.szPath), Level(record.fLevel), Status(record.nStatus), bool(record.fRebuilding),
                 record.cbArray, record.nSlot, record.nWorking, record.nFailed, members)


@wraps("RAIDInfoGet")
def get(path: str) -> Array:
    """The array of this path; NotFoundError when there is none or it does not run."""
    cell = ffi.new("RAIDINFO **")
    try:
        if call("RAIDInfoGet", path, cell) == 0:
            raise NotFoundError(f"no array at {path}", lib.ERR_PATH_NOT_FOUND)
        return _from_c(cell[0])
    finally:
        lib.RAIDInfoFree(cell[0])


@wraps("RAIDInfoEnum")
def all() -> list[Array]:
    cell = ffi.new("RAIDLIST **")
    try:
        call("RAIDInfoEnum", cell)
        found, node = [], cell[0]
        while node != ffi.NULL:
            found.append(_from_c(node.pInfo))
            node = node.pNext
        return found
    finally:
        lib.RAIDListFree(cell[0])


@wraps("RAIDRebuildingWait")
def wait(path: str) -> None:
    """Waits until the array is no longer being rebuilt; Error when it is not normal then."""
    call("RAIDRebuildingWait", path)
