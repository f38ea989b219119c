#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Verdicts of the whole program: verdicts.py TINTGATE SCRATCH_FOLDER

Each case is a pair of charts and a preset with the verdict that they must get and the warnings that
must come with it. All figures of each result are worked out again by verdict_model.py, and those of
random charts too.
"""

import csv
import json
import math
import pathlib
import random
import re
import subprocess
import sys

import jsonschema

from measure_model import BALANCED, REQUESTED
from verdict_model import CRITERIA, Model, Side, lab_of_xyz, xyz_of_lab

ROOT = pathlib.Path(__file__).parents[2]
SCHEMA = json.loads((ROOT / "docs/result.schema.json").read_text())
# Shown by tests/analysis/LibraryTest.cpp and JudgementTest.cpp: no two files can cause them.
ELSEWHERE = {"criterionUnknown", "spectraNotStored", "sameFile"}


# Files -------------------------------------------------------------------------------------------

def text_of(side):
    lines = ["CGATS.17"]
    if side.illuminant:
        lines.append(f"ILLUMINANT {side.illuminant}")
    if side.observer:
        lines.append(f"OBSERVER {side.observer}")
    if side.condition:
        lines.append(f"MEASUREMENT_CONDITION {side.condition}")
    chart = side.chart
    names = [name for name, key in (("SAMPLE_ID", "id"), ("SAMPLE_NAME", "name")) if side.has(key)]
    count = len(chart[0].get("device", []))
    names += {"CMYK": ["CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"]
              + [f"SPOT_{i}" for i in range(1, count - 3)],
              "RGB": ["RGB_R", "RGB_G", "RGB_B"],
              "nCLR": [f"{count}CLR_{i + 1}" for i in range(count)]}[side.columns] if count else []
    names += ["LAB_L", "LAB_A", "LAB_B"] if side.has("lab") else []
    spectral = side.has("grey") or side.has("spectrum")
    names += [f"SPECTRAL_{nm}" for nm in range(380, 740, 10)] if spectral else []
    lines += ["BEGIN_DATA_FORMAT", " ".join(names), "END_DATA_FORMAT", f"NUMBER_OF_SETS {len(chart)}",
              "BEGIN_DATA"]
    for patch in chart:
        cells = [f'"{patch[key]}"' for key in ("id", "name") if side.has(key)]
        cells += [*patch.get("device", []), *patch.get("lab", [])] + [patch.get("grey")] * (
            36 if side.has("grey") else 0)
        cells += patch["spectrum"] if side.has("spectrum") else []
        lines.append(" ".join(map(str, cells)))
    return "\n".join([*lines, "END_DATA", ""])


def preset_of(preset):
    required = ' required="yes"' if preset.get("required") else ""
    criteria = "".join(f'<{name} tolerance="{limit}" used="yes" decimals="2"/>'
                       for name, limit in preset["criteria"].items())
    options = "".join(f"<{name}>{preset[name]}</{name}>" for name in (
        "repeats", "minimumGreys", "paper", "toneAims", "toneAimsBlack", "spotToneAims",
        "greyWeights") if name in preset)
    return (f'<tolerancePreset version="1"><id>1</id><name>Case</name>'
            f'<formula>{preset.get("formula", "CIE76")}</formula><editable>no</editable>'
            f"<showInClient>no</showInClient><usedForDynamicWedge>no</usedForDynamicWedge>"
            f'<illuminationCondition{required}>{preset.get("condition", -1)}</illuminationCondition>'
            f"<psd>no</psd>{options}<criteria>{criteria}</criteria></tolerancePreset>")


# Charts of the cases -----------------------------------------------------------------------------

def patch(device, lab, **labels):
    return {"device": list(device), "lab": list(lab), **labels}


WEDGE = [patch(*row) for row in (
    ((0, 0, 0, 0), (95, 0, -2)), ((100, 0, 0, 0), (55, -37, -50)), ((0, 100, 0, 0), (48, 74, -3)),
    ((0, 0, 100, 0), (89, -5, 93)), ((0, 0, 0, 100), (16, 0, 0)), ((55, 0, 0, 0), (73, -18, -28)),
    ((100, 0, 0, 20), (48, -33, -43)), ((10, 6, 6, 0), (89, 0, -3)),
    ((20, 12, 12, 0), (82, -1, -4)), ((40, 27, 27, 0), (68, -2, -4)),
    ((60, 45, 45, 0), (52, -2, -4)), ((80, 65, 65, 0), (37, -4, -3)))]
LIMITS = {"average": 2, "maximum": 4, "paperWhite": 3, "solidMaximum": 3, "greyAverage": 2}


def moved(chart, *offset, only=None):
    """A chart whose patches are off by so much; `only` by these device values."""
    return [{**p, "lab": [round(value + step, 6) for value, step in zip(p["lab"], offset)]}
            if only is None or tuple(p["device"]) == only else dict(p) for p in chart]


def labelled(chart, **kinds):
    return [{**p, **{kind: labels[i] for kind, labels in kinds.items()}}
            for i, p in enumerate(chart)]


def without(chart, *keys):
    return [{key: value for key, value in p.items() if key not in keys} for p in chart]


def with_inks(chart, count, *further):
    return [{**p, "device": p["device"] + [0] * (count - 4)} for p in chart] + list(further)


def stated(*greys, a=0, b=0):
    return [{"id": str(i), "lab": [116 * grey ** (1 / 3) - 16, a, b]}
            for i, grey in enumerate(greys)]


def flat(*greys):
    """Patches of flat spectra, whose colours are stated as another light might show them."""
    return [{**p, "grey": grey} for p, grey in zip(stated(*greys, a=9, b=9), greys)]


A_TO_L = [f"A{i}" for i in range(1, 13)]
NUMBERS = [str(i) for i in range(1, 13)]
SHIFTED = NUMBERS[5:] + NUMBERS[:5]
PLAIN = without(WEDGE, "device")
RGB = [{**p, "device": p["device"][:3]} for p in WEDGE]
SMALL = WEDGE[:5]
SPOTS = [patch((0, 0, 0, 0, 100, 0, 0), (70, 50, 60)), patch((0, 0, 0, 0, 0, 100, 0), (60, -60, 20)),
         patch((0, 0, 0, 0, 0, 0, 100), (25, 40, -60))]
LARGER = WEDGE + [patch((c, c, 0, 40), (50, 9, -9)) for c in (30, 50, 70)]
NO_GREYS = {"average": 2, "paperWhite": 3, "solidMaximum": 3}
AVERAGE = {"average": 2}


def case(what, verdict, target, measurement, codes="", criteria=None, patch_set=None, **preset):
    sides = [side if isinstance(side, Side) or side is None else Side(side)
             for side in (target, measurement, patch_set)]
    return {"what": what, "verdict": verdict, "sides": sides, "codes": sorted(codes.split()),
            "preset": {**preset, "criteria": LIMITS if criteria is None else criteria}}


GOOD = moved(WEDGE, 1, 0, 0)
ON_YELLOW = [{**p, "lab": lab} for p, lab in zip(WEDGE, [(93, 0, 2), (54.2, -37.5, -46.4)]
                                                    + [p["lab"] for p in WEDGE[2:]])]
MEAN = {**AVERAGE, "maximum": 2, "repeatSpread": 2.5}
CASES = [
    case("a good print", "passed", WEDGE, GOOD),
    case("a bad one", "failed", WEDGE, moved(WEDGE, 0, 0, 5)),
    # Repeated readings.
    case("measured twice, the second too dark", "failed", WEDGE, GOOD + moved(WEDGE, -12, 0, 0)),
    case("measured twice", "passed", WEDGE, GOOD + moved(WEDGE, -1, 0, 0)),
    case("three readings of two target patches", "failed",
         WEDGE + moved(WEDGE[:1], -3, 0, 0), GOOD + 2 * moved(WEDGE[:1], -3, 0, 0),
         criteria={"maximum": 2.5}),
    case("a target that states paper twice", "failed", WEDGE + moved(WEDGE[:1], 9, 0, 0), GOOD),
    case("readings on both sides of the target", "failed", WEDGE,
         moved(WEDGE, 3, 0, 0) + moved(WEDGE, -3, 0, 0), criteria={"maximum": 2}),
    case("their mean", "passed", WEDGE, moved(WEDGE, 2.2, 0, 0) + moved(WEDGE, -2.2, 0, 0),
         criteria=MEAN, repeats="mean"),
    case("a mean of readings too far apart", "failed", WEDGE,
         moved(WEDGE, 3, 0, 0) + moved(WEDGE, -3, 0, 0), criteria=MEAN, repeats="mean"),
    case("a mean without a limit for its readings", "incomplete", WEDGE,
         moved(WEDGE, 1, 0, 0) + moved(WEDGE, -1, 0, 0), "spreadUnjudged", AVERAGE, repeats="mean"),
    case("nothing to take a mean of", "incomplete", WEDGE, GOOD, criteria=MEAN, repeats="mean"),
    case("a patch set of a wedge measured twice", "failed", LARGER,
         GOOD + moved(WEDGE, -12, 0, 0), patch_set=WEDGE),
    # Labels.
    case("names against ids that only number the rows", "passed",
         labelled(PLAIN, id=NUMBERS, name=A_TO_L), labelled(PLAIN, id=SHIFTED, name=A_TO_L),
         "pairedByLabels", AVERAGE),
    case("the same, paper under one name twice", "passed",
         labelled(PLAIN, id=NUMBERS, name=["A2"] + A_TO_L[1:]),
         labelled(PLAIN, id=SHIFTED, name=["A2"] + A_TO_L[1:]), "pairedByLabels", AVERAGE),
    case("names that tell no patches apart", "passed", labelled(PLAIN, id=NUMBERS, name=["x"] * 12),
         labelled(PLAIN, id=NUMBERS, name=["x"] * 12)[::-1], criteria=AVERAGE),
    case("ids", "passed", labelled(WEDGE, id=NUMBERS),
         labelled(PLAIN, id=NUMBERS)[::-1], criteria=LIMITS),
    case("one id in common, all names", "passed",
         labelled(PLAIN, id=NUMBERS, name=A_TO_L),
         labelled(PLAIN, id=["2"] + [f"x{i}" for i in range(11)], name=A_TO_L), "pairedByLabels",
         AVERAGE),
    case("ids that are names on the other side", "passed", labelled(PLAIN, id=A_TO_L),
         labelled(PLAIN, id=NUMBERS, name=A_TO_L)[::-1], criteria=AVERAGE),
    case("measured twice by labels", "failed", labelled(PLAIN, id=A_TO_L),
         labelled(PLAIN, id=A_TO_L) + labelled(moved(PLAIN, -12, 0, 0), id=A_TO_L),
         criteria=AVERAGE),
    case("process colours against RGB", "incomplete", labelled(WEDGE, id=NUMBERS),
         Side(labelled(RGB, id=NUMBERS), space="RGB"), "deviceSpacesDiffer pairedByLabels"),
    case("the same, and bad", "failed", labelled(WEDGE, id=NUMBERS),
         Side(labelled(moved(RGB, 0, 0, 9), id=NUMBERS), space="RGB"),
         "deviceSpacesDiffer pairedByLabels"),
    case("nothing but the order", "incomplete", PLAIN, moved(PLAIN, 1, 0, 0), "pairedByOrder",
         AVERAGE),
    # What has no counterpart.
    case("a chart larger than the wedge", "passed", LARGER, GOOD),
    case("measured without a target", "passed", WEDGE, GOOD + LARGER[12:], "patchesUnpaired"),
    case("device values in whole percents", "passed",
         WEDGE + [patch((3.1, 2.2, 2.2, 0), (92, 0, -3))], GOOD + [patch((3, 2, 2, 0), (92, 0, -3))],
         "pairedByRoundedValues"),
    case("device values never filled in", "passed", labelled(WEDGE, id=NUMBERS),
         labelled([{**p, "device": [0, 0, 0, 0]} for p in GOOD], id=NUMBERS), "deviceValuesIgnored"),
    # Illuminant and observer.
    case("other light, with spectra", "passed", Side(stated(0.2, 0.5)),
         Side(flat(0.2, 0.5), illuminant="D65"), "calculatedFromSpectra", AVERAGE),
    case("other observer, with spectra of another print", "failed",
         Side(stated(0.2, 0.5)), Side(flat(0.3, 0.5), observer="10"), "calculatedFromSpectra",
         AVERAGE),
    case("other observer on one side, without spectra", "incomplete", Side(WEDGE),
         Side(GOOD, observer="10"), "observersDiffer otherLightOrObserver"),
    case("other light on both sides", "passed", Side(WEDGE, illuminant="D65"),
         Side(GOOD, illuminant="D65"), "otherLightOrObserver otherLightOrObserver"),
    case("other light on one side, and bad", "failed", Side(WEDGE, illuminant="D65"),
         moved(WEDGE, 0, 0, 9), "illuminantsDiffer otherLightOrObserver"),
    case("the usual conditions stated on one side", "passed",
         Side(WEDGE, illuminant="D50", observer="2"), GOOD),
    # Measuring conditions.
    case("M0 against M1", "passed", Side(WEDGE, condition="M0"), Side(GOOD, condition="M1"),
         "measurementConditionsDiffer"),
    case("another condition than the preset's", "passed", WEDGE, Side(GOOD, condition="M0"),
         "presetConditionDiffers", condition=1),
    case("the same, required", "incomplete", WEDGE, Side(GOOD, condition="M0"),
         "presetConditionDiffers", condition=1, required=True),
    case("a required condition that nobody states", "incomplete", Side(WEDGE, condition="M1"), GOOD,
         "measurementConditionUnknown", condition=1, required=True),
    case("a required condition that is met", "passed", WEDGE, Side(GOOD, condition="M1"),
         condition=1, required=True),
    case("any condition, but one", "incomplete", Side(WEDGE, condition="M0"),
         Side(GOOD, condition="M2"), "measurementConditionsDiffer", required=True),
    case("a number that is no condition", "passed", Side(WEDGE, condition="M0"), GOOD, condition=7),
    # Criteria.
    case("one fails, one has no answer", "failed", WEDGE, moved(WEDGE, 0, 0, 5),
         criteria={**LIMITS, "spotMaximum": 3}),
    case("none fails, one has no answer", "incomplete", WEDGE, GOOD,
         criteria={**LIMITS, "spotMaximum": 3}),
    case("no criterion", "incomplete", WEDGE, GOOD, "nothingJudged", {}),
    case("four greys", "incomplete", WEDGE[:-1], GOOD[:-1]),
    case("four greys, one measured twice", "incomplete", WEDGE[:-1], GOOD[:-1] + GOOD[-2:-1]),
    case("four greys that are enough", "passed", WEDGE[:-1], GOOD[:-1], minimumGreys=4),
    case("outer gamut: 55 percent is not of the list", "passed", WEDGE,
         moved(GOOD, 0, 0, 30, only=(55, 0, 0, 0)), "outerGamutIncomplete",
         {"outerGamutMaximum": 2}),
    case("outer gamut: with black it is", "failed", WEDGE,
         moved(GOOD, 0, 0, 30, only=(100, 0, 0, 20)), "outerGamutIncomplete",
         {"outerGamutMaximum": 2}),
    case("surface of the gamut: 55 percent is of it", "failed", WEDGE,
         moved(GOOD, 0, 0, 30, only=(55, 0, 0, 0)), criteria={"surfaceGamutAverage": 2}),
    case("surface of the gamut: with black it is not", "passed", WEDGE,
         moved(GOOD, 0, 0, 30, only=(100, 0, 0, 20)), criteria={"surfaceGamutAverage": 2}),
    # Aims for the paper.
    case("no paper to correct for", "incomplete", WEDGE[1:], GOOD[1:], "paperUnknown", AVERAGE,
         paper="corrected"),
    case("papers too different", "incomplete", WEDGE, moved(WEDGE, -12, 0, 0), "papersTooDifferent",
         {"solidBlack": 20}, paper="corrected"),
    case("the paper itself is not corrected", "failed", WEDGE, moved(WEDGE, 0, 0, 4),
         criteria={"paperWhite": 3}, paper="corrected"),
    case("the paper itself is not relative", "failed", WEDGE, moved(WEDGE, 0, 0, 4),
         criteria={"paperWhite": 3}, paper="relative"),
    case("a solid on another paper", "failed", WEDGE, ON_YELLOW, criteria={"solidCyan": 3}),
    case("the same, corrected", "passed", WEDGE, ON_YELLOW, criteria={"solidCyan": 3},
         paper="corrected"),
    # Criteria on request.
    case("tone values without a solid", "incomplete", WEDGE[:1] + WEDGE[2:], GOOD[:1] + GOOD[2:],
         criteria={"toneCyan": 3}),
    case("tone values", "failed", WEDGE, moved(GOOD, -9, 0, 0, only=(55, 0, 0, 0)),
         criteria={"toneCyan": 3}),
    case("ramps", "failed", WEDGE, moved(GOOD, -9, 0, 0, only=(55, 0, 0, 0)),
         criteria={"rampLightness": 3}),
    case("a mean of readings with a limit for their average", "incomplete", WEDGE,
         moved(WEDGE, 1, 0, 0) + moved(WEDGE, -1, 0, 0), "spreadUnjudged",
         {**AVERAGE, "repeatAverage": 2}, repeats="mean"),
    # More than four inks.
    case("seven inks against themselves", "passed", Side(with_inks(WEDGE, 7, *SPOTS), space="nCLR"),
         Side(with_inks(WEDGE, 7, *SPOTS), space="nCLR"), criteria={**LIMITS, "spotMaximum": 3}),
    case("seven inks, the sixth bad", "failed", Side(with_inks(WEDGE, 7, *SPOTS), space="nCLR"),
         Side(with_inks(WEDGE, 7, *moved(SPOTS, 0, 0, 4, only=(0, 0, 0, 0, 0, 100, 0))),
              space="nCLR"), criteria={"spotMaximum": 3}),
    case("seven inks against four", "passed", SMALL, Side(with_inks(SMALL, 7), space="nCLR"),
         criteria=NO_GREYS),
]


# Comparing ---------------------------------------------------------------------------------------

class Program:
    def __init__(self, tintgate, folder):
        self.tintgate, self.folder = tintgate, pathlib.Path(folder)
        self.folder.mkdir(parents=True, exist_ok=True)
        self.validator = jsonschema.Draft202012Validator(SCHEMA)

    def result(self, sides, preset):
        """The result of one run, checked against the schema."""
        paths = []
        for i, side in enumerate(sides):
            if side is not None:
                paths.append(self.folder / f"{i}.txt")
                paths[-1].write_text(text_of(side))
        tolerance, output = self.folder / "preset.xml", self.folder / "output.json"
        tolerance.write_text(preset_of(preset))
        output.unlink(missing_ok=True)
        subprocess.run([self.tintgate, *paths[:2], tolerance, output, *paths[2:]], check=True)
        result = json.loads(output.read_text(encoding="ascii"))
        self.validator.validate(result)
        return result


def labels_of(side, row):
    return [side.chart[row].get(key, "") for key in ("id", "name")]


def check(result, model, sides):
    """Everything that the model knows of a result."""
    target, measurement, patch_set = sides
    # Weights of ASTM E308 add up to the diffuser within so much of Lab.
    tolerance = 1e-3 if target.calculated or measurement.calculated else 2e-6

    def near(a, b, what):
        assert (a is None) == (b is None) and (a is None or abs(a - b) <= tolerance), \
            f"{what}: program {a}, model {b}"
    assert result["verdict"] == model.verdict, (result["verdict"], model.verdict)
    codes = sorted(w["code"] for w in result["warnings"] if w["code"] != "readerNote")
    assert codes == sorted(model.codes), (codes, model.codes)
    assert any(w["keepsOpen"] for w in result["warnings"]) == model.open
    assert len(result["patches"]) == len(model.patches)
    assert result["pairing"]["unpairedTarget"] == model.lost_target
    near(result["repeats"]["largestDistance"], model.spread, "spread")
    if model.spread is not None:
        counts = result["repeats"]["patches"], result["repeats"]["readings"]
        assert counts == (model.repeated, model.readings)
    for row, (selected, _, measured), pair in zip(result["patches"], model.patches, model.pairs):
        assert row[:2] == labels_of(patch_set or target, selected), (row, selected)
        on_sheet = row[6:] or row[:2]
        assert on_sheet == labels_of(measurement, measured), (row, measured)
        for stated_lab, expected in zip(row[3:5], pair):
            for a, b in zip(stated_lab, expected):
                near(a, b, f"Lab of {row[:3]}")
    names = {criterion["name"]: criterion for criterion in result["criteria"]}
    assert set(names) == set(model.values)
    for name, criterion in names.items():
        near(criterion["value"], model.values[name], name)
    check_measures(result, model, near)


def check_measures(result, model, near):
    """The parts of a result that criteria on request bring along."""
    if "papers" in result:
        for i, side in enumerate(("target", "measured")):
            paper = result["papers"][side]
            assert (paper is None) == (model.papers is None)
            for a, b in zip(paper or [], model.papers[i] if model.papers else []):
                near(a, b, f"paper of the {side}")
    tones = result.get("tones", {"inks": []})
    parts = [(tones, "tones"), (result.get("spotTones", {"inks": []}), "spots")]
    for stated, attribute in parts:
        for ink in stated["inks"]:
            expected = getattr(model.tone_values, attribute)[ink["channel"]]
            assert [step[0] for step in ink["steps"]] == list(expected), (ink, expected)
            for nominal, measured, aim, _, _ in ink["steps"]:
                near(measured, expected[nominal][0], f"tone value at {nominal}")
                near(aim, expected[nominal][1], f"aim at {nominal}")
    if any(ink["steps"] for ink in tones["inks"]):
        assert (tones["method"] == "density") == model.tone_values.by_density
    if "each" in result["repeats"]:
        each = result["repeats"]["each"]
        assert len(each) == model.repeated and sum(one[1] for one in each) == model.readings
        near(max((one[3] for one in each), default=None), model.spread, "spread of each")


def run_cases(program):
    seen = set()
    for c in CASES:
        try:
            sides, preset = c["sides"], c["preset"]
            result = program.result(sides, preset)
            assert result["verdict"] == c["verdict"], result["verdict"]
            codes = [warning["code"] for warning in result["warnings"]]
            assert sorted(code for code in codes if code != "readerNote") == c["codes"], codes
            if "deviceValuesIgnored" in c["codes"]:  # as the program says, so the model is told
                sides = [Side(without(side.chart, "device")) if side is sides[1] else side
                         for side in sides]
            model = Model(*sides, preset)
            model.codes += [code for code in c["codes"] if code == "deviceValuesIgnored"]
            check(result, model, sides)
            seen.update(codes)
        except AssertionError as fault:
            raise AssertionError(f"case \"{c['what']}\": {fault}") from fault
    return seen


def random_side(dice, devices, space="CMYK"):
    chart = [patch(dice.choice(devices), [dice.uniform(20, 90), dice.uniform(-9, 9),
                                         dice.uniform(-9, 9)])
             for _ in range(dice.randint(3, 14))]
    for p in chart:
        p["lab"] = [round(value, 3) for value in p["lab"]]
        p["device"] = [max(0, round(value + dice.choice((0, 0, 0, 0.002, 0.3)), 4)) if value < 100
                       else value for value in p["device"]]
    for kind in dice.sample(("id", "name"), dice.randint(0, 2)):
        pool = dice.choice((NUMBERS + A_TO_L, A_TO_L[:6]))
        chart = labelled(chart, **{kind: [dice.choice(pool) for _ in chart]})
    if dice.random() < 0.3:
        chart = without(chart, "device")
    return Side(chart, condition=dice.choice(("", "", "M0", "M1")), space=space)


def run_random(program, count):
    """Small charts with many repeats, whose figures all have to agree with the model."""
    dice = random.Random(20)
    devices = [p["device"] for p in WEDGE[:4] + WEDGE[7:9]] + [[100, 100, 0, 0], [0, 0, 0, 40]]
    compared = 0
    while compared < count:
        sides = [random_side(dice, devices), random_side(dice, devices), None]
        if dice.random() < 0.2:
            sides[2] = random_side(dice, devices)
            if not sides[2].has("device"):
                continue
        # Columns of zeros would count as never filled in; sets that share nothing are refused.
        if any(side and side.has("device") and len({tuple(p["device"]) for p in side.chart}) == 1
               for side in sides):
            continue
        preset = {"criteria": {name: dice.choice((20, 60)) for name in dice.sample(
                      sorted(CRITERIA), 2)},
                  "formula": dice.choice(("CIE76", "CIE2000")),
                  "repeats": dice.choice(("each", "mean")), "condition": dice.choice((-1, 0, 1)),
                  "required": dice.random() < 0.3, "minimumGreys": dice.choice((1, 2, 5))}
        model = Model(*sides, preset)
        if not model.patches:
            continue
        result = program.result(sides, preset)
        try:
            check(result, model, sides)
        except AssertionError as fault:
            raise AssertionError(f"random pair {compared}, files in {program.folder}: {fault}") \
                from fault
        compared += 1


def run_worked(program):
    """Figures that were worked out elsewhere, mostly from published sets."""
    def values(sides, expect, **preset):
        preset["criteria"] = {name: 50 for name in expect}
        result = program.result([*map(Side, sides), None], preset)
        found = {criterion["name"]: criterion["value"] for criterion in result["criteria"]}
        for name, (value, within) in expect.items():
            assert abs(found[name] - value) <= within, (name, found[name], value)
        return result

    def labs_are(result, expected, within):
        for row, lab in zip(result["patches"], expected):
            assert all(abs(a - b) <= within for a, b in zip(row[3], lab)), (row, lab)

    # FOGRA39 at 40 percent against tone values of 53 (13 of increase) of its three inks.
    fogra39 = {}
    with open(ROOT / "tests/data/colour/tone-values-fogra39.csv", encoding="ascii") as file:
        for row in csv.DictReader(line for line in file if not line.startswith("#")):
            fogra39[row["ink"], int(row["nominal"])] = xyz_of_lab(
                [float(row[axis]) for axis in "Lab"])
    paper, ours, theirs = fogra39["C", 0], [], []
    for i, ink in enumerate("CMY"):
        solid = fogra39[ink, 100]
        aim = [p + 0.53 * (s - p) for p, s in zip(paper, solid)]
        for tone, target, measured in ((0, paper, paper), (100, solid, solid),
                                       (40, aim, fogra39[ink, 40])):
            device = [tone if i == at else 0 for at in range(4)]
            ours.append(patch(device, lab_of_xyz(target)))
            theirs.append(patch(device, lab_of_xyz(measured)))
    values([ours, theirs], {"toneCyanMiddle": (0.97, 0.006), "toneMagentaMiddle": (0.69, 0.006),
                            "toneYellowMiddle": (0.13, 0.006), "midToneSpread": (1.66, 0.006)})
    values([ours, theirs], {"toneCyan": (1.33, 0.006)}, toneAims="A")  # 53.97 against 55.3

    # CRPC6, its 50/40/40 against the grey of its own paper.
    grey = [patch((0, 0, 0, 0), (95, 1, -4)), patch((50, 40, 40, 0), (57.46, 0.38, -2.03))]
    values([grey, grey], {"greyBalanceMaximum": (math.hypot(0.12, 0.03), 1e-6)}, minimumGreys=1)

    with open(ROOT / "tests/data/analysis/corrected-aims-crpc6.csv", encoding="ascii") as file:
        rows = list(csv.DictReader(line for line in file if not line.startswith("#")))
    aims = [patch([float(row[ink]) for ink in "CMYK"], [float(row[axis]) for axis in "Lab"])
            for row in rows]
    result = values([aims, [{**aims[0], "lab": [93, 0, -1]}, *aims[1:]]], {}, paper="corrected")
    labs_are(result, [[float(row[f"{axis}_corrected"]) for axis in "Lab"] for row in rows], 6e-5)

    fogra = [patch((0, 0, 0, 0), (95, 0, -2)), patch((100, 0, 0, 0), (55, -37, -50)),
             patch((0, 0, 0, 100), (16, 0, 0)), patch((100, 100, 0, 0), (24, 22, -46))]
    result = values([fogra, fogra], {"paperWhite": (0, 0)}, paper="relative")
    labs_are(result, [(100, 0, 0), (58.198, -38.667, -50.389), (17.441, 0, 0.596),
                      (25.802, 22.991, -46.829)], 6e-4)


def random_tones(dice, devices, most):
    """Most patches that tone values are made of, some of them twice, in random colours."""
    chosen = dice.sample(devices, len(devices) * 6 // 7)
    chosen += dice.sample(chosen, dice.randint(0, 3))
    dice.shuffle(chosen)
    chart = [patch(device, [round(dice.uniform(5 if any(device) else 80, most), 2), round(dice.uniform(-60, 60), 2),
                            round(dice.uniform(-60, 60), 2)]) for device in chosen]
    if dice.random() < 0.5:
        for p in chart:
            p["spectrum"] = [round(dice.uniform(0.01, 1), 4) for _ in range(36)]
    return Side(chart)


def run_random_tones(program, count):
    """Criteria that are answered on request, under all options."""
    dice = random.Random(23)
    inks = 6
    levels = (3, 10, 30, 40, 50, 70, 75, 80, 90, 100)
    devices = [[0] * inks, [100] * 4 + [0, 0], [30, 30, 0, 0, 0, 0]]
    devices += [[level if i == ink else 0 for i in range(inks)]
                for ink in range(inks) for level in levels]
    devices += [[*grey, 0, 0, 0] for grey in BALANCED]
    answered = set()
    for turn in range(count):
        curves = turn % 2 == 0
        pool = [d for d in devices if not curves or all(v % 10 == 0 for v in d[:3])
                and all(v % 10 == 0 for v in d[3:])]  # the model's curves are known at tens
        sides = [random_tones(dice, pool, 95), random_tones(dice, pool, 95), None]
        preset = {"criteria": {name: 20 for name in dice.sample(REQUESTED, 20) + ["paperWhite"]},
                  "formula": dice.choice(("CIE76", "CIE2000")),
                  "repeats": dice.choice(("each", "mean")), "minimumGreys": dice.choice((1, 5)),
                  "paper": dice.choice(("absolute", "corrected", "relative")),
                  "spotToneAims": dice.choice(("nominal", "target")),
                  "greyWeights": dice.choice(("equal", "falling"))}
        if curves:
            preset["toneAims"] = dice.choice("ABC")
            preset["toneAimsBlack"] = dice.choice(("A", "B", "C", "target"))
        model = Model(*sides, preset)
        result = program.result(sides, preset)
        try:
            check(result, model, sides)
        except AssertionError as fault:
            raise AssertionError(f"random tones {turn}, files in {program.folder}: {fault}") \
                from fault
        answered |= {name for name, value in model.values.items() if value is not None}
    assert answered >= set(REQUESTED), set(REQUESTED) - answered


def main(tintgate, folder):
    program = Program(tintgate, folder)
    seen = run_cases(program)
    run_random(program, 150)
    run_worked(program)
    run_random_tones(program, 40)
    listed = set(re.findall(r"^\| `(\w+)`", (ROOT / "docs/result.md").read_text().split(
        "## Warning codes")[1].split("\n# ")[0], re.MULTILINE))
    assert seen - listed == set(), f"codes that docs/result.md does not list: {seen - listed}"
    assert listed - seen - ELSEWHERE - {"readerNote"} == set(), f"codes without a case: {listed - seen}"


if __name__ == "__main__":
    main(*sys.argv[1:])
