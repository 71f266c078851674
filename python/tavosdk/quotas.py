"""Limits on the space that a user may take on a volume."""
from __future__ import annotations

import dataclasses

from ._core import ask, c_names, call, ffi, wraps

__getattr__, __dir__ = c_names("quota", globals())


@dataclasses.dataclass(frozen=True)
class Quota:
    limit: float    #: megabytes of 1024 KiB; 0 without a limit
    used: int       #: bytes


@wraps("TAVOSupportQUOTA")
def supported() -> bool:
    return bool(ask("TAVOSupportQUOTA"))


@wraps("TAVOQuotaGet")
def get(user: str, device: str) -> Quota:
    """Limit and use of a user on the volume of this block device."""
    record = ffi.new("TAVOQUOTA *")
    call("TAVOQuotaGet", user, device, record)
    return Quota(record.rLimit, record.cbUsed)


@wraps("TAVOQuotaSet")
def set(user: str, device: str, limit: float) -> None:
    call("TAVOQuotaSet", user, device, ffi.new("float *", limit))


@wraps("TAVOQuotaInit")
def switch_on(volume: int) -> None:
    call("TAVOQuotaInit", volume)


@wraps("TAVOQuotaOff")
def switch_off(volume: int) -> None:
    call("TAVOQuotaOff", volume)
