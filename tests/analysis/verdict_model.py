# SPDX-License-Identifier: Apache-2.0
"""What a verdict must be, worked out in the plainest way: every rule of docs/criteria.md and
docs/result.md by itself, without regard to time, and nothing taken from the program.

A chart is a list of patches: dicts with `device` (percent), `lab`, `id`, `name`, each of which may
be absent, and `grey`, the reflectance of a flat spectrum. A Side is a chart with its header.
"""

import csv
import math
import pathlib

import measure_model
from measure_model import REQUESTED

HERE = pathlib.Path(__file__).parent
WHITE = (96.42, 100.0, 82.49)  # of the ICC profile connection space, which Lab is relative to
DIFFUSER = (96.422, 100.0, 82.521)  # D50, 2 degrees, after ASTM E308
GREYS = [
    (10, 6, 6), (20, 12, 12), (40, 27, 27), (60, 45, 45), (80, 65, 65), (100, 85, 85),
    (3.1, 2.2, 2.2), (10.2, 7.4, 7.4), (25, 19, 19), (50, 40, 40), (75, 66, 66),
    (3, 2.24, 2.24), (10, 7.46, 7.46), (25, 18.88, 18.88), (75, 66.12, 66.12), (90, 85.34, 85.34),
]


def outer_gamut_list():
    with open(HERE.parent / "data/analysis/outer-gamut-226.csv", encoding="ascii") as file:
        rows = csv.DictReader(line for line in file if not line.startswith("#"))
        return [tuple(float(row[ink]) for ink in "CMYK") for row in rows]


OUTER_GAMUT = outer_gamut_list()


class Side:
    def __init__(self, chart, illuminant="", observer="", condition="", space="CMYK"):
        self.chart, self.columns = chart, space
        self.space = "CMYK" if space == "nCLR" else space  # the first four inks, then spots
        self.illuminant, self.observer, self.condition = illuminant, observer, condition
        self.other_light = (illuminant or "D50", observer or "2") != ("D50", "2")
        self.calculated = self.other_light and all("grey" in patch for patch in chart)

    def has(self, what):
        return all(what in patch for patch in self.chart)

    def lab(self, row):
        patch = self.chart[row]
        if self.calculated:
            return lab_of_xyz([patch["grey"] * part for part in DIFFUSER])
        return patch["lab"]

    def counted(self):
        if self.calculated:
            return "D50", "2"
        return self.illuminant or "D50", self.observer or "2"


# Colour ------------------------------------------------------------------------------------------

def lab_of_xyz(xyz):
    def f(t):
        return t ** (1 / 3) if t > 216 / 24389 else (24389 / 27 * t + 16) / 116
    x, y, z = (f(value / white) for value, white in zip(xyz, WHITE))
    return 116 * y - 16, 500 * (x - y), 200 * (y - z)


def xyz_of_lab(lab):
    def inverse(t):
        return t ** 3 if t ** 3 > 216 / 24389 else (116 * t - 16) * 27 / 24389
    y = (lab[0] + 16) / 116
    return [white * inverse(t)
            for white, t in zip(WHITE, (y + lab[1] / 500, y, y - lab[2] / 200))]


def mean_of(labs):
    if len(labs) == 1:
        return labs[0]
    return lab_of_xyz([sum(part) / len(labs) for part in zip(*map(xyz_of_lab, labs))])


def delta_e00(first, second):
    """Sharma, Wu and Dalal, The CIEDE2000 Color-Difference Formula (2005), in degrees."""
    chroma = (math.hypot(*first[1:]) + math.hypot(*second[1:])) / 2
    stretch = 1.5 - math.sqrt(chroma ** 7 / (chroma ** 7 + 25 ** 7)) / 2
    (l1, c1, h1), (l2, c2, h2) = (
        (L, math.hypot(stretch * a, b), math.degrees(math.atan2(b, stretch * a)) % 360)
        for L, a, b in (first, second))
    turn = h2 - h1
    if c1 * c2 == 0:
        turn = 0
    elif abs(turn) > 180:
        turn -= math.copysign(360, turn)
    mean_l, mean_c = (l1 + l2) / 2, (c1 + c2) / 2
    hue = h1 + h2 if c1 * c2 == 0 else h1 + turn / 2
    t = (1 - 0.17 * math.cos(math.radians(hue - 30)) + 0.24 * math.cos(math.radians(2 * hue))
         + 0.32 * math.cos(math.radians(3 * hue + 6)) - 0.2 * math.cos(math.radians(4 * hue - 63)))
    sl = 1 + 0.015 * (mean_l - 50) ** 2 / math.sqrt(20 + (mean_l - 50) ** 2)
    sc, sh = 1 + 0.045 * mean_c, 1 + 0.015 * mean_c * t
    rt = (-2 * math.sqrt(mean_c ** 7 / (mean_c ** 7 + 25 ** 7))
          * math.sin(math.radians(60 * math.exp(-(((hue % 360 - 275) / 25) ** 2)))))
    dl, dc = (l2 - l1) / sl, (c2 - c1) / sc
    dh = 2 * math.sqrt(c1 * c2) * math.sin(math.radians(turn / 2)) / sh
    return math.sqrt(max(0, dl * dl + dc * dc + dh * dh + rt * dc * dh))


def delta_h(first, second):
    c1, c2 = math.hypot(*first[1:]), math.hypot(*second[1:])
    return math.sqrt(max(0, math.dist(first[1:], second[1:]) ** 2 - (c1 - c2) ** 2))


FORMULAS = {"CIE76": math.dist, "CIE2000": delta_e00}


# Pairing -----------------------------------------------------------------------------------------

def pair_keys(left, right, partner):
    """The first left row still alone goes with the first right row of its key still alone."""
    taken = set(partner.values())
    for row, key in enumerate(left):
        if row in partner:
            continue
        free = [i for i, other in enumerate(right) if other == key and i not in taken]
        if free:
            partner[row] = free[0]
            taken.add(free[0])


def pair_repeats(keys, partner):
    """Partners of the rows without one, from the rows with their key in turn."""
    found, turns = {}, {}
    for row, key in enumerate(keys):
        like = [i for i, other in enumerate(keys) if other == key and i in partner]
        if row not in partner and like:
            found[row] = partner[like[turns.get(key, 0) % len(like)]]
            turns[key] = turns.get(key, 0) + 1
    return found


class Pairing:
    def __init__(self, left, right):
        self.rounded = self.contradicted = 0
        self.spaces_differ = False
        self.partner, self.again = {}, []
        if left.has("device") and right.has("device") and left.space == right.space:
            self.by = "deviceValues"
            self.by_device(left, right)
            return
        self.spaces_differ = left.has("device") and right.has("device")
        self.by = "labels"
        self.by_labels(left, right)
        if not self.partner:
            self.by = "order"
            labelled = [side.has("id") or side.has("name") for side in (left, right)]
            if len(left.chart) == len(right.chart) or not all(labelled):
                count = min(len(left.chart), len(right.chart))
                self.partner = {row: row for row in range(count)}

    def repeats(self, left, right):
        inverse = {}
        for row, other in sorted(self.partner.items()):
            inverse.setdefault(other, row)
        inverse.update({other: row for row, other in self.again})
        self.again += sorted(((row, other) for other, row in pair_repeats(right, inverse).items()),
                             key=lambda pair: pair[1])
        self.partner.update(pair_repeats(left, self.partner))

    def by_device(self, left, right):
        width = max(len(side.chart[0]["device"]) for side in (left, right))

        def keys(side, per_percent):
            return [tuple(math.floor(value * per_percent + 0.5) for value in patch["device"])
                    + (0,) * (width - len(patch["device"])) for patch in side.chart]
        for scale in (10000, 100, 1):
            before = len(self.partner)
            pair_keys(keys(left, scale), keys(right, scale), self.partner)
            if scale == 1:
                self.rounded = len(self.partner) - before
        for scale in (10000, 100):
            self.repeats(keys(left, scale), keys(right, scale))

    def by_labels(self, left, right):
        best = None
        for first, second in (("id", "id"), ("name", "name"), ("id", "name"), ("name", "id")):
            if not left.has(first) or not right.has(second):
                continue
            keys = [[patch[kind] for patch in side.chart]
                    for side, kind in ((left, first), (right, second))]
            partner = {}
            pair_keys(*keys, partner)
            telling = all(10 * len(set(labels)) >= 9 * len(labels) for labels in keys)
            named = (first, second) == ("name", "name") and telling
            if best is None or len(partner) > len(best[0]) \
                    or (named and len(partner) == len(best[0])):
                best = partner, keys, (first, second)
        if best is None or not best[0]:
            return
        self.partner, keys, kinds = dict(best[0]), best[1], best[2]
        other = {"id": "name", "name": "id"}[kinds[0]]
        if kinds[0] == kinds[1] and left.has(other) and right.has(other):
            labels = [[patch[other] for patch in side.chart] for side in (left, right)]
            elsewhere = {}
            pair_keys(*labels, elsewhere)
            self.contradicted = sum(row in elsewhere and labels[0][row] != labels[1][at]
                                    for row, at in self.partner.items())
        self.repeats(*keys)


# Judgement ---------------------------------------------------------------------------------------

def near(value, wanted):
    return abs(value - wanted) <= 0.5


def is_kind(kind, device):
    inks = device[:4]
    spots = device[4:]

    def is_inks(*wanted):
        return all(near(value, level) for value, level in zip(inks, wanted))
    if kind == "spots":
        return is_inks(0, 0, 0, 0) and sum(not near(spot, 0) for spot in spots) == 1 \
            and any(near(spot, 100) for spot in spots)
    if not all(near(spot, 0) for spot in spots):
        return False
    solids = {"cyan": (100, 0, 0, 0), "magenta": (0, 100, 0, 0), "yellow": (0, 0, 100, 0),
              "black": (0, 0, 0, 100)}
    overprints = {"red": (0, 100, 100, 0), "green": (100, 0, 100, 0), "blue": (100, 100, 0, 0)}
    if kind in solids | overprints:
        return is_inks(*(solids | overprints)[kind])
    return {
        "all": lambda: True,
        "paper": lambda: is_inks(0, 0, 0, 0),
        "solids": lambda: any(is_inks(*inks) for inks in solids.values()),
        "chromatic": lambda: any(is_inks(*solids[ink]) for ink in ("cyan", "magenta", "yellow")),
        "secondaries": lambda: any(is_inks(*inks) for inks in overprints.values()),
        "greys": lambda: near(inks[3], 0) and any(is_inks(*grey, inks[3]) for grey in GREYS),
        "surface": lambda: near(inks[3], 0) and any(near(value, 0) for value in inks[:3])
        and not is_inks(0, 0, 0, 0),
        "outer": lambda: any(is_inks(*entry) for entry in OUTER_GAMUT),
    }[kind]()


CRITERIA = {  # name: patches, quantity, statistic
    "average": ("all", "dE", "mean"), "maximum": ("all", "dE", "max"),
    "percentile95": ("all", "dE", "95"), "paperWhite": ("paper", "dE", "max"),
    "solidMaximum": ("solids", "dE", "max"), "solidCyan": ("cyan", "dE", "max"),
    "solidMagenta": ("magenta", "dE", "max"), "solidYellow": ("yellow", "dE", "max"),
    "solidBlack": ("black", "dE", "max"), "solidHueMaximum": ("chromatic", "dH", "max"),
    "greyMaximum": ("greys", "dCh", "max"), "greyAverage": ("greys", "dCh", "mean"),
    "secondaryMaximum": ("secondaries", "dE", "max"), "secondaryRed": ("red", "dE", "max"),
    "secondaryGreen": ("green", "dE", "max"), "secondaryBlue": ("blue", "dE", "max"),
    "spotAverage": ("spots", "dE", "mean"), "spotMaximum": ("spots", "dE", "max"),
    "outerGamutAverage": ("outer", "dE", "mean"), "outerGamutMaximum": ("outer", "dE", "max"),
    "greyHueAverage": ("greys", "dH", "mean"), "surfaceGamutAverage": ("surface", "dE", "mean"),
    "repeatSpread": ("repeats", "dE", "max"),
}


class Model:
    """`patches`: (selected row, target row, measured row). `values`: by criterion, None without an
    answer. `codes`: the warnings, in no order, without those of the reader."""

    def __init__(self, target, measurement, patch_set, preset):
        self.codes = []
        self.open = False
        self.pair(target, measurement, patch_set)
        self.warn_of_conditions(target, measurement, preset)
        self.compare(target, measurement, preset)
        self.judge(preset)

    def warn(self, code, keeps_open=False):
        self.codes.append(code)
        self.open = self.open or keeps_open

    def pair(self, target, measurement, patch_set):
        selection = patch_set or target
        rows = []  # by side: for each selected row the rows of the side
        for side in (target, measurement):
            if side is selection:
                rows.append([[row] for row in range(len(side.chart))])
                continue
            pairing = Pairing(selection, side)
            if pairing.spaces_differ:
                self.warn("deviceSpacesDiffer", True)
            if pairing.by == "order":
                self.warn("pairedByOrder", True)
            if pairing.by == "labels" and (pairing.spaces_differ or pairing.contradicted):
                self.warn("pairedByLabels")
            if pairing.rounded:
                self.warn("pairedByRoundedValues")
            rows.append([[pairing.partner[row]] if row in pairing.partner else []
                         for row in range(len(selection.chart))])
            for row, other in pairing.again:
                rows[-1][row].append(other)
        self.patches, further, lost = [], [], 0
        for row, (ours, theirs) in enumerate(zip(*rows)):
            lost += not ours or not theirs
            for turn in range(max(len(ours), len(theirs)) if ours and theirs else 0):
                place = self.patches if turn == 0 else further
                place.append((row, ours[turn % len(ours)], theirs[turn % len(theirs)]))
        self.patches += further
        self.lost_target = 0 if patch_set else lost
        seen = {row for rows_of_one in rows[1] for row in rows_of_one}
        if (patch_set and lost) or (not patch_set and len(seen) < len(measurement.chart)):
            self.warn("patchesUnpaired")
        devices = [side for side in (selection, target, measurement) if side.has("device")]
        devices = [side for side in devices if side.space == "CMYK"] or devices
        place = {id(selection): 0, id(target): 1, id(measurement): 2}
        self.device = [devices[0].chart[patch[place[id(devices[0])]]]["device"]
                       for patch in self.patches] if devices else None
        self.is_cmyk = bool(devices) and devices[0].space == "CMYK"

    def warn_of_conditions(self, target, measurement, preset):
        for side in (target, measurement):
            if side.calculated:
                self.warn("calculatedFromSpectra")
            elif side.other_light:
                self.warn("otherLightOrObserver")
        for i, code in enumerate(("illuminantsDiffer", "observersDiffer")):
            if target.counted()[i] != measurement.counted()[i]:
                self.warn(code, True)
        required = preset.get("required", False)
        stated = [side.condition for side in (target, measurement)]
        if all(stated) and stated[0] != stated[1]:
            self.warn("measurementConditionsDiffer", required)
        if 0 <= preset.get("condition", -1) <= 3:
            asked = f"M{preset['condition']}"
            for condition in stated:
                if condition and condition != asked:
                    self.warn("presetConditionDiffers", required)
            if required and not stated[1]:
                self.warn("measurementConditionUnknown", True)

    def compare(self, target, measurement, preset):
        formula = FORMULAS[preset.get("formula", "CIE76")]
        keys = [tuple(device) for device in self.device] if self.device \
            else [patch[0] for patch in self.patches]
        groups = {}
        for index, key in enumerate(keys):
            groups.setdefault(key, []).append(index)
        self.spread, self.readings, self.repeated = None, 0, 0
        self.distances = []
        for members in groups.values():
            readings = sorted({self.patches[i][2] for i in members})
            if len(readings) > 1:
                labs = [measurement.lab(row) for row in readings]
                distances = [formula(mean_of(labs), lab) for lab in labs]
                self.distances += distances
                self.spread = max(self.spread or 0, *distances)
                self.readings += len(readings)
                self.repeated += 1
        self.pairs = [(target.lab(t), measurement.lab(m)) for _, t, m in self.patches]
        self.group = keys
        if self.is_cmyk:
            readings = [(device, *patch[1:])
                        for device, patch in zip(self.device, self.patches)]
            self.tone_values = measure_model.ToneValues(readings, target, measurement, preset,
                                                        xyz_of_lab)
        if preset.get("repeats") == "mean":
            self.pairs = []
            for members in groups.values():
                rows = [sorted({self.patches[i][side] for i in members}) for side in (1, 2)]
                self.pairs.append((mean_of([target.lab(row) for row in rows[0]]),
                                   mean_of([measurement.lab(row) for row in rows[1]])))
            firsts = [members[0] for members in groups.values()]
            self.patches = [self.patches[i] for i in firsts]
            self.device = [self.device[i] for i in firsts] if self.device else None
            self.group = list(groups)
        self.adjust(target, preset, formula)
        self.figures = {"dE": [formula(*pair) for pair in self.pairs],
                        "dH": [delta_h(*pair) for pair in self.pairs],
                        "dCh": [math.dist(a[1:], b[1:]) for a, b in self.pairs]}

    def adjust(self, target, preset, formula):
        """Aims for another paper than the target's."""
        self.measured_as_is = [pair[1] for pair in self.pairs]
        papers = [i for i in range(len(self.pairs))
                  if self.is_cmyk and all(near(value, 0) for value in self.device[i])]
        self.papers = self.paper_difference = None
        if papers:
            self.papers = [mean_of([self.pairs[i][side] for i in papers]) for side in (0, 1)]
        aims = preset.get("paper", "absolute")
        if aims == "absolute":
            return
        if not papers:
            return self.warn("paperUnknown", True)
        self.paper_difference = max(formula(*self.pairs[i]) for i in papers)
        ours, theirs = map(xyz_of_lab, self.papers)
        if aims == "relative":
            self.pairs = [[lab_of_xyz(measure_model.relative(xyz_of_lab(lab), paper))
                           for lab, paper in zip(pair, (ours, theirs))] for pair in self.pairs]
            return
        black = [row for row, patch in enumerate(target.chart) if "device" in patch
                 and target.space == "CMYK" and all(v >= 99.5 for v in patch["device"][:4])
                 and all(near(v, 0) for v in patch["device"][4:])]
        rows = black[:1] or range(len(target.chart))
        darkest = [min(parts) for parts in
                   zip(*(xyz_of_lab(target.lab(row)) for row in rows))]
        self.pairs = [(lab_of_xyz(measure_model.substrate_corrected(
            xyz_of_lab(pair[0]), ours, theirs, darkest)), pair[1]) for pair in self.pairs]
        if delta_e00(*self.papers) > 5:
            self.warn("papersTooDifferent", True)

    def value_of(self, name, preset):
        if name in REQUESTED:
            return measure_model.value_of(name, self, preset)
        if name == "paperWhite" and self.paper_difference is not None:
            return self.paper_difference
        kind, quantity, statistic = CRITERIA[name]
        if name == "repeatSpread":
            return self.spread
        chosen = [i for i in range(len(self.patches)) if kind == "all"
                  or (self.is_cmyk and is_kind(kind, self.device[i]))]
        needed = preset.get("minimumGreys", 5) if kind == "greys" else 1
        if len({self.group[i] for i in chosen}) < needed:
            return None
        figures = sorted(self.figures[quantity][i] for i in chosen)
        return {"mean": sum(figures) / len(figures), "max": figures[-1],
                "95": figures[math.ceil(len(figures) * 95 / 100) - 1]}[statistic]

    def judge(self, preset):
        used = preset["criteria"]
        self.values = {name: self.value_of(name, preset)
                       for name in [*CRITERIA, *(name for name in REQUESTED if name in used)]}
        if not used:
            self.warn("nothingJudged")
        present = {entry for entry in OUTER_GAMUT for device in (self.device or [])
                   if self.is_cmyk and is_kind("outer", device)
                   and all(near(*pair) for pair in zip(device, entry))}
        if any(name.startswith("outerGamut") for name in used) \
                and 0 < len(present) < len(OUTER_GAMUT):
            self.warn("outerGamutIncomplete")
        if preset.get("repeats") == "mean" and self.spread is not None \
                and "repeatSpread" not in used:
            self.warn("spreadUnjudged", True)

        def rounded(value):
            return math.floor(value * 100 + 0.5) / 100
        answers = [(self.values[name], limit) for name, limit in used.items()]
        if any(value is not None and rounded(value) > limit for value, limit in answers):
            self.verdict = "failed"
        elif not used or self.open or any(value is None for value, _ in answers):
            self.verdict = "incomplete"
        else:
            self.verdict = "passed"
