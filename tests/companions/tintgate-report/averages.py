#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Averages of the whole program against plain means: averages.py REPORT TINTGATE SCRATCH_FOLDER"""

import csv
import json
import pathlib
import random
import subprocess
import sys

ROOT = pathlib.Path(__file__).parents[3]
sys.path.insert(0, str(ROOT / "tests/analysis"))
from verdict_model import Side, delta_e00, mean_of, xyz_of_lab  # noqa: E402
from verdicts import preset_of, text_of  # noqa: E402


def random_chart(dice, devices, spectra, drift):
    chart = []
    for number, device in enumerate(devices):
        lab = [round(value + dice.uniform(-drift, drift), 3)
               for value in (40 + 50 * (number % 7) / 7, number % 5 * 9 - 18, number % 3 * 20 - 20)]
        patch = {"id": f"P{number}", "device": device, "lab": lab}
        if spectra:
            patch["spectrum"] = [round(dice.uniform(0.02, 0.9), 4) for _ in range(36)]
        chart.append(patch)
    dice.shuffle(chart)
    return chart


def rows_of(path):
    """A CGATS text that this program wrote: names of the columns to values, row by row."""
    text = path.read_text()
    names = text.split("BEGIN_DATA_FORMAT\n")[1].split("\n")[0].split("\t")
    lines = text.split("BEGIN_DATA\n")[1].split("END_DATA")[0].strip().split("\n")
    return [dict(zip(names, line.split("\t"))) for line in lines]


def near(a, b, what):
    assert abs(a - b) < 1e-9 * max(1, abs(b)), (what, a, b)


def check_mean(report, folder, dice, with_spectra):
    devices = [[dice.randrange(101) for _ in range(4)] for _ in range(40)]
    devices[7] = devices[3]  # read twice within the chart: the two rows stay apart
    charts = [random_chart(dice, devices, spectra, 2) for spectra in with_spectra]
    paths = []
    for i, chart in enumerate(charts):
        paths.append(folder / f"m{i}.txt")
        paths[-1].write_text(text_of(Side(chart)))
    mean, spread = folder / "mean.txt", folder / "spread.csv"
    told = subprocess.run([report, "average", *paths, "-o", mean, "--spread", spread], check=True,
                          capture_output=True, text=True).stdout
    spreads = list(csv.DictReader(spread.read_text().splitlines()))
    taken = [set() for _ in charts]
    largest = 0
    for row, stated in zip(rows_of(mean), spreads, strict=True):
        device = [float(row[f"CMYK_{ink}"]) for ink in "CMYK"]
        patches = []
        for chart, used in zip(charts, taken):  # of patches that are alike the k-th with the k-th
            at = next(i for i, p in enumerate(chart) if p["device"] == device and i not in used)
            used.add(at)
            patches.append(chart[at])
        lab = mean_of([p["lab"] for p in patches])
        for name, value in zip("LAB", lab):
            near(float(row[f"LAB_{name}"]), value, row)
        if not any(with_spectra):  # which XYZ would be from
            for i, name in enumerate("XYZ"):
                near(float(row[f"XYZ_{name}"]),
                     sum(xyz_of_lab(p["lab"])[i] for p in patches) / len(patches), row)
        assert ("SPECTRAL_NM380" in row) == all(with_spectra)
        if all(with_spectra):
            for i in range(36):
                near(float(row[f"SPECTRAL_NM{380 + 10 * i}"]),
                     sum(p["spectrum"][i] for p in patches) / len(patches), row)
        distances = [delta_e00(lab, p["lab"]) for p in patches]
        near(float(stated["mean_distance"]), sum(distances) / len(distances), stated)
        near(float(stated["largest_distance"]), max(distances), stated)
        assert distances[int(stated["furthest_measurement"]) - 1] == max(distances)
        largest = max(largest, *distances)
    assert f"largest {largest:.2f}" in told, told
    return paths[0], mean


def main(report, tintgate, scratch):
    folder = pathlib.Path(scratch)
    folder.mkdir(parents=True, exist_ok=True)
    dice = random.Random(5)
    for with_spectra in ((True, True, True), (False, False), (True, False, True)):
        first, mean = check_mean(report, folder, dice, with_spectra)
    # The mean is a measurement like any other.
    preset, result = folder / "preset.xml", folder / "result.json"
    preset.write_text(preset_of({"criteria": {"average": 5}}))
    subprocess.run([tintgate, first, mean, preset, result], check=True)
    assert len(json.loads(result.read_text())["patches"]) == 40

    def refuses(status, *others):
        lost = folder / "lost.txt"
        lost.unlink(missing_ok=True)
        run = subprocess.run([report, "average", first, *others, "-o", lost], capture_output=True)
        assert run.returncode == status and run.stderr and not lost.exists(), run
    other = Side([{**p, "device": [100 - v for v in p["device"]]} for p in
                  random_chart(dice, [[i, 0, 0, 0] for i in range(40)], False, 1)])
    (folder / "other.txt").write_text(text_of(other))
    (folder / "m0.txt").write_text(first.read_text().replace("CGATS.17", "CGATS.17\nMEASUREMENT_"
                                                             "CONDITION M0", 1))
    (folder / "fewer.txt").write_text(text_of(Side(other.chart[:9])))
    (folder / "no.txt").write_text("nothing")
    first = mean
    for status, name in ((14, "other.txt"), (14, "m0.txt"), (14, "fewer.txt"), (4, "no.txt"),
                         (3, "none.txt")):
        refuses(status, folder / name)
    refuses(64)


if __name__ == "__main__":
    main(*sys.argv[1:])
