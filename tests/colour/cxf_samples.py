#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Writes one measurement as CGATS text and as CxF3, in several forms.

cxf_samples.py CHARACTERISATION.ti3 FOLDER

The CxF files follow the schema of CxF3 (CxF3_Core.xsd). The texts have the same numbers, digit by
digit. Spectra and spot colours are derived from the process inks, because no free set has them.
"""

import math
import sys
from pathlib import Path
from xml.sax.saxutils import escape, quoteattr

NAMESPACE = "http://colorexchangeformat.com/CxF3-core"
CMYK = ("CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K")
INKS = ("Cyan", "Magenta", "Yellow", "Black")
LAB = ("LAB_L", "LAB_A", "LAB_B")
XYZ = ("XYZ_X", "XYZ_Y", "XYZ_Z")
BANDS = range(380, 731, 10)


def read(path):
    """Rows of a simple CGATS text as dictionaries of the cells' texts."""
    text = Path(path).read_text(encoding="latin-1")
    names = text.split("BEGIN_DATA_FORMAT")[1].split("END_DATA_FORMAT")[0].split()
    body = text.split("BEGIN_DATA\n")[1].split("END_DATA")[0]
    return [dict(zip(names, line.split())) for line in body.strip().splitlines()]


def with_spectra(row):
    inks = [float(row[name]) / 100 for name in CMYK]
    for band in BANDS:
        value = 0.85
        for ink, centre in zip(inks, (640, 540, 440, 550)):
            width = 60 if ink is not inks[3] else 400
            value *= 1 - 0.93 * ink * math.exp(-(((band - centre) / width) ** 2))
        row[f"SPEC_{band}"] = f"{value:.6f}"


def with_spots(row):
    row["SPOT_Orange"] = f"{float(row['CMYK_M']) / 2:g}"
    row["SPOT_Green"] = f"{float(row['CMYK_C']) / 4:g}"


def write_text(path, rows, columns, header=""):
    lines = ["CGATS.17", header + f"NUMBER_OF_FIELDS {1 + len(columns)}", "BEGIN_DATA_FORMAT",
             "SAMPLE_ID " + " ".join(columns), "END_DATA_FORMAT", f"NUMBER_OF_SETS {len(rows)}",
             "BEGIN_DATA"]
    lines += [row["SAMPLE_ID"] + " " + " ".join(row[name] for name in columns) for row in rows]
    path.write_text("\n".join(lines) + "\nEND_DATA\n", encoding="utf-8")


def element(name, content, **attributes):
    words = "".join(f" {key}={quoteattr(value)}" for key, value in attributes.items())
    return f"<cc:{name}{words}>{content}</cc:{name}>"


def device(row, spots):
    amounts = "".join(element(ink, row[name]) for ink, name in zip(INKS, CMYK))
    for name in spots:
        amounts += element("SpotColor", element("Name", escape(name.removeprefix("SPOT_"))) +
                           element("Percentage", row[name]))
    kind = "ColorCMYKPlusN" if spots else "ColorCMYK"
    return element("DeviceColorValues", element(kind, amounts, ColorSpecification="press"))


def colours(row, columns, conditions):
    values = ""
    if LAB[0] in columns:
        values += element("ColorCIELab",
                          "".join(element(part, row[name]) for part, name in zip("LAB", LAB)),
                          ColorSpecification=conditions)
    if XYZ[0] in columns:
        values += element("ColorCIEXYZ",
                          "".join(element(part, row[name]) for part, name in zip("XYZ", XYZ)),
                          ColorSpecification=conditions)
    spectrum = [row[name] for name in columns if name.startswith("SPEC_")]
    if spectrum:
        values += element("ReflectanceSpectrum", " ".join(spectrum), StartWL="380",
                          ColorSpecification=conditions)
    return element("ColorValues", values)


def measured_under(name, condition, illumination):
    measurement = (element("MeasurementType", "Spectrum_Reflectance") +
                   '<cc:WavelengthRange StartWL="380" Increment="10"/>' +
                   element("Device", element("Model", "Bench 3") +
                           element("DeviceIllumination", illumination)))
    tristimulus = element("Illuminant", "D50") + element("Observer", "2_Degree")
    return element("ColorSpecification",
                   element("TristimulusSpec", tristimulus) +
                   element("MeasurementSpec", measurement), Id=name) if condition else \
        element("ColorSpecification", element("TristimulusSpec", tristimulus), Id=name)


def write_cxf(path, objects, prefix="cc"):
    all_conditions = (measured_under("m1", True, "M1_Daylight") +
                      measured_under("m2", True, "M2_UVExcluded") +
                      measured_under("press", False, ""))
    body = element("FileInformation", element("Creator", "cxf_samples")) + \
        element("Resources", element("ObjectCollection", "\n".join(objects)) +
                element("ColorSpecificationCollection", all_conditions))
    text = f'<?xml version="1.0" encoding="UTF-8"?>\n<cc:CxF xmlns:cc="{NAMESPACE}">{body}</cc:CxF>\n'
    if prefix != "cc":
        text = text.replace("xmlns:cc", f"xmlns:{prefix}" if prefix else "xmlns")
        text = text.replace("<cc:", f"<{prefix}:" if prefix else "<")
        text = text.replace("</cc:", f"</{prefix}:" if prefix else "</")
    path.write_text(text, encoding="utf-8")


def whole_objects(rows, columns, spots=()):
    """Device values and colours in one object."""
    return [element("Object", colours(row, columns, "m1") + device(row, spots),
                    ObjectType="Color", Name="", Id=row["SAMPLE_ID"]) for row in rows]


def location(row):
    number = int(row["SAMPLE_ID"]) - 1
    place = {"Page": 1, "Row": number % 20, "Column": number // 20, "SampleID": -1}
    return element("TagCollection",
                   "".join(f'<cc:Tag Name="{name}" Value="{value}"/>'
                           for name, value in place.items()), Name="Location")


def parted_objects(rows, columns):
    """As exported by a chart reader: measurements first, in another order, under two conditions,
    with only the position on the sheet in common with their targets.
    """
    darker = []
    for row in rows:
        darker.append(dict(row))
        for name in columns:
            if name.startswith("SPEC_"):
                darker[-1][name] = f"{float(row[name]) * 0.9:.6f}"
    measured = []
    for number, row in enumerate(reversed(rows)):
        measured.append(element("Object", colours(row, columns, "m1") + location(row),
                                ObjectType="M1_Measurement", Name=f"M1_{number}", Id=f"c{number}"))
    for number, row in enumerate(darker):
        measured.append(element("Object", colours(row, columns, "m2") + location(row),
                                ObjectType="M2_Measurement", Name=f"M2_{number}", Id=f"d{number}"))
    targets = [element("Object", device(row, ()) + location(row), ObjectType="Target",
                       Name="", Id=row["SAMPLE_ID"]) for row in rows]
    return measured + targets


def main():
    source, folder = sys.argv[1], Path(sys.argv[2])
    rows = read(source)
    for row in rows:
        with_spectra(row)
        with_spots(row)
    spectrum = tuple(f"SPEC_{band}" for band in BANDS)
    spots = ("SPOT_Orange", "SPOT_Green")
    header = 'KEYWORD "MEASUREMENT_CONDITION"\nMEASUREMENT_CONDITION "M1"\n'
    forms = {"cmyk": CMYK + XYZ + LAB, "spots": CMYK + spots + LAB, "spectra": CMYK + spectrum,
             "lab": CMYK + LAB, "labels": LAB}
    for name, columns in forms.items():
        write_text(folder / f"{name}.txt", rows, columns, header)
    write_cxf(folder / "cmyk.cxf", whole_objects(rows, forms["cmyk"]))
    write_cxf(folder / "spots.cxf", whole_objects(rows, forms["spots"], spots), "ns0")
    write_cxf(folder / "lab.cxf", whole_objects(rows, forms["lab"]), "")
    write_cxf(folder / "spectra.cxf", parted_objects(rows, spectrum))
    write_cxf(folder / "labels.cxf",
              [element("Object", colours(row, LAB, "m1"), ObjectType="Standard", Name="",
                       Id=row["SAMPLE_ID"]) for row in rows])


if __name__ == "__main__":
    main()
