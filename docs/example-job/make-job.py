#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Makes a complete job for a store: tickets, and the files that they name.

The default job compares a print on super-calendered paper (measured: FOGRA40L) with the printing
condition for coated paper (references: FOGRA39L). Debian's icc-profiles-free contains both data
sets. Options make other jobs, including jobs without a measurement.

  make-job.py FOLDER
  tintgate-store import FOLDER/tickets.json           into an existing store
  tintgate-store file put FOLDER/server /server
"""

import argparse
import json
import math
import shutil
import sys
import xml.etree.ElementTree as xml
from pathlib import Path

HERE = Path(__file__).resolve().parent
ICC = Path("/usr/share/color/icc")
PRESETS = (HERE.parents[1] / "presets", HERE.parents[2] / "tintgate/presets")  # Source, installed.

INSTALL = "/server"  # The server's install folder, as its jobs name it.
TEMP = "/server/temp"
STRIP = "example"
CIEDE2000 = 4
DEVICE = 33  # Number of the instrument; docs/instruments.md describes how to name it.
JDF_BYTES = 8192  # An update requires 5,000 bytes; blanks after the end fill the file.
STRIP_COLUMNS = 16

FIELDS = ("XYZ_X", "XYZ_Y", "XYZ_Z", "LAB_L", "LAB_A", "LAB_B")
GREYS = ((10, 6, 6), (20, 12, 12), (40, 27, 27), (60, 45, 45), (80, 65, 65), (100, 85, 85))


def read_chart(path):
    """Maps device values in percent to the six FIELDS of the first patch that has them."""
    lines = iter(path.read_text(encoding="latin-1").splitlines())
    for line in lines:
        if line.strip() == "BEGIN_DATA_FORMAT":
            fields = next(lines).split()
        if line.strip() == "BEGIN_DATA":
            break
    patches = {}
    for line in lines:
        if line.strip() == "END_DATA":
            break
        row = dict(zip(fields, line.split()))
        device = tuple(float(row["CMYK_" + ink]) for ink in "CMYK")
        patches.setdefault(device, [float(row[field]) for field in FIELDS])
    return patches


def strip_patches():
    """A strip as on contract proofs: paper, tone ramps, overprints, greys and mixtures."""
    patches = [(0, 0, 0, 0)]
    for ink in range(4):
        for tone in (10, 20, 40, 70, 100):
            patches.append(tuple(tone if i == ink else 0 for i in range(4)))
    for tone in (40, 70, 100):
        patches += [(0, tone, tone, 0), (tone, 0, tone, 0), (tone, tone, 0, 0)]
    patches += [(*grey, 0) for grey in GREYS]
    patches += [(0, 0, 0, 60), (0, 0, 0, 80), (100, 100, 100, 0)]
    patches += [(100, 40, 0, 0), (40, 100, 0, 0), (0, 100, 40, 0), (0, 40, 100, 0),
                (40, 0, 100, 0), (100, 0, 40, 0), (40, 40, 40, 0), (70, 40, 40, 0),
                (10, 40, 40, 0)]
    return [tuple(float(tone) for tone in patch) for patch in patches]


def criteria_entries():
    """Maps the names in the table of docs/criteria.md to entries of a preset's arrays."""
    entries = {}
    for line in (HERE.parent / "criteria.md").read_text(encoding="utf-8").splitlines():
        cells = [cell.strip() for cell in line.split("|")]
        if len(cells) > 3 and cells[1].isdigit():
            entries[cells[2].strip("`")] = int(cells[1])
    return entries


def preset_keys(path):
    """The keys of a tolerance preset's ticket, from its file."""
    preset = xml.parse(path).getroot()
    used, tolerances, decimals = [0] * 32, [0.0] * 32, [0] * 32
    entries = criteria_entries()
    for criterion in preset.find("criteria"):
        if criterion.tag not in entries:
            continue  # Has no entry: the library reads it from the preset's file.
        entry = entries[criterion.tag]
        used[entry] = int(criterion.get("used") == "yes")
        tolerances[entry] = float(criterion.get("tolerance"))
        decimals[entry] = int(criterion.get("decimals"))

    def yes(name):
        return {"int": int(preset.findtext(name) == "yes")}

    return {
        "Name": {"string": preset.findtext("name")},
        "Editable": yes("editable"),
        "ShowInClient": yes("showInClient"),
        "UsedForDynamicWedge": yes("usedForDynamicWedge"),
        "IlluminationCondition": {"int": int(preset.findtext("illuminationCondition"))},
        "FograPSDPreset": yes("psd"),
        "Values/UsedForResult": {"int": used},
        "Values/Preset": {"double": tolerances},
        "Values/DecimalPlaces": {"int": decimals},
    }


def value_keys(root, chart, patches):
    """XYZ (0 to 100) and Lab, one key for each column."""
    columns = list(zip(*(chart[patch] for patch in patches)))
    names = [f"XYZValues/{axis}Values" for axis in "XYZ"]
    names += [f"LabValues/{axis}Values" for axis in "LAB"]
    return {f"{root}/{name}": {"double": list(column)} for name, column in zip(names, columns)}


def job_keys(arguments, preset_id):
    """The keys that both strips share."""
    keys = {
        # Description and status: the job waits to be verified.
        "Input/Title": {"string": arguments.title},
        "Input/SubType": {"int": 0},
        "Input/FileType": {"int": 0},
        "Job/Display/Status": {"int": 208},
        "Job/FromEsko": {"int": 0},
        "Remote/ShowInVerifier": {"int": 1},
        "General/ParentID": {"int": arguments.parent},
        "CMM/PaperName": {"string": arguments.paper},
        # Server paths of the job's files.
        "System/InstallFolder": {"string": INSTALL},
        "System/Folders/Temp": {"string": TEMP},
        "Output/Jdf/FileName": {"string": f"job-{arguments.job}.jdf"},
        "Workflow/Name": {"string": "Verification of proofs"},
        "Workflow/Verify/Active": {"int": 3 if arguments.two_strips else 1},
        "Footer/Dynstrip/UseDynstrip": {"int": 0},
    }
    for strip in strips(arguments):
        keys.update(strip_keys(arguments, preset_id, "" if strip == 1 else "2"))
    return keys


def strips(arguments):
    return (1, 2) if arguments.two_strips else (1,)


def strip_keys(arguments, preset_id, suffix):
    """How a strip is verified, and its references. `suffix` ends the keys of the strip."""
    keys = {
        f"Workflow/Verify/DeltaEMode{suffix}": {"int": CIEDE2000},
        f"Workflow/Verify/ComparisonMethod{suffix}": {"int": preset_id},
        f"Footer/ControlstripFile{suffix}": {"string": f"{STRIP}.it8"},
    }
    if arguments.parent:
        keys["Footer/Nesting/ControlstripMode"] = {"int": 1}
        # Without it, neither the nested strip nor the parent's other jobs are found.
        keys["Footer/Nesting/PSDAssessment"] = {"string": ""}
        keys[f"Footer/Nesting/ControlstripFile{suffix}"] = {"string": f"{STRIP}.it8"}
    if is_profile(arguments.references):
        keys[f"Footer/ControlstripInputProfile{suffix}"] = {
            "string": f"{INSTALL}/{arguments.references.name}"}
    elif arguments.unmeasured:
        keys[f"Workflow/Verify/CharacterizationData{suffix}"] = {
            "string": arguments.references.name}
    keys[f"Workflow/Verify/MeasurementWorkflow{suffix}"] = {"int": workflow(arguments)}
    return keys


def workflow(arguments):
    """The measurement workflow: 1 takes references from a profile, 2 from a file, 3 from the ticket
    or, if that has none, from a profile. Only 3 updates the JDF."""
    if arguments.unmeasured:
        return 3 if is_profile(arguments.references) else 2
    return 1 if is_profile(arguments.references) else 3


def is_profile(path):
    return path.suffix.lower() in (".icc", ".icm")


def measurement_keys(root, patches, measured, references):
    """A measurement below "Remote/Measurement" or "Remote/Measurement2", and its references unless
    these are a profile."""
    keys = {
        # The number of measurements, and the values of the last one. CMYK is in percent.
        f"{root}/Status": {"int": 1},
        f"{root}/Illumination/Mode": {"int": 1},
        f"{root}/Numpatches": {"int": len(patches)},
        # No spectra. The three keys are required nevertheless.
        f"{root}/SpectralValues/Base": {"int": 380},
        f"{root}/SpectralValues/Length": {"int": 0},
        f"{root}/SpectralValues/Stepsize": {"int": 10},
    }
    keys.update(value_keys(root, measured, patches))
    for ink, tones in zip("CMYK", zip(*patches)):
        keys[f"{root}/CMYKValues/{ink}Values"] = {"double": list(tones)}
    if references is None:
        return keys

    keys[f"{root}/Reference/Numpatches"] = {"int": len(patches)}
    keys.update(value_keys(f"{root}/Reference", references, patches))
    for ink, tones in zip("CMYK", zip(*patches)):  # From 0 to 255.
        keys[f"{root}/Reference/CMYKValues/{ink}Values"] = {
            "int": [math.floor(tone * 2.55 + 0.5) for tone in tones]}
    return keys


def strip_text(patches, references):
    """The control strip, in rows of STRIP_COLUMNS. The first line with the word DEVICE must be its
    value."""
    rows = len(patches) // STRIP_COLUMNS
    lines = ["CGATS.17", f"DEVICE {DEVICE}", f"NUMBER_OF_STRIPS {rows}",
             f"NUMBER_OF_COLS {STRIP_COLUMNS}", "NUMBER_OF_FIELDS 11", "BEGIN_DATA_FORMAT",
             "\t".join(["SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "LAB_L", "LAB_A",
                        "LAB_B", "XYZ_X", "XYZ_Y", "XYZ_Z"]),
             "END_DATA_FORMAT", f"NUMBER_OF_SETS {len(patches)}", "BEGIN_DATA"]
    for number, patch in enumerate(patches, 1):
        values = references[patch]
        lines.append("\t".join([str(number)] + [f"{value:.2f}" for value in
                                                (*patch, *values[3:], *values[:3])]))
    return "\r\n".join(lines + ["END_DATA", ""])


def jdf_text(arguments):
    text = f"""<?xml version="1.0" encoding="UTF-8"?>
<JDF xmlns="http://www.CIP4.org/JDFSchema_1_1" xmlns:xsi="http://www.w3.org/2001/XMLSchema-instance"
     ID="J{arguments.job}" JobID="{arguments.job}" JobPartID="1" Type="Combined"
     Types="ColorSpaceConversion DigitalPrinting" Status="Waiting" Version="1.4">
  <AuditPool>
    <Created AgentName="make-job.py" ID="A1" TimeStamp="2024-01-01T12:00:00Z"/>
  </AuditPool>
  <ResourcePool>
    <Media ID="M1" Class="Consumable" Status="Available" MediaType="Paper" Weight="60"/>
  </ResourcePool>
  <ResourceLinkPool>
    <MediaLink rRef="M1" Usage="Input"/>
  </ResourceLinkPool>
</JDF>
"""
    return text + " " * (JDF_BYTES - len(text))


def parse_arguments():
    parser = argparse.ArgumentParser(description=__doc__,
                                     formatter_class=argparse.RawDescriptionHelpFormatter)
    default = next((str(folder) for folder in PRESETS if folder.is_dir()), ".")
    parser.add_argument("folder", type=Path, help="folder for the job; created if missing")
    parser.add_argument("--job", type=int, default=7, help="number of the job (default 7)")
    parser.add_argument("--title", default="Summer catalogue, sheet 1")
    parser.add_argument("--paper", default="Super-calendered, 60 g/m2")
    parser.add_argument("--measured", type=Path, default=ICC / "FOGRA40L.ti3",
                        help="chart with the measured values (default FOGRA40L)")
    parser.add_argument("--unmeasured", action="store_true",
                        help="make a job without a measurement")
    parser.add_argument("--references", type=Path, default=ICC / "FOGRA39L.ti3",
                        help="chart with the reference values, or a CMYK profile "
                             "(default FOGRA39L)")
    parser.add_argument("--two-strips", action="store_true",
                        help="add a second strip with the same patches")
    parser.add_argument("--parent", type=int, default=0,
                        help="make a nested job and the ticket of its parent with this number")
    parser.add_argument("--preset", type=Path, default=Path(default) / "CVP_0001.xml",
                        help="file of the tolerance preset")
    return parser.parse_args()


def tickets(arguments, patches, measured, references):
    preset_id = int(xml.parse(arguments.preset).getroot().findtext("id"))
    keys = job_keys(arguments, preset_id)
    if not arguments.unmeasured:
        for strip in strips(arguments):
            root = "Remote/Measurement" if strip == 1 else "Remote/Measurement2"
            keys.update(measurement_keys(root, patches, measured, references))
    made = [{"type": 27, "id": preset_id, "keys": preset_keys(arguments.preset)},
            {"type": 3, "id": arguments.job, "keys": keys}]
    if arguments.parent:
        # The parent is not verified itself. It receives the results of its children.
        made.append({"type": 3, "id": arguments.parent,
                     "keys": {"Input/Title": {"string": "Sheet with several jobs"},
                              "Job/Display/Status": {"int": 0},
                              "Workflow/Verify/Active": {"int": 1}}})
    return {"format": "tintgate tickets", "version": 1, "tickets": made}


def put_server_files(server, arguments, patches, values):
    for name in ("ControlCharts", "tickets", "temp", "IT8_CharacterizationData"):
        (server / name).mkdir(parents=True, exist_ok=True)
    (server / f"ControlCharts/{STRIP}.it8").write_bytes(strip_text(patches, values).encode("ascii"))
    preset_id = int(xml.parse(arguments.preset).getroot().findtext("id"))
    shutil.copyfile(arguments.preset, server / f"tickets/CVP_{preset_id:04}.xml")
    (server / f"temp/job-{arguments.job}.jdf").write_text(jdf_text(arguments), encoding="ascii")
    if is_profile(arguments.references):
        shutil.copyfile(arguments.references, server / arguments.references.name)
    elif arguments.unmeasured:
        shutil.copyfile(arguments.references,
                        server / "IT8_CharacterizationData" / arguments.references.name)


def main():
    arguments = parse_arguments()
    for path in (arguments.measured, arguments.references, arguments.preset):
        if not path.is_file():
            sys.exit(f"{path} is missing (the charts are in the package icc-profiles-free)")
    measured = read_chart(arguments.measured)
    references = None if is_profile(arguments.references) else read_chart(arguments.references)
    values = measured if references is None else references  # Colours in the strip's file.
    patches = [patch for patch in strip_patches() if patch in measured and patch in values]
    patches = patches[:len(patches) // STRIP_COLUMNS * STRIP_COLUMNS]

    put_server_files(arguments.folder / "server", arguments, patches, values)
    (arguments.folder / "tickets.json").write_text(
        json.dumps(tickets(arguments, patches, measured, references), indent=1) + "\n",
        encoding="ascii")
    print(f"Job {arguments.job} with {len(patches)} patches is in {arguments.folder}")


if __name__ == "__main__":
    main()
