"""photofx: bit-exact photo effects on numpy arrays and Pillow images.

Images are numpy arrays, used without a copy: uint32 (H, W) of 0xAARRGGBB words, or uint8
(H, W, 4) of B, G, R, A bytes (the same memory on little-endian machines). R, G, B, A arrays
(Pillow's and imageio's order) go through one explicit conversion: ``layout="rgba"``, or
``from_pil`` and ``to_pil`` for Pillow images.

There is one function per effect, named and parametrised as ``photofx list`` shows them (with
"_" for "-"): ``photofx.brightness(img, level=14)``, ``photofx.twirl(img, angle=-180,
radius=120, fast=True)``; ``photofx.apply(img, "brightness", level=14)`` takes the name as a
string and ``photofx.effects()`` lists them. ``out=`` writes into an array you already have.

``BlurSession`` and ``TiltShiftSession`` keep working copies between previews; ``batch`` runs a
chain of effects over many files on a Dask cluster; ``lib`` is the C library as it stands.
"""

import sys as _sys

import numpy as _np

if _sys.byteorder != "little":  # pragma: no cover - every target is little-endian
    raise ImportError("photofx: B, G, R, A bytes are 0xAARRGGBB words only on little-endian CPUs")

from . import _catalog
from . import _photofx as _ext
from ._catalog import Effect, Param

__all__ = [
    "apply",
    "apply_file",
    "batch",
    "BlurSession",
    "Effect",
    "effects",
    "FileResult",
    "from_pil",
    "MAX_PIXELS",
    "Param",
    "TiltShiftSession",
    "to_pil",
]

#: Image files with more pixels than this are refused by ``batch`` (as by the command-line tool).
MAX_PIXELS = _ext.MAX_PIXELS


def _make(effect, template, namespace, name=None):
    name = name or effect.function
    source = template.format(
        name=name,
        index=effect.index,
        keywords=_catalog.keywords(effect, _catalog.extras(effect)),
        session_keywords=_catalog.keywords(effect, ("out",)),
        values=_catalog.values(effect),
    )
    scope = dict(namespace)
    exec(source, scope)  # the names come from the catalogue, checked to be identifiers
    return scope[name]


_FUNCTION = """def {name}(img, *, {keywords}):
    return _run({index}, img, {values}, mask, rect, ellipse, out, layout)
"""
_FUNCTION_NO_SELECTION = """def {name}(img, *, {keywords}):
    return _run({index}, img, {values}, None, None, None, out, layout)
"""

for _effect in _catalog.EFFECTS:
    _template = _FUNCTION if _effect.selects != "nothing" else _FUNCTION_NO_SELECTION
    _f = _make(_effect, _template, {"_run": _ext.run})
    _f.__module__ = __name__
    _f.__doc__ = _catalog.docstring(_effect)
    globals()[_effect.function] = _f
    __all__.append(_effect.function)
del _effect, _template, _f


def effects():
    """Every effect, in the order ``photofx list`` shows them."""
    return list(_catalog.EFFECTS)


def _find(name):
    effect = _catalog.BY_NAME.get(name) if isinstance(name, str) else None
    if effect is None:
        raise ValueError(f"unknown effect {name!r} (photofx.effects() lists them)")
    return effect


def apply(img, effect, **params):
    """Runs the effect named `effect` ("faded-colour" or "faded_colour") with `params`, the
    keywords its own function takes."""
    return globals()[_find(effect).function](img, **params)


# ---- Pillow ---------------------------------------------------------------------------------


def from_pil(image):
    """A Pillow image as a new uint32 (H, W) array of 0xAARRGGBB words (opaque when the image
    has no alpha)."""
    if image.mode != "RGBA":
        image = image.convert("RGBA")
    pixels = _np.array(image, dtype=_np.uint8)  # R, G, B, A
    _ext.swap_red_blue(pixels, pixels)
    return pixels.view(_np.uint32).reshape(pixels.shape[:2])


def to_pil(img):
    """A uint32 (H, W) or B, G, R, A uint8 (H, W, 4) array as a new RGBA Pillow image."""
    from PIL import Image

    a = _np.asarray(img)
    if not (
        (a.dtype == _np.uint32 and a.ndim == 2)
        or (a.dtype == _np.uint8 and a.ndim == 3 and a.shape[2] == 4)
    ):
        raise TypeError(f"to_pil takes uint32 (H, W) or uint8 (H, W, 4), not {a.dtype} {a.shape}")
    a = _np.ascontiguousarray(a)
    return Image.frombuffer("RGBA", (a.shape[1], a.shape[0]), a, "raw", "BGRA", 0, 1).copy()


# ---- Preview sessions ----------------------------------------------------------------------

_PREVIEW = """def {name}(self, *, {session_keywords}):
    return self._session.preview({values}, out)
"""


class _Session:
    _effect = None  # the catalogue entry whose preview this is

    def __init__(self, img, mask=None, *, rect=None, ellipse=None):
        self._session = _ext.Session(self._effect.index, img, mask, rect, ellipse)

    def close(self):
        """Releases the working copies (also at the end of a ``with`` block)."""
        self._session.close()

    @property
    def closed(self):
        return self._session.closed

    def __enter__(self):
        return self

    def __exit__(self, *exc):
        self.close()
        return False


def _session_class(name, effect_name, doc):
    effect = _catalog.BY_NAME[effect_name]
    preview = _make(effect, _PREVIEW, {}, "preview")
    preview.__doc__ = _catalog.docstring(effect, session=True)
    preview.__qualname__ = name + ".preview"
    cls = type(name, (_Session,), {"_effect": effect, "preview": preview, "__doc__": doc})
    cls.__module__ = __name__
    return cls


BlurSession = _session_class(
    "BlurSession",
    "blur-preview",
    """Blur previews of one image, as an editor's slider makes them.

    ``with photofx.BlurSession(img, mask) as s: s.preview(level=6)``. The session makes its
    working copies of img (and of the selection: mask, rect, ellipse as for the effects) once
    and blurs them at each preview; each preview equals ``photofx.blur_preview`` with the same
    arguments. Keep img unchanged while the session is open. Sessions share the library's one
    workspace safely: a session whose copies another one replaced makes them again.""",
)

TiltShiftSession = _session_class(
    "TiltShiftSession",
    "tilt-shift-preview",
    """Tilt-shift previews of one image: ``with photofx.TiltShiftSession(img) as s:
    s.preview(centre=240, half_height=40)``. Like ``BlurSession``; each preview equals
    ``photofx.tilt_shift_preview`` with the same arguments.""",
)

# ---- Batches and the C library, loaded when first used ---------------------------------------


def batch(inputs, steps, out_dir, client=None, **options):
    """Applies a chain of steps to many image files with dask.distributed; see
    photofx._batch.batch (and docs/python.md) for the options."""
    from . import _batch

    return _batch.batch(inputs, steps, out_dir, client, **options)


def apply_file(input, output, steps, *, max_pixels=MAX_PIXELS):
    """Applies a chain of steps to one image file, as each worker of ``batch`` does."""
    from . import _batch

    return _batch.apply_file(input, output, steps, max_pixels=max_pixels)


def __getattr__(name):
    if name == "lib":
        from . import _lib

        value = _lib.Library(_ext.__file__)
    elif name == "FileResult":
        from . import _batch

        value = _batch.FileResult
    else:
        raise AttributeError(f"module 'photofx' has no attribute {name!r}")
    globals()[name] = value
    return value

