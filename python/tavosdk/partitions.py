"""Partitions: the layouts of the system disks, and making and removing them. What is on a changed disk is lost."""
from __future__ import annotations

import enum

from ._core import c_names, call, ffi, lib, text, wraps
from .lists import taken

__getattr__, __dir__ = c_names("partition", globals())


class Table(enum.Enum):
    NONE = 1
    MBR = 2
    GPT = 3


#: The names of the types of an MS-DOS table.
TYPES: dict[int, str] = {row.nType: text(row.szName) for row in lib.PartType if row.szName != ffi.NULL}


@wraps("PartitionTableTypeGet")
def table(disk: str) -> Table:
    kind = ffi.new("int *")
    call("PartitionTableTypeGet", disk, kind)
    return Table(kind[0])


@wraps("PartitionPathEnum")
def paths() -> list[str]:
    """All disks and partitions that the kernel knows."""
    return taken("PartitionPathEnum", None)


@wraps("PartitionCreate")
def create(disk: str, system: bool) -> None:
    """Creates the two system partitions, or the data partition. What is on the disk is lost."""
    call("PartitionCreate", disk, lib.PARTITION_SYSTEM if system else lib.PARTITION_DATA, None)


@wraps("PartitionClean")
def clean(disk: str, system: bool) -> None:
    call("PartitionClean", disk, lib.PARTITION_SYSTEM if system else lib.PARTITION_DATA)
