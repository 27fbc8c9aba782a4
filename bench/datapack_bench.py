#!/usr/bin/env python3
"""Times every datapack subcommand and takes its peak memory, on game-state packages of several
sizes and on nested packages of several depths. Run by hand, not in CI:

    bench/datapack_run [--sizes 1,10,100] [--depths 10,100,1023] [--depth-sizes 2,20]
                       [--repeat N] [--work DIR]

(bench/datapack_run installs python3 and GNU time when missing, builds, and runs this script.)

Each package is made by `datapack pack` from a generated JSON. Times are CPU seconds, user and
system, the best of --repeat runs: other work on the machine disturbs them little. Per byte, they
count the package's bytes (both packages' for diff; pack writes the package) and leave out the
program's start (the best time of showing the demo package, loading the plug-ins included).
Memory is the peak resident set; the last column is that peak less the program's own (its peak
showing the demo package), per byte of package.
"""

import argparse
import json
import os
import random
import subprocess
import sys
import tempfile
import resource

MB = 1 << 20


def game_state(size):
    """Zones of at most 9999 Players each, about 290 bytes of package per player."""
    rng = random.Random(size)
    players = max(1, size // 290)
    zones = []
    while players > 0:
        count = min(players, 9999)
        players -= count
        entries = []
        for i in range(count):
            entries.append({"values": [
                "player%d" % i,
                round(rng.uniform(0, 1000), 2),
                [round(rng.uniform(-100, 100), 3) for _ in range(3)],
                [[round(rng.uniform(-1, 1), 4) for _ in range(4)] for _ in range(4)],
            ]})
        zones.append({"values": [len(zones)], "directories": [entries]})
    players_shape = {"name": "Players", "data": [
        {"name": "Name", "type": "Txt"}, {"name": "Score", "type": "Val"},
        {"name": "Position", "type": "Vec"}, {"name": "Transform", "type": "Mat"}],
        "directories": []}
    return {"directory": {"name": "Zones", "data": [{"name": "Id", "type": "Val"}],
                          "directories": [players_shape], "entries": zones}}


def nested(depth, size):
    """Chains of directories `depth` deep, as many as make about `size` bytes of package."""
    def shape(level):
        return {"name": "L%d" % level, "data": [{"name": "v", "type": "Val"}],
                "directories": [shape(level + 1)] if level + 1 < depth else []}

    def entry(level):
        item = {"values": [level]}
        if level + 1 < depth:
            item["directories"] = [[entry(level + 1)]]
        return item

    # A level costs its three lines, indented by its depth.
    per_chain = sum(3 * level + 50 for level in range(depth))
    chains = max(1, size // per_chain)
    sys.setrecursionlimit(10 * depth + 1000)
    top = shape(0)
    top["entries"] = [entry(0) for _ in range(min(chains, 9999))]
    return {"directory": top}


def run(command, stdin_path=None, stdout_path=os.devnull):
    """CPU seconds (user and system) and peak resident bytes of one run, whose exit status must
    be 0 or 1. GNU time takes the peak: a child of this process would count the interpreter's
    pages as its own."""
    with open(stdin_path or os.devnull, "rb") as stdin, open(stdout_path, "wb") as stdout:
        before = resource.getrusage(resource.RUSAGE_CHILDREN)
        result = subprocess.run(["/usr/bin/time", "-f", "%M"] + command, stdin=stdin,
                                stdout=stdout, stderr=subprocess.PIPE)
        after = resource.getrusage(resource.RUSAGE_CHILDREN)
        seconds = (after.ru_utime + after.ru_stime) - (before.ru_utime + before.ru_stime)
    if result.returncode not in (0, 1):
        raise SystemExit("failed: %s\n%s" % (" ".join(command), result.stderr.decode()))
    kilobytes = result.stderr.decode(errors="replace").strip().splitlines()[-1]
    return seconds, int(kilobytes) * 1024


def measure(datapack, work, name, description, repeat, commands):
    source = os.path.join(work, name + ".json")
    package = os.path.join(work, name + ".pkg")
    with open(source, "w") as out:
        json.dump(description, out)
    run([datapack, "pack", source, "-o", package])
    size = os.path.getsize(package)
    shown = os.path.join(work, name + ".shown.json")
    run([datapack, "show", "--json", package], stdout_path=shown)
    other = os.path.join(work, name + ".other.pkg")
    run([datapack, "scramble", package, "-o", other])
    rows = []
    for label, arguments in commands:
        arguments = [a.format(pkg=package, json=shown, other=other) for a in arguments]
        # The packages a command handles: diff reads two, pack writes one, the others read one.
        handled = size * max(1, sum(a in (package, other) for a in arguments))
        best = None
        for _ in range(repeat):
            seconds, peak = run([datapack] + arguments)
            best = (seconds, peak) if best is None or seconds < best[0] else best
        rows.append((label, handled, best[0], best[1]))
    json_size = os.path.getsize(shown)
    for path in (source, shown, other):
        os.remove(path)
    os.remove(package)
    return size, json_size, rows


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--datapack", default="build/default/bin/datapack")
    parser.add_argument("--sizes", default="1,10,100", help="game-state sizes in MB")
    parser.add_argument("--depths", default="10,100,1023", help="nesting depths")
    parser.add_argument("--depth-sizes", default="2", help="MB of the nested packages")
    parser.add_argument("--repeat", type=int, default=3)
    parser.add_argument("--commands", default="show,show --json,pack,scramble,unscramble,check,diff")
    parser.add_argument("--work", default=None, help="folder for the packages (default: a temp)")
    options = parser.parse_args()

    known = {
        "show": ["show", "{pkg}"],
        "show --json": ["show", "--json", "{pkg}"],
        "pack": ["pack", "{json}"],
        "scramble": ["scramble", "{pkg}"],
        "unscramble": ["unscramble", "{pkg}"],
        "check": ["check", "{pkg}"],
        "diff": ["diff", "{pkg}", "{other}"],
    }
    commands = [(c, known[c]) for c in options.commands.split(",")]
    work = options.work or tempfile.mkdtemp(prefix="datapack_bench_")
    datapack = os.path.abspath(options.datapack)

    cases = [("game state %g MB" % float(s), "game%s" % s, game_state(int(float(s) * MB)))
             for s in options.sizes.split(",")]
    cases += [("nested %s deep %g MB" % (d, float(m)), "nested%s_%s" % (d, m),
               nested(int(d), int(float(m) * MB)))
              for d in options.depths.split(",") for m in options.depth_sizes.split(",")]
    demo = os.path.join(work, "demo.pkg")
    run([datapack, "demo", "-o", demo])
    start, base = min(run([datapack, "show", demo]) for _ in range(5))
    print("start-up %.1f ms, peak %.1f MB" % (start * 1e3, base / MB))
    print("%-22s %-12s %10s %10s %9s %12s %9s %9s %9s" % (
        "package", "command", "bytes", "handled", "seconds", "ns/byte", "peak MB", "peak/size",
        "above/size"))
    for title, name, description in cases:
        size, json_size, rows = measure(datapack, work, name, description, options.repeat,
                                        commands)
        print("%s: %d bytes of package, %d of JSON from show --json" % (title, size, json_size))
        for label, handled, seconds, peak in rows:
            print("%-22s %-12s %10d %10d %9.3f %12.1f %9.1f %9.2f %9.2f" %
                  (title, label, size, handled, seconds, (seconds - start) * 1e9 / handled,
                   peak / MB, peak / size, (peak - base) / size))
            sys.stdout.flush()
        description.clear()


if __name__ == "__main__":
    main()
