# SPDX-License-Identifier: Apache-2.0
"""Tone values, grey balance, ramps and paper in the plainest way, for verdict_model.py: formulas of
docs/criteria.md by themselves, without regard to time, and nothing taken from the program.
"""

import csv
import math
import pathlib

DATA = pathlib.Path(__file__).parents[1] / "data"
BALANCED = [(3.1, 2.2, 2.2), (10.2, 7.4, 7.4), (25, 19, 19), (50, 40, 40), (75, 66, 66),
            (3, 2.24, 2.24), (10, 7.46, 7.46), (25, 18.88, 18.88), (75, 66.12, 66.12),
            (90, 85.34, 85.34)]
INKS = ("Cyan", "Magenta", "Yellow", "Black")
WHITE = (96.42, 100.0, 82.49)
CURVES = {"A": (6.1, 10.5, 13.5, 15.3, 16.0, 15.6, 14.0, 11.0, 6.5),
          "B": (8.3, 13.9, 17.2, 18.8, 19.0, 17.9, 15.7, 12.1, 7.0),
          "C": (10.6, 17.2, 20.9, 22.3, 22.0, 20.4, 17.4, 13.2, 7.5)}  # at 10, 20 .. 90
REQUESTED = ["repeatAverage",
             *(f"tone{ink}{part}" for ink in INKS for part in ("", "Middle", "ThreeQuarters")),
             "midToneSpread", "sctvSpotAverage", "sctvSpotMaximum", "sctvAverage", "sctvMaximum",
             "rampLightness", "greyBalanceAverage", "greyBalanceMaximum", "greyLightnessAverage",
             "greyLightnessMaximum", "blackLightnessAverage", "blackLightnessMaximum"]


def status_e():
    with open(DATA / "colour/density-status-e.csv", encoding="ascii") as file:
        rows = list(csv.DictReader(line for line in file if not line.startswith("#")))
    return {int(row["nm"]): [float(row[ink]) for ink in ("red", "green", "blue", "visual")]
            for row in rows}


STATUS_E = status_e()


def near(value, wanted):
    return abs(value - wanted) <= 0.5


def f(t):
    return t ** (1 / 3) if t > 216 / 24389 else (24389 / 27 * t + 16) / 116


def lightnesses(xyz):
    return [116 * f(value / white) - 16 for value, white in zip(xyz, WHITE)]


def sctv(paper, solid, tint):
    """ISO 20654, from XYZ."""
    p, s, t = map(lightnesses, (paper, solid, tint))
    whole = sum((a - b) ** 2 for a, b in zip(s, p))
    return 100 * math.sqrt(sum((a - b) ** 2 for a, b in zip(t, p)) / whole) if whole else None


def density(spectra, ink):
    """Of the mean of several spectra, 380 nm and on by 10 nm."""
    weights = [STATUS_E[380 + 10 * i][ink] for i in range(len(spectra[0]))]
    mean = [sum(values) / len(spectra) for values in zip(*spectra)]
    return -math.log10(sum(r * w for r, w in zip(mean, weights)) / sum(weights))


def murray_davies(paper, solid, tint):
    return 100 * (1 - 10 ** -(tint - paper)) / (1 - 10 ** -(solid - paper))


def colorimetric(ink, paper, solid, tint):
    def light(xyz):
        return (xyz[0] - 0.55 * xyz[2], xyz[1], xyz[2], xyz[1])[ink]
    whole = light(paper) - light(solid)
    return 100 * (light(paper) - light(tint)) / whole if whole else None


def substrate_corrected(xyz, paper, new_paper, darkest):
    return [(x - low) * (new - low) / (old - low) + low if old - low > 1e-6 else x
            for x, old, new, low in zip(xyz, paper, new_paper, darkest)]


def relative(xyz, paper):
    return [x * white / p for x, white, p in zip(xyz, WHITE, paper)]


def weight(tone, preset):
    return 1 - 0.75 * max(0, (tone - 50) / 50) if preset.get("greyWeights") == "falling" else 1


class Ramps:
    """Readings of a comparison by ink and tint. A reading is (device, target row, measured row)."""

    def __init__(self, readings):
        self.papers, self.solids, self.tints = [], {}, {}
        for reading in readings:
            inked = [i for i, value in enumerate(reading[0]) if not near(value, 0)]
            if not inked:
                self.papers.append(reading)
            elif len(inked) == 1:
                value = reading[0][inked[0]]
                if value >= 99.5:
                    self.solids.setdefault(inked[0], []).append(reading)
                else:
                    key = math.floor(value * 100 + 0.5)
                    self.tints.setdefault(inked[0], {}).setdefault(key, []).append(reading)


class ToneValues:
    """Measured tone values and aims: {ink: {nominal: (measured, aim)}}."""

    def __init__(self, readings, target, measurement, preset, xyz_of_lab):
        self.ramps, self.xyz_of_lab = Ramps(readings), xyz_of_lab
        sides = {1: target, 2: measurement}
        curves = [preset.get("toneAims", "target")] * 3
        curves.append(preset.get("toneAimsBlack", curves[0]))
        needed = [measurement] + ([target] if "target" in curves else [])
        self.by_density = all(side.has("spectrum") for side in needed)
        self.tones, self.spots = {}, {}
        inks = len(readings[0][0]) if readings else 4
        for ink in range(inks):
            tints = self.ramps.tints.get(ink, {})
            if not self.ramps.papers or ink not in self.ramps.solids:
                tints = {}
            if ink < 4:
                self.tones[ink] = {}
            self.spots[ink] = {}
            for key, tint in sorted(tints.items()):
                nominal = key / 100
                parts = (self.ramps.papers, self.ramps.solids[ink], tint)
                if ink < 4:
                    measured = self.tone(ink, 2, measurement, parts)
                    aim = self.tone(ink, 1, target, parts) if curves[ink] == "target" \
                        else nominal + CURVES[curves[ink]][round(nominal / 10) - 1]
                    if measured is not None and aim is not None:
                        self.tones[ink][nominal] = measured, aim
                spot = [sctv(*(self.mean_xyz(side, sides[side], part) for part in parts))
                        for side in (1, 2)]
                aim = spot[0] if preset.get("spotToneAims") == "target" else nominal
                if spot[1] is not None and aim is not None:
                    self.spots[ink][nominal] = spot[1], aim

    def mean_xyz(self, side, chart, readings):
        rows = {reading[side] for reading in readings}
        return [sum(parts) / len(rows) for parts in
                zip(*(self.xyz_of_lab(chart.lab(row)) for row in rows))]

    def tone(self, ink, side, chart, parts):
        if self.by_density:
            return murray_davies(*(density([chart.chart[row]["spectrum"] for row in
                                            {reading[side] for reading in part}], ink)
                                   for part in parts))
        return colorimetric(ink, *(self.mean_xyz(side, chart, part) for part in parts))

    def spreads(self):
        found = {}
        for nominal in (40, 50):
            steps = [[m - a for at, (m, a) in self.tones[ink].items() if near(at, nominal)]
                     for ink in range(3)]
            if all(steps):
                found[nominal] = max(s[0] for s in steps) - min(s[0] for s in steps)
        return found


TONE_RANGES = {"": lambda at: True, "Middle": lambda at: near(at, 40) or near(at, 50),
               "ThreeQuarters": lambda at: 69.5 <= at <= 80.5}


def value_of(name, model, preset):
    """Of a criterion that is answered on request; None without an answer."""
    def of(deviations, mean):
        if not deviations:
            return None
        return sum(deviations) / len(deviations) if mean else max(deviations)
    if name == "repeatAverage":
        return of(model.distances, True)
    if not model.is_cmyk:
        return None
    if name == "midToneSpread":
        return max(model.tone_values.spreads().values(), default=None)
    for ink, word in enumerate(INKS):
        if name.startswith(f"tone{word}"):
            chosen = TONE_RANGES[name.removeprefix(f"tone{word}")]
            return of([abs(m - a) for at, (m, a) in model.tone_values.tones[ink].items()
                       if chosen(at)], False)
    if name.startswith("sctv"):
        return of([abs(m - a) for ink, steps in model.tone_values.spots.items()
                   if "Spot" not in name or ink > 3 for m, a in steps.values()],
                  name.endswith("Average"))
    single = [(i, [ink for ink, value in enumerate(device) if not near(value, 0)])
              for i, device in enumerate(model.device)]
    single = [(i, inks[0]) for i, inks in single if len(inks) == 1]

    def lightness(i):
        return abs(model.pairs[i][0][0] - model.pairs[i][1][0])
    if name == "rampLightness":
        return of([lightness(i) for i, ink in single if 29.5 <= model.device[i][ink] <= 70.5],
                  False)
    if name.startswith("black"):
        return of([lightness(i) * weight(model.device[i][3], preset) for i, ink in single
                   if ink == 3 and model.device[i][3] < 99.5], name.endswith("Average"))
    greys = [i for i, device in enumerate(model.device)
             if all(near(value, 0) for value in device[3:])
             and any(all(map(near, device, grey)) for grey in BALANCED)]
    if len({model.group[i] for i in greys}) < preset.get("minimumGreys", 5):
        return None
    if name.startswith("greyLightness"):
        return of([lightness(i) * weight(model.device[i][0], preset) for i in greys],
                  name.endswith("Average"))
    if model.papers is None:
        return None
    paper, figures = model.papers[1], []
    for i in greys:
        cyan = model.device[i][0]
        aim = [value * (1 - cyan / 100) for value in paper[1:]]
        figures.append(math.dist(model.measured_as_is[i][1:], aim) * weight(cyan, preset))
    return of(figures, name.endswith("Average"))
