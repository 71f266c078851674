"""What the rest of the appliance tells the library: the model's limits and the hardware around it."""
from __future__ import annotations

import dataclasses

from ._core import ask, c_names, call, text, wraps
from ._owned import record

__getattr__, __dir__ = c_names("appliance", globals())


@dataclasses.dataclass(frozen=True)
class ExpansionUnit:
    number: int        #: 1 for the first
    port: int          #: index of the internal port that leads to it, from 0
    powered: bool
    disks: list[str]


@wraps("TAVOMaxDiskGet")
def bays() -> int:
    return int(ask("TAVOMaxDiskGet"))


@wraps("TAVOEBoxInfoEnum")
def expansion_units() -> list[ExpansionUnit]:
    with record("TAVOEBOX", "free") as cell:
        count = call("TAVOEBoxInfoEnum", cell)
        return [ExpansionUnit(box.iUnit, box.iPort, bool(box.fPoweron),
                              [text(box.rgszDisk[place]) for place in range(box.nDisk)]) for box in cell[0][0:count]]
