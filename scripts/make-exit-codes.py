#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Generates everything that lists exit codes, so that each is described in one place:
docs/exit-codes.csv describes the codes; docs/job-outcomes.csv, next to it, describes who must do what
after a job that ended with a code.

make-exit-codes.py header docs/exit-codes.csv ExitCodes.h
make-exit-codes.py man    docs/exit-codes.csv page.1.in page.1
make-exit-codes.py table  docs/exit-codes.csv exit-codes.md
make-exit-codes.py jobs   docs/exit-codes.csv docs/jobs.md    replaces the page's table of outcomes
make-exit-codes.py check  docs/exit-codes.csv docs/jobs.md    fails if that table is out of date
"""

import re
import sys
from pathlib import Path

sys.dont_write_bytecode = True  # Keeps the source tree unchanged.
from tables import (c_text, expect_rising, markdown, read, replaced, roff,  # noqa: E402
                    write_or_check)

HEADER = """\
// Generated from docs/exit-codes.csv and docs/job-outcomes.csv; change those files instead.
#pragma once

/// Exit codes of the tool, and statuses of the analysis library. Each code has one cause.
enum ExitCode : int {{
{enumerators}
}};

/// Explains a code to people. All texts are ASCII without a final full stop, and not empty. The last
/// three are null if no job ends with the code.
struct ExitCodeText {{
    int code;
    const char* name;
    const char* meaning;
    const char* cause;
    const char* remedy;
    const char* jobCause; ///< Cause of the code in a job: often `cause`.
    const char* jobActor; ///< Who can change the outcome: client, operator or administrator.
    const char* jobRetry; ///< Whether repeating the call can help: begins with no, after a fix, or yes.
}};

/// Every code, in ascending order.
inline constexpr ExitCodeText exitCodeTexts[] = {{
{rows}
}};
"""

ACTORS = ("client", "operator", "administrator")
RETRIES = r"(no|after a fix|yes)(,.+)?"
BLOCK_START = (
    "<!-- Made from exit-codes.csv and job-outcomes.csv by scripts/make-exit-codes.py. -->\n\n"
)
BLOCK_END = "\n<!-- End of the table. -->\n"


def by_code(path, columns):
    rows = read(path, columns)
    codes = [int(row["code"]) for row in rows]
    expect_rising(path, codes)
    return dict(zip(codes, rows))


def outcomes_of(path, codes):
    """Returns the rows of the codes that a job can end with. A row without a cause gets the code's."""
    outcomes = by_code(path, ("who", "retry"))
    for code, row in outcomes.items():
        if code not in codes:
            sys.exit(f"{path}: there is no exit code {code}")
        row["job_cause"] = row["job_cause"] or codes[code]["cause"]
        if not set(row["who"].split(", ")) <= set(ACTORS):
            sys.exit(f"{path}: {code}: '{row['who']}' are not {', '.join(ACTORS)}")
        if not re.fullmatch(RETRIES, row["retry"]):
            sys.exit(f"{path}: {code}: '{row['retry']}' does not begin with a known answer")
    missing = [code for code, row in codes.items() if row["from"] == "job" and code not in outcomes]
    if missing:
        sys.exit(f"{path}: codes of jobs without an outcome: {missing}")
    return outcomes


def rows_of(path):
    """All codes in ascending order. "job" is the outcome, or None."""
    codes = by_code(path, ("name", "from", "meaning", "cause", "remedy"))
    outcomes = outcomes_of(Path(path).with_name("job-outcomes.csv"), codes)
    return [row | {"job": outcomes.get(code)} for code, row in codes.items()]


def initializer(row):
    texts = [c_text(row[part]) for part in ("name", "meaning", "cause", "remedy")]
    if row["job"]:
        texts += [c_text(row["job"][part]) for part in ("job_cause", "who", "retry")]
    else:
        texts += ["nullptr"] * 3
    return f"    {{{row['code']}, " + ",\n     ".join(texts) + "},"


def header(rows):
    return HEADER.format(
        enumerators="\n".join(
            f"    exit{row['name']} = {row['code']}, ///< {row['meaning']}." for row in rows
        ),
        rows="\n".join(map(initializer, rows)),
    )


def own_job_cause(row):
    """The cause in a job if it differs from the code's."""
    job = row["job"]
    return job["job_cause"] if job and job["job_cause"] != row["cause"] else None


def man(rows, template):
    lines = []
    for row in rows:
        lines += [".TP", f".B {row['code']}", roff(row["meaning"] + ".")]
        lines += [roff(row[part] + ".") for part in ("cause", "remedy")]
        if own_job_cause(row):
            lines += [roff(f"In a job: {own_job_cause(row)}.")]
    with open(template, encoding="utf-8") as source:
        return source.read().replace("@EXIT_CODES@", "\n".join(lines))


def stars(text):
    """Prevents L*a*b* from being read as emphasis."""
    return text.replace("*", "\\*")


def table(rows):
    parts = ("code", "from", "meaning", "cause", "remedy")
    return (
        "# Exit codes\n\n"
        "These are the exit codes of the tool, of jobs on a print server, and of the analysis "
        "library. jobs.md describes what a client does with those of a job.\n\n"
        + markdown((*parts, "cause in a job"),
                   [[stars(row[part]) for part in parts] + [stars(own_job_cause(row) or "")]
                    for row in rows])
    )


def outcomes(rows):
    """Makes one row of codes that a client handles alike."""
    groups = {}
    for row in rows:
        if row["job"]:
            groups.setdefault((row["job"]["who"], row["job"]["retry"]), []).append(row["code"])
    return markdown(("Codes", "Who acts", "Retry"),
                    [[", ".join(codes), *answer] for answer, codes in groups.items()])


def main(arguments):
    kind, rows, target = arguments[0], rows_of(arguments[1]), Path(arguments[-1])
    if kind in ("jobs", "check"):
        text = replaced(target, BLOCK_START, outcomes(rows), BLOCK_END)
        write_or_check(target, text, kind == "check",
                       "scripts/make-exit-codes.py jobs docs/exit-codes.csv docs/jobs.md")
        return
    if kind == "man":
        text = man(rows, arguments[2])
    else:
        text = {"header": header, "table": table}[kind](rows)
    target.write_text(text, encoding="utf-8")


if __name__ == "__main__":
    main(sys.argv[1:])
