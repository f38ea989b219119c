#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Creates results like those of a print room after some months, with the tool itself.

make-results.py TINTGATE PRESET FOLDER COUNT [--seed N]

Job N is FOLDER/JobID_N with "output.json" and "meta.json". A control strip of FOGRA39L is measured
with noise. In the second half, cyan becomes lighter and yellower, so it drifts and finally fails.
The same arguments give the same results.
"""

import argparse
import json
import os
import random
import subprocess
from concurrent.futures import ThreadPoolExecutor
from datetime import datetime, timedelta
from pathlib import Path

CHART = Path("/usr/share/color/icc/FOGRA39L.ti3")
START = datetime(2026, 3, 2, 7, 30)
TONES = (0, 10, 20, 40, 70, 100)
GREYS = ((10, 6, 6, 0), (20, 12, 12, 0), (40, 27, 27, 0), (60, 45, 45, 0), (80, 65, 65, 0))


def strip():
    """The chart's patches in a strip: paper, ramps of each ink, overprints, greys."""
    wanted = {tuple(tone if i == ink else 0 for i in range(4)) for ink in range(4) for tone in TONES}
    wanted |= {(0, 100, 100, 0), (100, 0, 100, 0), (100, 100, 0, 0), *GREYS}
    text = CHART.read_text(encoding="latin-1")
    fields = text.split("BEGIN_DATA_FORMAT")[1].split("END_DATA_FORMAT")[0].split()
    patches = {}
    for line in text.split("BEGIN_DATA\n")[1].split("END_DATA")[0].splitlines():
        row = dict(zip(fields, line.split()))
        device = tuple(float(row["CMYK_" + ink]) for ink in "CMYK")
        if device in wanted:
            patches.setdefault(device, [float(row["LAB_" + axis]) for axis in "LAB"])
    return sorted(patches.items())


def cgats(patches, shift):
    lines = ["CGATS.17", "BEGIN_DATA_FORMAT",
             "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B", "END_DATA_FORMAT",
             f"NUMBER_OF_SETS {len(patches)}", "BEGIN_DATA"]
    for i, (device, lab) in enumerate(patches, 1):
        moved = shift(device, lab)
        lines.append(" ".join([f"A{i}", *(f"{v:g}" for v in device), *(f"{v:.3f}" for v in moved)]))
    return "\n".join([*lines, "END_DATA", ""])


def noisy(rng, drift):
    common = [rng.gauss(0, 0.25) for _ in range(3)]

    def shift(device, lab):
        cyan = device[0] / 100 if device[1:] == (0, 0, 0) else 0
        move = (2.8 * drift * cyan, 2.0 * drift * cyan, 7.5 * drift * cyan)
        return [v + c + m + rng.gauss(0, 0.2) for v, c, m in zip(lab, common, move)]

    return shift


def meta_text(job, when, title):
    text = json.loads((Path(__file__).parents[2] / "tests/data/report/meta.json").read_text())
    text["created"] = when.strftime("%Y-%m-%dT%H:%M:%S+01:00")
    text["job"].update(id=job, title=title, strip=1)
    text["instrument"]["name"] = "Instrument 33"
    text["paper"] = "Matt coated, 115 g/m2"
    text["workflow"]["name"] = "Press 2"
    return json.dumps(text)


def make(arguments, patches, target, job):
    rng = random.Random(arguments.seed * 1_000_003 + job)
    place = job / arguments.count
    folder = arguments.folder / f"JobID_{job}"
    folder.mkdir(parents=True, exist_ok=True)
    measured = folder / "Measured sample.txt"
    measured.write_text(cgats(patches, noisy(rng, max(0, 2 * place - 1))))
    result = folder / "output.json"
    subprocess.run([arguments.tintgate, target, measured, arguments.preset, result], check=True,
                   env={**os.environ, "TMPDIR": str(folder)})
    when = START + timedelta(days=240 * place, minutes=rng.randrange(600))
    (folder / "meta.json").write_text(meta_text(job, when, f"Order {20000 + job}, sheet 1"))


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("tintgate")
    parser.add_argument("preset", type=Path)
    parser.add_argument("folder", type=Path)
    parser.add_argument("count", type=int)
    parser.add_argument("--seed", type=int, default=1)
    arguments = parser.parse_args()
    patches = strip()
    arguments.folder.mkdir(parents=True, exist_ok=True)
    target = arguments.folder / "target.txt"
    target.write_text(cgats(patches, lambda device, lab: lab))
    with ThreadPoolExecutor(2) as pool:
        list(pool.map(lambda job: make(arguments, patches, target, job),
                      range(1, arguments.count + 1)))


if __name__ == "__main__":
    main()
