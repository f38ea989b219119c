#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Checks documents of the library: audit.py SCHEMA DOCUMENT...

Each document must be ASCII JSON without NaN or infinity and fit the schema. The figures of a result
that follow from its own rows are calculated again.
"""

import json
import math
import statistics
import sys

import jsonschema


def refuse(word):
    raise ValueError(f"{word} is no JSON")


def near(a, b):
    assert abs(a - b) < 2e-6, (a, b)


def audit_result(result):
    rows = result["patches"]
    differences = sorted(row[5] for row in rows)
    stated = result["statistics"]
    assert stated["count"] == len(rows) == result["pairing"]["paired"]
    near(stated["mean"], statistics.fmean(differences))
    near(stated["median"], statistics.median(differences))
    near(stated["standardDeviation"], statistics.pstdev(differences))
    near(stated["maximum"], differences[-1])
    near(stated["percentile95"], differences[math.ceil(len(rows) * 95 / 100) - 1])
    for _, _, device, target, measured, difference, *labels in rows:
        assert len(labels) in (0, 2)
        assert len(device) == len(result["deviceChannels"])
        if result["formula"]["name"] == "CIE76":
            assert abs(difference - math.dist(target, measured)) < 5e-6
    for criterion in result["criteria"]:
        if criterion["outcome"] in ("pass", "fail"):
            passed = criterion["rounded"] <= criterion["tolerance"]
            assert criterion["outcome"] == ("pass" if passed else "fail"), criterion
        assert criterion["patches"] <= len(rows)
        if criterion["name"] in ("maximum", "solidCyan", "paperWhite") and criterion["patches"]:
            near(rows[criterion["worstPatch"]][5], criterion["value"])
    for side in ("measurement", "patchSet"):
        count = result["pairing"]["unpaired" + side[0].upper() + side[1:]]
        assert count == len(result["unpaired"][side])


def main(schema_path, *paths):
    with open(schema_path, encoding="ascii") as file:
        schema = json.load(file)
    jsonschema.Draft202012Validator.check_schema(schema)
    validator = jsonschema.Draft202012Validator(schema)
    for path in paths:
        with open(path, encoding="ascii") as file:
            text = file.read()
        assert text.endswith("}\n"), path
        document = json.loads(text, parse_constant=refuse)
        validator.validate(document)
        if "patches" in document:
            audit_result(document)
        print(path, "is sound")


main(*sys.argv[1:])
