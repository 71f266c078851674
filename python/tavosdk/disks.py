"""Disks: which there are, what they are, and their power state."""
from __future__ import annotations

import dataclasses
from typing import Any

from ._core import NotFoundError, c_names, call, ffi, lib, text, wraps
from ._owned import chain, record

__getattr__, __dir__ = c_names("disk", globals())


@dataclasses.dataclass(frozen=True)
class Disk:
    path: str
    model: str
    size: int                 #: bytes
    temperature: int | None   #: degrees Celsius
    bay: int                  #: the letter as a number, 1 for a
    unit: int                 #: the expansion unit, 0 for an internal bay


def _from_c(info: Any) -> Disk:
    return Disk(text(info.szPath), text(info.szModel).rstrip(), info.cbDisk,
                None if info.nTemperature < 0 else info.nTemperature, info.iDisk, info.iUnit)


@wraps("DiskInfoGet")
def get(path: str) -> Disk:
    """The disk that this path, or that of one of its partitions, names; NotFoundError for an empty bay."""
    with record("DISKINFO", "DiskInfoFree") as cell:
        if call("DiskInfoGet", path, cell) == 0:
            raise NotFoundError(f"no disk at {path}", lib.ERR_FILE_NOT_FOUND)
        return _from_c(cell[0])


@wraps("DiskInfoEnum")
def all() -> list[Disk]:
    """The disks of all bays and of all expansion units that have power."""
    with record("DISKLIST", "DiskInfoEnumFree") as cell:
        call("DiskInfoEnum", None, cell)
        return [_from_c(node.pInfo) for node in chain(cell[0])]


@wraps("TAVODiskTemperatureGet")
def temperature(path: str) -> int:
    """Degrees Celsius. Wakes a disk that sleeps."""
    return int(call("TAVODiskTemperatureGet", path))


@wraps("TAVOIDiskCheckPower")
def in_standby(path: str) -> bool:
    state = ffi.new("unsigned char *")
    call("TAVOIDiskCheckPower", path, state)
    return bool(state[0] == 0)


@wraps("TAVOIDiskSetDiskStandby")
def spin_down(path: str) -> None:
    call("TAVOIDiskSetDiskStandby", path)


@wraps("TAVODiskSetStandbyTimer")
def set_standby_minutes(minutes: int) -> None:
    """For all internal disks: 0 (never), 1 to 21, a multiple of 30 up to 330, or 480."""
    call("TAVODiskSetStandbyTimer", minutes)
