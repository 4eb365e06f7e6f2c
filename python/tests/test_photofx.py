"""The photofx package against the C library called directly, its arrays, its errors, its threads
and its batches. PHOTOFX_LIBRARY names the library to compare with (default: the package's own
exports, photofx.lib); PHOTOFX_TOOL the command-line tool whose outputs batches must match."""

import hashlib
import os
import re
import subprocess
import threading

import numpy as np
import pytest
from PIL import Image

import photofx
from photofx import _photofx, _stubs
from photofx._lib import Library

W, H = 200, 160  # above 150 a side, so auto adjust maps tones rather than falling back
HDR = (70, 100, 1000, 5120)


@pytest.fixture(scope="module")
def lib():
    path = os.environ.get("PHOTOFX_LIBRARY")
    return Library(path) if path else photofx.lib


def picture(seed, w=W, h=H):
    return np.random.default_rng(seed).integers(0, 2**32, (h, w), dtype=np.uint32)


IMG = picture(1)
SEL = np.zeros((H, W), bool)
SEL[20:100, 30:150] = np.random.default_rng(2).random((80, 120)) < 0.5


class Call:
    """The arguments of a direct C call: full(levels) and part(levels) in the library's order."""

    def __init__(self, src, sel):
        self.src, self.dst, self.h, self.w = src, src.copy(), src.shape[0], src.shape[1]
        self.mask = None if sel is None else sel.astype(np.uint8)
        ys, xs = np.nonzero(sel) if sel is not None else ([0, H - 1], [0, W - 1])
        self.win = tuple(int(v) for v in (min(xs), max(xs), min(ys), max(ys)))

    def full(self, *levels):
        return (self.src, self.dst, self.w, self.h, *levels)

    def part(self, *levels):
        return (self.src, self.mask, self.dst, self.w, self.h, *levels, *self.win)


def tuned(L, values, call):
    L.fx_set_hdr(*values)
    call()
    L.fx_set_hdr(*HDR)


def blur_preview(L, c, mask, bounds):
    L.fx_Init_blur(c.src, mask, c.w, c.h, *bounds)
    L.fx_make_blur_preview(c.src, mask, c.dst, c.w, c.h, 6)
    L.fx_destroy_blur()


def mirror(L, c):
    mode, axis = L.MIRROR_KEEP_RIGHT, L.MIRROR_HORIZONTAL
    ow, oh = L.getMirrorOutwidth(c.w, 40, mode, axis), L.getMirrorOutheight(c.h, 40, mode, axis)
    out = np.zeros((oh, ow), np.uint32)
    L.runMirror(c.src, c.w, c.h, out, ow, oh, 40, mode, axis)
    return out


def paper(c):
    return _photofx.paper_texture(c.w, c.h)


def tilt(L, c):
    L.initTiltShift(c.src, c.w, c.h)
    L.makeTiltShift(c.src, c.dst, c.w, c.h, 30, 8)
    L.destroyTiltShift()


def pair(full, partial, *levels):
    return (lambda L, c: getattr(L, full)(*c.full(*levels)),
            lambda L, c: getattr(L, partial)(*c.part(*levels)))


def only(full, *levels):  # the package keeps the selected pixels of the whole image's result
    return lambda L, c: getattr(L, full)(*c.full(*levels)), None


def hdr(values, full, partial=None):
    return (lambda L, c: tuned(L, values, lambda: getattr(L, full)(*c.full())),
            partial and (lambda L, c: tuned(L, values, lambda: getattr(L, partial)(*c.part()))))


def brush(fn, *levels):
    return lambda L, c: getattr(L, fn)(c.dst, *levels), None


B = dict(cx=40, cy=30, radius=20)
# effect: (its keywords, the C call on the whole image, the C call under a selection)
ROWS = {
    "brightness": ({"level": 14}, *pair("controlBrightness", "controlBrightnessPartial", 14)),
    "contrast": ({"level": 16}, *pair("controlContrast", "controlContrastPartial", 16)),
    "saturation": ({"level": 3}, *pair("controlSaturation", "controlSaturationPartial", 3)),
    "temperature": ({"level": 17}, *pair("controlTemperature", "controlTemperaturePartial", 17)),
    "exposure": ({"level": 13}, *pair("controlExposure", "controlExposurePartial", 13)),
    "hue": ({"level": 4}, *pair("controlHue", "controlHuePartial", 4)),
    "faded-colour": ({"level": 60}, *pair("controlFadedColour", "controlFadedColourPartial", 60)),
    "invert": ({}, *pair("applyInvert", "applyInvertPartial")),
    "channel-gains": (dict(red=14, green=12, blue=4),
                      *pair("controlAdjustRGB", "AdjustRGB", 14, 12, 4)),
    "colour-tone": ({"hue": 200}, *only("fx_change_colortone", 200)),
    "lighten": (dict(B, strength=100), *brush("rubLighten", 40, 30, W, H, 100, 20)),
    "darken": (dict(B, strength=90), *brush("rubDarken", 40, 30, W, H, 90, 20)),
    "blur": ({"level": 6}, lambda L, c: L.applyBlur(c.src, None, c.dst, W, H, 6, 1, 0, 1, 0),
             lambda L, c: L.applyBlur(*c.part(6))),
    "blur-preview": ({"level": 6}, lambda L, c: blur_preview(L, c, None, (1, 0, 1, 0)),
                     lambda L, c: blur_preview(L, c, c.mask, c.win)),
    "tilt-shift": ({"centre": 30, "half_height": 8}, *only("applyTiltShift", 30, 8)),
    "tilt-shift-preview": ({"centre": 30, "half_height": 8}, tilt, None),
    "sharpen": ({}, lambda L, c: L.fx_apply_sharpen_all(*c.full()),
                lambda L, c: L.applySharpen(*c.part(0))),
    "pixelize": ({"shift": 3}, *only("applyPixelize", 3)),
    "pixelize-brush": (dict(B, shift=2), *brush("rubPixelize", W, H, 2, 40, 30, 20)),
    "red-eye": (B, *brush("removeRedeye", W, H, 40, 30, 20)),
    "gamma": (dict(channel="blue", gamma=1.8), *only("control_gamma", 3, 1.8)),
    "input-levels": (dict(channel="red", low=40, high=215),
                     *only("changeHistogramByInput", 1, 40, 215)),
    "output-levels": (dict(channel="green", low=9, high=99),
                      *only("changeHistogramByOutput", 2, 9, 99)),
    "greyscale": ({"level": 15}, *pair("controlGreyscale", "controlGreyscalePartial", 15)),
    "sepia": ({}, *pair("fx_apply_sepia", "fx_apply_sepia_partial")),
    "vignette": ({}, *only("fx_apply_vignette")),
    "vignette-preview": ({}, *only("fx_apply_vignette_prev")),
    "vintage": ({}, *pair("applyVintage", "applyVintagePartial")),
    "vintage-preview": ({}, *only("fx_apply_vintage_prev")),
    "old-photo": ({}, *pair("applyOldPhoto", "applyOldPhotoPartial")),
    "old-photo-texture": ({},
                          lambda L, c: L.fx_apply_oldphoto_texture(c.src, c.dst, paper(c), W, H),
                          lambda L, c: L.fx_apply_oldphoto_texture_partial(
                              c.src, c.dst, paper(c), c.mask, W, H, *c.win)),
    "pop-art": ({}, *only("applyPopArt")),
    "pop-art-preview": ({}, *only("fx_apply_popart_prev")),
    "soft-glow": ({"level": 80}, *pair("applySoftglow", "applySoftglowPartial", 80)),
    "retro": ({}, *pair("applyRetro", "applyRetroPartial")),
    "sunshine": ({}, *pair("applySunshine", "applySunshinePartial")),
    "downlight": (dict(threshold=50, cutoff=90, weight1=2000, weight2=5000),
                  *hdr((50, 90, 2000, 5000), "applyDownlight", "applyDownlightPartial")),
    "bluewash": ({}, *pair("applyBluewash", "applyBluewashPartial")),
    "nostalgia": ({}, *pair("applyNostalgia", "applyNostalgiaPartial")),
    "yellow-glow": ({}, *pair("applyYellowglow", "applyYellowglowPartial")),
    "mirror": (dict(column=40, mode="keep-right"), mirror, None),
    "sphericity": (dict(B, level=-60),
                   lambda L, c: L.runSphericity(*c.full(40, 30, 20, -60), *c.win, 0), None),
    "twirl": (dict(B, angle=-180, fast=True),
              lambda L, c: L.runTwirl(*c.full(40, 30, 20, -180), *c.win, 1), None),
    "auto-adjust": (dict(threshold=60, cutoff=85, weight1=4000),
                    *hdr((60, 85, 4000, 5120), "applyAutoAdjust")),
}


def digest(a):
    return hashlib.sha256(np.ascontiguousarray(a).tobytes()).hexdigest()[:16]


def reference(L, call, sel):
    c = Call(IMG, sel)
    out = call(L, c)
    return out if isinstance(out, np.ndarray) else c.dst


def test_every_catalogue_entry_has_a_row():
    assert sorted(ROWS) == sorted(e.name for e in photofx.effects())


@pytest.mark.parametrize("name", sorted(ROWS))
def test_every_effect_equals_the_c_library(lib, name):
    kw, full, partial = ROWS[name]
    f = getattr(photofx, name.replace("-", "_"))
    want = reference(lib, full, None)
    out = np.full(want.shape, 0xA5A5A5A5, np.uint32)  # every pixel must be written
    assert digest(f(IMG, **kw, out=out)) == digest(want)
    assert digest(f(IMG.view(np.uint8).reshape(H, W, 4), **kw)) == digest(want.view(np.uint8))
    if f.__kwdefaults__.get("mask", 0) is None:  # it takes a selection
        want = (reference(lib, partial, SEL) if partial
                else np.where(SEL, reference(lib, full, SEL), IMG))
        out[...] = 0xA5A5A5A5
        assert digest(f(IMG, **kw, mask=SEL, out=out)) == digest(want), "under a selection"


def test_arrays_are_used_without_a_copy():
    img, out = IMG.copy(), np.empty_like(IMG)
    assert photofx.brightness(img, level=14, out=out) is out
    as_bytes = img.view(np.uint8).reshape(H, W, 4)
    assert np.shares_memory(photofx.invert(as_bytes, out=as_bytes), img)
    assert np.array_equal(img, photofx.invert(IMG))
    rgba = np.ascontiguousarray(IMG.view(np.uint8).reshape(H, W, 4)[..., [2, 1, 0, 3]])
    assert np.array_equal(photofx.brightness(rgba, level=3, layout="rgba")[..., [2, 1, 0, 3]],
                          photofx.brightness(IMG, level=3).view(np.uint8).reshape(H, W, 4))
    assert np.array_equal(photofx.from_pil(photofx.to_pil(IMG)), IMG)


def misaligned():
    return np.frombuffer(bytes(W * H * 4 + 1), np.uint8)[1:].reshape(H, W, 4)


def overlapping(i, o):
    flat = i.reshape(-1)
    return photofx.brightness(flat[:-W].reshape(H - 1, W), out=flat[W:].reshape(H - 1, W))


# (effect and its keywords (with the harness's out=), or a call of (img, out); error; message)
BAD = [
    ("brightness", dict(level=21), ValueError, "level=21 is out of range 0..20"),
    ("brightness", dict(level=1.5), TypeError, "level must be an int, not float"),
    ("brightness", dict(level=True), TypeError, "level must be an int, not bool"),
    ("twirl", dict(cx=W), ValueError, f"cx={W} is out of range 0..{W - 1} for a {W} x {H} image"),
    ("twirl", dict(fast="yes"), ValueError, "fast must be one of 'off', 'on', not 'yes'"),
    ("gamma", dict(gamma=float("nan")), ValueError, "gamma=nan is out of range 0.1..10"),
    ("input_levels", dict(low=200, high=100), ValueError, "high must be above low"),
    ("brightness", dict(mask=SEL[1:]), ValueError, f"mask must have the image's shape ({H}, {W})"),
    ("brightness", dict(mask=SEL * 1.0), TypeError, "mask must be a bool or uint8 array"),
    ("brightness", dict(rect=(1, 2, 0, 3)), ValueError, "width and height must be at least 1"),
    ("brightness", dict(rect=(1, 2, 3)), TypeError, "rect must be four ints"),
    ("brightness", dict(ellipse=(-50, -50, 5, 5)), ValueError, "lies outside the 200x160 image"),
    ("brightness", dict(layout="argb"), ValueError, "layout must be 'bgra' or 'rgba'"),
    ("brightness", dict(layout="rgba"), TypeError, "must be a uint8 array (H, W, 4) of R, G, B, A"),
    (lambda i, o: photofx.mirror(i, mode="keep-top"), None, ValueError, "keep-top and keep-bottom"),
    (lambda i, o: photofx.invert(i.T, out=o), None, ValueError, "img must be C-contiguous"),
    (lambda i, o: photofx.invert(i.astype(np.int32)), None, TypeError, "not a int32 array"),
    (lambda i, o: photofx.invert(i.view(np.uint8)), None, ValueError, "not a uint8 array of shape"),
    (lambda i, o: photofx.invert(photofx.to_pil(i)), None, TypeError, "photofx.from_pil converts"),
    (lambda i, o: photofx.invert(misaligned()), None, ValueError, "img must be aligned to 4 bytes"),
    (lambda i, o: photofx.invert(i, out=o[1:]), None, ValueError, f"array of shape ({H}, "),
    (lambda i, o: photofx.invert(i, out=o.view(np.uint8)), None, ValueError, "out must be a uint32"),
    (lambda i, o: photofx.invert(i, out=np.frombuffer(o.tobytes(), np.uint32).reshape(H, W)),
     None, ValueError, "out must be writeable"),
    (overlapping, None, ValueError, "out overlaps img"),
    (lambda i, o: photofx.twirl(i, out=i), None, ValueError, "out must not be img"),
    (lambda i, o: photofx.apply(i, "brightnes"), None, ValueError, "unknown effect 'brightnes'"),
]


@pytest.mark.parametrize("effect,arguments,error,message", BAD)
def test_bad_arguments_raise_and_write_nothing(effect, arguments, error, message):
    img, out, selection = IMG.copy(), np.full((H, W), 0xA5A5A5A5, np.uint32), SEL.copy()
    call = effect
    if not callable(effect):
        call = lambda i, o: getattr(photofx, effect)(i, out=o, **arguments)  # noqa: E731
    with pytest.raises(error, match=re.escape(message)):
        call(img, out)
    assert np.array_equal(img, IMG) and np.array_equal(SEL, selection) and (out == 0xA5A5A5A5).all()


def test_threads_never_corrupt_the_module_state():
    images = [picture(10 + t) for t in range(4)]
    jobs = [
        lambda i: photofx.auto_adjust(i, threshold=40, cutoff=80),
        lambda i: photofx.auto_adjust(i, weight1=6000),
        lambda i: photofx.downlight(i, mask=SEL, cutoff=60),
        lambda i: photofx.blur_preview(i, level=3, mask=SEL),
        lambda i: photofx.tilt_shift_preview(i, centre=40),
    ]
    want = [[digest(job(i)) for job in jobs] for i in images]
    previews = [[digest(photofx.blur_preview(i, level=v, mask=SEL)) for v in range(9)]
                for i in images]
    wrong = []

    def hammer(t):
        with photofx.BlurSession(images[t], SEL) as session:
            for r in range(12):
                k = (r + t) % len(jobs)
                if digest(jobs[k](images[t])) != want[t][k]:
                    wrong.append((t, r, k))
                if digest(session.preview(level=(r * 5 + t) % 9)) != previews[t][(r * 5 + t) % 9]:
                    wrong.append((t, r, "session"))

    threads = [threading.Thread(target=hammer, args=(t,)) for t in range(4)]
    for th in threads:
        th.start()
    for th in threads:
        th.join()
    assert wrong == []
    with pytest.raises(ValueError, match="the session is closed"):
        session = photofx.TiltShiftSession(IMG)
        session.close()
        session.preview()


def test_the_stubs_list_every_effect_as_the_catalogue_says():
    with open(os.path.join(os.path.dirname(photofx.__file__), "__init__.pyi")) as f:
        assert f.read() == _stubs.render()


# (a chain in the tool's syntax, the same as a list of steps); a relative mask file name is
# resolved against the working directory, as the tool resolves it
CHAINS = [
    ("brightness --level 13 , vintage --ellipse 100,80,60,40 , twirl --angle -90 --radius 50",
     [("brightness", {"level": 13}), ("vintage", {"ellipse": (100, 80, 60, 40)}),
      ("twirl", {"angle": -90, "radius": 50})]),
    ("sepia --mask mask.png , pixelize --shift 2 --mask=mask.png --rect 0,0,90,140",
     [("sepia", {"mask": "mask.png"}),
      ("pixelize", {"shift": 2, "mask": "mask.png", "rect": (0, 0, 90, 140)})]),
]


@pytest.mark.parametrize("chain,steps", CHAINS)
def test_a_cluster_batch_equals_the_serial_run_and_the_tool(tmp_path, monkeypatch, chain, steps):
    tool = os.environ.get("PHOTOFX_TOOL") and os.path.abspath(os.environ["PHOTOFX_TOOL"])
    monkeypatch.chdir(tmp_path)
    photofx.to_pil(picture(9, 180, 140)).save("mask.png")  # grey and alpha both vary
    os.mkdir("in")
    inputs = []
    for name, mode in (("a.png", "RGBA"), ("b.webp", "RGB"), ("c.jpg", "RGB"), ("d.png", "L"),
                       ("e.tif", "RGBA")):
        inputs.append(str(tmp_path / "in" / name))
        photofx.to_pil(picture(len(inputs), 180, 140) | 0x3F3F3F3F).convert(mode).save(inputs[-1])
    inputs.append(str(tmp_path / "in" / "broken.png"))
    open(inputs[-1], "wb").write(b"not a picture")
    results = photofx.batch(inputs, chain, tmp_path / "out", workers=2, timeout=120, progress=False)
    assert [r.error is None for r in results] == [True] * 5 + [False]
    assert "broken.png" in results[-1].error
    for r in results[:-1]:
        serial = str(tmp_path / ("serial-" + os.path.basename(r.input)))
        photofx.apply_file(r.input, serial, steps)
        assert open(r.output, "rb").read() == open(serial, "rb").read(), r.input
        if tool:
            mine = str(tmp_path / ("tool-" + os.path.basename(r.input)))
            subprocess.run([tool, "apply", *chain.split(), r.input, mine], check=True, timeout=60)
            same = np.array_equal(np.asarray(Image.open(mine)), np.asarray(Image.open(r.output)))
            assert same, r.input
    with pytest.raises(ValueError, match="more than the limit of 1000 pixels"):
        photofx.apply_file(inputs[0], tmp_path / "x.png", chain, max_pixels=1000)
    with pytest.raises(ValueError, match="step 2 .vintage.: vintage has no parameter --level"):
        photofx.batch(inputs, "brightness , vintage --level 3", tmp_path / "out")
