"""Discovery of the other appliances on the network."""
from __future__ import annotations

from ._core import c_names, call, wraps
from .hashes import taken

__getattr__, __dir__ = c_names("fhost", globals())


@wraps("TAVOFHOSTDumpHost")
def search() -> None:
    """Asks the network and collects the answers for ten seconds; starts the daemon when it does not run."""
    call("TAVOFHOSTDumpHost")


@wraps("TAVOFHOSTGet2Hash")
def collected() -> dict[str, str]:
    """The addresses that the last search found, by "NAME(ADDRESS)". What hosts say of themselves is not to be trusted."""
    return taken("TAVOFHOSTGet2Hash")


def hosts() -> dict[str, str]:
    """Searches, and returns what answered."""
    search()
    return collected()
