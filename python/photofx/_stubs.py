"""Writes photofx/__init__.pyi from the catalogue: `python -m photofx._stubs > __init__.pyi`.

The stub file is checked in, so that editors and type checkers see every effect function with its
parameters' types, ranges and defaults; a test compares it with what this module makes.
"""

from . import _catalog

_HEAD = '''"""Type stubs of photofx, made from the catalogue by `python -m photofx._stubs`."""

from os import PathLike
from typing import Any, Iterable, List, Literal, NamedTuple, Optional, Sequence, Tuple, TypeVar
from typing import Union

import numpy as np
import numpy.typing as npt

from ._catalog import Effect as Effect, Param as Param

# uint32 (H, W) of 0xAARRGGBB words, or uint8 (H, W, 4) of bytes; results are like the input.
_A = TypeVar("_A", npt.NDArray[np.uint32], npt.NDArray[np.uint8])
Mask = Union[npt.NDArray[np.bool_], npt.NDArray[np.uint8]]
Box = Tuple[int, int, int, int]
_Path = Union[str, PathLike[str]]

MAX_PIXELS: int
lib: Any

class FileResult(NamedTuple):
    input: str
    output: str
    error: Optional[str]

def effects() -> List[Effect]: ...
def apply(img: _A, effect: str, **params: Any) -> _A: ...
def from_pil(image: Any) -> npt.NDArray[np.uint32]: ...
def to_pil(img: npt.NDArray[Any]) -> Any: ...
def batch(
    inputs: Iterable[_Path],
    steps: Union[str, Sequence[Any]],
    out_dir: _Path,
    client: Any = None,
    *,
    workers: Optional[int] = None,
    max_pixels: int = ...,
    progress: Optional[bool] = None,
    timeout: Optional[float] = None,
) -> List[FileResult]: ...
def apply_file(
    input: _Path, output: _Path, steps: Union[str, Sequence[Any]], *, max_pixels: int = ...
) -> None: ...
'''

_SESSION = '''
class {name}:
    """{doc}"""
    closed: bool
    def __init__(
        self,
        img: npt.NDArray[Any],
        mask: Optional[Mask] = None,
        *,
        rect: Optional[Box] = None,
        ellipse: Optional[Box] = None,
    ) -> None: ...
    def preview(self, *, {keywords}) -> npt.NDArray[Any]: ...
    def close(self) -> None: ...
    def __enter__(self) -> "{name}": ...
    def __exit__(self, *exc: object) -> bool: ...
'''


def render():
    out = [_HEAD]
    for e in _catalog.EFFECTS:
        keywords = _catalog.keywords(e, _catalog.extras(e), stubs=True)
        out.append(f'def {e.function}(img: _A, *, {keywords}) -> _A:\n    """{e.summary}"""\n')
    sessions = (("BlurSession", "blur-preview"), ("TiltShiftSession", "tilt-shift-preview"))
    for name, effect in sessions:
        e = _catalog.BY_NAME[effect]
        keywords = _catalog.keywords(e, (), stubs=True) + ", out: Optional[npt.NDArray[Any]] = None"
        out.append(_SESSION.format(name=name, doc=e.summary, keywords=keywords.lstrip(", ")))
    return "\n".join(out)


if __name__ == "__main__":
    print(render(), end="")
