#!/usr/bin/env python3
"""Makes from docs/exit-codes.csv whatever states exit codes, so that each is said in one place.

make-exit-codes.py header docs/exit-codes.csv ExitCodes.h
make-exit-codes.py man    docs/exit-codes.csv page.1.in page.1
make-exit-codes.py table  docs/exit-codes.csv exit-codes.md
"""

import csv
import sys

HEADER = """\
// Made from docs/exit-codes.csv; change that file instead.
#pragma once

/// Exit codes of the tool, and statuses of the analysis library. One code for one cause.
enum ExitCode : int {{
{enumerators}
}};

/// What a code means to the person who meets it. All texts are ASCII, without a full stop at their
/// end, and neither empty nor null.
struct ExitCodeText {{
    int code;
    const char* name;
    const char* meaning;
    const char* cause;
    const char* remedy;
}};

/// Every code, in rising order.
inline constexpr ExitCodeText exitCodeTexts[] = {{
{rows}
}};
"""


def rows_of(path):
    with open(path, newline="", encoding="utf-8") as source:
        rows = list(csv.DictReader(source))
    codes = [int(row["code"]) for row in rows]
    if codes != sorted(set(codes)) or codes[-1] > 255:
        sys.exit(f"{path}: codes repeat, do not rise or are no exit codes")
    for row in rows:
        for part in ("name", "from", "meaning", "cause", "remedy"):
            text = row[part]
            if not text or not text.isascii() or text.endswith("."):
                sys.exit(f"{path}: {row['code']}: '{part}' is empty, not ASCII or ends with a stop")
    return rows


def c_text(text):
    return '"' + text.replace("\\", "\\\\").replace('"', '\\"') + '"'


def roff(text):
    return text.replace("\\", "\\e").replace("-", "\\-").replace("'", "\\(aq")


def header(rows):
    return HEADER.format(
        enumerators="\n".join(
            f"    exit{row['name']} = {row['code']}, ///< {row['meaning']}." for row in rows
        ),
        rows="\n".join(
            "    {%s, %s, %s,\n     %s,\n     %s}," % (
                row["code"], c_text(row["name"]), c_text(row["meaning"]),
                c_text(row["cause"]), c_text(row["remedy"]))
            for row in rows
        ),
    )


def man(rows, template):
    lines = []
    for row in rows:
        lines += [".TP", f".B {row['code']}", roff(row["meaning"] + ".")]
        lines += [roff(row[part] + ".") for part in ("cause", "remedy")]
    with open(template, encoding="utf-8") as source:
        return source.read().replace("@EXIT_CODES@", "\n".join(lines))


def table(rows):
    parts = ("code", "from", "meaning", "cause", "remedy")
    lines = [parts, ("---",) * len(parts), *([row[part] for part in parts] for row in rows)]
    return (
        "# Exit codes\n\n"
        "Of the tool itself, of a job on the print server, and of the analysis library.\n\n"
        + "".join("| " + " | ".join(cells) + " |\n" for cells in lines)
    )


def main(arguments):
    kind, source = arguments[0], rows_of(arguments[1])
    if kind == "man":
        text = man(source, arguments[2])
    else:
        text = {"header": header, "table": table}[kind](source)
    with open(arguments[-1], "w", encoding="utf-8") as target:
        target.write(text)


if __name__ == "__main__":
    main(sys.argv[1:])
