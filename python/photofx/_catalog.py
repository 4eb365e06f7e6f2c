"""The effect catalogue as Python sees it.

Names, parameters, ranges, defaults and help texts come from the table the command-line tool
lists (catalog/effects.cpp, read through the extension); this module only turns them into
Python: the functions' signatures and docstrings, and the type stubs made from the same pieces.
"""

import keyword
from dataclasses import dataclass
from typing import Optional, Tuple

from . import _photofx as _ext

# Keywords every effect function takes besides its parameters.
SELECTION = ("mask", "rect", "ellipse")
COMMON = ("out", "layout")


@dataclass(frozen=True)
class Param:
    """One parameter of an effect."""

    name: str  # the Python keyword: half_height
    option: str  # as the command line writes it, without the dashes: half-height
    kind: str  # "int", "real", "choice" (one of `choices`) or "bool" (an off/on choice)
    default: object  # None: a share of the image's size, see `range`
    range: str  # as `photofx list` prints it: "0..20 (10)", "0..W-1 (W/2)", "off|on (off)"
    help: str
    choices: Tuple[str, ...] = ()


@dataclass(frozen=True)
class Effect:
    """One effect: its names, what it does and what it takes."""

    name: str  # as the command line writes it: faded-colour
    function: str  # the Python function: faded_colour
    family: str
    summary: str
    selects: str  # "mask": a partial variant; "keep": edits all, keeps the selection; "nothing"
    stateful: bool  # uses module-wide library state (serialised by the module's lock)
    in_place: bool  # out may be img itself
    params: Tuple[Param, ...]
    index: int

    def param(self, name: str) -> Optional[Param]:
        for p in self.params:
            if name in (p.name, p.option):
                return p
        return None


def _python_name(name):
    ident = name.replace("-", "_")
    if not ident.isidentifier() or keyword.iskeyword(ident):
        raise ImportError(f"photofx: catalogue name {name!r} is no Python identifier")
    return ident


def _load():
    effects = []
    for index, e in enumerate(_ext.catalog()):
        params = tuple(
            Param(
                name=_python_name(p["name"]),
                option=p["name"],
                kind=p["kind"],
                default=p["default"],
                range=f"False or True ({p['default']})" if p["kind"] == "bool" else p["describe"],
                help=p["help"],
                choices=tuple(p.get("choices", ())),
            )
            for p in e["params"]
        )
        taken = {"img", *SELECTION, *COMMON}
        for p in params:
            if p.name in taken:
                raise ImportError(f"photofx: {e['name']} has a parameter named {p.name}")
        effects.append(
            Effect(
                name=e["name"],
                function=_python_name(e["name"]),
                family=e["family"],
                summary=e["summary"],
                selects=e["selects"],
                stateful=e["state"],
                in_place=e["in_place"],
                params=params,
                index=index,
            )
        )
    return tuple(effects)


EFFECTS = _load()
BY_NAME = {**{e.name: e for e in EFFECTS}, **{e.function: e for e in EFFECTS}}

# ---- Signatures -----------------------------------------------------------------------------

_TYPES = {"int": "int", "real": "float", "bool": "bool"}


def annotation(p):
    if p.kind == "choice":
        return "Literal[" + ", ".join(repr(c) for c in p.choices) + "]"
    t = _TYPES[p.kind]
    return t if p.default is not None else f"Optional[{t}]"


def extras(effect):
    """The keywords an effect function takes after the effect's parameters."""
    return (SELECTION if effect.selects != "nothing" else ()) + COMMON


_STUB_TYPES = {
    "mask": "Optional[Mask]",
    "rect": "Optional[Box]",
    "ellipse": "Optional[Box]",
    "out": "Optional[_A]",
    "layout": 'Literal["bgra", "rgba"]',
}


def keywords(effect, names, *, stubs=False):
    """The keyword-only part of a signature: the effect's parameters with their defaults, then
    `names` ("level=10, mask=None, ..."); with annotations for the stubs."""
    parts = []
    for p in effect.params:
        typed = f": {annotation(p)} = " if stubs else "="
        parts.append(f"{p.name}{typed}{p.default!r}")
    for n in names:
        default = '"bgra"' if n == "layout" else "None"
        parts.append(f"{n}: {_STUB_TYPES[n]} = {default}" if stubs else f"{n}={default}")
    return ", ".join(parts)


def values(effect):
    """The tuple of the parameters, in the table's order, as the extension takes them."""
    return "(" + "".join(p.name + ", " for p in effect.params) + ")"


# ---- Docstrings ---------------------------------------------------------------------------

_IMG = """img : numpy.ndarray
    uint32 (H, W) of 0xAARRGGBB words, or uint8 (H, W, 4) of B, G, R, A bytes (the same
    memory on little-endian machines); with layout="rgba", uint8 (H, W, 4) of R, G, B, A."""

_SELECTION = """mask : numpy.ndarray of bool or uint8, (H, W), optional
    selects the pixels where it is non-zero
rect : (x, y, width, height), optional
    selects columns x..x+width-1 and rows y..y+height-1
ellipse : (cx, cy, rx, ry), optional
    selects the pixels inside the ellipse, edge included"""

_SELECTION_NOTES = {
    "mask": "The library's partial variant edits the selection",
    "keep": "The whole image is edited and only the selected pixels are kept",
}

_COMMON = """out : numpy.ndarray, optional
    the array to write, of the result's dtype and shape; img itself to edit in
    place{in_place}
layout : "bgra" or "rgba"
    "rgba" takes and gives R, G, B, A bytes, converting once on the way in and once out"""


def _sentence(text):
    return text[:1].upper() + text[1:] + ("" if text.endswith(".") else ".")


def _param_doc(p):
    kind = {"int": "int", "real": "float", "bool": "bool", "choice": "str"}[p.kind]
    return f"{p.name} : {kind}, {p.range}\n    {p.help}"


def docstring(effect, *, session=False):
    lines = [_sentence(effect.summary), ""]
    if effect.stateful and not session:
        lines += ["Uses the library's module-wide state: such calls run one at a time.", ""]
    lines += ["Parameters", "----------"]
    if not session:
        lines.append(_IMG)
    lines += [_param_doc(p) for p in effect.params]
    if not session:
        if effect.selects != "nothing":
            lines.append(_SELECTION)
        in_place = "" if effect.in_place else " (not this effect: it reads img as it writes)"
        lines.append(_COMMON.format(in_place=in_place))
    else:
        lines.append("out : numpy.ndarray, optional\n    the array to write, like the image")
    lines += ["", "Returns", "-------", "numpy.ndarray", "    out, or a new array like img"]
    if any(p.default is None for p in effect.params):
        lines += [
            "",
            "Ranges with W, H or L are measured on the image (its width, height, longer side);",
            "their defaults (None) are the share of it shown in brackets.",
        ]
    if not session and effect.selects in _SELECTION_NOTES:
        lines += ["", _SELECTION_NOTES[effect.selects] + " (one selection: all given must select)."]
    return "\n".join(lines)
