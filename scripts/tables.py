# SPDX-License-Identifier: Apache-2.0
"""Shared by the generators of code lists: reads a CSV file, writes its texts into C++, manual pages
and Markdown, and replaces the generated part of a handwritten page.
"""

import csv
import sys


def read(path, columns):
    """The rows. Exits if one of these columns is empty, is not ASCII or ends with a full stop."""
    with open(path, newline="", encoding="utf-8") as source:
        rows = list(csv.DictReader(source, strict=True))
    for row in rows:
        for column in columns:
            text = row[column]
            if not text or not text.isascii() or text.endswith("."):
                sys.exit(f"{path}: {' '.join(list(row.values())[:2])}: "
                         f"'{column}' is empty, not ASCII or ends with a stop")
    return rows


def expect_rising(path, codes):
    if codes != sorted(set(codes)) or codes[-1] > 255:
        sys.exit(f"{path}: {codes} repeat, do not rise or are no exit codes")


def c_text(text):
    return '"' + text.replace("\\", "\\\\").replace('"', '\\"') + '"'


def roff(text):
    return text.replace("\\", "\\e").replace("-", "\\-").replace("'", "\\(aq")


def sentence(text):
    return text[:1].upper() + text[1:] + "."


def markdown(heads, rows):
    lines = ["|".join(f" {cell} " if cell else " " for cell in cells) for cells in (heads, *rows)]
    lines.insert(1, "|".join("---" for _ in heads))
    return "".join(f"|{line}|\n" for line in lines)


def replaced(path, start, made, end):
    """The page with `made` between its marks, which are whole lines and are kept."""
    page = path.read_text(encoding="utf-8")
    head, found_start, rest = page.partition(start)
    _, found_end, tail = rest.partition(end)
    if not found_start or not found_end:
        sys.exit(f"{path} lacks the marks of what is made for it")
    return head + start + made + end + tail


def write_or_check(path, text, check, command):
    """With check, exits if the page is out of date."""
    if not check:
        path.write_text(text, encoding="utf-8")
    elif text != path.read_text(encoding="utf-8"):
        sys.exit(f"{path} is out of date: run {command}")
