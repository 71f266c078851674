"""LVM: physical volumes, volume groups and logical volumes."""
from __future__ import annotations

import dataclasses

from ._core import NotFoundError, c_names, call, ffi, lib, text, text_of, wraps

__getattr__, __dir__ = c_names("lvm", globals())


@dataclasses.dataclass(frozen=True)
class PhysicalVolume:
    path: str
    group: str   #: "/dev/vg1"; "" without a group
    uuid: str    #: of the group


@wraps("LVMIsSupport")
def supported() -> bool:
    return bool(lib.LVMIsSupport())


@wraps("LVMPvSBEnum")
def physical_volumes() -> list[PhysicalVolume]:
    cell = ffi.new("LVMPVLIST **")
    try:
        call("LVMPvSBEnum", cell)
        found, node = [], cell[0]
        while node != ffi.NULL:
            found.append(PhysicalVolume(text(node.pv.szPv), text(node.pv.szVg), text(node.pv.szUuid)))
            node = node.pNext
        return found
    finally:
        lib.LVMPvSBListFree(cell[0])


@wraps("LVMGetLVPath")
def path(device: str) -> str:
    """The path of the first logical volume on a device; NotFoundError without one."""
    found = text_of("LVMGetLVPath", device, room=256)
    if not found:
        raise NotFoundError(f"no volume on {device}", lib.ERR_NO_VOLUME_ID)
    return found
