#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Kills a watching tintgate-check at random moments while measurements arrive, then lets it finish and
checks that every content has exactly one complete result.

try-watch-kills.py TINTGATE_CHECK [--kills 300] [--files 2000] [--seed N] [--poll] [--page]
                   [--target FILE]

Files arrive in all ways: written in pieces, renamed into place, in new folders, as copies under other
names, again under the same name with other content, and cut off. Content that was replaced before a
watch saw it may have no result, but never two.
"""

import argparse
import hashlib
import json
import os
import random
import re
import signal
import subprocess
import sys
import tempfile
import threading
import time
from pathlib import Path

ROWS = 60  # of the target: enough for a verdict, and quick
RESULT = re.compile(r"^(?P<name>.+)\.(?P<sha>[0-9a-f]{64})(?P<error>\.error)?\.json$")


def read_target(path):
    """Returns the head and the rows of a CGATS text."""
    head, rest = Path(path).read_text(encoding="latin-1").split("BEGIN_DATA\n")
    rows = [row for row in rest.split("END_DATA")[0].splitlines() if row.strip()]
    step = max(len(rows) // ROWS, 1)
    rows = rows[::step][:ROWS]
    return re.sub(r"NUMBER_OF_SETS \d+", f"NUMBER_OF_SETS {len(rows)}", head), rows


class Writer(threading.Thread):
    """Writes files at even intervals over `seconds`."""

    def __init__(self, folder, target, count, seconds, seed):
        super().__init__()
        self.folder, self.count, self.seconds = Path(folder), count, seconds
        self.random = random.Random(seed)
        self.head, self.rows = target
        self.paths = []
        self.fields = self.head.split("BEGIN_DATA_FORMAT")[1].split("END_DATA_FORMAT")[0].split()

    def content(self, number):
        spread = self.random.choice((0.2, 1.0, 4.0))
        rows = []
        for row in self.rows:
            cells = row.split()
            for place, field in enumerate(self.fields):
                if field.startswith("LAB_"):
                    cells[place] = f"{float(cells[place]) + self.random.gauss(0, spread):.4f}"
            rows.append(" ".join(cells))
        text = f"{self.head}BEGIN_DATA\n" + "\n".join(rows) + "\nEND_DATA\n"
        text = text.replace("\n", f'\nDESCRIPTOR "measurement {number}"\n', 1)
        return text[: len(text) * 2 // 3] if number % 25 == 7 else text

    def write(self, path, text):
        path.parent.mkdir(parents=True, exist_ok=True)
        way = self.random.random()
        if way < 0.4:
            hidden = path.with_name("." + path.name)
            hidden.write_text(text, encoding="latin-1")
            hidden.rename(path)
            return
        with open(path, "w", encoding="latin-1") as file:
            half = len(text) // 2
            file.write(text[:half])
            if way < 0.5:
                file.flush()
                time.sleep(0.002)
            file.write(text[half:])

    def run(self):
        start = time.monotonic()
        for number in range(self.count):
            folder = self.folder / self.random.choice(("", "a", f"day {number // 100}", "ü/b"))
            path = folder / f"proof {number}.txt"
            if self.paths and number % 20 == 3:
                path = self.random.choice(self.paths)  # exported again under the same name
            self.write(path, self.content(number))
            self.paths.append(path)
            if number % 30 == 11:
                self.write(folder / f"copy {number}.txt", path.read_text(encoding="latin-1"))
            time.sleep(max(start + self.seconds * (number + 1) / self.count - time.monotonic(), 0))


class Watch:
    def __init__(self, arguments):
        self.command = arguments

    def start(self, output=subprocess.DEVNULL):
        return subprocess.Popen(self.command, stdout=output, stderr=subprocess.PIPE)


def sha_of(path):
    return hashlib.sha256(Path(path).read_bytes()).hexdigest()


def results_below(folder):
    """Returns the SHA-256 and paths of results, and of what is written for broken measurements."""
    found = {}
    for path in Path(folder).rglob("*.json"):
        match = RESULT.match(path.name)
        if match:
            found.setdefault(match["sha"], []).append(path)
    return found


def check(program, target, exports, results, wants_pages):
    """Yields a sentence for each fault."""
    found = results_below(results)
    present = {}
    for path in sorted(Path(exports).rglob("*.txt")):
        if not path.name.startswith("."):
            present.setdefault(sha_of(path), path)
    for sha, path in present.items():
        if sha not in found:
            yield f"{path} has no result"
    lines = subprocess.run([program, "-t", target, "--json", "-j1", exports], check=False,
                           stdout=subprocess.PIPE).stdout.splitlines()
    verdicts = {}
    for line in map(json.loads, lines):
        verdicts[sha_of(line["file"])] = line["verdict"]
    for sha, paths in found.items():
        if len(paths) > 1:
            yield f"{sha} has {len(paths)} results: {', '.join(map(str, paths))}"
        for path in paths:
            try:
                result = json.loads(path.read_text(encoding="ascii"))
            except ValueError as error:
                yield f"{path} is not complete: {error}"
                continue
            verdict = result.get("verdict")
            if sha in verdicts and verdict != verdicts[sha]:
                yield f"{path}: {verdict}, and without a watch {verdicts[sha]}"
            page = path.with_suffix(".html")
            if wants_pages and verdict and not page.exists():
                yield f"{path} has no page"


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("program")
    parser.add_argument("--kills", type=int, default=300)
    parser.add_argument("--files", type=int, default=2000)
    parser.add_argument("--seed", type=int, default=int(time.time()))
    parser.add_argument("--poll", action="store_true")
    parser.add_argument("--page", action="store_true")
    parser.add_argument("--target", default="/usr/share/color/icc/FOGRA39L.ti3")
    options = parser.parse_args()
    print(f"seed {options.seed}")
    chance = random.Random(options.seed)

    with tempfile.TemporaryDirectory() as scratch:
        exports, results = f"{scratch}/exports", f"{scratch}/results"
        os.mkdir(exports)
        head, rows = read_target(options.target)
        target = f"{scratch}/target.txt"
        Path(target).write_text(head + "BEGIN_DATA\n" + "\n".join(rows) + "\nEND_DATA\n",
                                encoding="latin-1")
        command = [options.program, "--watch", exports, "--out", results, "-t", target,
                   "--interval", "0.05", *["--poll"] * options.poll, *["--page"] * options.page]
        lifetime = 0.1  # seconds, on average
        writer = Writer(exports, (head, rows), options.files, options.kills * lifetime,
                        options.seed)
        writer.start()
        for _ in range(options.kills):
            watch = Watch(command).start()
            time.sleep(chance.uniform(0, 2 * lifetime))
            watch.kill()
            watch.communicate()
        after_kills = len(results_below(results))
        writer.join()

        screen = Path(scratch) / "screen"
        with screen.open("wb") as output:
            watch = Watch(command).start(output)
        deadline = time.monotonic() + 120
        expected = {sha_of(path) for path in Path(exports).rglob("*.txt")
                    if not path.name.startswith(".")}
        # Before its first line, a signal still ends the watch in the ordinary way.
        while time.monotonic() < deadline and (not screen.stat().st_size or
                                               not expected <= set(results_below(results))):
            time.sleep(0.1)
        watch.send_signal(signal.SIGTERM)
        words = watch.communicate()[1].decode()
        faults = list(check(options.program, target, exports, results, options.page))
        if watch.returncode != 0:
            faults.append(f"the last watch ended with {watch.returncode}: {words}")
        print(f"{options.kills} kills while {options.files} files arrived: {after_kills} results "
              f"after the last kill, {len(results_below(results))} at the end, "
              f"{len(expected)} different contents present")
    print("\n".join(faults) or "every content has exactly one complete result")
    return 1 if faults else 0


if __name__ == "__main__":
    sys.exit(main())
