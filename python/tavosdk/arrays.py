"""Arrays: the md arrays that the appliance's disks are joined into."""
from __future__ import annotations

import dataclasses
import enum
from typing import Any

from ._core import Error, NotFoundError, c_names, call, lib, text, to_c, wraps
from ._owned import chain, record

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


def _from_c(info: Any) -> Array:
    return Array(text(info.szPath), Level(info.fLevel), Status(info.nStatus), bool(info.fRebuilding), info.cbArray,
                 info.nSlot, info.nWorking, info.nFailed,
                 [Member(text(member.szPath), State(member.nState)) for member in chain(info.pMembers)])


@wraps("RAIDInfoGet")
def get(path: str) -> Array:
    """The array of this path; NotFoundError when there is none or it does not run."""
    with record("RAIDINFO", "RAIDInfoFree") as cell:
        if call("RAIDInfoGet", path, cell) == 0:
            raise NotFoundError(f"no array at {path}", lib.ERR_PATH_NOT_FOUND)
        return _from_c(cell[0])


@wraps("RAIDInfoEnum")
def all() -> list[Array]:
    with record("RAIDLIST", "RAIDListFree") as cell:
        call("RAIDInfoEnum", cell)
        return [_from_c(node.pInfo) for node in chain(cell[0])]


@wraps("RAIDRebuildingWait")
def wait(path: str) -> None:
    """Waits until the array is no longer being rebuilt; Error when it is not normal then. Other threads go on."""
    if lib.RAIDRebuildingWait(to_c(path)) < 0:
        raise Error(f"{path} is not normal")
