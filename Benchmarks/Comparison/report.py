"""The figures of a comparison as tables (Markdown), the goals with a yes or no, and a picture."""
import math
from statistics import median

FAMILIES = ["chain", "diamonds", "loops", "state", "procedures", "mixture"]
ROAD_PASSES = ["placeExitNodes", "inlineProcedures", "placeLoopAroundMain", "insertValidConditionAssignments", "transformToSSAForm",
               "divideBasicBlock", "propagateSparseConditionalConstant", "replaceConstantConditions", "replaceConstantVariables",
               "foldConstants", "removeUnusedVarDefs"]
TOOLS = {"ours": "road", "gcc": "GCC, into-SSA + first CCP", "ipsccp": "LLVM, ipsccp alone",
         "pipeline": "LLVM, mem2reg + ipsccp + adce + simplifycfg"}
HALF = ("chain", "diamonds")


class Figures:
    """What was measured: lists of results by tool, family and N."""

    def __init__(self):
        self.results = {}
        self.growing = {}  # family and N: seconds, of families that grow by a rule
        self.layer = {}

    def add(self, tool, family, count, result):
        self.results.setdefault((tool, family, count), []).append(result)

    def counts(self, tool, family):
        return sorted(count for t, f, count in self.results if (t, f) == (tool, family))

    def seconds(self, tool, family, count):
        results = self.results.get((tool, family, count))
        if not results:
            return None
        if tool != "ours":
            return median(result["seconds"] for result in results)
        return self.part(family, count, "road")

    def part(self, family, count, *names):
        """Seconds of some steps of our side together; the first run of each process counts, memory being fresh as in a build."""
        results = self.results.get(("ours", family, count))
        return median(sum(result["runs"][0][name] for name in names) for result in results) if results else None

    def micro(self, tool, family, count):
        seconds = self.seconds(tool, family, count)
        return None if seconds is None else 1e6 * seconds / count

    def peak(self, tool, family, count):
        results = self.results.get((tool, family, count))
        return median(result["peak"] for result in results) / count / 1024 if results else None

    def exponent(self, tool, family):
        """Slope between the smallest N from 10,000 on and the largest one."""
        counts = [count for count in self.counts(tool, family) if count >= 10000]
        if len(counts) < 2:
            return None
        low, high = self.seconds(tool, family, counts[0]), self.seconds(tool, family, counts[-1])
        return math.log(high / low) / math.log(counts[-1] / counts[0]) if low and high else None


def number(value, digits=1):
    return "-" if value is None else f"{value:.{digits}f}"


def ratio(ours, other):
    return "-" if ours is None or not other else f"{ours / other:.2f}"


def grid(head, rows):
    lines = ["| " + " | ".join(head) + " |", "|" + "---|" + "---:|" * (len(head) - 1)]
    return "\n".join(lines + ["| " + " | ".join(row) + " |" for row in rows]) + "\n"


def time_table(figures):
    rows = []
    for family in FAMILIES:
        for count in figures.counts("ours", family):
            ours = figures.micro("ours", family, count)
            others = [figures.micro(tool, family, count) for tool in ("gcc", "ipsccp", "pipeline")]
            rows.append([family, f"{count:,}", number(ours, 2)] + [cell for other in others for cell in (number(other, 2), ratio(ours, other))])
    return grid(["family", "N", "road", "GCC", "ratio", "ipsccp", "ratio", "mem2reg + ...", "ratio"], rows)


def growth_table(figures):
    rows = [[family] + [number(figures.exponent(tool, family), 2) for tool in TOOLS] for family in FAMILIES
            if figures.counts("ours", family)]
    return grid(["family", "road", "GCC", "ipsccp", "mem2reg + ..."], rows)


def memory_table(figures):
    rows = []
    for family in FAMILIES:
        for count in figures.counts("ours", family)[-1:]:
            first, second = figures.results[("ours", family, count)][-1]["runs"][:2]
            rows.append([family, f"{count:,}"] + [f"{run['peak_bytes'] / count / 1024:.2f}" for run in (first, second)]
                        + [f"{run['heap_after_bytes'] / count / 1024:.2f}" for run in (first, second)]
                        + [last_peak(figures, tool, family) for tool in ("gcc", "ipsccp", "pipeline")])
    return grid(["KiB a statement", "N", "peak in run 1", "in run 2", "kept after run 1", "after run 2", "GCC, peak", "ipsccp, peak",
                 "mem2reg + ..., peak"], rows)


def last_peak(figures, tool, family):
    """At the largest N that the tool was asked for."""
    counts = figures.counts(tool, family)
    return f"{figures.peak(tool, family, counts[-1]):.2f} at {counts[-1]:,}" if counts else "-"


def pass_table(figures, count):
    families = [family for family in FAMILIES if ("ours", family, count) in figures.results]
    steps = ["read", "build"] + ROAD_PASSES + ["hoistCodeOutOfIfElseBranches", "emit", "release"]
    rows = [[step] + [number(1e6 * figures.part(family, count, step) / count, 2) for family in families] for step in steps]
    rows.append(["road"] + [number(figures.micro("ours", family, count), 2) for family in families])
    return grid(["µs a statement, N = " + f"{count:,}"] + families, rows)


def growing_table(figures):
    rows = []
    for family in sorted({family for family, _ in figures.growing}):
        counts = sorted(count for f, count in figures.growing if f == family)
        seconds = [figures.growing[family, count] for count in counts]
        slope = math.log(seconds[-1] / seconds[0]) / math.log(counts[-1] / counts[0]) if len(counts) > 1 else None
        rows += [[family, f"{count:,}", number(1e6 * value / count, 1), number(slope, 2) if count == counts[-1] else ""]
                 for count, value in zip(counts, seconds)]
    return grid(["family", "N", "road, µs a statement", "exponent"], rows)


# Each goal: a sentence with its figures, and True, False or None (not measured).


def goal_times(figures, count=100000):
    for family in FAMILIES:
        ours, gcc = figures.micro("ours", family, count), figures.micro("gcc", family, count)
        factor = 0.5 if family in HALF else 1.0
        text = f"1. {family}: at most {factor:g} of GCC at N = {count:,} ({number(ours, 2)} against {number(gcc, 2)} µs a statement)"
        yield text, None if ours is None or gcc is None else ours <= factor * gcc
    ours, theirs = figures.micro("ours", "procedures", count), figures.micro("ipsccp", "procedures", count)
    text = f"1. procedures: at most 0.2 of ipsccp at N = {count:,} ({number(ours, 2)} against {number(theirs, 2)} µs a statement)"
    yield text, None if ours is None or theirs is None else ours <= 0.2 * theirs


def goal_growth(figures):
    for family in FAMILIES:
        counts = figures.counts("ours", family)
        slope = figures.exponent("ours", family)
        whole = bool(counts) and counts[0] <= 10000 and counts[-1] >= 1000000
        text = f"2. {family}: growth exponent from 10,000 to 1,000,000 at most 1.08 ({number(slope, 2)}" + ("" if whole else ", smaller N only") + ")"
        yield text, slope <= 1.08 if whole else None


def goal_memory(figures):
    for family in FAMILIES:
        results = figures.results.get(("ours", family, 1000000))
        text = f"3. {family}: at most 1.5 KiB a statement at N = 1,000,000, the same again in a second run"
        if not results:
            yield text, None
            continue
        first, second = results[-1]["runs"][:2]
        grown = second["heap_after_bytes"] - first["heap_after_bytes"]
        first_peak = first["peak_bytes"] / 1024 / 1000000
        # Two in a hundred are left to the heap's own book-keeping.
        same = grown <= 0.02 * first["peak_bytes"] and second["peak_bytes"] <= 1.02 * first["peak_bytes"]
        text += (f" ({first_peak:.2f} KiB; the second run: peak {100 * second['peak_bytes'] / first['peak_bytes']:.1f}% of the first, "
                 f"{grown / 1000000:+.0f} bytes a statement kept)")
        yield text, first_peak <= 1.5 and same


def goal_layer(figures):
    for text, limit, value in figures.layer.get("goals", []):
        yield f"4. {text}: at most {limit} ns ({number(value, 1)})", None if value is None else value <= limit


def goal_rest(figures, count=100000):
    for family in FAMILIES:
        rest, road = figures.part(family, count, "read", "build", "emit"), figures.part(family, count, "road")
        text = f"5. {family}: reading, building and emission at most the road at N = {count:,}"
        if rest is not None:
            text += f" ({1e6 * rest / count:.2f} against {1e6 * road / count:.2f} µs a statement)"
        yield text, None if rest is None else rest <= road


def goals(figures):
    lines = []
    for goal in (goal_times, goal_growth, goal_memory, goal_layer, goal_rest):
        for text, met in goal(figures):
            lines.append(f"- **{'not measured' if met is None else 'yes' if met else 'no'}** - {text}")
    return "\n".join(lines) + "\n"


def whole_report(figures):
    middle = max((c for f in FAMILIES for c in figures.counts("ours", f) if c <= 100000), default=None)
    parts = ["CPU time in µs a statement, medians; ratio: road / the other one.\n", time_table(figures),
             "Growth exponents, from the smallest to the largest N measured:\n", growth_table(figures),
             "Memory: resident peak of the process, and what its heap still holds when a run has released everything:\n", memory_table(figures)]
    if middle:
        parts += ["Where the time goes:\n", pass_table(figures, middle)]
    if figures.growing:
        parts += ["Families that grow by a rule:\n", growing_table(figures)]
    return "\n".join(parts + ["Goals:\n", goals(figures)])


COLOURS = {"ours": "#0b6e4f", "gcc": "#b8860b", "ipsccp": "#3a5fcd", "pipeline": "#b22222"}


def picture(figures):
    """One panel for each family: seconds over N, both logarithmic."""
    width, height, columns = 330, 250, 3
    families = [family for family in FAMILIES if figures.counts("ours", family)]
    rows = (len(families) + columns - 1) // columns
    out = [f'<svg xmlns="http://www.w3.org/2000/svg" width="{columns * width}" height="{rows * height + 40}" '
           'font-family="sans-serif" font-size="11">', '<rect width="100%" height="100%" fill="white"/>']
    for place, family in enumerate(families):
        out.append(f'<g transform="translate({place % columns * width},{place // columns * height})">')
        out += panel(figures, family, width, height)
        out.append("</g>")
    for place, (tool, title) in enumerate(TOOLS.items()):
        x, y = 20 + place * 235, rows * height + 20
        out.append(f'<rect x="{x}" y="{y - 8}" width="14" height="8" fill="{COLOURS[tool]}"/><text x="{x + 19}" y="{y}">{title}</text>')
    return "\n".join(out + ["</svg>", ""])


def panel(figures, family, width, height):
    left, right, top, bottom = 48, width - 12, 26, height - 30
    low_n, high_n, low_t, high_t = 4.0, 6.0, -2.5, 2.5

    def place(count, seconds):
        x = left + (math.log10(count) - low_n) / (high_n - low_n) * (right - left)
        y = bottom - (math.log10(max(seconds, 1e-4)) - low_t) / (high_t - low_t) * (bottom - top)
        return x, min(max(y, top), bottom)

    out = [f'<text x="{left}" y="16" font-weight="bold">{family}</text>',
           f'<rect x="{left}" y="{top}" width="{right - left}" height="{bottom - top}" fill="none" stroke="#888"/>']
    for power in range(-2, 3):
        _, y = place(10000, 10.0 ** power)
        out.append(f'<line x1="{left}" x2="{right}" y1="{y:.1f}" y2="{y:.1f}" stroke="#ddd"/>'
                   f'<text x="{left - 5}" y="{y + 4:.1f}" text-anchor="end">{10.0 ** power:g} s</text>')
    for power in (4, 5, 6):
        x, _ = place(10 ** power, 1)
        out.append(f'<text x="{x:.1f}" y="{bottom + 15}" text-anchor="middle">{10 ** power:,}</text>')
    for tool in TOOLS:
        points = [(count, figures.seconds(tool, family, count)) for count in figures.counts(tool, family)]
        spots = [place(count, seconds) for count, seconds in points if seconds]
        line = " ".join(f"{x:.1f},{y:.1f}" for x, y in spots)
        out.append(f'<polyline points="{line}" fill="none" stroke="{COLOURS[tool]}" stroke-width="2"/>')
        out += [f'<circle cx="{x:.1f}" cy="{y:.1f}" r="2.5" fill="{COLOURS[tool]}"/>' for x, y in spots]
    return out
