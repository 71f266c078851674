"""Local groups."""
from __future__ import annotations

import dataclasses

from ._core import Error, Texts, ask, c_names, call, lib, quietly, string, text, text_of, wraps
from ._owned import record
from .lists import taken

__getattr__, __dir__ = c_names("group", globals())


@dataclasses.dataclass
class Group:
    name: str
    gid: int = -1                   #: -1 when passed in: choose one, or keep it
    members: list[str] = dataclasses.field(default_factory=list)
    description: str = ""


def _get(function: str, key: str | int) -> Group:
    with record("TAVOGROUP", "TAVOGroupFree") as cell:
        call(function, key, cell)
        group = cell[0]
        members: list[str] = []
        while (member := string(group.rgszMember[len(members)])) is not None:
            members.append(member)
        return Group(text(group.szName), group.nGid, members, description(text(group.szName)))


@wraps("TAVOGroupGet", "TAVOGroupDescGet")
def get(name: str) -> Group:
    """The group of this name, in any case of letters; NotFoundError when there is none."""
    return _get("TAVOGroupGet", name)


@wraps("TAVOGroupGetByGID")
def get_by_gid(gid: int) -> Group:
    return _get("TAVOGroupGetByGID", gid)


@wraps("TAVOGroupEnumByPrefix")
def names(prefix: str = "") -> list[str]:
    return taken("TAVOGroupEnumByPrefix", lib.TAVO_GROUP_LOCAL, prefix, place=0)


@wraps("TAVOGroupListMember")
def members(name: str) -> list[str]:
    """The members that are existing users; of "users" every local user."""
    return taken("TAVOGroupListMember", name)


@wraps("TAVOGroupDescGet")
def description(name: str) -> str:
    return text_of("TAVOGroupDescGet", name, room=512)


@wraps("TAVOGroupSet", "TAVOGroupDescSet")
def set(group: Group, old_name: str | None = None) -> Group:
    """Adds the group, or makes the one called old_name what `group` says. Returns it as it is stored."""
    given = Texts(group.members)
    with record("TAVOGROUP", "TAVOGroupFree") as cell:
        call("TAVOGroupAlloc2", cell, group.name, group.gid, given.array)
        call("TAVOGroupSet", old_name, cell[0])
    if group.description != description(group.name):
        call("TAVOGroupDescSet", group.name, group.description)
    return get(group.name)


@wraps("TAVOGroupDelete")
def delete(*names: str) -> None:
    """Deletes groups; the others also when one of them cannot be deleted."""
    given = Texts(names)
    result, error = quietly("TAVOGroupDelete", given.array, len(given))
    if error is not None and (result < 0 or error.name in ("ERR_NO_SUCH_GROUP", "ERR_GROUP_DB_DELETE")):
        raise error


@wraps("BlTLIBIsGroupName")
def is_name(name: str) -> bool:
    return bool(ask("BlTLIBIsGroupName", name))


def exists(name: str) -> bool:
    try:
        get(name)
    except Error as error:
        if error.name in ("ERR_NO_SUCH_GROUP", "ERR_INVALID_GROUPNAME"):
            return False
        raise
    return True
