"""Measures the road beside the large compilers and prints the table and the goals; Scripts/compare builds and calls it."""
import argparse
import json
import os
import re
import subprocess
import sys

from measure import Bench, Failed
from report import FAMILIES, Figures, picture, whole_report

SIZES = [10000, 30000, 100000, 300000, 1000000]
QUICK_SIZES = [10000, 100000]
# Beyond these LLVM takes minutes to hours, and the front ends more memory than a desk has.
LARGEST = {"ours": 1000000, "gcc": 300000, "ipsccp": 100000, "pipeline": 30000}
GROWING = {"wide": [3000, 10000, 30000], "nested": [3000, 10000, 30000], "callees": [1000, 3000, 10000]}
BEGIN, END = "<!-- begin of the measured part, by Scripts/compare -->", "<!-- end of the measured part -->"


def parse():
    parser = argparse.ArgumentParser(prog="compare", description="Runs the road, gcc and LLVM's opt on the same programs, alternating, "
                                     "and prints medians, ratios, memory, growth and the goals.")
    parser.add_argument("families", nargs="*", metavar="FAMILY", help="default: " + " ".join(FAMILIES))
    parser.add_argument("--quick", action="store_true", help="two sizes and one run of each instead of five and three")
    parser.add_argument("--sizes", metavar="N,N,...", help="these sizes instead")
    parser.add_argument("--ours-only", action="store_true", help="leave gcc and LLVM out")
    parser.add_argument("--runs", type=int, help="runs of each tool on each program")
    parser.add_argument("--update-documentation", action="store_true", help="write the result into Documentation/Performance.md and .svg")
    parser.add_argument("--svg", metavar="FILE", help="write the picture there")
    parser.add_argument("--json", metavar="FILE", help="write all figures there")
    parser.add_argument("--limit", type=int, default=300, help="CPU seconds after which one run is given up (%(default)s)")
    parser.add_argument("--root", required=True, help=argparse.SUPPRESS)
    parser.add_argument("--build", required=True, help=argparse.SUPPRESS)
    wanted = parser.parse_args()
    for family in wanted.families:
        if family not in FAMILIES:
            parser.error(f"no family '{family}'; there are {', '.join(FAMILIES)}")
    if wanted.sizes and not re.fullmatch(r"\d+(,\d+)*", wanted.sizes):
        parser.error("--sizes takes numbers with commas between them")
    wanted.counts = QUICK_SIZES if wanted.quick else SIZES
    if wanted.sizes:
        wanted.counts = sorted(int(size) for size in wanted.sizes.split(","))
    return wanted


def measure_family(bench, figures, wanted, family, tools):
    gone = set()  # a tool that failed on one size is not asked for the next one
    for count in wanted.counts:
        # Large programs say enough in fewer runs.
        runs = wanted.runs or (1 if wanted.quick else 3)
        for number in range(runs if count < 300000 else min(runs, 2)):
            for tool, measure in tools.items():
                if tool in gone or count > LARGEST[tool]:
                    continue
                print(f"compare: {family} {count:,} {tool} {number + 1}", file=sys.stderr)
                try:
                    figures.add(tool, family, count, measure(family, count))
                except Failed as reason:
                    print(f"compare: {reason}", file=sys.stderr)
                    gone.add(tool)
        clean(bench, family, count)


def clean(bench, family, count):
    for name in os.listdir(bench.directory):
        if name.startswith(f"{family}-{count}."):
            os.remove(f"{bench.directory}/{name}")


def measure_growing(bench, figures, wanted):
    for family, counts in GROWING.items():
        for count in counts[:2] if wanted.quick else counts:
            print(f"compare: {family} {count:,}", file=sys.stderr)
            try:
                figures.growing[family, count] = bench.ours(family, count)["runs"][0]["road"]
            except Failed as reason:
                print(f"compare: {reason}", file=sys.stderr)
                break
            finally:
                clean(bench, family, count)


# Goals of the layer: what is said, the limit in ns, the program, the benchmark, and the counter of it.
LAYER_GOALS = [
    ("breadth-first search, per node and edge of 1,000,000 nodes", 13, "Layer", "breadthFirst/shape:0/nodes:1000000"),
    ("depth-first search", 19, "Layer", "depthFirst/shape:0/nodes:1000000"),
    ("components", 30, "Layer", "components/shape:0/nodes:1000000"),
    ("strong components in creation order", 35, "Layer", "strongComponents/shape:0/nodes:1000000"),
    ("copy and union of sets of 4 pointers", 30, "Layer", "copyAndUnite/.*/n:4$"),
    ("copy and union of sets of 16 pointers", 60, "Layer", "copyAndUnite/.*/n:16$"),
    ("insert into a map of 100,000 handles", 25, "Layer", "mapInsert.*/n:100000$"),
    ("hit in a map of 100,000 handles", 8, "Layer", "mapHit.*/n:100000$"),
    ("immediate dominators, per node and edge", 150, "Passes", "immediateDominators/diamonds/100000"),
]


def measure_layer(bench, figures):
    goals = []
    for text, limit, program, name in LAYER_GOALS:
        goals.append((text, limit, benchmark_figure(f"{bench.benchmarks}/Benchmark{program}", name)))
    figures.layer["goals"] = goals


def benchmark_figure(program, name):
    """Nanoseconds for each item of the slowest benchmark that matches, or nothing where there is none."""
    if not os.path.exists(program):
        return None
    text = subprocess.run([program, f"--benchmark_filter={name}", "--benchmark_format=json"], stdout=subprocess.PIPE,
                          stderr=subprocess.DEVNULL, check=False).stdout
    try:
        found = [nanoseconds(entry) for entry in json.loads(text)["benchmarks"]]
    except (ValueError, KeyError):
        return None
    found = [value for value in found if value is not None]
    return max(found) if found else None


def nanoseconds(entry):
    """Counters named ns_... are nanoseconds, those named per_... seconds; without either the whole iteration is the item."""
    for name, value in entry.items():
        if name.startswith("ns_"):
            return value
        if name.startswith("per_") and not name.startswith("per_family"):
            return 1e9 * value
    return entry["cpu_time"] * {"ns": 1, "us": 1e3, "ms": 1e6, "s": 1e9}[entry["time_unit"]]


def update_documentation(root, text, drawing):
    path = f"{root}/Documentation/Performance.md"
    with open(path) as page:
        old = page.read()
    if old.count(BEGIN) != 1 or old.count(END) != 1:
        sys.exit(f"compare: {path} has lost its markers")
    new = re.sub(re.escape(BEGIN) + ".*?" + re.escape(END), lambda _: f"{BEGIN}\n\n{text}\n{END}", old, flags=re.S)
    with open(path, "w") as page:
        page.write(new)
    with open(f"{root}/Documentation/Performance.svg", "w") as out:
        out.write(drawing)


def main():
    wanted = parse()
    bench = Bench(wanted.root, wanted.build, f"{wanted.build}/comparison", wanted.limit)
    tools = {"ours": lambda family, count: bench.ours(family, count, 2)}
    if not wanted.ours_only:
        if bench.gcc:
            tools["gcc"] = bench.gcc_times
        if bench.clang and bench.opt:
            tools["ipsccp"], tools["pipeline"] = bench.ipsccp, bench.pipeline
    figures = Figures()
    for family in wanted.families or FAMILIES:
        measure_family(bench, figures, wanted, family, tools)
    if not wanted.families:
        measure_growing(bench, figures, wanted)
        measure_layer(bench, figures)
    text = whole_report(figures)
    print(text)
    drawing = picture(figures)
    if wanted.svg:
        with open(wanted.svg, "w") as out:
            out.write(drawing)
    if wanted.json:
        with open(wanted.json, "w") as out:
            json.dump([[*key, value] for key, value in figures.results.items()], out)
    if wanted.update_documentation:
        update_documentation(wanted.root, text, drawing)


main()
