#!/usr/bin/env python3
"""Checks that each target sees the headers behind its arrows, and no others.

arrows.py COMPILER SOURCE_DIR BINARY_DIR TARGET...

The build tree holds, for each target, the headers that it publishes (see/TARGET), those of its own
(see/TARGET.own) and its include path (arrows/TARGET). Whether a header is found is left to the
compiler's preprocessor.
"""

import re
import subprocess
import sys
from pathlib import Path

# What stands behind each target's arrows. A new target, or a new arrow, is stated here first.
ARROWS = {
    "base": "",
    "propertylist": "base",
    "plist-reader": "propertylist",
    "platformrecords": "",
    "platform": "base platformrecords propertylist",
    "text": "platform",
    "ticketrecords": "",
    "ticket": "ticketrecords text",
    "log": "",
    "helper": "base platform",
    "commrecords": "platformrecords ticketrecords",
    "comm": "base commrecords ticket text helper platform",
    "records": "",
    "jdf": "records",
    "job": "base comm jdf records log helper text libTintgate platform",
    "logger": "log",
    "jobform": "",
    "Tintgate": "base jobform logger log records platform libTintgate",
    "TintgateJob": "job jobform log records libTintgate",
    "colour": "base",
    "report": "colour",
    "viewer": "report platform writefailures",
    "measuring": "base colour platform",
    "NerovaMeasure": "measuring report",
    "analysis": "colour records",  # libTintgate without its ten functions' names
    "libTintgate": "analysis colour records",
    "ticketengine": "ticketrecords",
    "StoreEngine": "ticketengine",
    "writefailures": "base",
    "store": "base StoreEngine",
    "ComGUI": "commrecords ticketrecords ticketengine StoreEngine store platform writefailures",
    "bytes": "",
    "diagnosis": "base job comm records logger log helper libTintgate platform store",
    "tintgate-store": "bytes diagnosis store",
    "tintgate-report": "report analysis libTintgate bytes store platform",
}

# Arrows that go on through a target, because a header that it publishes needs them itself.
EXPOSES = {
    "commrecords": "platformrecords ticketrecords",
    "comm": "commrecords ticket",
    "platform": "platformrecords",
    "report": "colour",
    "measuring": "colour",
    "analysis": "records",
    "ticket": "ticketrecords text",
    "ticketengine": "ticketrecords",
    "StoreEngine": "ticketengine",
    "store": "StoreEngine",
}

# Made by the build for everybody who returns or explains an exit code or a status.
FOR_ALL = {"ExitCodes.h", "CompanionStatuses.h"}


def seen_by(target):
    """The targets whose published headers `target` sees."""
    seen, ahead = set(), ARROWS[target].split()
    while ahead:
        name = ahead.pop()
        if name not in seen:
            seen.add(name)
            ahead += EXPOSES.get(name, "").split()
    return seen | {target}


def headers_under(folder):
    return sorted(str(path.relative_to(folder)) for path in folder.rglob("*.h"))


def found(compiler, include_path, headers):
    """Those of the headers that the compiler finds on an include path."""
    source = "".join(
        f'#if __has_include("{header}")\nfound {header}\n#endif\n' for header in headers
    )
    command = [compiler, "-E", "-P", "-x", "c++", *(f"-I{name}" for name in include_path), "-"]
    # In a folder without headers: the current one counts as that of the source.
    result = subprocess.run(
        command, input=source, capture_output=True, text=True, check=True, cwd="/"
    )
    return {line.split()[1] for line in result.stdout.splitlines() if line.startswith("found ")}


def check_arrows(compiler, binary_dir, targets):
    """Yields a sentence for each header that a target sees and should not, or the reverse."""
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
        if target not in ARROWS:
            yield f"{target} has no row in the table of arrows"
            continue
        expected = set(private[target])
        for name in seen_by(target):
            expected.update(published.get(name, []))
        include_path = (binary_dir / "arrows" / target).read_text().split()
        actual = found(compiler, include_path, everything)
        for header in sorted(actual - expected - FOR_ALL):
            yield f"{target} sees {header}, which no arrow leads to"
        for header in sorted(expected - actual):
            yield f"{target} does not see {header}, which is behind an arrow"


def check_includes(source_dir):
    """Yields a sentence for each include that goes around the arrows: not written from the root.

    Tests and benchmarks, which no target sees, may have helpers beside them or atop their tree.
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
    faults = [*check_arrows(compiler, Path(binary_dir), targets), *check_includes(Path(source_dir))]
    print("\n".join(faults) or f"{len(targets)} targets see what they should")
    return 1 if faults or not targets else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
