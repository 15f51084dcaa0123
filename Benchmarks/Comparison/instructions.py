"""Counts the instructions of the road on fixed programs under callgrind and compares them with the numbers kept in the tree.

  instructions.py --root DIRECTORY --timer PROGRAM [--renew]

Counted are the whole process and, inclusively, each step that makes up at least one instruction in two hundred. A count of more than
105% of the kept one fails; --renew writes the counts as the new ones.
"""
import argparse
import json
import os
import re
import subprocess
import sys
import tempfile

PROGRAMS = [("chain", 2000), ("diamonds", 2000), ("loops", 2000), ("state", 2000), ("procedures", 2000), ("mixture", 2000),
            ("callees", 400)]
STEPS = {"read": r"hpn::readProgram\(", "build": r"hpn::ProgramGraph::ProgramGraph\(", "emit": r"hpn::emitProgram\(",
         "release": r"hpn::ProgramGraph::~ProgramGraph\("}
STEPS.update({name: rf"ZfCControlFlowGraph::{name}\(" for name in (
    "placeExitNodes", "inlineProcedures", "placeLoopAroundMain", "insertValidConditionAssignments", "transformToSSAForm",
    "divideBasicBlock", "addSSAEdges", "sparseConditionalConstant", "replaceConstantConditions", "replaceConstantVariables",
    "foldConstants", "removeUnusedVarDefs", "hoistCodeOutOfIfElseBranches")})
LIMIT = 1.05


def count(root, timer, family, size):
    with tempfile.TemporaryDirectory() as directory:
        program, profile = f"{directory}/{family}.hpn", f"{directory}/profile"
        with open(program, "w") as out:
            subprocess.run([f"{root}/Scripts/generate", family, str(size), "1"], stdout=out, check=True)
        subprocess.run(["valgrind", "--tool=callgrind", f"--callgrind-out-file={profile}", timer, program, "1"],
                       stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL, check=True)
        text = subprocess.run(["callgrind_annotate", "--inclusive=yes", "--threshold=100", profile], stdout=subprocess.PIPE,
                              stderr=subprocess.DEVNULL, check=True, text=True).stdout
    total = int(re.search(r"^ *([\d,]+) .*PROGRAM TOTALS", text, re.M).group(1).replace(",", ""))
    counts = {"whole": total}
    for step, pattern in STEPS.items():
        found = [int(line.replace(",", "")) for line in re.findall(rf"^ *([\d,]+) .*?:{pattern}", text, re.M)]
        if found and 200 * max(found) >= total:
            counts[step] = max(found)
    return counts


def compare(kept, counted):
    """Prints each step that has changed much; answers whether one has become too slow."""
    too_slow = False
    for program, steps in counted.items():
        for step, now in steps.items():
            before = kept.get(program, {}).get(step)
            if before is None:
                # A step that was too small to be kept has grown if it is large now.
                if step == "whole" or now > 0.025 * steps["whole"]:
                    print(f"{program} {step}: {now:,} instructions, none kept")
                    too_slow = True
                continue
            if abs(now / before - 1) > 0.01:
                print(f"{program} {step}: {now:,} instructions, {100 * now / before:.1f}% of the kept {before:,}")
            too_slow = too_slow or now > LIMIT * before
    return too_slow


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("--root", required=True)
    parser.add_argument("--timer", required=True)
    parser.add_argument("--renew", action="store_true")
    wanted = parser.parse_args()
    path = f"{wanted.root}/Benchmarks/instructions.json"
    counted = {family: count(wanted.root, wanted.timer, family, size) for family, size in PROGRAMS}
    kept = {}
    if os.path.exists(path):
        with open(path) as old:
            kept = json.load(old)
    too_slow = compare(kept, counted) if kept else not wanted.renew
    if wanted.renew:
        with open(path, "w") as out:
            json.dump(counted, out, indent=2)
            out.write("\n")
        return
    if too_slow:
        sys.exit("More than 5% above the kept numbers. If that is meant, run Scripts/renew-instructions and commit the new ones.")
    print("No step has more than 5% above its kept number.")


main()
