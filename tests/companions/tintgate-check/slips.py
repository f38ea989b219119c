#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Makes each slip of docs/checking.md and compares what tintgate-check prints with the page.

slips.py check TINTGATE_CHECK docs/checking.md
slips.py write TINTGATE_CHECK docs/checking.md     replaces the part of the page

Each slip names words that its message must have, so that a message that is no help is not taken over
into the page unseen. The last two need root, and are left out without it.
"""

import os
import re
import stat
import subprocess
import sys
import tempfile
from pathlib import Path

ICC = Path("/usr/share/color/icc")
START = "<!-- Made by tests/companions/tintgate-check/slips.py. -->\n"
END = "<!-- End of the slips. -->\n"
ORDINARY_USER = 65534
ROW_STEP = 27  # Of the target's rows, these are in the measurement.

CONDITIONS = """default = "coated-proof"

[conditions.coated-proof]
target = "FOGRA39L.ti3"
preset = "contract-proof"

[conditions.newspaper]
target = "TR002.ti3"
preset = "validation-print"
"""


def strip_of(fields=None, shift=0.0, rows=slice(0, None, ROW_STEP), header="", prefix=""):
    """A measurement: some rows of FOGRA39L, of some of its columns."""
    head, rest = (ICC / "FOGRA39L.ti3").read_text(encoding="latin-1").split("BEGIN_DATA\n")
    names = head.split("BEGIN_DATA_FORMAT")[1].split("END_DATA_FORMAT")[0].split()
    lines = []
    for row in rest.split("END_DATA")[0].splitlines()[rows]:
        cells = dict(zip(names, row.split()))
        cells["SAMPLE_ID"] = prefix + cells["SAMPLE_ID"]
        cells["LAB_L"] = f"{float(cells['LAB_L']) + shift:.2f}"
        lines.append(" ".join(cells[name] for name in fields or names if name in cells))
    names = [name for name in fields or names]
    return (f"CTI3\n{header}NUMBER_OF_FIELDS {len(names)}\nBEGIN_DATA_FORMAT\n{' '.join(names)}\n"
            f"END_DATA_FORMAT\nNUMBER_OF_SETS {len(lines)}\nBEGIN_DATA\n" + "\n".join(lines) +
            "\nEND_DATA\n")


def rgb():
    return ("CGATS.17\nNUMBER_OF_FIELDS 7\nBEGIN_DATA_FORMAT\n"
            "SAMPLE_ID RGB_R RGB_G RGB_B LAB_L LAB_A LAB_B\nEND_DATA_FORMAT\nNUMBER_OF_SETS 2\n"
            "BEGIN_DATA\nr1 255 0 0 53 80 67\nr2 0 255 0 87 -86 83\nEND_DATA\n")


FIELDS = ["SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"]
LAB = ["LAB_L", "LAB_A", "LAB_B"]


def make_files(folder):
    """Everything that the slips need, and the settings of the user."""
    good = strip_of(FIELDS + LAB)
    texts = {
        "proof.txt": good,
        "proof.cgats": good,
        "proof.json": good,
        "other/proof.html": "<p>notes of the operator</p>",
        "other/proof.txt": good,
        "empty.txt": "",
        "cut.txt": good[:len(good) * 2 // 3],
        "no-colours.txt": strip_of(FIELDS),
        "words.txt": good.replace(good.split("BEGIN_DATA\n")[1].split()[6], "light", 1),
        "rgb.txt": rgb(),
        "other-chart.txt": strip_of(["SAMPLE_ID", *LAB], rows=slice(0, 24), prefix="X"),
        "inverted.txt": strip_of(FIELDS + LAB, shift=-35),
        "result.json": '{\n  "format": "tintgate-result",\n  "formatVersion": 1\n}\n',
        "conditions.toml": CONDITIONS,
        "unquoted.toml": CONDITIONS.replace('"FOGRA39L.ti3"', "FOGRA39L.ti3"),
        "misspelt.toml": CONDITIONS.replace("preset =", "presett =", 1),
        "no-target.toml": '[conditions.coated-proof]\npreset = "contract-proof"\n',
        "other-default.toml": CONDITIONS.replace('default = "coated-proof"', 'default = "coated"'),
        "old-target.toml": CONDITIONS.replace('"FOGRA39L.ti3"', '"FOGRA27L.ti3"'),
        "house.xml": (Path(PRESETS) / "CVP_0001.xml").read_text().replace(
            'average tolerance="2.5"', 'average tolerance="2,5"'),
        "contract.xml": (Path(PRESETS) / "CVP_0001.xml").read_text(),
        "exports/readme.md": "nothing here yet\n",
        "home/.config/tintgate/conditions.toml": "",
    }
    for name, text in texts.items():
        path = folder / name
        path.parent.mkdir(parents=True, exist_ok=True)
        path.write_text(text)
    for name, data in {"proof.xlsx": b"PK\x03\x04\x14\0", "proof.pdf": b"%PDF-1.7\n%\xe2\xe3",
                       "scan.jpg": b"\xff\xd8\xff\xe0\0\x10JFIF"}.items():
        (folder / name).write_bytes(data)
    (folder / "secret.txt").write_text(good)
    (folder / "secret.txt").chmod(0)
    for path in [folder, *folder.rglob("*")]:
        if os.geteuid() == 0:
            os.chown(path, ORDINARY_USER, ORDINARY_USER)
    (folder / "results").mkdir()
    (folder / "results").chmod(0o555)


# Title, arguments, status, words of the message. "|part" of a title shows the output from there on.
SLIPS = [
    ("The name is misspelt", "-t FOGRA39L prof.txt", 3, "no such file,spelling"),
    ("A name with blanks has no quotes", "-t FOGRA39L my proof.txt", 3, "quotes"),
    ("No file fits a pattern", "-t FOGRA39L '*.cxf'", 3, "pattern"),
    ("Target and measurement are swapped|What to do", f"-t proof.txt {ICC}/FOGRA39L.ti3", 2,
     "swapped,follows -t"),
    ("The target itself was given as the measurement|What to do", "-t proof.txt proof.txt", 2,
     "one file,export of your print"),
    ("A print was measured for another condition|What to do",
     "--conditions conditions.toml inverted.txt", 1, "coated-proof,with -c"),
    ("Nothing says what to compare with", "proof.txt", 64, "-t,-c"),
    ("There is no such target", "-t FOGRA93L proof.txt", 3, 'FOGRA39L"?,--list'),
    ("A folder was given as the target", "-t exports/ proof.txt", 3, "path of a file"),
    ("The target is a profile for RGB", f"-t {ICC}/sRGB.icc proof.txt", 3, "CMYK output profile"),
    ("Both are profiles", f"-t {ICC}/ghostscript/ps_cmyk.icc {ICC}/ghostscript/default_cmyk.icc", 3,
     "--patch-set"),
    ("There is no such preset", "-t FOGRA39L -p contract-prof proof.txt", 64,
     'contract-proof",--list'),
    ("A condition was given as the preset", "--conditions conditions.toml -t FOGRA39L -p newspaper "
     "proof.txt", 64, "follows -c"),
    ("A preset has a decimal comma", "-t FOGRA39L -p house.xml proof.txt", 3,
     "Line 20,2\\,5,--list"),
    ("The condition is misspelt", "--conditions conditions.toml -c coatedproof proof.txt", 64,
     "coated-proof,--list"),
    ("A preset was given as the condition", "-c contract-proof proof.txt", 64, "follows -p"),
    ("A data set was given as the condition", "-c FOGRA39L proof.txt", 64, "follows -t"),
    ("There is no file of conditions", "--conditions condition.toml proof.txt", 3,
     "condition.toml,--conditions"),
    ("A text in conditions.toml has no quotes", "--conditions unquoted.toml proof.txt", 3,
     "unquoted.toml:4,quotes"),
    ("A key in conditions.toml is misspelt", "--conditions misspelt.toml proof.txt", 3,
     "misspelt.toml:5,presett,preset"),
    ("A condition has no target", "--conditions no-target.toml proof.txt", 3,
     "no-target.toml:1,target ="),
    ("The default condition is none of them", "--conditions other-default.toml proof.txt", 3,
     "other-default.toml:1,coated"),
    ("The target of a condition is gone", "--conditions old-target.toml proof.txt", 3,
     "FOGRA27L,--list"),
    ("The measurement is a spreadsheet", "-t FOGRA39L proof.xlsx", 3, "spreadsheet,CGATS"),
    ("The measurement is a PDF", "-t FOGRA39L proof.pdf", 3, "PDF,Export"),
    ("The measurement is a picture", "-t FOGRA39L scan.jpg", 3, "picture,instrument"),
    ("The measurement is empty", "-t FOGRA39L empty.txt", 3, "empty,again"),
    ("The measurement is cut off", "-t FOGRA39L cut.txt", 3, "again"),
    ("The measurement has no colours", "-t FOGRA39L no-colours.txt", 3, "L*a*b*"),
    ("A number is a word", "-t FOGRA39L words.txt", 3, "Correct the cell"),
    ("The measurement is of an RGB chart", "-t FOGRA39L rgb.txt", 3, "RGB,CMYK"),
    ("The measurement is of another chart", "-t FOGRA39L other-chart.txt", 3,
     "another chart,ids"),
    ("The arguments are those of Tintgate", "proof.txt proof.txt contract.xml output.json "
     "-t FOGRA39L", 3, "after -p"),
    ("A result was given as the measurement", "-t FOGRA39L result.json", 3,
     "tintgate-report --text"),
    ("The folder has no measurements", "-t FOGRA39L exports", 3, ".txt,.cxf"),
    ("You may not read the measurement", "-t FOGRA39L secret.txt", 3, "permissions,chmod"),
    ("You may not write in the folder|! ", "-t FOGRA39L proof.txt --page --out results", 3,
     "permissions,--out"),
    ("The page would replace another file|! ", "-t FOGRA39L other/proof.txt --page", 3,
     "not made by Tintgate,--out"),
    ("The result would replace the measurement|! ", "-t FOGRA39L proof.json --result", 3,
     "is an input,--out"),
    ("Two measurements would have one page|! ", "-t FOGRA39L proof.txt proof.cgats --page "
     "--out pages", 3, "different names"),
    ("--out names a file", "-t FOGRA39L proof.txt --page --out proof.pdf", 64, "folder"),
    ("An option is misspelt", "-t FOGRA39L proof.txt --pages", 64, "--pages,--help"),
    ("--poll without --watch", "-t FOGRA39L proof.txt --poll", 64, "--watch"),
    ("The watched folder is not there", "-t FOGRA39L --watch /srv/exprots", 3,
     "/srv/exprots,mounted"),
    ("The output can't be printed", "-t FOGRA39L proof.txt >/dev/full", 3, "No space left"),
    ("The disk is full|! ", "-t FOGRA39L proof.txt --page --out full", 3, "Make room,--out"),
]


def run(program, folder, arguments):
    environment = {"PATH": "/usr/bin:/bin", "HOME": str(folder / "home"), "LC_ALL": "C.UTF-8",
                   "TINTGATE_ROOT": str(folder / "root"), **{
                       name: value for name, value in os.environ.items() if "SAN_OPTIONS" in name}}
    done = subprocess.run(["sh", "-c", f'exec "$0" {arguments}', program], check=False, cwd=folder,
                          env=environment, stdout=subprocess.PIPE, stderr=subprocess.STDOUT,
                          stdin=subprocess.DEVNULL, text=True, timeout=60,
                          user=ORDINARY_USER if os.geteuid() == 0 else None)
    return done.returncode, done.stdout


def shown(title, output):
    """The part of the output that the page shows."""
    _, _, part = title.partition("|")
    if part:
        at = re.search(rf"^{re.escape(part)}", output, re.MULTILINE)
        output = output[at.start():] if at else output
    elif "\nConditions: none" in output:
        output = output[:output.index("\nConditions: none")]
    return output.rstrip("\n")


def block(title, arguments, status, output):
    heading = title.partition("|")[0]
    return f"**{heading}** (status {status})\n\n```\n$ tintgate-check {arguments}\n{output}\n```\n"


def mount_full_disk(folder):
    """A disk of a few KB, or false if this user may not make one."""
    disk = folder / "full"
    disk.mkdir()
    command = ["mount", "-t", "tmpfs", "-o", "size=16k,mode=777", "tmpfs", str(disk)]
    return subprocess.run(command, check=False, stderr=subprocess.DEVNULL).returncode == 0


def blocks_of(program, folder, faults):
    """The slips as the page shows them, in order; None for one that can't be made here."""
    has_full_disk = mount_full_disk(folder)
    try:
        for title, arguments, status, words in SLIPS:
            if "--out full" in arguments and not has_full_disk:
                yield None
                continue
            actual, output = run(program, folder, arguments)
            if actual != status:
                faults.append(f"{title}: status {actual} instead of {status}\n{output}")
            plain = " ".join(output.split())
            for word in re.split(r"(?<!\\),", words):
                if word.replace("\\", "") not in plain:
                    faults.append(f"{title}: the message lacks '{word}':\n{output}")
            yield block(title, arguments, status, shown(title, output))
    finally:
        if has_full_disk:
            subprocess.run(["umount", str(folder / "full")], check=False)


def main(mode, program, page):
    page = Path(page)
    text = page.read_text(encoding="utf-8")
    head, _, rest = text.partition(START)
    old, _, tail = rest.partition(END)
    faults = []
    with tempfile.TemporaryDirectory() as scratch:
        folder = Path(scratch)
        folder.chmod(folder.stat().st_mode | stat.S_IXOTH | stat.S_IROTH)
        make_files(folder)
        blocks = list(blocks_of(os.path.abspath(program), folder, faults))
    if mode == "write":
        page.write_text(head + START + "\n" + "\n".join(filter(None, blocks)) + "\n" + END + tail,
                        encoding="utf-8")
    else:
        for made in filter(None, blocks):
            if made not in old:
                faults.append(f"{page} does not have this ('slips.py write' makes it anew):\n{made}")
        if old.count("(status ") != len(SLIPS):
            faults.append(f"{page} has {old.count('(status ')} slips, and there are {len(SLIPS)}")
    print("\n".join(faults) or f"{len(SLIPS)} slips, {blocks.count(None)} of them left out")
    return 1 if faults else 0


PRESETS = Path(__file__).parents[3] / "presets"

if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
