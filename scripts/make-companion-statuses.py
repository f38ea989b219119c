#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Generates everything that lists exit statuses of the companion programs from
docs/companion-statuses.csv: the header for the programs and their help, and the lists in their
pages in docs/.

make-companion-statuses.py header docs/companion-statuses.csv CompanionStatuses.h
make-companion-statuses.py pages  docs/companion-statuses.csv    replaces the lists in the pages
make-companion-statuses.py check  docs/companion-statuses.csv    fails if one is out of date
"""

import re
import sys
from pathlib import Path

sys.dont_write_bytecode = True  # Keeps the source tree unchanged.
from tables import (c_text, expect_rising, markdown, read, replaced, roff, sentence,  # noqa: E402
                    write_or_check)

MADE = "Made from companion-statuses.csv by scripts/make-companion-statuses.py."
HEADER = """\
// Made from docs/companion-statuses.csv; change that file instead.
#pragma once

{programs}"""
PROGRAM = """\
/// Exit statuses of {program}.
enum class {prefix}Status : int {{
{enumerators}
}};

/// The end of its help, with a line end.
inline constexpr char {small}StatusHelp[] =
    "Exit status:\\n"
{lines};
"""
MARKS = {
    ".md": (f"<!-- {MADE} -->\n\n", "\n<!-- End of the table. -->\n"),
    ".1": (f'.\\" {MADE}\n', '.\\" End of the statuses.\n'),
}
# Pages that list a program's statuses. Other programs' manual pages are made from their help.
PAGES = {
    "tintgate-store": ("stores.md",),
    "tintgate-report": ("report.md",),
    "tintgate-check": ("checking.md", "tintgate-check.1"),
    "NerovaMeasure": ("measuring.md", "NerovaMeasure.1"),
    "Nerova Verify": ("viewer.md", "NerovaVerify.1"),
    "Plistbuddy": (),
}


def statuses_of(path):
    """The rows of each program."""
    programs = {}
    for row in read(path, ("program", "name", "meaning")):
        programs.setdefault(row["program"], []).append(row)
    for rows in programs.values():
        expect_rising(path, [int(row["status"]) for row in rows])
    if set(programs) != set(PAGES):
        sys.exit(f"{path}: the programs are not {', '.join(PAGES)}")
    return programs


def plain(text):
    """Removes Markdown's backticks."""
    return text.replace("`", "")


def header_of(program, rows):
    prefix = re.sub(r"(?:^|[ -])(\w)", lambda match: match[1].upper(), program)
    return PROGRAM.format(
        program=program, prefix=prefix, small=prefix[0].lower() + prefix[1:],
        enumerators="\n".join(f"    {row['name']} = {row['status']}, ///< {sentence(plain(row['meaning']))}"
                              for row in rows),
        lines="\n".join("    " + c_text(f"{row['status']:>4}  {plain(row['meaning'])}")[:-1] + '\\n"'
                        for row in rows),
    )


def table(rows):
    heads = {"status": "Status", "meaning": "Meaning", "remedy": "What helps"}
    if not any(row["remedy"] for row in rows):
        del heads["remedy"]
    return markdown(tuple(heads.values()), [[row[part] for part in heads] for row in rows])


def manual(rows):
    return "".join(f".TP\n.B {row['status']}\n{roff(sentence(plain(row['meaning'])))}\n" for row in rows)


def main(kind, source, *target):
    programs = statuses_of(source)
    if kind == "header":
        text = HEADER.format(programs="\n".join(header_of(*item) for item in programs.items()))
        Path(target[0]).write_text(text, encoding="utf-8")
        return
    for program, rows in programs.items():
        for name in PAGES[program]:
            page = Path(source).with_name(name)
            start, end = MARKS[page.suffix]
            made = table(rows) if page.suffix == ".md" else manual(rows)
            write_or_check(page, replaced(page, start, made, end), kind == "check",
                           "scripts/make-companion-statuses.py pages docs/companion-statuses.csv")


if __name__ == "__main__":
    main(*sys.argv[1:])
