# The lower half of the module, which cffi makes from the headers: names and types are those of C.
from typing import Any

ffi: Any
lib: Any
