#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Runs the file forms of the tool on real data and shows the results.

demo.py TINTGATE FOLDER
"""

import csv
import json
import subprocess
import sys
from pathlib import Path

ICC = "/usr/share/color/icc"
PROFILE = f"{ICC}/ghostscript/default_cmyk.icc"
PRESET = "presets/CVP_0001.xml"
WORST = 5


def headline(text):
    print(f"\n{text}\n{'=' * len(text)}")


def meanings():
    with open("docs/exit-codes.csv", newline="", encoding="utf-8") as file:
        return {int(row["code"]): row["meaning"] for row in csv.DictReader(file)}


class Demo:
    def __init__(self, tool):
        self.tool = tool
        self.meanings = meanings()
        self.surprises = 0

    def run(self, *arguments, expected=0):
        print(f"\n$ Tintgate {' '.join(map(str, arguments))}")
        code = subprocess.run([self.tool, *arguments], check=False).returncode
        print(f"exit code {code}: {self.meanings.get(code, 'not in the list')}")
        if code != expected:
            self.surprises += 1
            print(f"  expected: {expected}")

    def compare(self, target, measurement, output, verdict):
        self.run(target, measurement, PRESET, output)
        result = json.loads(Path(output).read_text(encoding="ascii"))
        show(result)
        if result["verdict"] != verdict:
            self.surprises += 1
            print(f"  expected: {verdict}")


def show(result):
    statistics = result["statistics"]
    print(f"\nVerdict: {result['verdict'].upper()}, {result['preset']['name']}, "
          f"{result['formula']['name']}")
    print(f"{statistics['count']} patches: mean {statistics['mean']:.2f}, "
          f"95th percentile {statistics['percentile95']:.2f}, largest {statistics['maximum']:.2f}\n")
    print(f"  {'criterion':46} {'unit':>4} {'value':>7} {'at most':>8}")
    for criterion in filter(lambda criterion: criterion["used"], result["criteria"]):
        value = criterion["value"]
        value = "-" if value is None else f"{value:.{criterion['decimals']}f}"
        print(f"  {criterion['title']:46} {criterion['unit']:>4} {value:>7} "
              f"{criterion['tolerance']:8.2f}  {criterion['outcome']}")
    for warning in result["warnings"]:
        print(f"  warning: {warning}")

    column = {name: index for index, name in enumerate(result["patchColumns"])}
    worst = sorted(result["patches"], key=lambda patch: -patch[column["difference"]])[:WORST]
    if worst[0][column["difference"]] == 0:
        return
    print(f"\n  {'worst patches':14} {'C M Y K':18} {'target L* a* b*':24} "
          f"{'measured L* a* b*':24} {'dE':>6}")
    for patch in worst:
        device = " ".join(f"{value:g}" for value in patch[column["device"]])
        lab = [" ".join(f"{value:7.2f}" for value in patch[column[side]])
               for side in ("target", "measured")]
        print(f"  {patch[column['id']]:14} {device:18} {lab[0]:24} {lab[1]:24} "
              f"{patch[column['difference']]:6.2f}")


def show_table(path):
    """The head of a CGATS text with L*a*b* values."""
    lines = Path(path).read_text(encoding="utf-8").splitlines()
    fields = lines[lines.index("BEGIN_DATA_FORMAT") + 1].split()
    start = lines.index("BEGIN_DATA") + 1
    print("\n  " + "".join(f"{field:>10}" for field in fields))
    for line in lines[start:start + 4]:
        print("  " + "".join(f"{float(value):10.5g}" for value in line.split()))
    print("  ...")


def main(tool, folder):
    Path(folder).mkdir(parents=True, exist_ok=True)
    demo = Demo(tool)

    headline("Does the super-calendered paper of FOGRA40 match the coated one of FOGRA39?")
    demo.compare(f"{ICC}/FOGRA39L.ti3", f"{ICC}/FOGRA40L.ti3", f"{folder}/papers.json", "failed")

    headline("Is TR006, coated paper in America, FOGRA39 by another name?")
    demo.compare(f"{ICC}/FOGRA39L.ti3", f"{ICC}/TR006.ti3", f"{folder}/coated.json", "passed")

    headline("L*a*b* values that a profile gives for the CMYK values of a chart")
    lab = f"{folder}/profile.it8"
    demo.run(f"{ICC}/FOGRA39L.ti3", PROFILE, lab)
    show_table(lab)
    print("\nCompared with the profile itself, they must agree:")
    demo.compare(lab, PROFILE, f"{folder}/profile.json", "passed")

    headline("Can these files be used?")
    demo.run(f"{ICC}/FOGRA39L.ti3")
    demo.run(PROFILE)
    demo.run(f"{ICC}/sRGB.icc", expected=34)
    demo.run("README.md", expected=22)
    demo.run(f"{folder}/missing.ti3", expected=20)

    print(f"\nThe files are in {folder}. docs/result.md explains what a result contains.")
    return 1 if demo.surprises else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
