#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Checks that each target sees the headers that its dependencies allow, and no others.

arrows.py COMPILER SOURCE_DIR BINARY_DIR TARGET...

For each target, the build tree contains its published headers (see/TARGET), its private headers
(see/TARGET.own) and its include path (arrows/TARGET). The compiler's preprocessor decides whether a
header is found.
"""

import re
import subprocess
import sys
from pathlib import Path

# The table in docs/architecture.md is the single source of what each target may see.
ROW = re.compile(r"^\| `([\w-]+)` \| `[^`]*` \|([^|]*)\|([^|]*)\|[^|]+\|$", re.MULTILINE)


def read_table(source_dir):
    """By target, the names of the targets that it sees, and of the targets that it passes on."""
    rows = ROW.findall((source_dir / "docs" / "architecture.md").read_text(encoding="utf-8"))
    if not rows:
        sys.exit("docs/architecture.md has no table of targets")
    return ({name: sees.split() for name, sees, _ in rows},
            {name: passes.split() for name, _, passes in rows})


# Generated for every target that returns or explains an exit code or a status, or shows a text.
FOR_ALL = {"ExitCodes.h", "CompanionStatuses.h", "TextKeys.h"}


def seen_by(target, arrows, exposes):
    """The targets whose published headers `target` sees."""
    seen, ahead = set(), list(arrows[target])
    while ahead:
        name = ahead.pop()
        if name not in seen:
            seen.add(name)
            ahead += exposes.get(name, [])
    return seen | {target}


def check_circles(arrows):
    """Yields a sentence for each target that depends on itself."""
    for start in arrows:
        seen, ahead = set(), list(arrows[start])
        while ahead:
            name = ahead.pop()
            if name not in seen:
                seen.add(name)
                ahead += arrows.get(name, [])
        if start in seen:
            yield f"{start} is part of a circle of arrows"


def headers_under(folder):
    return sorted(str(path.relative_to(folder)) for path in folder.rglob("*.h"))


def found(compiler, include_path, headers):
    """The headers that the compiler finds on an include path."""
    source = "".join(
        f'#if __has_include("{header}")\nfound {header}\n#endif\n' for header in headers
    )
    command = [compiler, "-E", "-P", "-x", "c++", *(f"-I{name}" for name in include_path), "-"]
    # Runs in a folder without headers, because the current folder counts as the source's.
    result = subprocess.run(
        command, input=source, capture_output=True, text=True, check=True, cwd="/"
    )
    return {line.split()[1] for line in result.stdout.splitlines() if line.startswith("found ")}


def check_arrows(compiler, binary_dir, targets, arrows, exposes):
    """Yields a sentence for each header that a target sees but should not, or the reverse."""
    see = binary_dir / "see"
    published = {
        folder.name: headers_under(folder)
        for folder in see.iterdir()
        if not folder.name.endswith(".own")
    }
    private = {name: headers_under(see / f"{name}.own") for name in targets}
    everything = sum((*published.values(), *private.values()), [])
    for header in {header for header in everything if everything.count(header) > 1}:
        yield f"{header} is published more than once"
    for target in targets:
        if target not in arrows:
            yield f"{target} has no row in the table of arrows"
            continue
        expected = set(private[target])
        for name in seen_by(target, arrows, exposes):
            expected.update(published.get(name, []))
        include_path = (binary_dir / "arrows" / target).read_text().split()
        actual = found(compiler, include_path, everything)
        for header in sorted(actual - expected - FOR_ALL):
            yield f"{target} sees {header}, which no arrow leads to"
        for header in sorted(expected - actual):
            yield f"{target} does not see {header}, which is behind an arrow"


def check_includes(source_dir):
    """Yields a sentence for each include that is not written from the root.

    Tests and benchmarks, which no target sees, may have helpers next to them or in their top
    folder.
    """
    shared = {path.name for path in (source_dir / "tests" / "support").glob("*.h")} | FOR_ALL
    for path in sorted(source_dir.rglob("*")):
        inside = path.relative_to(source_dir)
        if path.suffix not in (".h", ".cpp") or inside.parts[0] in ("build", "out"):
            continue
        for name in re.findall(r'^\s*#\s*include\s*"([^"]*)"', path.read_text(), re.MULTILINE):
            beside = inside.parts[0] in ("tests", "bench") and any(
                (folder / name).is_file() for folder in (path.parent, source_dir / inside.parts[0])
            )
            if name in shared or (beside and ".." not in name):
                continue
            if ".." in name.split("/") or not (source_dir / name).is_file():
                yield f'{inside} includes "{name}", which is not written from the root'


def main(compiler, source_dir, binary_dir, *targets):
    arrows, exposes = read_table(Path(source_dir))
    faults = [
        *check_circles(arrows),
        *check_arrows(compiler, Path(binary_dir), targets, arrows, exposes),
        *check_includes(Path(source_dir)),
    ]
    print("\n".join(faults) or f"{len(targets)} targets see what they should")
    return 1 if faults or not targets else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
