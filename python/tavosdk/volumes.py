"""LVM: physical volumes, volume groups and logical volumes."""
from __future__ import annotations

import dataclasses

from ._core import NotFoundError, ask, c_names, call, lib, text, text_of, wraps
from ._owned import chain, record

__getattr__, __dir__ = c_names("lvm", globals())


@dataclasses.dataclass(frozen=True)
class PhysicalVolume:
    path: str
    group: str   #: "/dev/vg1"; "" without a group
    uuid: str    #: of the group


@wraps("LVMIsSupport")
def supported() -> bool:
    return bool(ask("LVMIsSupport"))


@wraps("LVMPvSBEnum")
def physical_volumes() -> list[PhysicalVolume]:
    with record("LVMPVLIST", "LVMPvSBListFree") as cell:
        call("LVMPvSBEnum", cell)
        return [PhysicalVolume(text(node.pv.szPv), text(node.pv.szVg), text(node.pv.szUuid)) for node in chain(cell[0])]


@wraps("LVMGetLVPath")
def path(device: str) -> str:
    """The path of the first logical volume on a device; NotFoundError without one."""
    found = text_of("LVMGetLVPath", device, room=256)
    if not found:
        raise NotFoundError(f"no volume on {device}", lib.ERR_NO_VOLUME_ID)
    return found
