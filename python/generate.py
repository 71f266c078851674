#!/usr/bin/python3
"""Writes what the Python module takes from the public headers: the C source of its lower half, and the comments.

usage: generate.py FOLDER
"""
import pathlib
import pprint
import re
import sys

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parents[1] / "tools/reference"))
import headers  # noqa: E402

import cffi  # noqa: E402


def declarations():
    """The headers as cffi reads them."""
    parts = ["typedef int... pid_t;"]
    for family in headers.in_order():
        source = (headers.TREE / "include" / family.header).read_text()
        code = family.code
        # cffi takes the layout of records with attributes from the compiler and checks that of all others.
        for struct in re.findall(r"typedef struct (?:__attribute__\S+ )?\w* ?\{.*?\} \w+;", source, re.S):
            if "__attribute__" in struct:
                name = re.search(r"(\w+);$", struct).group(1)
                code = re.sub(rf"\}} {name};", f"...; }} {name};", code)
        macros = []
        for name, value, _ in family.constants:
            if name in family.strings:
                macros.append(f"static char *const {name};")
            elif re.search(rf"^#define {name}\b", source, re.M):
                macros.append(f"#define {name} {value}")
        parts += ["\n".join(macros), code]
    return "\n".join(parts)


def main(folder):
    folder.mkdir(parents=True, exist_ok=True)
    builder = cffi.FFI()
    # The caller frees arrays that the library returns.
    builder.cdef(declarations() + "\nvoid free(void *);")
    builder.set_source("tavosdk._tavosdk", "#include <stdlib.h>\n#include <tavosdk.h>")
    builder.emit_c_code(str(folder / "_tavosdk.c"))
    reference = {name: (entry.family.name, entry.kind, entry.prototype, entry.comment.text)
                 for name, entry in sorted(headers.names().items())}
    (folder / "_reference.py").write_text(
        '"""Made from the public headers: family, kind, declaration and comment of every exported name."""\n'
        f"NAMES = {pprint.pformat(reference, width=118)}\n")


if __name__ == "__main__":
    if len(sys.argv) != 2:
        sys.exit(__doc__)
    main(pathlib.Path(sys.argv[1]))
