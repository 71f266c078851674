"""Disks: which there are, what they are, and their power state."""
from __future__ import annotations

import dataclasses

from ._core import NotFoundError, c_names, call, ffi, lib, text, wraps

__getattr__, __dir__ = c_names("disk", globals())


@dataclasses.dataclass(frozen=True)
class Disk:
    path: str
    model: str
    size: int                 #: bytes
    temperature: int | None   #: degrees Celsius
    bay: int                  #: the letter as a number, 1 for a
    unit: int                 #: the expansion unit, 0 for an internal bay


def _from_c(record: ffi.CData) -> Disk:
    return Disk(text(record.szPath), text(record.szModel).rstrip(), record.cbDisk,
                None if record.nTemperature < 0 else record.nTemperature, record.iDisk, record.iUnit)


@wraps("DiskInfoGet")
def get(path: str) -> Disk:
    """The disk that this path, or that of one of its partitions, names; NotFoundError for an empty bay."""
    cell = ffi.new("DISKINFO **")
    try:
        if call("DiskInfoGet", path, cell) == 0:
            raise NotFoundError(f"no disk at {path}", lib.ERR_FILE_NOT_FOUND)
        return _from_c(cell[0])
    finally:
        lib.DiskInfoFree(cell[0])


@wraps("DiskInfoEnum")
def all() -> list[Disk]:
    """The disks of all bays and of all expansion units that have power."""
    cell = ffi.new("DISKLIST **")
    try:
        call("DiskInfoEnum", None, cell)
        found, node = [], cell[0]
        while node != ffi.NULL:
            found.append(_from_c(node.pInfo))
            node = node.pNext
        return found
    finally:
        lib.DiskInfoEnumFree(cell[0])


@wraps("TAVODiskTemperatureGet")
def temperature(path: str) -> int:
    """Degrees Celsius. Wakes a disk that sleeps."""
    return call("TAVODiskTemperatureGet", path)


@wraps("TAVOIDiskCheckPower")
def in_standby(path: str) -> bool:
    state = ffi.new("unsigned char *")
    call("TAVOIDiskCheckPower", path, state)
    return state[0] == 0


@wraps("TAVOIDiskSetDiskStandby")
def spin_down(path: str) -> None:
    call("TAVOIDiskSetDiskStandby", path)


@wraps("TAVODiskSetStandbyTimer")
def set_standby_minutes(minutes: int) -> None:
    """For all internal disks: 0 (never), 1 to 21, a multiple of 30 up to 330, or 480."""
    call("TAVODiskSetStandbyTimer", minutes)
