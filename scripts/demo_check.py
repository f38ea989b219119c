#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Checks prints with tintgate-check, as a person with files does.

demo_check.py TINTGATE_CHECK FOLDER
"""

import os
import shlex
import shutil
import subprocess
import sys
from pathlib import Path

ICC = Path("/usr/share/color/icc")
CONDITIONS = """default = "coated-proof"

[conditions.coated-proof]
target = "FOGRA39L.ti3"
preset = "contract-proof"
paper = "Proof paper 235"
printer = "Proofer 2"

[conditions.newspaper]
target = "TR002.ti3"
preset = "validation-print"
"""


def main(program, folder):
    folder = Path(folder).resolve()
    shutil.rmtree(folder, ignore_errors=True)
    (folder / "week 47").mkdir(parents=True)
    shutil.copy(ICC / "TR006.ti3", folder / "proof.txt")
    for name, source in {"monday": "TR006", "tuesday": "FOGRA40L", "wednesday": "TR003"}.items():
        shutil.copy(ICC / f"{source}.ti3", folder / "week 47" / f"{name}.txt")
    (folder / "week 47" / "thursday.txt").write_text("")
    (folder / "conditions.toml").write_text(CONDITIONS)
    surprises = 0
    for title, arguments, expected in (
        ("One proof, and its page", "-t FOGRA39L proof.txt --page", 0),
        ("A week of proofs, against the default condition of a file of conditions",
         "--conditions conditions.toml 'week 47'", 3),
        ("A slip", "-t FOGRA93L proof.txt", 3),
    ):
        print(f"\n{title}\n{'=' * len(title)}\n\n$ tintgate-check {arguments}", flush=True)
        status = subprocess.run([os.path.abspath(program), *shlex.split(arguments)], check=False,
                                cwd=folder).returncode
        print(f"exit status {status}")
        if status != expected:
            surprises += 1
            print(f"  expected was {expected}")
    print(f"\nThe page is {folder}/proof.html. docs/checking.md describes the command.")
    return 1 if surprises else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
