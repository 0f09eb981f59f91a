"""Running what is measured: Google Benchmark programs, and whole processes in turns."""
import json
import os
import re
import statistics
import subprocess
import tempfile
import time
from pathlib import Path

BIN = Path(__file__).resolve().parent.parent / "build/bench/bin"


def benchmarks(program, repetitions):
    """The median seconds of each benchmark of a program, by its name: of the processor, but by the clock for those that wait
    for a disk or for a process of their own."""
    with tempfile.NamedTemporaryFile() as out:
        subprocess.run([BIN / program, f"--benchmark_repetitions={repetitions}", "--benchmark_out_format=json",
                        f"--benchmark_out={out.name}", "--benchmark_enable_random_interleaving=true",
                        "--benchmark_report_aggregates_only=true"], check=True, stdout=subprocess.DEVNULL)
        runs = json.load(open(out.name))["benchmarks"]
    scale = {"ns": 1e-9, "us": 1e-6, "ms": 1e-3, "s": 1}
    medians = {}
    for run in runs:
        if run.get("aggregate_name", "median") == "median":  # of one run there is just that
            name, clock = re.subn(r"/(manual|real)_time(/threads:\d+)?$", "", run["run_name"])
            medians[name] = run["real_time" if clock else "cpu_time"] * scale[run["time_unit"]]
    return medians


def in_turns(commands, rounds, directory):
    """The median seconds of processor time of each command, run one after the other ROUNDS times."""
    seconds = [[] for _ in commands]
    for _ in range(rounds):
        for i, command in enumerate(commands):
            process = subprocess.Popen([str(word) for word in command], cwd=directory, stdout=subprocess.DEVNULL)
            _, status, usage = os.wait4(process.pid, 0)
            if os.waitstatus_to_exitcode(status) not in (0, 1):
                raise SystemExit(f"{command} failed")
            seconds[i].append(usage.ru_utime + usage.ru_stime)
    return [statistics.median(s) for s in seconds]


def peak_memory(command, directory):
    """The most bytes of memory that a command held. A small program starts it, for what a process held before it became another
    one counts, and this one holds more than some that are measured."""
    with tempfile.NamedTemporaryFile("r") as out:
        words = ["/usr/bin/time", "-f", "%M", "-o", out.name, *map(str, command)]
        if subprocess.run(words, cwd=directory, stdout=subprocess.DEVNULL, check=False).returncode not in (0, 1):
            raise SystemExit(f"{command} failed")
        return int(out.read().split()[-1]) * 1024


def system_calls(command, opened):
    """How many system calls a command makes, its start included, and how many of them opened what `opened` matches."""
    with tempfile.NamedTemporaryFile("r") as trace:
        subprocess.run(["strace", "-f", "-o", trace.name, *command], check=True)
        lines = trace.readlines()
    return len(lines), sum(1 for line in lines if re.search(rf"open.*({opened}).* = \d", line))


def output(*command):
    return subprocess.run([str(word) for word in command], check=True, capture_output=True, text=True).stdout


def machine():
    model = re.search(r"model name\s*: (.*)", Path("/proc/cpuinfo").read_text())
    compiler = output("c++", "--version").splitlines()[0]
    return f"{model.group(1) if model else 'unknown processor'}, {os.cpu_count()} cores, {compiler}"


def today():
    return time.strftime("%Y-%m-%d")
