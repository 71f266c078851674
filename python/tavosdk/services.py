"""The appliance's services: their table, their state, and how they are switched."""
from __future__ import annotations

import dataclasses
import enum

from ._core import NotFoundError, ask, c_names, call, lib, string, text, wraps
from .lists import taken

__getattr__, __dir__ = c_names("service", globals())


class Action(enum.IntEnum):
    ENABLE = 0
    DISABLE = 1
    STOP = 2
    START = 3
    RESTART = 4
    KEY_NO = 5
    KEY_YES = 6


@dataclasses.dataclass(frozen=True)
class Service:
    id: int
    name: str
    script: str | None
    key: str | None       #: in /etc/tavoinfo.conf
    process: str | None   #: a pid file when it holds a "/"

    @property
    def on(self) -> bool:
        """Whether it is enabled, bound and running."""
        return bool(call("TAVOServiceStatusGet", self.id))

    def act(self, action: Action) -> None:
        call("TAVOServiceActionSet", self.id, int(action))

    def enable(self) -> None:
        self.act(Action.ENABLE)

    def disable(self) -> None:
        self.act(Action.DISABLE)

    def start(self) -> None:
        self.act(Action.START)

    def stop(self) -> None:
        self.act(Action.STOP)

    def restart(self) -> None:
        self.act(Action.RESTART)


@wraps("TAVOServiceIndexGet", "TAVOServiceInfoGet")
def get(name: str) -> Service:
    """The service of exactly this name; NotFoundError when there is none."""
    place = ask("TAVOServiceIndexGet", name)
    if place < 0:
        raise NotFoundError(f"no service {name}", lib.ERR_KEY_NOT_FOUND)
    row = call("TAVOServiceInfoGet", place)
    return Service(place, text(row.szName), string(row.szScript), string(row.szKey), string(row.szProc))


@wraps("TAVOServiceGetAll")
def all() -> list[Service]:
    """The services that the model supports."""
    return [get(name) for name in taken("TAVOServiceGetAll")]
