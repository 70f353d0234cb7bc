#!/usr/bin/env python3
"""Turns the results of bench/run into one Markdown table of ratios ours/peer.

Every figure is a median over the runs of one bench/run invocation; only the
ratios mean anything, since absolute times on a shared machine are noise.
A ratio below 1 means ours takes less time (or memory) than the peer.
"""
import argparse
import datetime
import json
import os
import platform
import re
import statistics
import subprocess

UNIT_NS = {"ns": 1.0, "us": 1e3, "ms": 1e6, "s": 1e9}
START = "<!-- bench-table:start -->"
END = "<!-- bench-table:end -->"


def load_micro(path):
    """Median CPU time in ns per benchmark name, from the single runs."""
    runs = {}
    if not path or not os.path.exists(path):
        return {}
    with open(path) as handle:
        report = json.load(handle)
    for bench in report.get("benchmarks", []):
        if bench.get("run_type", "iteration") != "iteration" or bench.get("error_occurred"):
            continue
        name = bench.get("run_name", bench["name"])
        runs.setdefault(name, []).append(bench["cpu_time"] * UNIT_NS[bench["time_unit"]])
    return {name: statistics.median(times) for name, times in runs.items()}


def load_drivers(path):
    """Median read CPU time (ns) and peak memory (KB) per driver."""
    runs = {}
    if os.path.exists(path):
        with open(path) as handle:
            for line in handle:
                line = line.strip()
                if line:
                    result = json.loads(line)
                    runs.setdefault(result["driver"], []).append(result)
    return {
        driver: {
            "time": statistics.median(r["cpu_s"] for r in results) * 1e9,
            "free": statistics.median(r.get("free_cpu_s", 0.0) for r in results) * 1e9,
            "whole": statistics.median(r["cpu_s"] + r.get("free_cpu_s", 0.0)
                                       for r in results) * 1e9,
            "memory": statistics.median(r["maxrss_kb"] for r in results),
        }
        for driver, results in runs.items()
    }


def show_time(ns):
    for unit, scale in (("s", 1e9), ("ms", 1e6), ("µs", 1e3)):
        if ns >= scale:
            return f"{ns / scale:.3g} {unit}"
    return f"{ns:.3g} ns"


def show_memory(kb):
    return f"{kb / 1024:.1f} MB"


class Table:
    def __init__(self):
        self.rows = []

    def add(self, what, ours, peer, show, target=None, peer_name=""):
        """One row; target is the largest ratio that meets it, or None."""
        if ours is None:
            self.rows.append((what, "not built", "", "", "", "skipped"))
            return
        if peer is None:
            verdict = "skipped (peer missing)" if peer_name else "reference"
            self.rows.append((what, show(ours), "—", "—", "", verdict))
            return
        ratio = ours / peer
        if target is None:
            verdict = "—"
            goal = ""
        else:
            verdict = "met" if ratio <= target else "**missed**"
            goal = f"≤ {target:.3g}"
        self.rows.append((what, show(ours), show(peer), f"{ratio:.2f}", goal, verdict))

    def markdown(self):
        lines = [
            "| Pair (ours vs peer) | ours | peer | ours/peer | target | |",
            "|---|---:|---:|---:|---:|---|",
        ]
        for row in self.rows:
            lines.append("| " + " | ".join(row) + " |")
        return "\n".join(lines)


def build_table(micro, drivers, subtrees):
    table = Table()
    ours = drivers.get("ours")
    boost = drivers.get("boost")
    floor = drivers.get("floor")
    get = lambda d, key: d[key] if d else None
    tree = f"{subtrees:,} subtrees"
    table.add(f"Tree read ({tree}): BuildFromFile vs boost read_info, time",
              get(ours, "time"), get(boost, "time"), show_time, 1 / 3, "boost")
    table.add("Tree read: BuildFromFile vs boost read_info, peak memory (whole process)",
              get(ours, "memory"), get(boost, "memory"), show_memory, 0.5, "boost")
    table.add("Tree read: BuildFromFile vs the floor (getline and count lines), time",
              get(ours, "time"), get(floor, "time"), show_time, 10, "floor")
    table.add("Tree read: boost read_info vs the floor, time (for scale)",
              get(boost, "time"), get(floor, "time"), show_time, None, "floor")
    table.add("Tree read + free, what a user waits for: ours vs boost read_info + free",
              get(ours, "whole"), get(boost, "whole"), show_time, 1 / 4, "boost")
    table.add("Tree free: deleting the tree vs reading it (ours)",
              get(ours, "free"), get(ours, "time"), show_time, 0.3, "ours")
    table.add("Tree free: deleting the tree, ours vs boost (for scale)",
              get(ours, "free"), get(boost, "free"), show_time, None, "boost")

    m = micro.get
    table.add("Tree merge: SetFrom of two bench trees vs BuildFromFile of one",
              m("TreeMerge/ours"), get(ours, "time"), show_time, 1, "ours")
    table.add("Lookup by name among 100,000 siblings (1,024 lookups): GetChild vs ptree::find",
              m("Lookup/ours"), m("Lookup/boost"), show_time, 0.1, "boost")
    table.add("Tree write: WriteToFile vs write_info", m("TreeWrite/ours"),
              m("TreeWrite/boost"), show_time, 1 / 3, "boost")
    table.add("Tree walk: GetChildAsInteger per subtree vs ptree::get<int>",
              m("TreeWalk/ours"), m("TreeWalk/boost"), show_time, None, "boost")

    for op, ours_name, peer_names in (
        ("encode", "Base64Encode/ours", ("Base64Encode/openssl", "Base64Encode/abseil")),
        ("decode", "Base64Decode/ours", ("Base64Decode/openssl", "Base64Decode/abseil")),
    ):
        openssl, abseil = (m(name) for name in peer_names)
        table.add(f"Base64 {op} 64 MB: base64_{op} vs OpenSSL EVP_{op.capitalize()}Block",
                  m(ours_name), openssl, show_time, None, "openssl")
        table.add(f"Base64 {op} 64 MB: base64_{op} vs abseil "
                  f"{'Base64Escape' if op == 'encode' else 'Base64Unescape'}",
                  m(ours_name), abseil, show_time, None, "abseil")
        faster = min((t for t in (openssl, abseil) if t is not None), default=None)
        table.add(f"Base64 {op} 64 MB: base64_{op} vs the faster of the two",
                  m(ours_name), faster, show_time, 1 / 1.5, "peers")
        table.add(f"Base64 {op} 64 MB: base64_{op} vs memcpy into a new buffer",
                  m(ours_name), m("Base64Copy/memcpy"), show_time, None, "memcpy")

    table.add("DWXString: 2^20 single-character appends vs std::string",
              m("StringAppend/ours"), m("StringAppend/std"), show_time, 1.2, "std")
    table.add("DWXString::Format vs snprintf into a stack buffer",
              m("StringFormat/ours"), m("StringFormat/snprintf"), show_time, None, "snprintf")
    table.add("DWXString::Format vs std::string sized by snprintf",
              m("StringFormat/ours"), m("StringFormat/std"), show_time, None, "std")
    table.add("DWXArray::Add 2^20 members vs std::vector<DWXObject*>::push_back",
              m("ArrayAdd/ours"), m("ArrayAdd/vector"), show_time, 1.5, "vector")
    table.add("DWXArray walk with DWXIter vs std::vector loop",
              m("ArrayWalk/ours"), m("ArrayWalk/vector"), show_time, None, "vector")
    table.add("DWXLinkedList::Append 2^18 members vs std::list::push_back",
              m("ListAppend/ours"), m("ListAppend/std"), show_time, None, "std")
    table.add("DWXDate::GetDifference, 1,024 pairs 1,000 years apart, vs date sys_days",
              m("DateDifference/ours"), m("DateDifference/date"), show_time, 2, "date")
    table.add("DWXCmdLine on a 50-argument vector (per parse)",
              m("CmdLine/ours"), None, show_time)
    return table


def command_output(*command):
    try:
        return subprocess.run(command, capture_output=True, text=True, check=True).stdout
    except (OSError, subprocess.CalledProcessError):
        return ""


def machine_facts():
    cpu = ""
    if os.path.exists("/proc/cpuinfo"):
        with open("/proc/cpuinfo") as handle:
            match = re.search(r"model name\s*:\s*(.*)", handle.read())
            cpu = match.group(1).strip() if match else ""
    memory = ""
    if os.path.exists("/proc/meminfo"):
        with open("/proc/meminfo") as handle:
            match = re.search(r"MemTotal:\s*(\d+)", handle.read())
            memory = f"{int(match.group(1)) / 1048576:.0f} GiB" if match else ""
    compiler = command_output("c++", "--version").splitlines()
    load = os.getloadavg()[0] if hasattr(os, "getloadavg") else 0.0
    versions = []
    for package in ("libboost-dev", "libssl-dev", "libabsl-dev", "libhowardhinnant-date-dev",
                    "libbenchmark-dev"):
        version = command_output("dpkg-query", "-W", "-f=${Version}", package).strip()
        versions.append(f"{package} {version or 'missing'}")
    return [
        f"CPU: {cpu or platform.processor() or 'unknown'}, {os.cpu_count()} logical cores, "
        f"{memory} memory",
        f"System: {platform.system()} {platform.release()} {platform.machine()}; "
        f"load average {load:.2f} at the end of the run (the machine is shared)",
        f"Compiler: {compiler[0] if compiler else 'unknown'}, Release build (bench preset)",
        "Peers: " + ", ".join(versions),
    ]


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("--drivers", required=True)
    parser.add_argument("--micro", required=True)
    parser.add_argument("--subtrees", type=int, required=True)
    parser.add_argument("--readme")
    args = parser.parse_args()

    table = build_table(load_micro(args.micro), load_drivers(args.drivers), args.subtrees)
    stamp = datetime.datetime.now(datetime.timezone.utc).strftime("%Y-%m-%d %H:%M UTC")
    section = "\n".join(
        [f"Run of {stamp}.", ""]
        + [f"- {fact}" for fact in machine_facts()]
        + ["", table.markdown()]
    )
    print(section)

    if args.readme:
        with open(args.readme) as handle:
            text = handle.read()
        start, end = text.find(START), text.find(END)
        if start < 0 or end < start:
            raise SystemExit(f"{args.readme}: table markers not found")
        text = text[: start + len(START)] + "\n" + section + "\n" + text[end:]
        with open(args.readme, "w") as handle:
            handle.write(text)


if __name__ == "__main__":
    main()
