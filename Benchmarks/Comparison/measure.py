"""Runs our road, gcc and LLVM's opt on one program each, and answers seconds of CPU time and bytes of memory."""
import json
import os
import re
import resource
import shutil
import subprocess
import tempfile
import time

from fair_form import fair_form

# Everything between the first CCP and the streaming of -flto is switched off: none of it is measured, and some of it (points-to
# analysis over a hundred thousand calls) takes hours. Helpers are not inlined, so that the first CCP sees one statement for
# each assignment as we do, and not ten.
GCC_FLAGS = ["-w", "-std=c99", "-O1", "-ftime-report", "-flto", "-fno-fat-lto-objects", "-fno-early-inlining",
             "-fno-tree-pta", "-fno-tree-fre", "-fno-tree-dse", "-fno-tree-forwprop", "-fno-tree-dce", "-fno-tree-sra",
             "-fno-ipa-pure-const", "-fno-ipa-modref",
             *[f"-fdisable-tree-{name}" for name in ("cddce1", "ethread", "mergephi1", "phiopt1", "ealias", "iftoswitch",
                                                     "profile_estimate", "early_objsz", "waccess1", "walloca1")]]
# Scanning of operands, CFG clean-up and the rest are left out of gcc's account, in its favour.
GCC_PASSES = ("tree PHI insertion", "tree SSA rewrite", "tree SSA other", "dominance frontiers", "dominance computation", "tree CCP")
PIPELINE = "function(mem2reg),ipsccp,function(adce,simplifycfg)"


def find_tool(*names):
    return next((path for path in map(shutil.which, names) if path), None)


class Failed(Exception):
    """A tool did not end well, or not in time."""


def run(command, limit, **options):
    """Runs a command; answers its output, its CPU seconds and its peak memory."""
    with tempfile.TemporaryFile() as out:
        child = subprocess.Popen(command, stdout=out, stderr=subprocess.STDOUT, preexec_fn=lambda: limit_cpu(limit), **options)
        _, status, usage = os.wait4(child.pid, 0)
        child.returncode = os.waitstatus_to_exitcode(status)
        out.seek(0)
        text = out.read().decode(errors="replace")
    if child.returncode != 0:
        raise Failed(f"{os.path.basename(command[0])} ended with {child.returncode}: {text[-300:]}")
    return text, usage.ru_utime + usage.ru_stime, usage.ru_maxrss * 1024


def limit_cpu(seconds):
    resource.setrlimit(resource.RLIMIT_CPU, (int(seconds), int(seconds) + 5))
    # The front ends recurse over long chains of else-ifs.
    resource.setrlimit(resource.RLIMIT_STACK, (resource.RLIM_INFINITY, resource.getrlimit(resource.RLIMIT_STACK)[1]))


class Bench:
    """The programs, made once, and the tools."""

    def __init__(self, root, build, directory, limit):
        self.root, self.directory, self.limit = root, directory, limit
        self.hpncg = f"{build}/CodeGenerator/hpncg"
        self.timer = f"{build}/Benchmarks/RoadTimer"
        self.benchmarks = f"{build}/Benchmarks"
        self.gcc = find_tool("gcc-12", "gcc")
        self.clang, self.opt = find_tool("clang-14", "clang"), find_tool("opt-14", "opt")
        os.makedirs(directory, exist_ok=True)

    def path(self, family, count, ending):
        return f"{self.directory}/{family}-{count}.{ending}"

    def program(self, family, count):
        path = self.path(family, count, "hpn")
        if not os.path.exists(path):
            with open(path + ".part", "w") as out:
                subprocess.run([f"{self.root}/Scripts/generate", family, str(count), "1"], stdout=out, check=True)
            os.rename(path + ".part", path)
        return path

    def c_program(self, family, count):
        path = self.path(family, count, "c")
        if not os.path.exists(path):
            plain = self.path(family, count, "plain.c")
            run([self.hpncg, "--no-optimize", self.program(family, count), "-o", plain], self.limit)
            with open(plain) as text, open(path + ".part", "w") as out:
                out.write(fair_form(text.read()))
            os.remove(plain)
            os.rename(path + ".part", path)
        return path

    def bitcode(self, family, count, promoted):
        path = self.path(family, count, "promoted.bc" if promoted else "bc")
        if not os.path.exists(path):
            if promoted:
                command = [self.opt, "-passes=mem2reg", self.bitcode(family, count, False), "-o", path + ".part"]
            else:
                command = [self.clang, "-w", "-std=c99", "-O0", "-Xclang", "-disable-O0-optnone", "-emit-llvm", "-c",
                           self.c_program(family, count), "-o", path + ".part"]
            run(command, self.limit)
            os.rename(path + ".part", path)
        return path

    def ours(self, family, count, runs=1):
        text, _, peak = run([self.timer, self.program(family, count), str(runs)], self.limit)
        return {"runs": json.loads(text), "peak": peak}

    def gcc_times(self, family, count):
        text, _, peak = run([self.gcc, *GCC_FLAGS, "-c", self.c_program(family, count), "-o", self.path(family, count, "o")],
                            self.limit)
        if not re.search(r"^ TOTAL +:", text, re.M):
            raise Failed("gcc gave no report of its times")
        seconds = 0.0  # what took less than a hundredth of a second has no line
        for name in GCC_PASSES:
            found = re.search(rf"^ {re.escape(name)} +: +([\d.]+) \( *\d+%\) +([\d.]+)", text, re.M)
            seconds += float(found.group(1)) + float(found.group(2)) if found else 0.0
        return {"seconds": seconds, "peak": peak}

    def opt_times(self, family, count, passes, wanted):
        source = self.bitcode(family, count, promoted=passes == "ipsccp")
        text, _, peak = run([self.opt, f"-passes={passes}", "-time-passes", "-disable-output", source], self.limit)
        return {"seconds": sum(pass_seconds(text, name) for name in wanted), "peak": peak}

    def ipsccp(self, family, count):
        return self.opt_times(family, count, "ipsccp", ["IPSCCPPass"])

    def pipeline(self, family, count):
        return self.opt_times(family, count, PIPELINE, ["DominatorTreeAnalysis", "PromotePass", "IPSCCPPass", "ADCEPass", "SimplifyCFGPass"])


def pass_seconds(report, name):
    """User and system seconds of a pass; the columns that a run has are named above them."""
    columns = re.search(r"^ *(-+[A-Za-z+ ]+-+.*--- Name ---)", report, re.M)
    names = re.findall(r"-+ ?([A-Za-z+ ]+?) ?-+(?= |$)", columns.group(1)) if columns else []
    row = re.search(rf"^(.*\)) +{name}$", report, re.M)
    if not row:
        raise Failed(f"opt's report has no line for {name}")
    values = [float(value) for value in re.findall(r"([\d.]+) \( *[\d.]+%\)", row.group(1))]
    wanted = [value for column, value in zip(names, values) if column in ("User Time", "System Time")]
    return sum(wanted) if wanted else values[0]
