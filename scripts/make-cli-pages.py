#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Makes a manual page or a bash completion from the --help output of a program and its commands, so
that both always match the program.

make-cli-pages.py man        PROGRAM VERSION page.1
make-cli-pages.py completion PROGRAM completion
"""

import re
import subprocess
import sys
from dataclasses import dataclass, field
from pathlib import Path


@dataclass
class Command:
    words: tuple  # Of the command, without the program's name.
    summary: str = ""
    usage: str = ""
    positionals: list = field(default_factory=list)  # Pairs of name and text.
    options: list = field(default_factory=list)
    groups: list = field(default_factory=list)  # Pairs of a heading and more options.
    names: list = field(default_factory=list)  # Pairs of a subcommand and its text.
    footer: list = field(default_factory=list)  # Lines.
    below: list = field(default_factory=list)


def entries(lines):
    """Rows of a name and its text. A text may start on the next line and have several lines."""
    rows = []
    for line in lines:
        start = re.match(r"  (\S.*?)(?:\s{2,}(\S.*))?$", line)
        if start and not line.startswith("   "):
            name, text = start.groups()
            if text is None and len(name) > 28 and re.search(r"[A-Z)] \S+ ", name):
                name, text = name, ""
            rows.append([name.strip(), text or ""])
        elif rows:
            rows[-1][1] = f"{rows[-1][1]} {line.strip()}".strip()
    return rows


def ask(program, words=()):
    text = subprocess.run([program, *words, "--help"], check=True, capture_output=True,
                          text=True, env={"LC_ALL": "C.UTF-8", "PATH": "/usr/bin:/bin"}).stdout
    command = Command(words)
    sections = {"": []}
    current = ""
    lines = text.splitlines()
    for line, after in zip(lines, [*lines[1:], ""]):
        group = re.fullmatch(r"\S.*:", line) and after.startswith("  -")
        if line in ("Positionals:", "Options:", "Subcommands:") or group:
            current = line[:-1]
            sections[current] = []
        elif current and line and not line.startswith(" "):
            current = "footer"  # Everything after the last list.
            sections.setdefault(current, []).append(line)
        else:
            sections[current].append(line)
    head = [line for line in sections[""] if line]
    command.usage = next((line.removeprefix("Usage: ") for line in head
                          if line.startswith("Usage: ")), "")
    command.summary = " ".join(line for line in head if not line.startswith("Usage: "))
    command.positionals = entries(sections.get("Positionals", []))
    command.options = entries(sections.get("Options", []))
    command.groups = [(title, entries(rows)) for title, rows in sections.items()
                      if title not in ("", "Positionals", "Options", "Subcommands", "footer")]
    command.names = entries(sections.get("Subcommands", []))
    command.footer = sections.get("footer", [])
    command.below = [ask(program, (*words, name)) for name, _ in command.names]
    return command


def roff(text):
    text = text.replace("\\", "\\e").replace("-", "\\-").replace("'", "\\(aq")
    return "\\&" + text if text.startswith(".") else text


def described(rows):
    return [line for name, text in rows
            for line in (".TP", f".B {roff(name)}", roff(text) or "\\&")]


def footer_lines(lines):
    """Keeps the lines unchanged: footers are formatted by hand."""
    while lines and not lines[-1]:
        lines = lines[:-1]
    return [".PP", ".nf", *map(roff, lines), ".fi"] if lines else []


def man_of(command, name):
    lines = [f".SS {roff(' '.join((name, *command.words)))}", roff(command.summary + "."),
             ".PP", f".B {roff(command.usage)}"]
    lines += described(command.positionals)
    lines += described(row for row in command.options if not row[0].startswith("-h"))
    lines += footer_lines(command.footer)
    for below in command.below:
        lines += man_of(below, name)
    return lines


def man(program, version):
    command, name = ask(program), Path(program).name
    summary = command.summary.rstrip(".")
    lines = [f'.\\" Made of what {name} says to \\-\\-help.',
             f'.TH "{name.upper()}" 1 "" "Tintgate {version}" "Tintgate"', ".SH NAME",
             f"{roff(name)} \\- {roff(summary[:1].lower() + summary[1:])}", ".SH SYNOPSIS",
             f".B {roff(command.usage)}", ".SH DESCRIPTION", roff(summary + ".")]
    lines += described(command.positionals)
    lines += [".SH OPTIONS", *described(command.options)]
    for title, rows in command.groups:
        lines += [f".SS {roff(title)}", *described(rows)]
    if command.below:
        lines += [".SH COMMANDS"]
        for below in command.below:
            lines += man_of(below, name)
    footer = footer_lines(command.footer)
    if footer:
        lines += [".SH NOTES", *footer[1:]]
    return "\n".join(lines) + "\n"


def words_of(command):
    """Possible words after a command: its long options and its subcommands."""
    rows = sum((rows for _, rows in command.groups), command.options)
    options = re.findall(r"--[a-z][a-z-]*", " ".join(name for name, _ in rows))
    return sorted(dict.fromkeys(options)) + [name for name, _ in command.names]


def cases_of(command):
    rows = [f"    '{' '.join(command.words)}') words='{' '.join(words_of(command))}' ;;"]
    for below in command.below:
        rows += cases_of(below)
    return rows


def completion(program):
    command, name = ask(program), Path(program).name
    function = "_" + re.sub(r"\W", "_", name)
    known = sorted({" ".join(row.words) for row in everything(command)})
    return f"""\
# bash completion for {name}: its commands and options, and names of files.
{function}() {{
  local current=${{COMP_WORDS[COMP_CWORD]}} path='' word words=''
  for word in "${{COMP_WORDS[@]:1:COMP_CWORD-1}}"; do
    case "${{path:+$path }}$word" in
    {'|'.join(f"'{row}'" for row in known if row) or "''"}) path="${{path:+$path }}$word" ;;
    esac
  done
  case "$path" in
{chr(10).join(cases_of(command))}
  esac
  mapfile -t COMPREPLY < <(compgen -W "$words" -- "$current")
  [ ${{#COMPREPLY[@]}} -gt 0 ] || compopt -o default
}}
complete -F {function} {name}
"""


def everything(command):
    yield command
    for below in command.below:
        yield from everything(below)


def main(what, program, *rest):
    text = man(program, rest[0]) if what == "man" else completion(program)
    Path(rest[-1]).write_text(text, encoding="utf-8")


if __name__ == "__main__":
    main(*sys.argv[1:])
