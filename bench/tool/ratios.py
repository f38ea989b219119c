#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Times the whole program against its peers and prints ratios.

ratios.py TINTGATE EMPTY_WX PRESET [--quick]

The two sides of a ratio take turns, so that other load affects both. The medians of processor time
are compared (all programs are single-threaded), because other load affects it less than elapsed
time, which is printed too. Peers: colverify -k of ArgyllCMS, which reads the same files and
computes the same differences, and a program that only starts with the wx base library. The large
files repeat the rows of FOGRA39L and FOGRA40L under new ids. --quick skips colverify at 100,000
patches, which takes about half a minute per run.
"""

import os
import statistics
import sys
import tempfile
import time

DATA = "/usr/share/color/icc/FOGRA{}L.ti3"
SETS = ("39", "40")


def repeat_rows(source, count, target):
    """A data set with `count` rows: the rows of `source` repeated and numbered from 1."""
    with open(source, encoding="latin-1") as file:
        head, rest = file.read().split("BEGIN_DATA\n")
    rows = [row.split(None, 1)[1] for row in rest.split("END_DATA")[0].splitlines() if row.strip()]
    head = head.replace(f"NUMBER_OF_SETS {len(rows)}", f"NUMBER_OF_SETS {count}")
    with open(target, "w", encoding="latin-1") as file:
        file.write(head + "BEGIN_DATA\n")
        file.writelines(f"{i + 1} {rows[i % len(rows)]}\n" for i in range(count))
        file.write("END_DATA\n")


def run(command):
    """Processor seconds, elapsed seconds and peak memory in MB of one run."""
    nowhere = [(os.POSIX_SPAWN_OPEN, 1, "/dev/null", os.O_WRONLY, 0)]
    start = time.perf_counter()
    child = os.posix_spawnp(command[0], command, os.environ, file_actions=nowhere)
    _, status, usage = os.wait4(child, 0)
    seconds = time.perf_counter() - start
    if status != 0:
        sys.exit(f"{' '.join(command)}: exit code {os.waitstatus_to_exitcode(status)}")
    return usage.ru_utime + usage.ru_stime, seconds, usage.ru_maxrss / 1024


def main(tintgate, empty_wx, preset, *options):
    quick = "--quick" in options
    verdicts = []

    def say(what, value, limit, unit=""):
        verdicts.append(value <= limit)
        missed = "" if value <= limit else "  MISSED"
        print(f"{what:36} {value:8.4g}{unit} (at most {limit:.4g}{unit}){missed}", flush=True)

    def ratio(what, first, second, pairs, limit):
        for command in (first, second):
            run(command)
        runs = [[run(command) for command in (first, second)] for _ in range(pairs)]
        processor, clock = (
            [statistics.median(pair[side][measure] for pair in runs) * 1e3 for side in (0, 1)]
            for measure in (0, 1)
        )
        say(what, processor[0] / processor[1], limit)
        print(f"  {processor[0]:.2f} : {processor[1]:.2f} ms; on the clock {clock[0]:.2f} : "
              f"{clock[1]:.2f} ms, {clock[0] / clock[1]:.4g}")

    with tempfile.TemporaryDirectory() as folder:
        os.environ["TMPDIR"] = folder

        def files(count):
            paths = [f"{folder}/{name}-{count}.ti3" for name in SETS]
            for name, path in zip(SETS, paths):
                if not os.path.exists(path):
                    repeat_rows(DATA.format(name), count, path)
            return paths

        def compare(count):
            return [tintgate, *files(count), preset, f"{folder}/result.json"]

        def colverify(count):
            return ["colverify", "-k", *files(count)]

        ratio("-version : empty wx program", [tintgate, "-version"], [empty_wx], 101, 3)
        ratio("1,617 patches : colverify -k", compare(1617), colverify(1617), 101, 0.4)
        if not quick:
            ratio("100,000 patches : colverify -k", compare(100_000), colverify(100_000), 2, 1 / 80)
        ratio("1,000,000 : 100,000 patches", compare(1_000_000), compare(100_000), 5, 10 * 1.15)
        say("100,000 patches, peak memory", run(compare(100_000))[2], 300, " MB")
    return 0 if all(verdicts) else 1


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
