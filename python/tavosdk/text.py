"""Text as the library handles it: trimming, colon encoding, UTF-8 without regard to case."""
from __future__ import annotations

from ._core import c_names, call, ffi, lib, text, text_of, to_c, wraps

__getattr__, __dir__ = c_names("str", globals())


@wraps("TLIBStrEncodeColon")
def encode_colon(value: str) -> str:
    """The text in a form that fits in a field of a line of colon-separated fields."""
    return text_of("TLIBStrEncodeColon", value)


@wraps("TLIBStrDecodeColon")
def decode_colon(value: str) -> str:
    return text_of("TLIBStrDecodeColon", value)


@wraps("TLIBUnicodeUTF8StrUpper")
def upper(value: str) -> str:
    return text_of("TLIBUnicodeUTF8StrUpper", value)


@wraps("TLIBUnicodeUTF8StrCaseCmp")
def compare(left: str, right: str) -> int:
    """-1, 0 or 1 as left is less than, equal to or greater than right, without regard to case."""
    return int(call("TLIBUnicodeUTF8StrCaseCmp", left, right, fails=lambda result: bool(result == -2)))


@wraps("TLIBStrTrimSpace")
def trim(value: str) -> str:
    buffer = ffi.new("char[]", to_c(value))
    call("TLIBStrTrimSpace", buffer, None)
    return text(buffer)
