"""The table of bench/README.md says what the runs say: medians, what they miss, and rows that did not run as they stood."""
import importlib.util
import json
import pathlib
import unittest
from importlib.machinery import SourceFileLoader

ROOT = pathlib.Path(__file__).resolve().parents[2]
loader = SourceFileLoader("bench_table", str(ROOT / "scripts/bench-table"))
bench_table = importlib.util.module_from_spec(importlib.util.spec_from_loader("bench_table", loader))
loader.exec_module(bench_table)


def run_of(**ratios):
    return {"benchmarks": [{"name": f"{name}/iterations:1", "real_time": 2, "cpu_time": 1, "time_unit": "ms", "ratio": ratio}
                           for name, ratio in ratios.items()]}


class BenchTable(unittest.TestCase):
    def test_a_median_is_held_against_the_target_and_none_is_made_up(self):
        target = {"what": "w", "target": "t", "filter": "A|B", "of": ["A", "B"], "figures": [["a", "0.ratio"], ["b", "1.ratio"]],
                  "beside": "{0.time_us:.0f} µs", "holds": "<= 1.5"}
        runs = [run_of(A=1, B=3), run_of(A=9, B=2), run_of(A=1.5, B=1)]
        self.assertEqual(bench_table.row_of(target, runs), "| w | t | 2000 µs: a **1.5 ×** (1 to 9), b **2 ×** (1 to 3), **missed** | "
                         "`--benchmark_filter='A\\|B'` |")
        self.assertIsNone(bench_table.row_of(target, [*runs, run_of(A=1)]), "B did not run")
        row = bench_table.row_of({**target, "figures": [["", "1.ratio / 0.ratio"]]}, runs[:1])
        self.assertIn(" **3 ×**, **missed** |", row)
        self.assertEqual(bench_table.rows_of("| what |\n" + row)["w", bench_table.command_of(target)], row)

    def test_every_row_names_a_benchmark_and_stands_once_in_the_readme(self):
        sources = "".join(path.read_text() for path in (ROOT / "bench").glob("*.cpp"))
        targets = json.loads((ROOT / "bench/targets.json").read_text())
        table = (ROOT / "bench/README.md").read_text().split(bench_table.BEGIN)[1].split(bench_table.END)[0]
        rows = bench_table.rows_of(table)
        for target in targets:
            for name in target["of"]:
                self.assertIn(name.split("/")[0].removeprefix("BM_"), sources)
            self.assertIn((target["what"], bench_table.command_of(target)), rows)


if __name__ == "__main__":
    unittest.main()
