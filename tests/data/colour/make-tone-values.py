#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Makes tone-values-fogra39.csv and densities.csv: make-tone-values.py [FOLDER]

The first is from FOGRA39L.ti3 of Debian's icc-profiles-free, the second from spectra in closed
form, both with formulas written out here. Figures that others have published for FOGRA39 are held
against the first.
"""

import csv
import math
import pathlib
import sys

HERE = pathlib.Path(__file__).parent
FOGRA39 = "/usr/share/color/icc/FOGRA39L.ti3"
WHITE = (96.422, 100, 82.521)
INKS = "CMYK"
# SCTV at 10, 30, 40, 50, 70, 80, and tone value increase at 40, 50, 80 where it is known.
KNOWN = {"C": ((8.617, 27.271, 37.540, 47.812, 69.767, 80.669), (13.97, 14.99, 10.96)),
         "M": ((8.525, 27.457, 37.823, 48.738, 71.107, 82.110), (12.31, 13.67, 10.23)),
         "Y": ((8.228, 26.395, 36.417, 46.812, 69.176, 80.529), (13.13, 14.41, 10.77)),
         "K": ((7.632, 23.898, 32.555, 41.996, 62.617, 73.897), (15.99, 17.15, 11.54))}


def ramps():
    """{ink: {nominal: (XYZ, Lab)}}, paper at 0."""
    text = pathlib.Path(FOGRA39).read_text(encoding="latin-1")
    columns = text.split("BEGIN_DATA_FORMAT")[1].split("END_DATA_FORMAT")[0].split()
    found = {ink: {} for ink in INKS}
    for line in text.split("BEGIN_DATA\n")[1].split("END_DATA")[0].strip().splitlines():
        row = dict(zip(columns, line.split()))
        device = [float(row[f"CMYK_{ink}"]) for ink in INKS]
        if sum(value > 0 for value in device) > 1:
            continue
        for ink, value in zip(INKS, device):
            if value > 0 or not any(device):
                found[ink].setdefault(value, ([float(row[f"XYZ_{axis}"]) for axis in "XYZ"],
                                              [float(row[f"LAB_{axis}"]) for axis in "LAB"]))
    return found


def lightness(value, white):
    t = value / white
    return 116 * (t ** (1 / 3) if t > 216 / 24389 else (24389 / 27 * t + 16) / 116) - 16


def sctv(paper, solid, tint):
    p, s, t = ([lightness(*pair) for pair in zip(xyz, WHITE)] for xyz in (paper, solid, tint))
    return 100 * math.sqrt(sum((a - b) ** 2 for a, b in zip(t, p))
                           / sum((a - b) ** 2 for a, b in zip(s, p)))


def tone(ink, paper, solid, tint):
    def light(xyz):
        return {"C": xyz[0] - 0.55 * xyz[2], "M": xyz[1], "Y": xyz[2], "K": xyz[1]}[ink]
    return 100 * (light(paper) - light(tint)) / (light(paper) - light(solid))


def write_tones(folder):
    with open(folder / "tone-values-fogra39.csv", "w", encoding="ascii") as file:
        file.write("# Made by make-tone-values.py from FOGRA39L.ti3 (Debian icc-profiles-free, data "
                   "by Fogra).\nink,nominal,X,Y,Z,sctv,tone,L,a,b\n")
        for ink, ramp in ramps().items():
            paper, solid = ramp[0][0], ramp[100][0]
            values = {n: (sctv(paper, solid, xyz), tone(ink, paper, solid, xyz))
                      for n, (xyz, _) in ramp.items()}
            for nominal, known in zip((10, 30, 40, 50, 70, 80), KNOWN[ink][0]):
                assert abs(values[nominal][0] - known) < 6e-4, (ink, nominal)
            for nominal, known in zip((40, 50, 80), KNOWN[ink][1]):
                assert abs(values[nominal][1] - nominal - known) < 0.02, (ink, nominal)  # known by rounded L*a*b*
            for nominal in (0, 10, 30, 40, 50, 70, 80, 100):
                xyz, lab = ramp[nominal]
                cells = [*xyz, *(f"{value:.6f}" for value in values[nominal]), *lab]
                file.write(f"{ink},{nominal}," + ",".join(map(str, cells)) + "\n")


def spectrum(number):
    """A paper, then inks whose absorption wanders through the spectrum."""
    depth = 0 if number == 0 else 0.9
    return [round(0.88 * (1 - depth * math.exp(-((nm - 430 - 30 * number) / 50) ** 2)), 5)
            for nm in range(380, 740, 10)]


def write_densities(folder):
    with open(HERE / "density-status-e.csv", encoding="ascii") as file:
        weights = list(csv.DictReader(line for line in file if not line.startswith("#")))
    with open(folder / "densities.csv", "w", encoding="ascii") as file:
        file.write("# Made by make-tone-values.py: densities of 36 reflectances, 380 to 730 nm.\n")
        file.write("red,green,blue,visual,reflectances\n")
        for number in range(8):
            values = spectrum(number)
            line = []
            for name in ("red", "green", "blue", "visual"):
                used = {int(row["nm"]): float(row[name]) for row in weights}
                used = [used[380 + 10 * i] for i in range(36)]
                line.append(f"{-math.log10(sum(map(math.prod, zip(values, used))) / sum(used)):.8f}")
            file.write(",".join(line) + "," + " ".join(map(str, values)) + "\n")


if __name__ == "__main__":
    place = pathlib.Path(sys.argv[1]) if len(sys.argv) > 1 else HERE
    write_tones(place)
    write_densities(place)
