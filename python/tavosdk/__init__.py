"""The appliance's state in Python: settings, locks, programs, users, groups, disks, arrays, services, networks.

Every family of the library is a module: ``tavosdk.users.get("anna")``, ``with tavosdk.locks.hold("user"): ...``. What a
module does not wrap is there under its C name, with the comment of its header: ``help(tavosdk.users.TAVOUserGet)``.

A failure is an ``Error`` with the code, the module and the line that the library recorded. Changing functions change the
machine that they run on: its ``/etc/passwd``, its disks. Try them in an appliance root.

The library keeps one record of the last failure for the whole process, so the module makes one call at a time: while a
call waits (for a lock, a search, a program) those of other threads wait too.
"""
from . import (appliance, arrays, discovery, disks, errors, groups, hashes, lists, locks, network, partitions,
               processes, quotas, sections, services, settings, stores, text, users, volumes)
from ._core import Error, LockError, NotFoundError

__all__ = ["Error", "LockError", "NotFoundError", "appliance", "arrays", "discovery", "disks", "errors", "groups",
           "hashes", "lists", "locks", "network", "partitions", "processes", "quotas", "sections", "services", "settings",
           "stores", "text", "users", "volumes"]
