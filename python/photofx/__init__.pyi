"""Type stubs of photofx, made from the catalogue by `python -m photofx._stubs`."""

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

def brightness(img: _A, *, level: int = 10, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """lighter or darker: moves the luma and keeps the colour"""

def contrast(img: _A, *, level: int = 10, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """pushes each channel away from mid grey, or draws it toward it below 10"""

def saturation(img: _A, *, level: int = 10, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """more or less colourful: 0 is grey, 20 about doubles each colour's distance from it"""

def temperature(img: _A, *, level: int = 10, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """warmer above 10 (more red, less blue), cooler below"""

def exposure(img: _A, *, level: int = 10, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """each channel times level / 10: 0 is black, 20 doubles"""

def hue(img: _A, *, level: int = 10, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """turns every colour round the colour wheel, 18 degrees per step"""

def faded_colour(img: _A, *, level: int = 0, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """blends toward a washed-out, warm-tinted copy"""

def invert(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """the negative: each colour channel becomes 255 minus itself"""

def channel_gains(img: _A, *, red: int = 10, green: int = 10, blue: int = 10, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """a slider per channel: a step adds 6 to its channel and takes 3 from the others"""

def colour_tone(img: _A, *, hue: int = 30, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """repaints the picture in one hue at low saturation"""

def lighten(img: _A, *, cx: Optional[int] = None, cy: Optional[int] = None, strength: int = 64, radius: Optional[int] = None, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """brush: lightens a disc, most at its centre; the disc becomes opaque"""

def darken(img: _A, *, cx: Optional[int] = None, cy: Optional[int] = None, strength: int = 64, radius: Optional[int] = None, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """brush: darkens a disc, most at its centre; the disc becomes opaque"""

def blur(img: _A, *, level: int = 4, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """soft blur of the selection, or of everything, on a scaled-down copy"""

def blur_preview(img: _A, *, level: int = 4, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """the same blur through a preview session, as an editor's slider runs it"""

def tilt_shift(img: _A, *, centre: Optional[int] = None, half_height: Optional[int] = None, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """a sharp horizontal band, the picture blurring away above and below it"""

def tilt_shift_preview(img: _A, *, centre: Optional[int] = None, half_height: Optional[int] = None, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """the same tilt-shift through a preview session"""

def sharpen(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """crisper vertical edges: each pixel pushed away from its left and right neighbours"""

def pixelize(img: _A, *, shift: int = 3, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """a mosaic of square blocks, each the colour of its top-left pixel"""

def pixelize_brush(img: _A, *, shift: int = 4, cx: Optional[int] = None, cy: Optional[int] = None, radius: Optional[int] = None, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """brush: the same mosaic inside a disc, on the grid of the whole picture"""

def red_eye(img: _A, *, cx: Optional[int] = None, cy: Optional[int] = None, radius: Optional[int] = None, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """takes the red out of strongly red pixels inside a square"""

def gamma(img: _A, *, channel: Literal['all', 'red', 'green', 'blue'] = 'all', gamma: float = 1.0, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """mid-tones lighter above 1, darker below; black and white stay"""

def input_levels(img: _A, *, channel: Literal['all', 'red', 'green', 'blue'] = 'all', low: int = 0, high: int = 255, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """stretches low..high over the whole range: more contrast, the ends clipped"""

def output_levels(img: _A, *, channel: Literal['all', 'red', 'green', 'blue'] = 'all', low: int = 0, high: int = 255, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """squeezes the whole range into low..high: less contrast"""

def greyscale(img: _A, *, level: int = 10, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """grey from the mean of the channels, lighter above 10 and darker below"""

def sepia(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """warm brown tones: red lifted and blue lowered, most in the mid-tones"""

def vignette(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """darkens toward the borders: to 9/16 at their middles, about 1/8 in the corners"""

def vignette_preview(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """the table-based vignette for previews: steeper, about 0 in the corners"""

def vintage(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """faded warm film: tone curves, brightness and contrast, then a vignette"""

def vintage_preview(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """a one-pass stand-in for the vintage look, for previews"""

def old_photo(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """sepia with flattened contrast and a vignette"""

def old_photo_texture(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """a warm tone with a quarter of a paper texture mixed in"""

def pop_art(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """four half-size copies, each posterised in its own colours"""

def pop_art_preview(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """four half-size copies, each turned to its own hue, for previews"""

def soft_glow(img: _A, *, level: int = 50, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """a slight blur, bright tones lifted and dark ones lowered"""

def retro(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """preset: faded, slightly bright and desaturated"""

def sunshine(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """preset: warm and golden, blue held back"""

def downlight(img: _A, *, threshold: int = 70, cutoff: int = 100, weight1: int = 1000, weight2: int = 5120, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """preset: faded and auto-adjusted, soft and dim; takes auto adjust's parameters"""

def bluewash(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """preset: cool and blue, a little more contrast"""

def nostalgia(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """preset: faded, bright and warm"""

def yellow_glow(img: _A, *, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """preset: faded and strongly yellow, with lifted contrast"""

def mirror(img: _A, *, column: Optional[int] = None, row: Optional[int] = None, mode: Literal['keep-left', 'keep-right', 'keep-top', 'keep-bottom'] = 'keep-left', axis: Literal['horizontal', 'vertical'] = 'horizontal', out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """keeps one side of a column or row and adds its reflection; changes the size"""

def sphericity(img: _A, *, cx: Optional[int] = None, cy: Optional[int] = None, radius: Optional[int] = None, level: int = 60, fast: bool = False, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """bulges (level above 0) or pinches (below 0) a circle of about 1.4 x radius"""

def twirl(img: _A, *, cx: Optional[int] = None, cy: Optional[int] = None, radius: Optional[int] = None, angle: int = 90, fast: bool = False, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """turns a circle by an angle that is largest at its centre and fades to its rim"""

def auto_adjust(img: _A, *, threshold: int = 70, cutoff: int = 100, weight1: int = 1000, weight2: int = 5120, mask: Optional[Mask] = None, rect: Optional[Box] = None, ellipse: Optional[Box] = None, out: Optional[_A] = None, layout: Literal["bgra", "rgba"] = "bgra") -> _A:
    """tone mapping from the picture's histogram (contrast 12 under 150 pixels a side)"""


class BlurSession:
    """the same blur through a preview session, as an editor's slider runs it"""
    closed: bool
    def __init__(
        self,
        img: npt.NDArray[Any],
        mask: Optional[Mask] = None,
        *,
        rect: Optional[Box] = None,
        ellipse: Optional[Box] = None,
    ) -> None: ...
    def preview(self, *, level: int = 4, out: Optional[npt.NDArray[Any]] = None) -> npt.NDArray[Any]: ...
    def close(self) -> None: ...
    def __enter__(self) -> "BlurSession": ...
    def __exit__(self, *exc: object) -> bool: ...


class TiltShiftSession:
    """the same tilt-shift through a preview session"""
    closed: bool
    def __init__(
        self,
        img: npt.NDArray[Any],
        mask: Optional[Mask] = None,
        *,
        rect: Optional[Box] = None,
        ellipse: Optional[Box] = None,
    ) -> None: ...
    def preview(self, *, centre: Optional[int] = None, half_height: Optional[int] = None, out: Optional[npt.NDArray[Any]] = None) -> npt.NDArray[Any]: ...
    def close(self) -> None: ...
    def __enter__(self) -> "TiltShiftSession": ...
    def __exit__(self, *exc: object) -> bool: ...
