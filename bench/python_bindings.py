#!/usr/bin/env python3
"""What the Python package adds to a call: the overhead of one effect call on a 16 x 16 image
(goal: at most 2 us), and 12-megapixel brightness through Python against the C call on the same
buffers (goal: within 1.05x).

  build/python/bin/python bench/python_bindings.py            prints the section
  build/python/bin/python bench/python_bindings.py --write    also puts it in docs/performance.md

Run it with the interpreter the package is installed in (scripts/check-python makes build/python).
Times are CPU time of this process (the machine is shared), the median of interleaved rounds.
The C call goes through photofx.lib, the same compiled code the package runs, so the ratio is the
binding's alone; ctypes adds a few microseconds to it, which at 12 megapixels is noise.
"""

import argparse
import os
import platform
import statistics
import time

import numpy as np

import photofx

ROOT = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
BEGIN = "<!-- python-bindings: written by bench/python_bindings.py -->"
END = "<!-- /python-bindings -->"


def cpu_time(call, number):
    start = time.process_time()
    for _ in range(number):
        call()
    return (time.process_time() - start) / number


def measure(cases, rounds, number):
    """Median seconds per call of each case, the cases interleaved round by round."""
    samples = {name: [] for name in cases}
    for _ in range(rounds):
        for name, call in cases.items():
            samples[name].append(cpu_time(call, number))
    return {name: statistics.median(s) for name, s in samples.items()}


def section(small, large, rounds):
    overhead = small["photofx.brightness(img, level=14, out=out)"]
    ratio = large["photofx.brightness(big, level=14, out=out)"] / large["C controlBrightness"]
    rows = [
        BEGIN,
        "## Python bindings",
        "",
        "Written by `bench/python_bindings.py` (the Python package of `python/`, built by "
        "`scripts/check-python`): CPU time per call, the median of "
        f"{rounds} interleaved rounds, on {platform.machine()} with Python "
        f"{platform.python_version()} and numpy {np.__version__}; load average "
        f"{os.getloadavg()[0]:.1f} on {os.cpu_count()} CPUs at the end of the run (other work "
        "on the machine inflates even CPU times).",
        "",
        "| Call | Image | Time | Goal | Met |",
        "|---|---|---:|---|---|",
    ]
    for name, t in small.items():
        goal = "≤ 2 µs" if name == "photofx.brightness(img, level=14, out=out)" else ""
        met = ("met" if t <= 2e-6 else "not met") if goal else ""
        rows.append(f"| `{name}` | 16 x 16 | {t * 1e6:.2f} µs | {goal} | {met} |")
    for name, t in large.items():
        python = name.startswith("photofx")
        goal = "≤ 1.05× the C call" if python and "out=" in name else ""
        met = ("met" if ratio <= 1.05 else "not met") if goal else ""
        rows.append(f"| `{name}` | 4000 x 3000 | {t * 1e3:.2f} ms | {goal} | {met} |")
    rows += [
        "",
        f"Call overhead {overhead * 1e6:.2f} µs; 12-megapixel brightness through Python "
        f"{ratio:.3f}× the C call. A fresh output array costs the page faults of a new "
        "48 MB allocation on every call; `out=` reuses one.",
        "",
        END,
    ]
    return "\n".join(rows)


def write(text):
    path = os.path.join(ROOT, "docs", "performance.md")
    with open(path) as f:
        old = f.read()
    if BEGIN in old:
        before, rest = old.split(BEGIN, 1)
        new = before + text + rest.split(END, 1)[1]
    else:
        new = old.rstrip("\n") + "\n\n" + text + "\n"
    with open(path, "w") as f:
        f.write(new)
    print(f"python_bindings: wrote {path}")


def main():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    parser.add_argument("--write", action="store_true", help="update docs/performance.md")
    parser.add_argument("--rounds", type=int, default=15)
    a = parser.parse_args()

    rng = np.random.default_rng(7)
    img = rng.integers(0, 2**32, (16, 16), dtype=np.uint32)
    out = np.empty_like(img)
    bright, lib = photofx.brightness, photofx.lib
    apply = photofx.apply
    c = lib.controlBrightness
    small = measure(
        {
            "photofx.brightness(img, level=14, out=out)": lambda: bright(img, level=14, out=out),
            "photofx.brightness(img, level=14)": lambda: bright(img, level=14),
            'photofx.apply(img, "brightness", level=14)': lambda: apply(
                img, "brightness", level=14
            ),
            "photofx.lib.controlBrightness (ctypes)": lambda: c(img, out, 16, 16, 14),
        },
        a.rounds,
        20000,
    )
    big = rng.integers(0, 2**32, (3000, 4000), dtype=np.uint32)
    big_out = np.empty_like(big)
    large = measure(
        {
            "C controlBrightness": lambda: c(big, big_out, 4000, 3000, 14),
            "photofx.brightness(big, level=14, out=out)": lambda: bright(
                big, level=14, out=big_out
            ),
            "photofx.brightness(big, level=14)": lambda: bright(big, level=14),
        },
        a.rounds,
        5,
    )
    text = section(small, large, a.rounds)
    print(text)
    if a.write:
        write(text)


if __name__ == "__main__":
    main()
