#!/usr/bin/env python3
"""Tests of bench/report's arithmetic (which figure a row is divided by, which goal applies and
whether it is met, how failures surface) on made-up results, and of the chart it draws with
photofx_chart (named by the PHOTOFX_CHART environment variable; skipped without it)."""
import importlib.machinery
import importlib.util
import json
import math
import os
import subprocess
import tempfile
import unittest

HERE = os.path.dirname(os.path.abspath(__file__))


def load(name, path):
    loader = importlib.machinery.SourceFileLoader(name, path)
    module = importlib.util.module_from_spec(importlib.util.spec_from_loader(name, loader))
    loader.exec_module(module)
    return module


report = load("report", os.path.join(HERE, "report"))
png = load("make_crop", os.path.join(os.path.dirname(HERE), "scripts", "make-test-crop"))


def bench(name, ms, label="", peak=0.0, px=12e6, aggregate="median", error=None):
    """One entry as Google Benchmark writes it to JSON."""
    b = {"name": f"{name}_{aggregate}" if aggregate else name, "run_name": name,
         "run_type": "aggregate" if aggregate else "iteration", "cpu_time": ms,
         "time_unit": "ms", "items_per_second": px / (ms / 1e3), "label": label,
         "scratch_peak": peak, "scratch_kept": 0.0, "image_px": px}
    if aggregate:
        b["aggregate_name"] = aggregate
    if error:
        b = {"name": name, "run_name": name, "run_type": "iteration", "error_occurred": True,
             "error_message": error}
    return b


def rows_of(entries):
    data = {"benchmarks": entries}
    results = report.parse_results(data)
    order = []
    for e in entries:
        n = report.base_name(e["run_name"])
        if n not in order:
            order.append(n)
    return {r.result.name: r for r in report.evaluate(results, order)}


class Goals(unittest.TestCase):
    def test_point_operation_is_held_to_twice_memcpy(self):
        rows = rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                        bench("fast/full/12mp", 15, "goal=memcpy*2"),
                        bench("slow/full/12mp", 25, "goal=memcpy*2")])
        self.assertAlmostEqual(rows["fast/full/12mp"].x_memcpy, 1.5)
        self.assertIs(rows["fast/full/12mp"].met, True)
        self.assertAlmostEqual(rows["slow/full/12mp"].x_memcpy, 2.5)
        self.assertIs(rows["slow/full/12mp"].met, False)
        self.assertEqual(rows["slow/full/12mp"].goal_text, "≤ 2× memcpy")

    def test_peer_goal_divides_by_the_peer_of_the_same_size(self):
        rows = rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                        bench("peer/cv-hsv/12mp", 20, "reference"),
                        bench("peer/cv-hsv/preview", 1, "reference", px=777600),
                        bench("hue/full/12mp", 30, "goal=peer*1 peer=cv-hsv")])
        hue = rows["hue/full/12mp"]
        self.assertAlmostEqual(hue.x_peer, 1.5)
        self.assertIs(hue.met, False)
        # In the chart the goal is drawn where the peer's own bar ends.
        self.assertAlmostEqual(hue.goal_memcpy, 2.0)

    def test_goals_are_judged_on_the_photograph_only(self):
        rows = rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                        bench("floor/memcpy/preview", 1, "reference", px=777600),
                        bench("blur-preview/full/12mp", 30, "goal=memcpy*4 scratch<=8"),
                        bench("blur-preview/full/preview", 30, "goal=memcpy*4 scratch<=8",
                              px=777600)])
        self.assertIs(rows["blur-preview/full/12mp"].met, True)
        self.assertEqual(rows["blur-preview/full/preview"].goal_text, "")
        self.assertIsNone(rows["blur-preview/full/preview"].met)

    def test_scratch_goal_counts_bytes_per_pixel_beside_time(self):
        rows = rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                        bench("lean/full/12mp", 30, "goal=memcpy*4 scratch<=8", peak=8 * 12e6),
                        bench("fat/full/12mp", 30, "goal=memcpy*4 scratch<=8", peak=9 * 12e6)])
        self.assertIs(rows["lean/full/12mp"].met, True)
        self.assertAlmostEqual(rows["fat/full/12mp"].bytes_per_px, 9.0)
        self.assertIs(rows["fat/full/12mp"].met, False)

    def test_partial_variant_is_held_to_one_and_a_half_times_its_full_variant(self):
        rows = rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                        bench("look/full/12mp", 40, "goal=memcpy*6"),
                        bench("look/partial/12mp", 70, ""),
                        bench("tone/full/12mp", 40, ""),
                        bench("tone/partial/12mp", 50, ""),
                        bench("tone/full/preview", 1, "", px=777600),
                        bench("tone/partial/preview", 9, "", px=777600)])
        self.assertAlmostEqual(rows["look/partial/12mp"].x_full, 1.75)
        self.assertIs(rows["look/partial/12mp"].met, False)
        self.assertIs(rows["tone/partial/12mp"].met, True)
        self.assertEqual(rows["tone/partial/12mp"].goal_text, "≤ 1.5× full")
        self.assertIsNone(rows["tone/partial/preview"].met)
        self.assertIn("1.75× full", report.summary(list(rows.values())))

    def test_summary_says_which_part_of_a_two_part_goal_fails(self):
        rows = rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                        bench("slow/full/12mp", 50, "goal=memcpy*4 scratch<=8", peak=8 * 12e6)])
        self.assertIs(rows["slow/full/12mp"].met, False)
        self.assertIn("(goal ≤ 4× memcpy: not met; scratch ≤ 8 B/px: met)",
                      report.summary(list(rows.values())))

    def test_goal_without_its_peer_is_not_judged(self):
        rows = rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                        bench("hue/full/12mp", 5, "goal=peer*1 peer=cv-hsv")])
        self.assertIsNone(rows["hue/full/12mp"].met)
        self.assertIn("?", report.row_cells(rows["hue/full/12mp"]))
        self.assertIn("1 not judged", report.summary(list(rows.values())))


    def test_hand_written_gap_notes_follow_the_summary(self):
        rows = list(rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                             bench("slow/full/12mp", 50, "goal=memcpy*2")]).values())
        md = report.markdown(rows, {}, {"date": "d", "mode": "m"}, "### Why\nbandwidth")
        self.assertLess(md.index("Not met:"), md.index("### Why\nbandwidth"))
        self.assertLess(md.index("bandwidth"), md.index("## 12 MP"))


class Results(unittest.TestCase):
    def test_median_is_used_not_mean(self):
        rows = rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                        bench("x/full/12mp", 100, "goal=memcpy*2", aggregate="mean"),
                        bench("x/full/12mp", 15, "goal=memcpy*2", aggregate="median"),
                        bench("x/full/12mp", 30, "goal=memcpy*2", aggregate="stddev")])
        self.assertAlmostEqual(rows["x/full/12mp"].x_memcpy, 1.5)

    def test_short_runs_carry_their_iteration_count_in_the_name(self):
        self.assertEqual(report.base_name("sepia/partial/12mp/iterations:2"), "sepia/partial/12mp")
        self.assertEqual(report.base_name("a/full/preview/min_time:0.100/repeats:3"),
                         "a/full/preview")
        rows = rows_of([bench("floor/memcpy/12mp/iterations:2", 10, "reference", aggregate=None),
                        bench("x/full/12mp/iterations:2", 10, "goal=memcpy*2", aggregate=None)])
        self.assertIs(rows["x/full/12mp"].met, True)

    def test_failed_benchmark_is_reported_and_fails_the_run(self):
        entries = [bench("floor/memcpy/12mp", 10, "reference"),
                   bench("x/full/12mp", 1, error="the call wrote nothing")]
        rows = rows_of(entries)
        self.assertIn("failed: the call wrote nothing", report.row_cells(rows["x/full/12mp"]))
        with tempfile.TemporaryDirectory() as d:
            path = os.path.join(d, "r.json")
            with open(path, "w") as f:
                json.dump({"benchmarks": entries}, f)
            with self.assertRaises(SystemExit) as e:
                report.main(["--from-json", path, "--out", d, "--chart", "/bin/true"])
            self.assertEqual(e.exception.code, 1)
            with open(os.path.join(d, "performance.md")) as f:
                self.assertIn("failed: the call wrote nothing", f.read())

    def test_report_from_a_saved_run_keeps_the_suite_order(self):
        # Interleaved repetitions are written in random order; the report follows registration.
        entries = [bench("b/full/12mp", 15, ""), bench("floor/memcpy/12mp", 10, "reference"),
                   bench("a/full/12mp", 15, "")]
        for e, family in zip(entries, (2, 0, 1)):
            e["family_index"] = family
        with tempfile.TemporaryDirectory() as d:
            path = os.path.join(d, "r.json")
            with open(path, "w") as f:
                json.dump({"benchmarks": entries}, f)
            report.main(["--from-json", path, "--out", d, "--chart", "/bin/true"])
            with open(os.path.join(d, "performance.md")) as f:
                text = f.read()
        self.assertLess(text.index("**memcpy**"), text.index("| a |"))
        self.assertLess(text.index("| a |"), text.index("| b |"))

    def test_chart_gets_one_bar_per_row_coloured_by_its_goal(self):
        rows = rows_of([bench("floor/memcpy/12mp", 10, "reference"),
                        bench("a/full/12mp", 15, "goal=memcpy*2"),
                        bench("a/partial/12mp", 40, ""),
                        bench("b/full/12mp", 50, "goal=memcpy*2")])
        bars = report.chart_bars(list(rows.values()), "T").splitlines()
        self.assertEqual(bars[:2], ["title\tT", "panel\t" + report.SIZES["12mp"]])
        self.assertEqual(bars[2:], ["bar\tmemcpy\t1\t0\treference",
                                    "bar\ta\t1.5\t2\tmet",
                                    "bar\ta partial\t4\t2.25\tmissed",
                                    "bar\tb\t5\t2\tmissed"])


class Arm(unittest.TestCase):
    @staticmethod
    def arm(counts):
        """bench/arm-cost's JSON for one build at 640 x 480, counts per pixel of 100 pixels."""
        return {"sizes": ["640x480"], "builds": {"armv7": {"640x480": {
            key: {"insns": n * 100, "items": 100, "unit": "pixel"} for key, n in counts.items()}}}}

    def test_partial_is_held_to_its_full_variant_and_full_never_above_partial(self):
        arm = self.arm({"hue/full": 70, "hue/partial": 75, "sepia/full": 30,
                        "sepia/partial": 20, "mirror/full": 9})
        rows = {r.key: r for r in report.arm_rows(arm)[0]}
        self.assertEqual((rows["hue/full"].goal["armv7"], rows["hue/full"].met["armv7"]),
                         (80, True))
        self.assertEqual((rows["hue/partial"].goal["armv7"], rows["hue/partial"].met["armv7"]),
                         (74, False))
        self.assertIsNone(rows["mirror/full"].goal["armv7"])
        md = report.arm_markdown(arm)
        self.assertIn("3 of 4 ARM goals met, 1 not met.", md)
        self.assertIn("more than their partial variant: sepia (armv7: 30.0 against 20.0)", md)


@unittest.skipUnless(os.environ.get("PHOTOFX_CHART"), "PHOTOFX_CHART names no chart program")
class Chart(unittest.TestCase):
    GREEN, RED, INK = (0x2E, 0x9E, 0x4F), (0xD6, 0x45, 0x2F), (0x20, 0x20, 0x20)

    def draw(self, bars):
        with tempfile.TemporaryDirectory() as d:
            bars_path, out = os.path.join(d, "c.chart"), os.path.join(d, "c.png")
            with open(bars_path, "w") as f:
                f.write(bars)
            subprocess.run([os.environ["PHOTOFX_CHART"], bars_path, out], check=True)
            width, _, bpp, rows = png.read_png(out)
        return [[tuple(r[x * bpp:x * bpp + 3]) for x in range(width)] for r in rows]

    @staticmethod
    def columns(image, colour):
        """Columns where any row shows the colour."""
        return sorted({x for row in image for x, c in enumerate(row) if c == colour})

    def test_bars_are_coloured_by_verdict_on_a_log_axis_with_the_goal_marked(self):
        # The axis spans whole decades, 0.1x to 10x: the 1x bar reaches half as far as the 10x
        # bar, and the goal of 2x lies log10(20) / 2 of the way along.
        image = self.draw("title\tT\npanel\tP\n"
                          "bar\ta\t1\t2\tmet\nbar\tb\t10\t2\tmissed\n")
        bars = image[:-40]  # the legend's swatches sit in the bottom rows
        green, red = self.columns(bars, self.GREEN), self.columns(bars, self.RED)
        self.assertTrue(green and red)
        self.assertEqual(green[0], red[0], "the bars start at the same origin")
        origin = green[0]
        half, full = green[-1] - origin, red[-1] - origin
        self.assertAlmostEqual(half / full, 0.5, delta=0.02)
        red_rows = [row for row in bars if self.RED in row]
        ticks = [x for x in range(origin, red[-1]) if all(r[x] == self.INK for r in red_rows)]
        self.assertTrue(ticks, "no goal mark across the missed bar")
        self.assertAlmostEqual((ticks[0] - origin) / full, math.log10(20) / 2, delta=0.02)


if __name__ == "__main__":
    unittest.main()
