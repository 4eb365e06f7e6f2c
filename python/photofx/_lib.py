"""photofx.lib: every export of the C library, called exactly as C calls it.

The declarations are read from the library's own header (shipped in the package), so each
function gets its C argument and result types and each table its element type and length.
Pointer arguments take C-contiguous numpy arrays, None, ctypes objects (byref(), arrays) or
addresses. These calls take none of the module's locks: a host that uses the module-wide state
(the blur workspace, auto adjust's parameters) from several threads serialises them itself.
"""

import ctypes
import os
import re

import numpy as np


class Pointer:
    """A pointer argument."""

    @classmethod
    def from_param(cls, obj):
        if obj is None:
            return None
        if isinstance(obj, np.ndarray):
            if not obj.flags.c_contiguous:
                raise TypeError("arrays passed to the C library must be C-contiguous")
            return ctypes.c_void_p(obj.ctypes.data)
        if isinstance(obj, int) and not isinstance(obj, bool):
            return ctypes.c_void_p(obj)
        return obj


_SCALARS = {
    "void": None,
    "int32_t": ctypes.c_int32,
    "uint32_t": ctypes.c_uint32,
    "uint8_t": ctypes.c_uint8,
    "double": ctypes.c_double,
}


def _type(text):
    text = " ".join(text.replace("const", " ").replace("*", " * ").split())
    if text.endswith("*"):
        return Pointer
    return _SCALARS[text]


def _result(text):
    text = " ".join(text.replace("const", " ").replace("*", " * ").split())
    return ctypes.c_void_p if text.endswith("*") else _SCALARS[text]


_FUNCTION = re.compile(r"PHOTOFX_API\s+([\w\s\*]+?)\s*\b(\w+)\s*\(([^)]*)\)\s*;")
_DATA = re.compile(r"PHOTOFX_API\s+extern\s+([\w\s\*]+?)\s*\b(\w+)\s*(?:\[(\d+)\])?\s*;")
_MACRO = re.compile(r"^#define\s+(PHOTOFX_[A-Z_]+|MIRROR_[A-Z_]+)\s+(\d+)", re.M)


def declarations(header_text):
    """(functions, data, constants) declared by the header: name -> (result, [argument types]),
    name -> (type, length or None), name -> int."""
    text = re.sub(r"/\*.*?\*/|//[^\n]*", " ", header_text, flags=re.S)
    functions, data = {}, {}
    for result, name, args in _FUNCTION.findall(text):
        args = args.strip()
        # Each argument is its type then its name: "const uint32_t* src", "int32_t *r".
        types = [] if args in ("", "void") else [a.strip()[: -len(a.split()[-1].lstrip("*"))]
                                                 for a in args.split(",")]
        functions[name] = (result, types)
    for ctype, name, length in _DATA.findall(text):
        data[name] = (ctype, int(length) if length else None)
    constants = {name: int(value) for name, value in _MACRO.findall(header_text)}
    return functions, data, constants


class Library:
    """The C library in the shared object at `path`, with its header's types."""

    def __init__(self, path, header=None):
        header = header or os.path.join(os.path.dirname(__file__), "photofx.h")
        with open(header) as f:
            functions, data, constants = declarations(f.read())
        self._dll = ctypes.CDLL(path)
        self.path = path
        for name, (result, args) in functions.items():
            fn = getattr(self._dll, name)
            fn.restype = _result(result)
            fn.argtypes = [_type(a) for a in args]
            setattr(self, name, fn)
        for name, (ctype, length) in data.items():
            t = _result(ctype)
            setattr(self, name, (t * length if length else t).in_dll(self._dll, name))
        for name, value in constants.items():
            setattr(self, name, value)
        self.functions = sorted(functions)
        self.data = sorted(data)

    def __repr__(self):
        return f"<photofx C library {self.path}: {len(self.functions)} functions>"
