"""What the modules share: calls that turn failures into exceptions, and the conversion of texts."""
from __future__ import annotations

import os
import threading
from typing import Any, Callable, Iterable, TypeVar

from ._reference import NAMES
from ._tavosdk import ffi as ffi, lib as lib

Function = TypeVar("Function", bound=Callable[..., Any])

# The library records one failure for the whole process; the interpreter lets other threads run during a call.
one_call = threading.RLock()
# A child process of fork has none of the other threads: none of them may be in the library just then.
os.register_at_fork(before=one_call.acquire, after_in_parent=one_call.release, after_in_child=one_call.release)

_NOT_FOUND = {"ERR_KEY_NOT_FOUND", "ERR_SECTION_NOT_FOUND", "ERR_NO_SUCH_USER", "ERR_NO_SUCH_GROUP", "ERR_NO_SUCH_SHARE",
              "ERR_FILE_NOT_FOUND", "ERR_PATH_NOT_FOUND"}
_CODES = {getattr(lib, name): name for name in dir(lib) if name.startswith("ERR_")}


class Error(Exception):
    """A failure of the library.

    code and name: the error code and its name. module and line: the place in the library that found the failure; None
    and 0 when a function fails without recording a code.
    """

    def __init__(self, what: str, code: int = 0, module: str | None = None, line: int = 0):
        self.what, self.code, self.module, self.line = what, code, module, line
        self.name = _CODES.get(code, f"0x{code:04X}") if code else "no code"
        place = f" ({module}:{line})" if module else ""
        super().__init__(f"{what}: {self.name}{place}")


class NotFoundError(Error, LookupError):
    """There is no such account, key, section or file."""


class LockError(Error):
    """A lock was not free in time."""


def failure(what: str) -> Error:
    """The failure that the library recorded last; call it under the lock of `call`."""
    code, module, line = lib.tavoerrno, lib.TAVOErrorGetFile(), lib.TAVOErrorGetLine()
    name = _CODES.get(code, "")
    kind = NotFoundError if name in _NOT_FOUND else LockError if name == "ERR_LOCK_FAILED" else Error
    return kind(what, code, string(module), line)


def call(name: str, *arguments: Any, fails: Callable[[Any], bool] | None = None) -> Any:
    """Calls the function and raises Error when it fails: when it returns a negative number or NULL, or as `fails` says."""
    with one_call:
        lib.TLIBErrSet(0)
        result = getattr(lib, name)(*map(to_c, arguments))
        if fails is None:
            failed = result == ffi.NULL if isinstance(result, ffi.CData) else result is not None and result < 0
        else:
            failed = fails(result)
        if failed:
            raise failure(name)
        return result


def below_one(result: int) -> bool:
    """Whether a function failed that returns 0 where nothing was found or changed."""
    return result <= 0


def ask(name: str, *arguments: Any) -> Any:
    """The result of a function that cannot fail, or whose result says all."""
    with one_call:
        return getattr(lib, name)(*map(to_c, arguments))


def quietly(name: str, *arguments: Any) -> tuple[Any, Error | None]:
    """The result of a function and what it recorded, without judging either."""
    with one_call:
        lib.TLIBErrSet(0)
        result = getattr(lib, name)(*map(to_c, arguments))
        return result, failure(name) if lib.tavoerrno else None


# What a function of C takes as it is; to ask these for a path costs as much as the rest of a call.
_OF_C = (int, bytes, ffi.CData)


def to_c(value: Any) -> Any:
    if isinstance(value, str):
        if "\0" in value:
            raise ValueError("a text for the library cannot hold a NUL")
        return value.encode("utf-8", "surrogateescape")
    if value is None:
        return ffi.NULL
    if not isinstance(value, _OF_C) and hasattr(value, "__fspath__"):
        return to_c(value.__fspath__())
    return value


def string(pointer: Any) -> str | None:
    """The text at a char pointer, or in a char array; None for NULL."""
    return None if pointer == ffi.NULL else ffi.string(pointer).decode("utf-8", "surrogateescape")


def text(pointer: Any) -> str:
    return string(pointer) or ""


class Texts:
    """An array of texts that ends with NULL, for the length of a call."""

    def __init__(self, texts: Iterable[str | None]):
        self._kept = [ffi.NULL if item is None else ffi.new("char[]", to_c(item)) for item in texts]
        self.array = ffi.new("char *[]", self._kept + [ffi.NULL])

    def __len__(self) -> int:
        return len(self._kept)


def text_of(name: str, *before: Any, room: int = 64, after: tuple[Any, ...] = (),
            fails: Callable[[Any], bool] | None = None) -> str:
    """The text that a function with a buffer and its size gives; the buffer grows until it is enough."""
    while True:
        buffer = ffi.new("char[]", room)
        try:
            call(name, *before, buffer, room, *after, fails=fails)
        except Error as error:
            if error.name not in ("ERR_NOT_ENOUGH_MEMORY", "ERR_TRUNCATED") or room >= 1 << 24:
                raise
            room *= 4
        else:
            return text(buffer)


def wraps(*names: str) -> Callable[[Function], Function]:
    """Adds the header's comments about the functions that a wrapper is made of to its docstring."""
    def add(function: Function) -> Function:
        parts = [function.__doc__ or ""]
        parts += [f"{NAMES[name][2]};\n\n{NAMES[name][3]}" for name in names]
        function.__doc__ = "\n\n".join(part for part in parts if part)
        return function
    return add


class CFunction:
    """A function under its C name. Texts may be str, None is NULL; it returns what C returns and raises nothing."""

    def __init__(self, name: str):
        self.__name__ = name
        self.__doc__ = f"{NAMES[name][2]};\n\n{NAMES[name][3]}"

    def __call__(self, *arguments: Any) -> Any:
        return ask(self.__name__, *arguments)

    def __repr__(self) -> str:
        return f"<C function {NAMES[self.__name__][2]}>"


def c_names(family: str, module: dict[str, Any]) -> tuple[Callable[[str], Any], Callable[[], list[str]]]:
    """__getattr__ and __dir__ of the module of a family: its names in C, beside what the module defines."""
    names = {name for name, entry in NAMES.items() if entry[0] == family}

    def get(name: str) -> Any:
        if name not in names:
            raise AttributeError(f"no such name: {name}")
        if NAMES[name][1] != "function":
            return getattr(lib, name)
        module[name] = CFunction(name)  # asked for once
        return module[name]

    def names_of() -> list[str]:
        return sorted(names | module.keys())

    return get, names_of
