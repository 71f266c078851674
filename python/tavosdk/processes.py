"""Programs and processes."""
from __future__ import annotations

from ._core import ask, c_names, call, ffi, to_c, wraps
from .settings import Path

__getattr__, __dir__ = c_names("proc", globals())


@wraps("TLIBTimedExec")
def run(program: Path, *arguments: str, timeout: int) -> int:
    """Runs a program by its path for at most timeout seconds and returns its exit code. It has no input, no output and no
    environment but PATH."""
    given = [ffi.new("char[]", to_c(argument)) for argument in arguments]
    return int(call("TLIBTimedExec", timeout, program, *given, ffi.cast("char *", 0)))


@wraps("TLIBPs")
def find(pattern: str) -> list[int]:
    """The ids of the processes whose line in the process table matches."""
    room = 64
    while True:
        pids = ffi.new("pid_t[]", room)
        count = call("TLIBPs", pattern, pids, room)
        if count <= room:
            return list(pids[0:count])
        room = count + 16


@wraps("BlTLIBProcAlive")
def alive(pid: int) -> bool:
    return bool(ask("BlTLIBProcAlive", pid))


@wraps("TLIBReadPidFile")
def pid_in(path: Path) -> int | None:
    """The process id in a pid file; None when it holds no number."""
    return call("TLIBReadPidFile", path) or None


@wraps("TLIBProcSignalByPidFile")
def signal(path: Path, number: int) -> None:
    """Sends a signal to the process that a pid file names."""
    call("TLIBProcSignalByPidFile", path, number)
