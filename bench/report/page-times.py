#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Times the page of a trend of 2,000 results against that of one result, in headless Chromium.

page-times.py TINTGATE TINTGATE_REPORT PRESET [--results N] [--pairs N] [--keep FOLDER]

Both are opened in turns, so that other load affects both. Prints two ratios of medians: of the
browser's whole run, and of the time within the page, from the start of loading until all charts are
drawn. Each page must produce no output on the browser's console and contain the expected numbers.
"""

import argparse
import json
import os
import re
import statistics
import subprocess
import sys
import tempfile
import time
from pathlib import Path

HERE = Path(__file__).resolve().parent
LIMIT = 3

# Runs after the page's own scripts. Reading a pixel of each chart makes the browser finish all
# drawing there.
PROBE = """<script>
for (const chart of document.querySelectorAll("canvas")) {
  chart.getContext("2d").getImageData(0, 0, 1, 1);
}
document.body.append(`[ready after ${performance.now()} ms]`);
</script>
"""


def with_probe(page):
    """A copy of the page whose content security policy allows the probe."""
    text = page.read_text()
    text = re.sub(r'<meta http-equiv="Content-Security-Policy".*?>', "", text, count=1)
    end = text.rindex("</body>")
    copy = page.with_suffix(".probe.html")
    copy.write_text(text[:end] + PROBE + text[end:])
    return copy


def open_page(page, profile):
    """Elapsed seconds, and the document after its scripts have run."""
    command = ["chromium", "--headless", "--disable-gpu", "--no-first-run", "--disable-sync",
               "--disable-background-networking", "--disable-component-update",
               "--enable-logging=stderr", "--timeout=20000", "--dump-dom",
               "--window-size=1200,1000", f"--user-data-dir={profile}"]
    if os.geteuid() == 0:
        command.append("--no-sandbox")
    start = time.perf_counter()
    done = subprocess.run([*command, f"file://{page}"], capture_output=True, text=True, check=True)
    seconds = time.perf_counter() - start
    if "CONSOLE" in done.stderr:
        sys.exit(f"{page}: the console says\n{done.stderr}")
    return seconds, done.stdout


def check(document, parts, page):
    for part in parts:
        if part not in document:
            sys.exit(f"{page}: {part!r} is not in the document")


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("tintgate")
    parser.add_argument("tintgate_report")
    parser.add_argument("preset")
    parser.add_argument("--results", type=int, default=2000)
    parser.add_argument("--pairs", type=int, default=7)
    parser.add_argument("--keep", type=Path, help="leave results and pages there")
    arguments = parser.parse_args()
    with tempfile.TemporaryDirectory() as scratch:
        compare(arguments, (arguments.keep or Path(scratch)).resolve())


def compare(arguments, folder):
    results = folder / "results"
    subprocess.run([sys.executable, HERE / "make-results.py", arguments.tintgate, arguments.preset,
                    results, str(arguments.results)], check=True)
    trend, one = folder / "trend.html", folder / "one.html"
    last = results / f"JobID_{arguments.results}" / "output.json"
    start = time.perf_counter()
    subprocess.run([arguments.tintgate_report, results, "--no-pages", "-o", trend], check=True)
    made = time.perf_counter() - start
    subprocess.run([arguments.tintgate_report, last, "-o", one], check=True)

    cyan = next(c for c in json.loads(last.read_text())["criteria"] if c["name"] == "solidCyan")
    expected = {
        trend: (f"{arguments.results} jobs", f"latest job {cyan['rounded']:.2f} of 3.00 ΔE00",
                "Drifting: cyan"),
        one: (f"Solid cyan</th><td class=\"number\">{cyan['rounded']:.2f} ",),
    }
    probes = {page: with_probe(page) for page in expected}
    runs = {page: [] for page in expected}
    inside = {page: [] for page in expected}
    for i in range(arguments.pairs + 1):
        for page, probe in probes.items():
            _, document = open_page(page, folder / "profile") if i == 0 else (0, None)
            if document:
                check(document, expected[page], page)
            seconds, document = open_page(probe, folder / "profile")
            if i > 0: # The first pair fills the caches.
                runs[page].append(seconds)
                inside[page].append(float(re.search(r"ready after ([\d.]+) ms", document)[1]))
    print(f"trend of {arguments.results} results: {trend.stat().st_size / 1e6:.2f} MB, "
          f"made in {made:.2f} s; page of one: {one.stat().st_size / 1e6:.2f} MB")
    met = [say("whole run of the browser", runs[trend], runs[one], "s"),
           say("within the page", inside[trend], inside[one], "ms")]
    sys.exit(0 if all(met) else 1)


def say(what, first, second, unit):
    a, b = statistics.median(first), statistics.median(second)
    missed = "" if a / b <= LIMIT else "  MISSED"
    print(f"{what:26} {a:8.4g} {unit} against {b:8.4g} {unit}: {a / b:.2f} (at most {LIMIT}){missed}",
          flush=True)
    return a / b <= LIMIT


if __name__ == "__main__":
    main()
