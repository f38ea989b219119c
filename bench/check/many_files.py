#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Times tintgate-check on many files against a loop of colverify -k, and prints ratios and memory.

many_files.py TINTGATE_CHECK [--quick]

1,000 measurements are made of FOGRA39L with noise, 1,617 patches each, and compared with FOGRA39L.
Rounds of tintgate-check over all of them and of colverify over a hundred take turns; medians are
compared, of the processor time and of the time on the clock. A busy machine stretches the second: the
limit for it holds for two free cores. The tree of 100,000 files consists of links to a few. --quick
leaves the tree out.
"""

import os
import random
import statistics
import sys
import tempfile
import time
from pathlib import Path

TARGET = "/usr/share/color/icc/FOGRA39L.ti3"
FILES = 1000
PEER_FILES = 100
ROUNDS = 5
TREE = 100_000


def make_measurements(folder):
    text = Path(TARGET).read_text(encoding="latin-1")
    head, rest = text.split("BEGIN_DATA\n")
    names = head.split("BEGIN_DATA_FORMAT")[1].split("END_DATA_FORMAT")[0].split()
    rows = [row.split() for row in rest.split("END_DATA")[0].splitlines() if row.strip()]
    noisy = [place for place, name in enumerate(names) if name.startswith(("XYZ_", "LAB_"))]
    chance = random.Random(39)
    for number in range(FILES):
        lines = []
        for row in rows:
            cells = list(row)
            for place in noisy:
                cells[place] = f"{float(cells[place]) + chance.gauss(0, 0.3):.4f}"
            lines.append(" ".join(cells))
        Path(folder, f"m{number:04}.txt").write_text(
            head + "BEGIN_DATA\n" + "\n".join(lines) + "\nEND_DATA\n", encoding="latin-1")


def run(command):
    """Processor seconds, seconds on the clock, and peak memory in MB."""
    nowhere = [(os.POSIX_SPAWN_OPEN, 1, "/dev/null", os.O_WRONLY, 0)]
    start = time.perf_counter()
    child = os.posix_spawnp(command[0], command, os.environ, file_actions=nowhere)
    _, status, usage = os.wait4(child, 0)
    seconds = time.perf_counter() - start
    if status != 0:
        sys.exit(f"{command[0]}: exit code {os.waitstatus_to_exitcode(status)}")
    return usage.ru_utime + usage.ru_stime, seconds, usage.ru_maxrss / 1024


def peer(folder):
    """The same of colverify for each of some files, scaled to all of them."""
    runs = [run(["colverify", "-k", TARGET, f"{folder}/m{number:04}.txt"])
            for number in range(PEER_FILES)]
    return [sum(one[measure] for one in runs) * FILES / PEER_FILES for measure in (0, 1)]


def make_tree(folder, measurements):
    """Links, since only their number counts; a file system allows so many to one file."""
    for number in range(TREE):
        if number % 1000 == 0:
            inside = Path(folder, f"{number // 1000:03}")
            inside.mkdir(parents=True)
        os.link(f"{measurements}/m{number % 1000:04}.txt", inside / f"{number % 1000:04}.txt")


def main(program, *options):
    missed = []

    def say(what, value, limit, unit=""):
        fits = value <= limit
        if not fits:
            missed.append(what)
        print(f"{what:44} {value:8.4g}{unit} (at most {limit:g}{unit}){'' if fits else '  MISSED'}",
              flush=True)

    with tempfile.TemporaryDirectory() as scratch:
        folder = f"{scratch}/measurements"
        os.mkdir(folder)
        make_measurements(folder)
        command = [program, "-t", TARGET, folder]
        run(command)
        rounds = [(run(command), peer(folder)) for _ in range(ROUNDS)]
        ours, peers = ([statistics.median(one[side][measure] for one in rounds)
                        for measure in (0, 1)] for side in (0, 1))
        print(f"{FILES} measurements, load {os.getloadavg()[0]:.1f} on {os.cpu_count()} processors: "
              f"{ours[0]:.3f} : {peers[0]:.3f} s of the processors, "
              f"{ours[1]:.3f} : {peers[1]:.3f} s on the clock")
        say("processor time : loop of colverify -k", ours[0] / peers[0], 0.12)
        say("time on the clock : loop of colverify -k", ours[1] / peers[1], 0.08)
        if "--quick" not in options:
            make_tree(f"{scratch}/tree", folder)
            few = run(command)[2]
            many = run([program, "-t", TARGET, f"{scratch}/tree"])[2]
            print(f"peak memory: {few:.1f} MB for {FILES} files, {many:.1f} MB for {TREE}")
            say("memory for each further file, bytes", (many - few) * 2**20 / (TREE - FILES), 200)
    return 1 if missed else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
