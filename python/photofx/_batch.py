"""Chains of effects over many image files, on a Dask cluster or one file at a time.

Each file is read, processed and written by one task on a worker: the files never travel
through the client. Pillow reads and writes them; pixels go through the same chain code as the
command-line tool's (the catalogue's), so the outputs' pixels are the tool's.
"""

import multiprocessing
import os
import sys
import threading
import time
import uuid
from typing import NamedTuple, Optional

import numpy as np

from . import _catalog
from . import _photofx as _ext

# The tool's quality for JPEG and lossy WebP, from the catalogue: lossy outputs are
# pixel-identical to the tool's only with the same encoder settings.
QUALITY = _ext.QUALITY

_FORMATS = {
    ".png": "PNG",
    ".jpg": "JPEG",
    ".jpeg": "JPEG",
    ".webp": "WEBP",
    ".tif": "TIFF",
    ".tiff": "TIFF",
}


_NAMES = ", ".join(_FORMATS)


class FileResult(NamedTuple):
    """What became of one input: `error` is None when its output was written."""

    input: str
    output: str
    error: Optional[str]


# ---- Steps ------------------------------------------------------------------------------------


def _word(value):
    if isinstance(value, bool):
        return "on" if value else "off"
    if isinstance(value, float):
        return repr(value)
    if isinstance(value, (tuple, list)):
        return ",".join(str(int(v)) for v in value)
    return os.fspath(value) if isinstance(value, os.PathLike) else str(value)


def chain_words(steps):
    """The words of a chain: from the tool's syntax ("brightness --level 13 , contrast") or from
    a list of steps, each an effect name or (effect, {param: value})."""
    words = _ext.split_words(steps) if isinstance(steps, str) else []
    for step in [] if isinstance(steps, str) else steps:
        name, params = (step, {}) if isinstance(step, str) else step
        effect = _catalog.BY_NAME.get(name)
        if effect is None:
            raise ValueError(f"unknown effect {name!r} (photofx.effects() lists them)")
        if words:
            words.append(",")
        words.append(effect.name)
        for key, value in dict(params).items():
            if key == "mask" and not isinstance(value, (str, os.PathLike)):
                raise TypeError(
                    f"{effect.function}: a batch step's mask is an image file's name, "
                    f"not {type(value).__name__}"
                )
            p = effect.param(key)
            option = p.option if p is not None else key
            words += ["--" + option, _word(value)]
    _ext.check_chain(words)
    return words


def _mask_files(words):
    """The mask file each step names (None: none), resolved as the tool resolves it: against the
    working directory of the process given the chain, not the worker's."""
    return [None if p is None else os.path.abspath(p) for p in _ext.mask_paths(words)]


# ---- One file -----------------------------------------------------------------------------------

_PIL_LIMIT = threading.Lock()


def _open(path, max_pixels):
    from PIL import Image

    # Pillow's own guard against huge files would refuse at another size than ours, so it is set
    # aside while the header is read; the size is then checked against `max_pixels`.
    with _PIL_LIMIT:
        saved = Image.MAX_IMAGE_PIXELS
        Image.MAX_IMAGE_PIXELS = None
        try:
            image = Image.open(path)
        finally:
            Image.MAX_IMAGE_PIXELS = saved
    width, height = image.size
    if width * height > max_pixels:
        image.close()
        raise ValueError(f"{width} x {height} is more than the limit of {max_pixels} pixels")
    return image


def _to_words(image):
    """8-bit B, G, R, A words as the tool reads files: 16-bit samples keep their high byte,
    grey becomes R = G = B, no alpha becomes opaque."""
    from PIL import Image

    if image.mode == "CMYK":
        raise ValueError("CMYK images are not supported")
    if image.mode in ("I", "I;16", "I;16B", "I;16L"):
        grey = (np.asarray(image, dtype=np.uint32) >> 8).astype(np.uint8)
        image = Image.fromarray(grey, "L")
    if image.mode != "RGBA":
        image = image.convert("RGBA")
    pixels = np.array(image, dtype=np.uint8)
    _ext.swap_red_blue(pixels, pixels)
    return pixels.view(np.uint32).reshape(pixels.shape[:2])


def _write(words, path):
    from PIL import Image

    fmt = _FORMATS[os.path.splitext(path)[1].lower()]
    image = Image.frombuffer("RGBA", (words.shape[1], words.shape[0]), words, "raw", "BGRA", 0, 1)
    options = {"quality": QUALITY} if fmt in ("JPEG", "WEBP") else {}
    if fmt == "TIFF":
        options["compression"] = "tiff_adobe_deflate"
    if fmt == "JPEG" or bool(np.all((words >> 24) == 0xFF)):
        image = image.convert("RGB")  # as the tool: no alpha channel when it says nothing
    folder, name = os.path.split(path)
    # Written under a temporary name beside the target and renamed when complete, so a failure
    # never leaves a half-written file nor spoils an existing one.
    temp = os.path.join(folder, f".{name}.{uuid.uuid4().hex[:8]}")
    try:
        with open(temp, "xb") as f:
            image.save(f, format=fmt, **options)
        os.replace(temp, path)
    except BaseException:
        if os.path.exists(temp):
            os.unlink(temp)
        raise


def _read(path, max_pixels):
    with _open(path, max_pixels) as image:
        return _to_words(image)


def _apply(input, output, words, masks, max_pixels):
    # Mask files are read as the tool reads them, under the same limit; the catalogue decides
    # which of their pixels select.
    pictures = [None if m is None else _read(m, max_pixels) for m in masks]
    _write(_ext.run_chain(words, _read(input, max_pixels), pictures), output)


def _task(input, output, words, masks, max_pixels):
    """A worker's task: None, or why the file failed."""
    try:
        _apply(input, output, words, masks, max_pixels)
        return None
    except MemoryError:
        return f"{input}: out of memory"
    except Exception as e:  # every failure is the file's, reported without stopping the batch
        return f"{input}: {e}"


def _output_path(input, out_dir):
    output = os.path.join(os.fspath(out_dir), os.path.basename(os.fspath(input)))
    if os.path.splitext(output)[1].lower() not in _FORMATS:
        raise ValueError(f"{output}: unknown image format (use {_NAMES})")
    return output


def apply_file(input, output, steps, *, max_pixels=_ext.MAX_PIXELS):
    """Reads `input`, runs the chain `steps` and writes `output` (its format from its name).
    Raises ValueError or OSError when the file cannot be read, processed or written."""
    output = os.fspath(output)
    if os.path.splitext(output)[1].lower() not in _FORMATS:
        raise ValueError(f"{output}: unknown image format (use {_NAMES})")
    words = chain_words(steps)
    _apply(os.fspath(input), output, words, _mask_files(words), max_pixels)


# ---- Many files -------------------------------------------------------------------------------


def _bar(done, total, stream):
    width = 30
    filled = width * done // max(total, 1)
    stream.write(f"\rphotofx: [{'#' * filled}{'.' * (width - filled)}] {done}/{total} files")
    stream.flush()


def batch(
    inputs,
    steps,
    out_dir,
    client=None,
    *,
    workers=None,
    max_pixels=_ext.MAX_PIXELS,
    progress=None,
    timeout=None,
):
    """Applies a chain of steps to every file of `inputs`, writing each to `out_dir` under its
    own name, with dask.distributed.

    steps: the tool's chain syntax ("brightness --level 13 , vintage --rect 0,0,300,200") or a
        list of steps, each an effect name or (effect, {param: value}). A step's mask file
        (--mask FILE, or mask="FILE") is read on the workers, a relative name resolved against
        this process's working directory, as the tool resolves it.
    client: None starts a LocalCluster of `workers` processes (default: one per CPU) for this
        batch; a distributed.Client, or a scheduler's address, runs on that cluster.
    max_pixels: larger files are refused (the tool's limit by default).
    progress: a progress bar of files done on stderr (default: when stderr is a terminal).
    timeout: seconds after which files not yet done are reported as failed.

    Returns one FileResult per input, in order. A file that cannot be read, processed or written
    is reported in its result and the others are still done; a bad chain or output name raises
    ValueError before anything starts.
    """
    from distributed import Client, LocalCluster, wait

    words = chain_words(steps)
    masks = _mask_files(words)
    inputs = [os.fspath(i) for i in inputs]
    outputs = [_output_path(i, out_dir) for i in inputs]
    seen = set()
    for out in outputs:
        if out in seen:
            raise ValueError(f"two inputs would both be written to {out}")
        seen.add(out)
    os.makedirs(out_dir, exist_ok=True)
    show = sys.stderr.isatty() if progress is None else progress

    owned = []
    if client is None:
        if getattr(multiprocessing.current_process(), "_inheriting", False):
            # A worker process starting up re-runs the main script: starting a cluster again
            # there would never end.
            raise RuntimeError(
                "photofx.batch started a worker that called photofx.batch again: call it under "
                "if __name__ == '__main__': in the main script"
            )
        cluster = LocalCluster(
            n_workers=workers or os.cpu_count() or 1,
            threads_per_worker=1,
            processes=True,
            dashboard_address=None,
        )
        owned.append(cluster)
        client = Client(cluster)
        owned.append(client)
    elif isinstance(client, str):
        client = Client(client)
        owned.append(client)
    try:
        futures = [
            client.submit(_task, i, o, words, masks, max_pixels, pure=False)
            for i, o in zip(inputs, outputs)
        ]
        errors = {}
        pending = set(futures)
        deadline = None if timeout is None else time.monotonic() + timeout
        if show:
            _bar(0, len(futures), sys.stderr)
        while pending:
            wait_for = 0.5 if deadline is None else min(0.5, deadline - time.monotonic())
            if wait_for <= 0:
                break
            try:
                done, pending = wait(pending, timeout=wait_for, return_when="FIRST_COMPLETED")
            except TimeoutError:  # nothing finished in this interval
                continue
            for f in done:
                try:
                    errors[f.key] = f.result()
                except Exception as e:  # the worker itself failed
                    errors[f.key] = f"worker failed: {e}"
            if show:
                _bar(len(futures) - len(pending), len(futures), sys.stderr)
        for f in pending:
            f.cancel()
            errors[f.key] = f"not done within {timeout} seconds"
        if show:
            sys.stderr.write("\n")
        return [
            FileResult(i, o, errors[f.key])
            for i, o, f in zip(inputs, outputs, futures)
        ]
    finally:
        for thing in reversed(owned):
            thing.close()
